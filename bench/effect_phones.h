// SPDX-License-Identifier: Apache-2.0
//
// The kinds of phone that effects are counted on, and what each effect asks of their drivers:
// written down here, not recorded from the service, so that a call too many shows.
#pragma once

#include <string>
#include <vector>

#include "bench/driver_files.h"

namespace bench {

// The event device of the force-feedback phone.
inline constexpr const char* kMotor = "/dev/input/event7";

// What a request asks of the driver: a text for a node, or a request to the motor.
struct DriverCall {
    enum class Kind { kNode, kEvent, kErase, kUpload } kind = Kind::kNode;
    std::string node;
    std::string text;
};

using DriverCalls = std::vector<DriverCall>;

struct Phone {
    PhoneFiles files;
    DriverCalls
            calls[4];  // of CLICK, DOUBLE_CLICK, TICK and HEAVY_CLICK at full strength, in order
};

// One for each class and perform method, named as the handset's profiles are. The force-feedback
// phone comes last: a process that has found one never takes its motor for another.
std::vector<Phone> effectPhones();

}  // namespace bench
