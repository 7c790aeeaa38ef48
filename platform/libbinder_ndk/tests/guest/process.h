// SPDX-License-Identifier: Apache-2.0
//
// The processes of a test. The test program itself never opens the driver: every party is a child
// forked from it, so each starts afresh and may run as any user.
#pragma once

#include <sys/types.h>

#include <functional>
#include <string>

namespace binder_test {

inline constexpr uid_t kRoot = 0;
inline constexpr uid_t kSystem = 1000;
inline constexpr uid_t kShell = 2000;
inline constexpr uid_t kApp = 10123;

class Process {
  public:
    // A child that runs `body` as `uid` and leaves with status 0, or 1 when an expectation in it
    // failed.
    Process(uid_t uid, const std::function<void()>& body);

    // As above for a server: returns when `body` has called its argument to say that it is ready.
    using Ready = std::function<void()>;
    Process(uid_t uid, const std::function<void(const Ready&)>& body);

    // Kills the child if it still runs.
    ~Process();
    Process(const Process&) = delete;
    Process& operator=(const Process&) = delete;

    pid_t pid() const { return mPid; }

    // Waits for the end; the exit status, or minus the signal.
    int wait();

    void kill();

  private:
    void start(uid_t uid, const std::function<void()>& body);

    pid_t mPid = -1;
};

// Runs `body` as `uid` in a process of its own; expectations in it count for the calling test.
void inProcess(uid_t uid, const std::function<void()>& body);

// Entries of this process's table of descriptors.
int countDescriptors();

// Waits up to ten seconds for a condition.
bool eventually(const std::function<bool()>& condition);

}  // namespace binder_test
