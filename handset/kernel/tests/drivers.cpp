// SPDX-License-Identifier: Apache-2.0
//
// The two drivers that have to behave alike.
#include "handset/kernel/tests/drivers.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <sstream>

#include <android-base/unique_fd.h>

#include "handset/driver/kernel_module.h"
#include "handset/driver/profile_reader.h"

namespace handset
{
namespace
{

constexpr const char *kReport = "/dev/qvx_vibrator_report";

std::vector<Json> parseLines(const std::string &text)
{
	std::vector<Json> lines;
	std::istringstream stream(text);
	for (std::string line; std::getline(stream, line);)
		lines.push_back(Json::parse(line));
	return lines;
}

constexpr const char *kNodes = R"({
    "nodes": {
        "/sys/class/leds/vibrator/duration": {"mode": "rw", "text": "0\n"},
        "/sys/class/leds/vibrator/motor_type": {"mode": "rw", "text": "LINEAR_1040\n", "hold": true},
        "/sys/class/leds/vibrator/num_waves": {"mode": "ro", "text": "137\n"},
        "/sys/class/leds/vibrator/reset": {"mode": "wo"},
        "/sys/class/timed_output/vibrator/enable": {"mode": "rw", "text": "0\n"},
        "/sys/class/qvx_vib_inputff/control/f0_stored": {"mode": "rw", "text": "0\n"}},
    )";

// The profile with that motor.
std::string profileWith(const char *motor)
{
	return std::string(kNodes) + "\"motor\": " + motor + "}";
}

class RealDriver : public Driver
{
      public:
	RealDriver()
	{
		const Profile profile =
			*parseProfile(profileWith(R"({"effects_max": 3})"));
		auto module = KernelModule::load(QVX_MODULE, profile);
		if (!module) {
			mProblem = module.error().message() +
				   "; handset/kernel/build-module builds it";
			return;
		}
		mModule = std::move(*module);
		mReport.reset(open(kReport, O_RDONLY | O_CLOEXEC));
	}

	std::string problem() const override
	{
		return mProblem;
	}

	std::string perform(uid_t user, const Request &request) const override
	{
		return runAs(user, [&] {
			return request("/dev/input/event" +
				       std::to_string(mModule->event()));
		});
	}

	std::vector<Json> noted() override
	{
		std::string text;
		char part[4096];
		ssize_t size = 0;
		while ((size = read(mReport.get(), part, sizeof part)) > 0) {
			text.append(part, static_cast<size_t>(size));
		}
		if (size < 0)
			return {Json{{"report", strerrorname_np(errno)}}};
		std::vector<Json> lines = parseLines(text);
		for (Json &line : lines)
			line.erase("pid");
		return lines;
	}

      private:
	std::string mProblem;
	std::unique_ptr<KernelModule> mModule;
	android::base::unique_fd mReport;
};

class SimulatedDriver : public Driver
{
      public:
	std::string problem() const override
	{
		return mDriver.isReady()
			       ? ""
			       : "the simulated driver: " + mDriver.errors();
	}

	std::string perform(uid_t user, const Request &request) const override
	{
		return mDriver.inside(user, [&] {
			return request("/dev/input/event9");
		});
	}

	std::vector<Json> noted() override
	{
		std::vector<Json> lines = parseLines(mDriver.rawJournal());
		for (Json &line : lines) {
			for (const char *key : {"n", "us", "pid"})
				line.erase(key);
		}
		return lines;
	}

      private:
	RunningDriver mDriver{profileWith(R"({"event": 9, "effects_max": 3})")};
};

} // namespace

std::unique_ptr<Driver> startRealDriver()
{
	return std::make_unique<RealDriver>();
}

std::unique_ptr<Driver> startSimulatedDriver()
{
	return std::make_unique<SimulatedDriver>();
}

} // namespace handset
