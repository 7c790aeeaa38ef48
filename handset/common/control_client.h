// SPDX-License-Identifier: Apache-2.0
//
// Asking the running driver for something.
#pragma once

#include <string>
#include <string_view>

#include <android-base/result.h>

namespace handset {

// Sends one request line (without its end) to the driver's control socket and returns what
// follows "ok" in the answer, or the driver's message as the error.
android::base::Result<std::string> askDriver(const std::string& socketPath,
                                             std::string_view request);

}  // namespace handset
