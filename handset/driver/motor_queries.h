// SPDX-License-Identifier: Apache-2.0
//
// The questions an evdev device answers (EVIOCG...), as linux/input.h lists them.
#pragma once

#include <optional>
#include <string>

#include "handset/driver/profile.h"

namespace handset {

// An answered question.
struct QueryAnswer {
    int result = 0;    // what ioctl(2) returns, or a negative error
    std::string data;  // what goes to the caller's memory
};

// Answers an ioctl that only asks. `command` is the whole request number, of which the size says
// how much room the caller has. Nothing when it is no such question; an evdev device then fails
// with EINVAL.
std::optional<QueryAnswer> answerQuery(const MotorProfile& motor, unsigned command);

}  // namespace handset
