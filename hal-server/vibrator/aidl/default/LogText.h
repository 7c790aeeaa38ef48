// SPDX-License-Identifier: Apache-2.0
//
// How a node's path is written in a log line.
#pragma once

#include <algorithm>
#include <string_view>

namespace aidl::android::hardware::vibrator {

// The path from its 11th character on, which leaves out the "/sys/class" that all nodes begin with.
// Nothing of a shorter path, such as the empty one of a node that the device does not have.
constexpr std::string_view fromClass(std::string_view path) {
    constexpr std::string_view kClassRoot = "/sys/class";
    return path.substr(std::min(kClassRoot.size(), path.size()));
}

}  // namespace aidl::android::hardware::vibrator
