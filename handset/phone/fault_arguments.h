// SPDX-License-Identifier: Apache-2.0
//
// A fault on the command line.
#pragma once

#include <string>
#include <vector>

#include <android-base/result.h>

namespace handset {

// Turns words such as `node=motor op=upload errno=ENOSPC times=1` into the JSON object the driver
// takes. A single word that begins with "{" is that object already. Which keys and values make
// sense is the driver's to judge.
android::base::Result<std::string> faultFromArguments(const std::vector<std::string>& words);

}  // namespace handset
