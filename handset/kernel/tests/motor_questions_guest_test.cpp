// SPDX-License-Identifier: Apache-2.0
//
// What the motor is asked about itself, of the real one and the simulated one.
#include <fcntl.h>
#include <linux/input.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cstring>

#include "handset/kernel/tests/agreement.h"
#include "handset/driver/tests/motor_file.h"

namespace handset
{
namespace
{

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

const Agreement kQuestions[] = {
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

INSTANTIATE_TEST_SUITE_P(MotorQuestions, MotorAgreement,
			 testing::ValuesIn(kQuestions), nameOf<Agreement>);

} // namespace
} // namespace handset
