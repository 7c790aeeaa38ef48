// SPDX-License-Identifier: Apache-2.0
//
// Which user may register which service, the part of a phone's SELinux policy for a kernel without
// SELinux; and which program is started for a service that is asked for, the part of its init scripts.
#pragma once

#include <sys/types.h>

#include <filesystem>
#include <map>
#include <set>
#include <string>
#include <utility>

#include <android-base/result.h>

#include "platform/servicemanager/service_starter.h"

namespace servicemanager {

// Root may register every name, anyone else what a rule allows.
class RegistrationRules {
  public:
    // Reads a file of lines "NAME USER [PROGRAM ARGUMENT...]": the service's whole name, a user by
    // name or number, and the program that is started as that user when somebody asks for the
    // service while it is not there. Empty lines and what follows a "#" do not count. An error is one line that names the file, the
    // line of the file, and what is accepted there.
    static android::base::Result<RegistrationRules> load(const std::filesystem::path& file);

    void allow(std::string name, uid_t user);

    bool mayRegister(uid_t user, const std::string& name) const;

    // How the service is started; null when it is not started on request.
    const StartCommand* commandFor(const std::string& name) const;

  private:
    android::base::Result<void> readLine(const std::string& line);

    std::set<std::pair<std::string, uid_t>> mAllowed;
    std::map<std::string, StartCommand> mCommands;
};

}  // namespace servicemanager
