// SPDX-License-Identifier: Apache-2.0
//
// The motor: a real force-feedback device behind the kernel's input core, and
// the simulated one. What it is asked about itself is in
// motor_questions_guest_test.cpp.
#include <fcntl.h>
#include <linux/input.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <csignal>
#include <cstring>

#include "handset/kernel/tests/agreement.h"
#include "handset/driver/tests/motor_file.h"

namespace handset
{
namespace
{

std::string newIds(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	return joined({file.upload(), file.upload(), file.upload(),
		       file.upload(), file.erase(1), file.upload(),
		       file.upload()});
}

std::string updates(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	return joined({file.upload(-1, 5, 100), file.upload(0, 6, 200),
		       file.upload(0, -7, 65535), file.event(0, 1)});
}

std::string unusedIds(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	return joined({file.upload(), file.upload(1), file.upload(3),
		       file.upload(96), file.upload(-2), file.upload(32767),
		       file.upload(-32768), file.erase(1), file.erase(3),
		       file.erase(-1), file.erase(99), file.erase(0),
		       file.erase(0)});
}

std::string anothersIds(const std::string &motor)
{
	const MotorFile own(motor, O_RDWR);
	const MotorFile other(motor, O_RDWR);
	return joined({own.upload(), other.upload(0), other.erase(0),
		       other.event(0, 1), other.upload(), own.erase(1),
		       own.upload(1), own.erase(0)});
}

std::string kinds(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	std::string answers;
	for (const int type :
	     {0, 79, 80, 81, 82, 83, 84, 85, 86, 87, 88, 96, 65535}) {
		ff_effect effect{};
		effect.type = static_cast<uint16_t>(type);
		effect.id = -1;
		answers += file.upload(effect) + " ";
	}
	for (const int waveform : {0, 87, 88, 89, 90, 91, 92, 93, 94, 65535}) {
		ff_effect effect{};
		effect.type = FF_PERIODIC;
		effect.u.periodic.waveform = static_cast<uint16_t>(waveform);
		effect.id = -1;
		answers += file.upload(effect) + " ";
	}
	return answers;
}

std::string updatesToAnotherKind(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	ff_effect rumble{};
	rumble.type = FF_RUMBLE;
	rumble.id = -1;
	rumble.u.rumble.strong_magnitude = 0xffff;
	rumble.u.rumble.weak_magnitude = 0x3000;
	const std::string first = file.upload(rumble);
	return joined({first, file.upload(0), file.upload(rumble),
		       file.upload(), file.upload(1)});
}

std::string everyField(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	int16_t samples[] = {0, 1, -1, 32767, -32768};
	ff_effect effect = MotorFile::record(-1, 500, samples, 5);
	effect.direction = 0x4000;
	effect.trigger = {288, 77};
	effect.replay.delay = 20;
	effect.u.periodic.period = 9;
	effect.u.periodic.magnitude = -3;
	effect.u.periodic.offset = -4;
	effect.u.periodic.phase = 10;
	effect.u.periodic.envelope = {11, 12, 13, 14};
	const ff_effect before = effect;
	const std::string id = file.upload(effect);
	const bool same = memcmp(&effect.u, &before.u, sizeof effect.u) == 0 &&
			  effect.direction == before.direction &&
			  effect.type == before.type;
	return joined({id, same ? "only the id is written back"
				: "more is written back"});
}

std::string sampleCounts(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	static int16_t samples[32769];
	for (int i = 0; i < 32769; ++i)
		samples[i] = static_cast<int16_t>(i);
	std::string answers;
	for (const uint32_t count :
	     {0U, 1U, 576U, 32768U, 32769U, 0x7fffffffU, 0x80000001U, ~0U}) {
		ff_effect effect = MotorFile::record(-1, 0, samples, count);
		const std::string id = file.upload(effect);
		answers += id + " ";
		if (effect.id >= 0)
			answers += file.erase(effect.id) + " ";
	}
	ff_effect none = MotorFile::record(-1, 0, nullptr, 0);
	return answers + file.upload(none);
}

std::string badPointers(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	int16_t *nowhere = nullptr;
	ff_effect effect = MotorFile::record(-1, 0, nowhere + 8, 2);
	const std::string samples = file.upload(effect);
	return joined(
		{samples, outcome(ioctl(file.fd(), EVIOCSFF, nullptr)),
		 outcome(ioctl(file.fd(), EVIOCGVERSION, nullptr)),
		 outcome(ioctl(file.fd(), EVIOCGNAME(16), nullptr)),
		 outcome(write(file.fd(), nowhere + 8, sizeof(input_event))),
		 file.upload()});
}

std::string refusalsBeforeTheSamples(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	const MotorFile other(motor, O_RDWR);
	int16_t *nowhere = nullptr;
	const auto uploadFromNowhere = [&](int id) {
		ff_effect effect = MotorFile::record(id, 0, nowhere + 8, 2);
		return file.upload(effect);
	};
	return joined({other.upload(), uploadFromNowhere(0),
		       uploadFromNowhere(1), file.upload(),
		       uploadFromNowhere(1), file.upload(),
		       uploadFromNowhere(-1)});
}

std::string playAndGain(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	return joined({file.upload(), file.event(0, 1), file.event(0, 3),
		       file.event(0, 0x7fffffff), file.event(0, 0),
		       file.event(FF_GAIN, 0), file.event(FF_GAIN, 5000),
		       file.event(FF_GAIN, 65535)});
}

std::string droppedEvents(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	return joined({file.upload(), file.event(0, -1), file.event(1, 1),
		       file.event(95, 1), file.event(0xffff, 1),
		       file.event(FF_GAIN, 65536), file.event(FF_GAIN, -1),
		       file.event(FF_AUTOCENTER, 100), file.event(FF_GAIN, 1),
		       file.erase(0), file.event(0, 1)});
}

std::string sizesOfEvents(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	input_event events[3] = {};
	for (input_event &event : events) {
		event.type = EV_FF;
		event.code = FF_GAIN;
		event.value = 7;
	}
	return joined({outcome(write(file.fd(), events, sizeof events)),
		       outcome(write(file.fd(), events, sizeof events[0] + 5)),
		       outcome(write(file.fd(), events, 23)),
		       outcome(write(file.fd(), events, 1)),
		       outcome(write(file.fd(), events, 0))});
}

std::string openModes(const std::string &motor)
{
	const MotorFile readOnly(motor, O_RDONLY);
	const MotorFile writeOnly(motor, O_WRONLY);
	char byte = 0;
	return joined(
		{readOnly.upload(), readOnly.event(0, 1), writeOnly.upload(),
		 writeOnly.event(1, 1), writeOnly.event(0, 1),
		 outcome(read(writeOnly.fd(), &byte, 1)), readOnly.erase(0)});
}

std::string permissions(const std::string &motor)
{
	return joined({openNode(motor, O_RDWR), openNode(motor, O_RDONLY),
		       openNode(motor, O_WRONLY),
		       outcome(access(motor.c_str(), R_OK))});
}

std::string closing(const std::string &motor)
{
	const MotorFile kept(motor, O_RDWR);
	std::string answers;
	{
		const MotorFile closed(motor, O_RDWR);
		answers = joined({closed.upload(), kept.upload(),
				  closed.upload(), closed.event(2, 1)});
	}
	return answers + joined({kept.upload(), kept.upload(), kept.upload()});
}

std::string duplicateKeeps(const std::string &motor)
{
	const MotorFile other(motor, O_RDWR);
	int duplicate = -1;
	std::string answers;
	{
		const MotorFile file(motor, O_RDWR);
		answers = file.upload() + " ";
		duplicate = dup(file.fd());
	}
	answers += other.upload() + " ";
	close(duplicate);
	return answers + other.upload();
}

std::string killedClient(const std::string &motor)
{
	const MotorFile kept(motor, O_RDWR);
	qvx::test::Process child(geteuid(), [&] {
		const MotorFile file(motor, O_RDWR);
		file.upload();
		file.upload();
		file.event(0, 1);
		kill(getpid(), SIGKILL);
	});
	return joined({std::to_string(child.wait()), kept.upload()});
}

std::string inheritedFile(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	std::string answers = file.upload() + " ";
	qvx::test::Process child(geteuid(), [&] {
		EXPECT_EQ(file.upload(0), "0");
		EXPECT_EQ(file.erase(0), "0");
	});
	answers += std::to_string(child.wait()) + " ";
	return answers + file.upload();
}

const Agreement kCases[] = {
	{"NewEffectsTakeTheLowestFreeId", kSystem, newIds,
	 "0 1 2 ENOSPC 0 1 ENOSPC "},
	{"AnUpdateKeepsItsId", kSystem, updates, "0 0 0 24 "},
	{"UnusedIdsAreInvalid", kSystem, unusedIds,
	 "0 EINVAL EINVAL EINVAL EINVAL EINVAL EINVAL EINVAL EINVAL EINVAL "
	 "EINVAL 0 EINVAL "},
	{"AnothersIdsAreRefusedButMayBePlayed", kSystem, anothersIds,
	 "0 EACCES EACCES 24 1 EACCES EACCES 0 "},
	{"KindsThatAreNotAnnouncedAreInvalid", kSystem, kinds,
	 "EINVAL EINVAL 0 EINVAL EINVAL EINVAL EINVAL EINVAL EINVAL EINVAL "
	 "EINVAL EINVAL EINVAL "
	 "EINVAL EINVAL EINVAL EINVAL EINVAL EINVAL EINVAL 1 EINVAL EINVAL "},
	{"AnUpdateToAnotherKindIsInvalid", kSystem, updatesToAnotherKind,
	 "0 EINVAL 0 1 1 "},
	{"EveryFieldReachesTheDriver", kSystem, everyField,
	 "0 only the id is written back "},
	{"SamplesUpToTheMotorsMemory", kSystem, sampleCounts,
	 "0 0 0 0 0 0 0 0 EINVAL EINVAL EINVAL EINVAL 0"},
	{"BadPointersAreFaults", kSystem, badPointers,
	 "EFAULT EFAULT EFAULT EFAULT EFAULT 0 "},
	{"ARefusedUploadsSamplesAreNotLookedAt", kSystem,
	 refusalsBeforeTheSamples, "0 EACCES EINVAL 1 EFAULT 2 ENOSPC "},
	{"PlayStopAndGainReachTheDriver", kSystem, playAndGain,
	 "0 24 24 24 24 24 24 24 "},
	{"EventsTheCoreDropsAreTaken", kSystem, droppedEvents,
	 "0 24 24 24 24 24 24 24 24 0 24 "},
	{"EventsAreTakenWhole", kSystem, sizesOfEvents,
	 "72 24 EINVAL EINVAL 0 "},
	{"AFilesModeSaysWhatItMayDo", kSystem, openModes,
	 "0 EBADF 1 24 24 EBADF 0 "},
	{"RootMayOpenIt", kRoot, permissions, "ok ok ok 0 "},
	{"TheSystemUserMayOpenIt", kSystem, permissions, "ok ok ok 0 "},
	{"AStrangerMayNotOpenIt", kStranger, permissions,
	 "EACCES EACCES EACCES EACCES "},
	{"CloseErasesTheFilesEffectsInOrder", kSystem, closing,
	 "0 1 2 24 0 2 ENOSPC "},
	{"ADuplicateKeepsTheEffects", kSystem, duplicateKeeps, "0 1 0"},
	{"AKilledClientsEffectsAreErased", kSystem, killedClient, "137 0 "},
	{"AnInheritedFileIsTheSameOwner", kSystem, inheritedFile, "0 0 0"},
};

TEST_P(MotorAgreement, OfRealAndSimulated)
{
	expectAgreement(GetParam());
}

INSTANTIATE_TEST_SUITE_P(Motor, MotorAgreement, testing::ValuesIn(kCases),
			 nameOf<Agreement>);

} // namespace
} // namespace handset
