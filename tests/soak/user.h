// SPDX-License-Identifier: Apache-2.0
//
// A user of a soak: a process that asks the service for one thing after another, round by round, and
// writes down what it asked and what it was answered where the test sees it, whatever becomes of the
// process.
#pragma once

#include <sys/types.h>

#include <array>
#include <atomic>
#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>

#include "tests/soak/requests.h"
#include "tests/support/process.h"

namespace qvx::test {

// One request. Times are CLOCK_MONOTONIC in microseconds, the journal's clock.
struct Asked {
    static constexpr int64_t kNever = -1;

    size_t request = 0;  // of the phone's table
    int number = 0;
    int64_t begin = 0;
    std::atomic<int64_t> end = 0;  // 0: not yet; kNever: the user was killed before
    Answer answer;
};

int64_t monotonicUs();

// How long a test is to go on: what SOAK_SECONDS says.
std::chrono::seconds soakTime(long otherwise);

class User {
  public:
    static constexpr size_t kPerRound = 500;

    // Starts at once, and then waits for a round. The table outlives the user.
    User(uid_t uid, std::span<const Request> table);

    // Begins a round: kPerRound requests.
    void begin();
    bool isDone() const;
    size_t countAsked() const { return mLog->count; }

    // Kills the process in the middle of what it does; another one goes on with the round.
    void replace();

    // The requests of the round that is done.
    std::span<const Asked> asked() const { return mLog->asked; }
    // Compositions of the round that were answered with ok and of whose end nobody told.
    int untold() const { return mLog->untold; }
    bool isPrivileged() const { return mUid == 0 || mUid == 1000; }
    uid_t uid() const { return mUid; }

  private:
    struct Log {
        std::atomic<size_t> count = kPerRound;
        std::atomic<int> untold = 0;
        std::array<Asked, kPerRound> asked;
    };
    struct Unmap {
        void operator()(Log* log) const;
    };

    void start();
    void live() const;
    void askNext(Client& client, int* expected) const;

    const uid_t mUid;
    const std::span<const Request> mTable;
    const std::unique_ptr<Log, Unmap> mLog;
    std::optional<Process> mProcess;
};

}  // namespace qvx::test
