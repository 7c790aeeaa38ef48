// SPDX-License-Identifier: Apache-2.0
//
// The motor that the guest tests of the motor run with.
#pragma once

#include <fcntl.h>

#include <climits>
#include <string>
#include <vector>

#include "handset/driver/event_node.h"
#include "handset/driver/kernel_module.h"
#include "handset/driver/tests/motor_file.h"
#include "handset/driver/tests/running_driver.h"

namespace handset {

using Lines = std::vector<std::string>;

inline constexpr const char* kMotor = "/dev/input/event9";

// A profile with that motor and these faults.
inline std::string profileWith(const std::string& faults) {
    return R"({"motor": {"event": 9, "effects_max": 3}, "faults": [)" + faults + "]}";
}

// Where the motor of a profile that names no number is, for whoever sees its driver's mounts.
inline std::string motorPath() {
    return eventNodePath(findEvent(MotorProfile().name).value_or(UINT_MAX));
}

// The motor of that profile, open.
class OpenMotor : public MotorFile {
  public:
    explicit OpenMotor(int flags = O_RDWR) : MotorFile(motorPath(), flags) {}
};

// The part of a line from "op" on, of the journal's lines with that op.
inline Lines linesOf(const RunningDriver& driver, const std::string& op) {
    Lines found;
    for (const std::string& line : driver.journal()) {
        const size_t at = line.find("\"op\":\"" + op + "\"");
        if (at != std::string::npos) found.push_back(line.substr(at));
    }
    return found;
}

}  // namespace handset
