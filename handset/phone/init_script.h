// SPDX-License-Identifier: Apache-2.0
//
// What the service's init script says about starting it again.
#pragma once

#include <chrono>
#include <string>

#include <android-base/result.h>

namespace handset {

struct InitScript {
    std::string name;                // "vendor.vibrator-quorvan"
    std::string serviceClass;        // "hal"
    std::chrono::seconds period{5};  // from one start to the next, at the least
    bool oneshot = false;            // once it has ended, it stays so
};

// Reads a script with one service.
android::base::Result<InitScript> parseInitScript(const std::string& text);
android::base::Result<InitScript> readInitScript(const std::string& path);

}  // namespace handset
