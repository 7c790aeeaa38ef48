// SPDX-License-Identifier: Apache-2.0
//
// The service as a process: whether it runs, is registered and answers, and as which user.
#pragma once

#include <filesystem>
#include <optional>
#include <vector>

#include "vibctl/doctor/doctor.h"
#include "vibctl/doctor/file_view.h"
#include "vibctl/doctor/finding.h"

namespace vibctl {

struct ServiceProcess {
    std::optional<pid_t> pid;  // of the one that is registered, else of one that merely runs
    User user;                 // its user, else the one of the init script
};

ServiceProcess findService(const BinderFacts& facts, const std::filesystem::path& proc);

bool managerAnswers(const BinderFacts& facts);

// The findings "binder", "service manager", "registration", "user" and "extension".
Finding checkDevice(const BinderFacts& facts, const FileView& view, const User& user);
Finding checkManager(const BinderFacts& facts, const std::filesystem::path& proc);
Finding checkRegistration(const BinderFacts& facts, const ServiceProcess& service,
                          const std::filesystem::path& proc);
Finding checkUser(const ServiceProcess& service);
Finding checkExtension(const BinderFacts& facts);

}  // namespace vibctl
