// SPDX-License-Identifier: Apache-2.0
//
// Which user may register which service: the part of a phone's SELinux policy for a kernel without
// SELinux.
#pragma once

#include <sys/types.h>

#include <filesystem>
#include <set>
#include <string>
#include <utility>

#include <android-base/result.h>

namespace servicemanager {

// Root may register every name, anyone else what a rule allows.
class RegistrationRules {
  public:
    // Reads a file of lines "NAME USER": the service's whole name, and a user by name or number.
    // Empty lines and what follows a "#" do not count. An error is one line that names the file, the
    // line of the file, and what is accepted there.
    static android::base::Result<RegistrationRules> load(const std::filesystem::path& file);

    void allow(std::string name, uid_t user);

    bool mayRegister(uid_t user, const std::string& name) const;

  private:
    std::set<std::pair<std::string, uid_t>> mAllowed;
};

}  // namespace servicemanager
