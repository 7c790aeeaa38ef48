// SPDX-License-Identifier: Apache-2.0
// Reading a profile or a single fault from JSON, strictly: whatever is not exactly as documented is
// refused with one line that names the place, what stands there and what is accepted.
#pragma once

#include <string>
#include <string_view>

#include "driver/profile.h"
#include "driver/result.h"

namespace handset {

/// Reads a profile's text.
Result<Profile> parseProfile(std::string_view text);

/// Reads the profile in the file at `path`; an error's text begins with the path.
Result<Profile> readProfile(const std::string& path);

/// Reads one fault object, for a phone with the given profile.
Result<FaultSpec> parseFault(std::string_view text, const Profile& profile);

}  // namespace handset
