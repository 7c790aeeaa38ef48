// SPDX-License-Identifier: Apache-2.0
//
// Whether a VINTF manifest declares the service, and if not, why that is.
#pragma once

#include <filesystem>
#include <optional>
#include <string>

#include "doctor/finding.h"

namespace vibctl {

/// Looks where the service manager looks. `root` is the folder that it reads manifests below;
/// `declared` is its own answer, where it gave one, and the files then only explain it.
Finding checkDeclaration(const std::filesystem::path& root, const std::string& service,
                         std::optional<bool> declared);

/// The folder that the running service manager reads manifests below: what its option --root says,
/// else "/".
std::filesystem::path manifestRoot(const std::filesystem::path& proc);

}  // namespace vibctl
