// SPDX-License-Identifier: Apache-2.0
//
// Long random sequences of requests to the real driver and to the simulated
// one, whose answers are compared; the seed makes both get the same.
#include <fcntl.h>
#include <linux/input.h>
#include <unistd.h>

#include <cstring>
#include <optional>
#include <random>

#include "handset/kernel/tests/agreement.h"
#include "handset/kernel/tests/node_file.h"
#include "handset/driver/tests/motor_file.h"

namespace handset
{
namespace
{

// Two files on one node: reads and writes.
std::string randomReadsAndWrites(unsigned seed)
{
	std::mt19937 random(seed);
	const auto below = [&](unsigned limit) {
		return static_cast<unsigned>(random() % limit);
	};
	const NodeFile files[2] = {{kReadWriteNode, O_RDWR},
				   {kReadWriteNode, O_RDWR}};
	std::string answers;
	for (int i = 0; i < 600; ++i) {
		const NodeFile &file = files[below(2)];
		const unsigned size = below(4) == 0 ? below(4096) : below(12);
		switch (below(5)) {
		case 0:
			answers += file.put(std::string(
				size, static_cast<char>('a' + below(26))));
			break;
		case 1:
			answers +=
				outcome(lseek(file.fd(), below(16), SEEK_SET));
			break;
		case 2:
			answers += file.getAt(size, below(16));
			break;
		default:
			answers += file.get(size);
		}
	}
	return answers;
}

class RandomSysfsRequests : public testing::TestWithParam<unsigned>
{
};

TEST_P(RandomSysfsRequests, AreAnsweredAlike)
{
	expectSame([](const std::string &) {
		return randomReadsAndWrites(GetParam());
	});
}

INSTANTIATE_TEST_SUITE_P(Sysfs, RandomSysfsRequests,
			 testing::Values(1U, 2U, 3U));

// Three files on the motor: everything a client may ask.
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
