// SPDX-License-Identifier: Apache-2.0
// Starting a process and waiting for its end.
#pragma once

#include <sys/types.h>

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "common/unique_fd.h"
#include "driver/result.h"

namespace handset {

/// How a command is started.
struct Launch {
    std::vector<std::string> command;          ///< the executable's path, then its arguments
    int mounts = -1;                           ///< mount namespace to enter, or -1
    std::optional<uid_t> user = std::nullopt;  ///< whom to become; none: stay who one is
    int output = -1;                           ///< descriptor for standard output, or -1: as it is
    int errors = -1;                           ///< descriptor for standard error, or -1: as it is
    int kept = -1;                             ///< descriptor that stays open over the start, or -1
};

/// Enters the mount namespace and takes on the user a launch asks for. The platform's system user
/// comes with its groups (system, input, log); any other has its own group only. No capability
/// stays with a user other than root. For a process that has one thread.
Failure becomeWhatLaunchAsks(const Launch& launch);

/// A process this one started. It is killed when this process ends, however that happens.
class Child {
  public:
    /// Runs a command. An executable that cannot be run is an error here, not an exit status.
    static Result<Child> start(const Launch& launch);

    /// Runs `work` in a fork of this process (which has one thread) and ends with its result.
    static Result<Child> fork(const std::function<int()>& work);

    pid_t pid() const { return pid_; }

    /// Becomes readable when the process has ended.
    int descriptor() const { return handle_.get(); }

    /// The exit status as a shell has it: the code, or 128 and the signal's number. Nothing while
    /// the process runs.
    std::optional<int> poll();

    /// Waits at most `patience` milliseconds for its end.
    void await(int patience) const;

    /// Asks it to end, insists after `patience` milliseconds, and waits until it has ended.
    void end(int patience);

  private:
    Child(pid_t pid, UniqueFd handle) : pid_(pid), handle_(std::move(handle)) {}

    pid_t pid_;
    UniqueFd handle_;
    std::optional<int> status_;
};

}  // namespace handset
