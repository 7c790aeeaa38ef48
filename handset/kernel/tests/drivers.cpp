// SPDX-License-Identifier: Apache-2.0
//
// The two drivers that have to behave alike.
#include "handset/kernel/tests/drivers.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <regex>
#include <sstream>

namespace handset
{
namespace
{

constexpr const char *kModuleName = "qvx_vibrator";
constexpr const char *kReport = "/dev/qvx_vibrator_report";
constexpr uid_t kSystemUser = 1000;
constexpr gid_t kInputGroup = 1004;

std::vector<Json> parseLines(const std::string &text)
{
	std::vector<Json> lines;
	std::istringstream stream(text);
	for (std::string line; std::getline(stream, line);)
		lines.push_back(Json::parse(line));
	return lines;
}

class RealDriver : public Driver
{
      public:
	RealDriver()
	{
		const int module = open(QVX_MODULE, O_RDONLY | O_CLOEXEC);
		if (module < 0) {
			mProblem = QVX_MODULE
				": not built; handset/kernel/build-module "
				"builds it";
			return;
		}
		mLoaded = syscall(SYS_finit_module, module, "effects_max=3",
				  0) == 0;
		if (!mLoaded)
			mProblem =
				std::string(QVX_MODULE ": ") + strerror(errno);
		close(module);
		if (mLoaded)
			findMotor();
		if (mProblem.empty())
			giveToSystemUser();
	}

	~RealDriver() override
	{
		if (mReport >= 0)
			close(mReport);
		if (mLoaded)
			syscall(SYS_delete_module, kModuleName, 0);
	}

	std::string problem() const override
	{
		return mProblem;
	}

	std::string perform(uid_t user, const Request &request) const override
	{
		return runAs(user, [&] { return request(mMotor); });
	}

	std::vector<Json> noted() override
	{
		std::string text;
		char part[4096];
		ssize_t size = 0;
		while ((size = read(mReport, part, sizeof part)) > 0) {
			text.append(part, static_cast<size_t>(size));
		}
		if (size < 0)
			return {Json{{"report", strerrorname_np(errno)}}};
		return parseLines(text);
	}

      private:
	void findMotor()
	{
		const std::string list = readNode("/proc/bus/input/devices");
		std::smatch found;
		const std::regex block("Name=\"qvx_vibrator_inputff\"\n[^\n]*"
				       "\n[^\n]*\n[^\n]*\n"
				       "H: Handlers=(event[0-9]+) \n");
		if (std::regex_search(list, found, block))
			mMotor = "/dev/input/" + found[1].str();
		mReport = open(kReport, O_RDONLY | O_CLOEXEC);
		if (mMotor.empty() || mReport < 0)
			mProblem = "the module has no motor or no report";
	}

	// What init does on a phone.
	void giveToSystemUser()
	{
		bool given =
			chown(mMotor.c_str(), kSystemUser, kInputGroup) == 0 &&
			chmod(mMotor.c_str(), 0660) == 0;
		for (const std::string &node :
		     {kReadWrite, kHeld, kReadOnly, kWriteOnly, kOtherClass,
		      kControlClass}) {
			given = given && chown(node.c_str(), kSystemUser,
					       kSystemUser) == 0;
		}
		if (!given)
			mProblem = std::string("nodes not given away: ") +
				   strerror(errno);
	}

	std::string mProblem;
	std::string mMotor;
	int mReport = -1;
	bool mLoaded = false;
};

constexpr const char *kProfile = R"({
    "nodes": {
        "/sys/class/leds/vibrator/duration": {"mode": "rw", "text": "0\n"},
        "/sys/class/leds/vibrator/motor_type": {"mode": "rw", "text": "LINEAR_1040\n", "hold": true},
        "/sys/class/leds/vibrator/num_waves": {"mode": "ro", "text": "137\n"},
        "/sys/class/leds/vibrator/reset": {"mode": "wo"},
        "/sys/class/timed_output/vibrator/enable": {"mode": "rw", "text": "0\n"},
        "/sys/class/qvx_vib_inputff/control/f0_stored": {"mode": "rw", "text": "0\n"}},
    "motor": {"event": 9, "effects_max": 3}})";

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
	RunningDriver mDriver{kProfile};
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
