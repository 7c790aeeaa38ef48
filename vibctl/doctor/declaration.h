// SPDX-License-Identifier: Apache-2.0
//
// Whether a VINTF manifest declares the service, and if not, why that is.
#pragma once

#include <filesystem>
#include <optional>

#include "vibctl/doctor/finding.h"

namespace vibctl {

// Looks where the service manager looks for what a device declares: vendor/etc/vintf/manifest.xml,
// vendor/etc/vintf/manifest/*.xml, then odm/..., below `root`. `declared` is the service manager's
// own answer, where it gave one, and the files then only explain it.
Finding checkDeclaration(const std::filesystem::path& root, std::optional<bool> declared);

// The directory that the running service manager reads manifests below: what its option --root says,
// else "/".
std::filesystem::path manifestRoot(const std::filesystem::path& proc);

}  // namespace vibctl
