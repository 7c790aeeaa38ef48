// SPDX-License-Identifier: Apache-2.0
//
// Starting a process and waiting for its end.
#pragma once

#include <sys/types.h>

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include <android-base/result.h>
#include <android-base/unique_fd.h>

namespace handset {

// How a command is started.
struct Launch {
    std::vector<std::string> command;          // the executable's path, then its arguments
    int mounts = -1;                           // mount namespace to enter, or -1
    std::optional<uid_t> user = std::nullopt;  // whom to become; none: stay who one is
    int output = -1;                           // descriptor for standard output, or -1: as it is
    int errors = -1;                           // descriptor for standard error, or -1: as it is
    int kept = -1;                             // descriptor that stays open over the start, or -1
};

// Enters the mount namespace and takes on the user a launch asks for. The platform's system user
// comes with its groups (system, input, log); any other has its own group only. No capability
// stays with a user other than root. For a process that has one thread.
android::base::Result<void> becomeWhatLaunchAsks(const Launch& launch);

// A process this one started. It is killed when this process ends, however that happens.
class Child {
  public:
    // Runs a command. An executable that cannot be run is an error here, not an exit status.
    static android::base::Result<Child> start(const Launch& launch);

    // Runs `work` in a fork of this process (which has one thread) and ends with its result.
    static android::base::Result<Child> fork(const std::function<int()>& work);

    pid_t pid() const { return mPid; }

    // Becomes readable when the process has ended.
    int descriptor() const { return mHandle.get(); }

    // The exit status as a shell has it: the code, or 128 and the signal's number. Nothing while
    // the process runs.
    std::optional<int> poll();

    // Waits at most `timeout` milliseconds for its end.
    void await(int timeout) const;

    // Asks it to end, insists after `timeout` milliseconds, and waits until it has ended.
    void end(int timeout);

  private:
    Child(pid_t pid, android::base::unique_fd handle) : mPid(pid), mHandle(std::move(handle)) {}

    pid_t mPid;
    android::base::unique_fd mHandle;
    std::optional<int> mStatus;
};

}  // namespace handset
