// SPDX-License-Identifier: Apache-2.0
//
// Processes as /proc shows them: who runs, as which user, and what it is doing.
#pragma once

#include <sys/types.h>

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace vibctl {

struct User {
    uid_t uid = 0;
    gid_t gid = 0;
    std::vector<gid_t> groups;  // the supplementary ones
};

// The first process whose executable has this file name. Without the right to see a process's
// executable, the name it was started by decides.
std::optional<pid_t> findProcess(const std::filesystem::path& proc, std::string_view executable);

// The file name of a process's executable; empty when there is no such process.
std::string executableOf(const std::filesystem::path& proc, pid_t pid);

// The effective user of a process; nothing when there is no such process.
std::optional<User> userOf(const std::filesystem::path& proc, pid_t pid);

// The words that a process was started with; none when there is no such process.
std::vector<std::string> commandLineOf(const std::filesystem::path& proc, pid_t pid);

// Whether a signal or a debugger has stopped the process.
bool isStopped(const std::filesystem::path& proc, pid_t pid);

// When the process was started, in clock ticks since boot; 0 when there is no such process.
uint64_t startTimeOf(const std::filesystem::path& proc, pid_t pid);

// The driver's node (below /sys or /dev/input) that a thread of the process is in a system call on;
// empty when there is none, or for lack of the right to look.
std::string nodeInUse(const std::filesystem::path& proc, pid_t pid);

// The device below /dev/input that the process holds open and that is gone, so that all it asks of it
// fails from now on, whatever stands under that name now; empty when there is none, or for lack of
// the right to look.
std::string goneInputDevice(const std::filesystem::path& proc, pid_t pid);

// The processes whose files are not those of process 1, in order; one for each mount namespace.
std::vector<pid_t> otherViews(const std::filesystem::path& proc);

}  // namespace vibctl
