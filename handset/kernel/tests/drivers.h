// SPDX-License-Identifier: Apache-2.0
//
// The two drivers that have to behave alike: the kernel module, which is real,
// and the simulated one. Both have the same nodes and a motor of three effects,
// owned as on a phone.
#pragma once

#include <sys/types.h>

#include <functional>
#include <memory>
#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "handset/driver/tests/running_driver.h"

namespace handset
{

using Json = nlohmann::json;

// The nodes that requests go to.
inline const std::string kReadWriteNode = "/sys/class/leds/vibrator/duration";
inline const std::string kHeld = "/sys/class/leds/vibrator/motor_type";
inline const std::string kReadOnlyNode = "/sys/class/leds/vibrator/num_waves";
inline const std::string kWriteOnlyNode = "/sys/class/leds/vibrator/reset";
inline const std::string kOtherClass =
	"/sys/class/timed_output/vibrator/enable";
inline const std::string kControlClass =
	"/sys/class/qvx_vib_inputff/control/f0_stored";

// What a client does with a driver whose motor is at `motor`, and its answers
// as a short text.
using Request = std::function<std::string(const std::string &motor)>;

class Driver
{
      public:
	virtual ~Driver() = default;

	// Empty when the driver is there, else what is wrong.
	virtual std::string problem() const = 0;

	// Performs a request in a process of its own and returns the answers.
	virtual std::string perform(uid_t user,
				    const Request &request) const = 0;

	// What the driver has noted, in its own words. To be asked once, after
	// the requests.
	virtual std::vector<Json> noted() = 0;
};

// Loads the kernel module; it is unloaded with the object.
std::unique_ptr<Driver> startRealDriver();

// Starts the simulated driver.
std::unique_ptr<Driver> startSimulatedDriver();

} // namespace handset
