// SPDX-License-Identifier: Apache-2.0
//
// Processes as /proc shows them: who runs, and as which user.
#pragma once

#include <sys/types.h>

#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace vibctl {

struct User {
    uid_t uid = 0;
    gid_t gid = 0;
    std::vector<gid_t> groups;  ///< the supplementary ones
};

/// The first process whose executable has this file name. Without the right to see a process's
/// executable, the name it was started by decides.
std::optional<pid_t> findProcess(const std::filesystem::path& proc, std::string_view executable);

/// The effective user of a process; nothing when there is no such process.
std::optional<User> userOf(const std::filesystem::path& proc, pid_t pid);

/// The words that a process was started with; none when there is no such process.
std::vector<std::string> commandLineOf(const std::filesystem::path& proc, pid_t pid);

}  // namespace vibctl
