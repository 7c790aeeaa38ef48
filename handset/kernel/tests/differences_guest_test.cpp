// SPDX-License-Identifier: Apache-2.0
//
// Where the simulated driver differs from a real one, and how: each row is
// shown to be so. The simulated driver stands in the place of sysfs and the
// input core and notes what a client asked, also what those would have kept
// from a driver; that makes it the better witness.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <linux/input.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include "handset/kernel/tests/agreement.h"
#include "handset/kernel/tests/driver_view.h"
#include "handset/driver/tests/motor_file.h"

namespace handset
{
namespace
{

using Lines = std::vector<std::string>;

struct Difference {
	const char *name;
	std::string (*request)(const std::string &motor);
	const char *realAnswers;
	Lines realNotes;
	const char *simulatedAnswers;
	Lines simulatedNotes;
};

std::ostream &operator<<(std::ostream &out, const Difference &difference)
{
	return out << difference.name;
}

std::string openAndRefusal(const std::string &)
{
	return joined({openNode(kReadWriteNode, O_RDWR),
		       openNode(kReadOnlyNode, O_RDWR)});
}

std::string motorOpen(const std::string &motor)
{
	return openNode(motor, O_RDONLY);
}

std::string refusedEffects(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	return joined({file.upload(2), file.erase(1)});
}

std::string eventsOutOfRange(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	return joined({file.upload(), file.event(0, -1), file.event(1, 1),
		       file.event(FF_GAIN, 65536)});
}

std::string eventOfAnotherType(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	input_event event{};
	event.type = EV_LED;
	event.code = LED_CAPSL;
	event.value = 1;
	return outcome(write(file.fd(), &event, sizeof event));
}

std::string shortEvent(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	return outcome(write(file.fd(), "abc", 3));
}

std::string eraseOfPlaying(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	return joined({file.upload(), file.event(0, 1), file.erase(0)});
}

std::string echo(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR | O_NONBLOCK);
	input_event events[2] = {};
	events[0].type = EV_FF;
	events[0].code = FF_GAIN;
	events[0].value = 7;
	const std::string written =
		outcome(write(file.fd(), events, sizeof events));
	return joined(
		{written, outcome(read(file.fd(), events, sizeof events))});
}

std::string seekInMotor(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	return outcome(lseek(file.fd(), 0, SEEK_SET));
}

std::string readersServices(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	int clock = 1;
	return joined({outcome(ioctl(file.fd(), EVIOCGRAB, 1)),
		       outcome(ioctl(file.fd(), EVIOCSCLOCKID, &clock)),
		       outcome(ioctl(file.fd(), EVIOCREVOKE, 0)),
		       file.upload()});
}

std::string repeatSettings(const std::string &motor)
{
	const MotorFile file(motor, O_RDWR);
	unsigned settings[2] = {};
	return joined({outcome(ioctl(file.fd(), EVIOCGREP, settings)),
		       outcome(ioctl(file.fd(), EVIOCSREP, settings))});
}

std::string moreThanAPage(const std::string &)
{
	const int node = open(kReadWriteNode.c_str(), O_RDWR);
	const std::string text(5000, '7');
	std::string answers =
		outcome(write(node, text.data(), text.size())) + " ";
	answers += std::to_string(readNode(kReadWriteNode).size());
	close(node);
	return answers;
}

std::string aWholePage(const std::string &)
{
	const std::string text(4096, '7');
	const std::string written = writeNode(kOtherClass, text, O_RDWR);
	return written + " " + std::to_string(readNode(kOtherClass).size());
}

std::string threeReads(const std::string &)
{
	const int node = open(kReadOnlyNode.c_str(), O_RDONLY);
	char text[2];
	std::string answers;
	for (int i = 0; i < 3; ++i)
		answers += outcome(read(node, text, sizeof text)) + " ";
	close(node);
	return answers;
}

std::string pollOfANode(const std::string &)
{
	pollfd polled{open(kReadWriteNode.c_str(), O_RDONLY), POLLIN | POLLPRI,
		      0};
	poll(&polled, 1, 0);
	close(polled.fd);
	return std::to_string(polled.revents);
}

const std::string kUpload = " custom 00000000";

std::string repeated(const std::string &text, int count)
{
	std::string all;
	for (int i = 0; i < count; ++i)
		all += text;
	return all;
}

const std::vector<Difference> kDifferences = {
	// A driver learns neither of opens and closes of its nodes nor of
	// refusals.
	{"OpensAndRefusals",
	 openAndRefusal,
	 "ok EACCES ",
	 {},
	 "ok EACCES ",
	 {"open duration O_RDWR = 0", "close duration",
	  "open num_waves O_RDWR = EACCES"}},
	{"OpensOfTheMotor",
	 motorOpen,
	 "ok",
	 {},
	 "ok",
	 {"open motor O_RDONLY = 0", "close motor"}},
	{"RefusedUploadsAndErasures",
	 refusedEffects,
	 "EINVAL EINVAL ",
	 {},
	 "EINVAL EINVAL ",
	 {"open motor O_RDWR = 0", "upload 2 = EINVAL custom ",
	  "erase 1 = EINVAL", "close motor"}},
	// The input core takes such events and passes none on.
	{"EventsOutOfRange",
	 eventsOutOfRange,
	 "0 24 24 24 ",
	 {"upload -1 = 0" + kUpload, "event 0 0", "erase 0 = 0"},
	 "0 24 24 24 ",
	 {"open motor O_RDWR = 0", "upload -1 = 0" + kUpload, "event 0 -1",
	  "event 1 1", "event 96 65536", "erase 0 = 0", "close motor"}},
	{"EventsOfOtherTypes",
	 eventOfAnotherType,
	 "24",
	 {},
	 "24",
	 {"open motor O_RDWR = 0", "event of type 17 1 1", "close motor"}},
	{"WritesShorterThanAnEvent",
	 shortEvent,
	 "EINVAL",
	 {},
	 "EINVAL",
	 {"open motor O_RDWR = 0", "write motor 616263 = EINVAL",
	  "close motor"}},
	// The input core stops an effect before it erases it. A client did not
	// ask for that.
	{"StopBeforeErase",
	 eraseOfPlaying,
	 "0 24 0 ",
	 {"upload -1 = 0" + kUpload, "event 0 1", "event 0 0", "erase 0 = 0"},
	 "0 24 0 ",
	 {"open motor O_RDWR = 0", "upload -1 = 0" + kUpload, "event 0 1",
	  "erase 0 = 0", "close motor"}},
	// The input core hands a packet of events to every reader of the
	// device.
	{"EchoToReaders",
	 echo,
	 "48 48 ",
	 {"event 96 7"},
	 "48 EAGAIN ",
	 {"open motor O_RDWR|O_NONBLOCK = 0", "event 96 7",
	  "event of type 0 0 0", "close motor"}},
	// A device in user space cannot say that it has no places to seek.
	{"SeekingInTheMotor",
	 seekInMotor,
	 "ESPIPE",
	 {},
	 "0",
	 {"open motor O_RDWR = 0", "close motor"}},
	// Nobody reads the motor, so what readers agree upon between them is
	// left out.
	{"ReadersServices",
	 readersServices,
	 "0 0 0 ENODEV ",
	 {},
	 "EINVAL EINVAL EINVAL 0 ",
	 {"open motor O_RDWR = 0", "upload -1 = 0" + kUpload, "erase 0 = 0",
	  "close motor"}},
	// A device in user space cannot answer ENOSYS.
	{"RepeatSettings",
	 repeatSettings,
	 "ENOSYS ENOSYS ",
	 {},
	 "EINVAL EINVAL ",
	 {"open motor O_RDWR = 0", "close motor"}},
	// sysfs hands a driver one page at most and shows one byte less; nodes
	// on phones that take
	// more are not plain sysfs files, so the simulated one takes any
	// length.
	{"WritesOfMoreThanAPage",
	 moreThanAPage,
	 "4096 4095",
	 {"write duration " + repeated("37", 4096) + " = 4096",
	  "read duration = 4095"},
	 "5000 5000",
	 {"open duration O_RDWR = 0",
	  "write duration " + repeated("37", 5000) + " = 5000",
	  "open duration O_RDONLY = 0", "read duration = 5000",
	  "close duration", "close duration"}},
	{"TheLastByteOfAPage",
	 aWholePage,
	 "4096 4095",
	 {"write enable " + repeated("37", 4096) + " = 4096",
	  "read enable = 4095"},
	 "4096 4096",
	 {"open enable O_RDWR = 0",
	  "write enable " + repeated("37", 4096) + " = 4096", "close enable",
	  "open enable O_RDONLY = 0", "read enable = 4096", "close enable"}},
	// A driver shows its text once; sysfs serves the pieces.
	{"ReadsInPieces",
	 threeReads,
	 "2 2 0 ",
	 {"read num_waves = 4"},
	 "2 2 0 ",
	 {"open num_waves O_RDONLY = 0", "read num_waves = 2",
	  "read num_waves = 2", "read num_waves = 0", "close num_waves"}},
	// sysfs calls a node that has not been read yet changed.
	{"PollOfANode",
	 pollOfANode,
	 "11",
	 {},
	 "1",
	 {"open duration O_RDONLY = 0", "close duration"}},
};

class DriverDifference : public testing::TestWithParam<Difference>
{
};

TEST_P(DriverDifference, IsAsListed)
{
	const Difference &difference = GetParam();
	const std::unique_ptr<Driver> real = startRealDriver();
	const std::unique_ptr<Driver> simulated = startSimulatedDriver();
	ASSERT_EQ(real->problem(), "");
	ASSERT_EQ(simulated->problem(), "");
	EXPECT_EQ(real->perform(1000, difference.request),
		  difference.realAnswers);
	EXPECT_EQ(inShort(real->noted()), difference.realNotes);
	EXPECT_EQ(simulated->perform(1000, difference.request),
		  difference.simulatedAnswers);
	EXPECT_EQ(inShort(simulated->noted()), difference.simulatedNotes);
}

INSTANTIATE_TEST_SUITE_P(Driver, DriverDifference,
			 testing::ValuesIn(kDifferences), nameOf<Difference>);

} // namespace
} // namespace handset
