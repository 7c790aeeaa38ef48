// SPDX-License-Identifier: Apache-2.0
//
// The parties of a test, each a process forked from it: it starts afresh and may run as any user.
#pragma once

#include <sys/types.h>

#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace qvx::test {

inline constexpr uid_t kRoot = 0;
inline constexpr uid_t kSystem = 1000;
inline constexpr uid_t kShell = 2000;
inline constexpr uid_t kApp = 10123;

// How a program is run.
struct Program {
    std::vector<std::string> words;  // the executable's path, then its arguments
    std::string errors;              // the file that gets what it writes to standard error
    bool tellsReadiness = false;     // it takes --ready-fd N and writes there once it serves
};

class Process {
  public:
    // A child that runs `body` as `uid`, without further groups, and leaves with status 0, or 1
    // when an expectation in it failed. It ends at the latest with the test.
    Process(uid_t uid, const std::function<void()>& body);

    // As above for a server: returns when `body` has called its argument to say that it is ready,
    // and fails the test where it did not or where an expectation had failed by then.
    using Ready = std::function<void()>;
    Process(uid_t uid, const std::function<void(const Ready&)>& body);

    // A child that becomes a program. Of one that tells its readiness it waits for that, half a
    // minute at most.
    Process(uid_t uid, const Program& program);

    // Kills the child if it still runs.
    ~Process();
    Process(const Process&) = delete;
    Process& operator=(const Process&) = delete;

    pid_t pid() const { return mPid; }

    // Whether a server has said that it is ready.
    bool isReady() const { return mReady; }

    // Sends a signal; 0 sends none.
    void signal(int number) const;

    // Waits for the end: the exit status, or 128 and the signal's number, as a shell has it.
    int wait();

    // Kills it, as a crash would, and waits for the end.
    void kill();

    // Whether it has ended by itself.
    bool hasEnded();

  private:
    void start(uid_t uid, const std::function<void()>& body);
    void reap(int options);

    pid_t mPid = -1;
    bool mReady = false;
    std::optional<int> mStatus;  // once it has ended
};

// Takes on a user, without further groups; a process of that user stays as it is.
bool becomeUser(uid_t uid);

// Runs `body` as `uid` in a process of its own; expectations in it count for the calling test.
void inProcess(uid_t uid, const std::function<void()>& body);

// Waits up to ten seconds for a condition.
bool eventually(const std::function<bool()>& condition);

}  // namespace qvx::test
