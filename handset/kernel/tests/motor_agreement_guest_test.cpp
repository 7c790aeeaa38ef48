// SPDX-License-Identifier: Apache-2.0
//
// The motor: a real force-feedback device behind the kernel's input core, and
// the simulated one.
#include <fcntl.h>
#include <linux/input.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <csignal>
#include <cstring>
#include <optional>
#include <random>

#include "handset/kernel/tests/agreement.h"
#include "handset/driver/tests/motor_file.h"

namespace handset
{
namespace
{

constexpr uid_t kRoot = 0;
constexpr uid_t kSystem = 1000;
constexpr uid_t kStranger = 2000;

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
	const pid_t child = fork();
	if (child == 0) {
		const MotorFile file(motor, O_RDWR);
		file.upload();
		file.upload();
		file.event(0, 1);
		kill(getpid(), SIGKILL);
	}
	return joined({std::to_string(waitForEnd(child)), kept.upload()});
}

std::string inheritedFile(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	std::string answers = file.upload() + " ";
	const pid_t child = fork();
	if (child == 0)
		_exit(file.upload(0) == "0" && file.erase(0) == "0" ? 0 : 1);
	answers += std::to_string(waitForEnd(child)) + " ";
	return answers + file.upload();
}

std::string questions(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	int number = 0;
	input_id id{};
	char text[64] = {};
	std::string answers =
		joined({outcome(ioctl(file.fd(), EVIOCGVERSION, &number)),
			std::to_string(number)});
	answers += joined({outcome(ioctl(file.fd(), EVIOCGEFFECTS, &number)),
			   std::to_string(number)});
	answers += joined(
		{outcome(ioctl(file.fd(), EVIOCGID, &id)),
		 std::to_string(id.bustype), std::to_string(id.vendor),
		 std::to_string(id.product), std::to_string(id.version)});
	answers += joined(
		{outcome(ioctl(file.fd(), EVIOCGNAME(sizeof text), text)),
		 text});
	memset(text, '#', 8);
	text[8] = '\0';
	answers +=
		joined({outcome(ioctl(file.fd(), EVIOCGNAME(5), text)), text});
	answers += joined(
		{outcome(ioctl(file.fd(), EVIOCGPHYS(sizeof text), text)),
		 text});
	return answers +
	       joined({outcome(ioctl(file.fd(), EVIOCGUNIQ(sizeof text), text)),
		       outcome(ioctl(file.fd(), EVIOCGNAME(0), text))});
}

std::string bitMaps(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	std::string answers;
	const auto ask = [&](unsigned long command) {
		unsigned char bits[128] = {};
		const int size = ioctl(file.fd(), command, bits);
		answers += outcome(size);
		for (int i = 0; i < size; ++i) {
			if (bits[i] != 0)
				answers += ":" + std::to_string(i) + "=" +
					   std::to_string(bits[i]);
		}
		answers += " ";
	};
	for (unsigned type = 0; type <= EV_MAX; ++type)
		ask(EVIOCGBIT(type, 128));
	ask(EVIOCGBIT(EV_FF, 11));
	ask(EVIOCGPROP(128));
	ask(EVIOCGKEY(128));
	ask(EVIOCGLED(128));
	ask(EVIOCGSND(128));
	ask(EVIOCGSW(128));
	return answers;
}

std::string questionsItDoesNotAnswer(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	unsigned char memory[256] = {};
	std::string answers;
	for (const unsigned long command :
	     {static_cast<unsigned long>(EVIOCGABS(0)),
	      static_cast<unsigned long>(EVIOCGKEYCODE),
	      static_cast<unsigned long>(EVIOCGMTSLOTS(8)),
	      static_cast<unsigned long>(_IO('E', 0xee)),
	      static_cast<unsigned long>(_IOR('E', 0xee, int)),
	      static_cast<unsigned long>(
		      _IOW('E', 0x80, int)), // an upload of another size
	      static_cast<unsigned long>(_IOR('Q', 0x01, int)), 0UL}) {
		answers += outcome(ioctl(file.fd(), command, memory)) + " ";
	}
	return answers;
}

std::string nothingToRead(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR | O_NONBLOCK);
	input_event events[2] = {};
	pollfd polled{file.fd(), POLLIN | POLLOUT, 0};
	const int ready = poll(&polled, 1, 0);
	return joined({outcome(read(file.fd(), events, sizeof events)),
		       outcome(read(file.fd(), events, 5)),
		       std::to_string(ready), std::to_string(polled.revents)});
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
	{"QuestionsAreAnswered", kSystem, questions,
	 "0 65537 0 3 0 6 0 0 0 21 qvx_vibrator_inputff 5 qvx_v### 11 "
	 "qvx/input0 ENOENT 0 "},
	{"BitMapsSayWhatItCan", kSystem, bitMaps,
	 "8:0=1:2=32 96 8 8 8 8 "
	 "EINVAL EINVAL EINVAL EINVAL EINVAL EINVAL EINVAL EINVAL EINVAL "
	 "EINVAL EINVAL 8 8 EINVAL EINVAL 16:10=3:11=32:12=1 EINVAL EINVAL "
	 "EINVAL EINVAL EINVAL "
	 "EINVAL EINVAL EINVAL EINVAL EINVAL 11:10=3 8 96 8 8 8 "},
	{"OtherQuestionsAreRefused", kSystem, questionsItDoesNotAnswer,
	 "EINVAL EINVAL EINVAL EINVAL EINVAL EFAULT EINVAL EINVAL "},
	{"ThereIsNothingToRead", kSystem, nothingToRead, "EAGAIN EINVAL 1 4 "},
};

class MotorAgreement : public testing::TestWithParam<Agreement>
{
};

TEST_P(MotorAgreement, OfRealAndSimulated)
{
	expectAgreement(GetParam());
}

INSTANTIATE_TEST_SUITE_P(Motor, MotorAgreement, testing::ValuesIn(kCases),
			 nameOf<Agreement>);

// Three files and a long random sequence of everything a client may ask; the
// seed makes both drivers get the same.
class RandomClient
{
      public:
	RandomClient(const std::string &motor, unsigned seed)
	    : mMotor(motor), mRandom(seed)
	{
		for (std::optional<MotorFile> &file : mFiles)
			file.emplace(mMotor, O_RDWR);
	}

	std::string run(int steps)
	{
		std::string answers;
		for (int i = 0; i < steps; ++i)
			answers += step() + " ";
		return answers;
	}

      private:
	int below(int limit)
	{
		return static_cast<int>(mRandom() %
					static_cast<unsigned>(limit));
	}

	std::string step()
	{
		std::optional<MotorFile> &file = mFiles[below(3)];
		switch (below(10)) {
		case 0:
			file.emplace(mMotor, O_RDWR);
			return "reopened";
		case 1:
		case 2:
			return file->erase(below(6) - 1);
		case 3:
			return file->event(FF_GAIN, below(70000) - 1000);
		case 4:
		case 5:
		case 6:
			return file->event(static_cast<uint16_t>(below(5)),
					   below(5) - 1);
		default:
			return upload(*file);
		}
	}

	std::string upload(const MotorFile &file)
	{
		int16_t samples[8];
		for (int16_t &sample : samples)
			sample = static_cast<int16_t>(mRandom());
		ff_effect effect = MotorFile::record(
			below(6) - 2, static_cast<uint16_t>(mRandom()), samples,
			static_cast<uint32_t>(below(9)));
		if (below(4) == 0) {
			effect.type = FF_RUMBLE;
			memset(&effect.u, 0, sizeof effect.u);
			effect.u.rumble.strong_magnitude =
				static_cast<uint16_t>(mRandom());
		}
		return file.upload(effect);
	}

	const std::string mMotor;
	std::mt19937 mRandom;
	std::optional<MotorFile> mFiles[3];
};

class RandomMotorRequests : public testing::TestWithParam<unsigned>
{
};

TEST_P(RandomMotorRequests, AreAnsweredAlike)
{
	expectSame([](const std::string &motor) {
		return RandomClient(motor, GetParam()).run(400);
	});
}

INSTANTIATE_TEST_SUITE_P(Motor, RandomMotorRequests,
			 testing::Values(1U, 2U, 3U));

} // namespace
} // namespace handset
