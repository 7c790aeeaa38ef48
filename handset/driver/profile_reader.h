// SPDX-License-Identifier: Apache-2.0
//
// Reading a profile or a single fault from JSON, strictly: whatever is not exactly as documented is
// refused with one line that names the place, what stands there and what is accepted.
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include <android-base/result.h>

#include "handset/driver/field_table.h"
#include "handset/driver/profile.h"

namespace handset {

// Reads a profile's text.
android::base::Result<Profile> parseProfile(std::string_view text);

// Reads the profile in the file at `path`; an error's text begins with the path.
android::base::Result<Profile> readProfile(const std::string& path);

// Reads one fault object, for a phone with the given profile.
android::base::Result<Fault> parseFault(std::string_view text, const Profile& profile);

// A key that the reader knows: of the object ("profile", "node", "file", "motor", "fault"), and
// what its value may be, where that is no object, list or table itself.
struct KnownKey {
    std::string_view object;
    std::string_view key;
    const Accepted* accepted = nullptr;
};

// Every key there is, in the order of the tables.
std::vector<KnownKey> knownKeys();

}  // namespace handset
