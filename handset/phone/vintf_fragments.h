// SPDX-License-Identifier: Apache-2.0
//
// The VINTF fragments that declare the service: without them the service manager refuses it.
#pragma once

#include <string>
#include <vector>

#include <android-base/result.h>

namespace handset {

// Copies every fragment (*.xml) that lies beside the service's sources to where a phone's vendor
// image has them, and adds to `made` each path that was not there before, directories first.
android::base::Result<void> installVintfFragments(std::vector<std::string>& made);

// Removes what an installation made, the newest first.
void removeVintfFragments(const std::vector<std::string>& made);

}  // namespace handset
