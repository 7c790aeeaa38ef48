// SPDX-License-Identifier: Apache-2.0
//
// Starts the services that run only while somebody uses them: what init does on a phone when the
// service manager asks it to.
#pragma once

#include <sys/types.h>

#include <chrono>
#include <map>
#include <string>
#include <vector>

#include <android-base/result.h>
#include <android-base/unique_fd.h>

namespace servicemanager {

// How a service is started.
struct StartCommand {
    uid_t user = 0;                  // whom it runs as; another than one's own takes root
    std::vector<std::string> words;  // the program's absolute path, then its arguments
};

// Not thread-safe, and for a process with one thread: it forks.
class ServiceStarter {
  public:
    using Clock = std::chrono::steady_clock;

    // `period` is the time from one start of a service to the next, at the least; init's by default.
    explicit ServiceStarter(Clock::duration period = std::chrono::seconds(5)) : mPeriod(period) {}

    // Starts the service of this name, unless the process that was started for it last still runs
    // or is younger than the period: true when it was started. It has its user's groups and no
    // others, writes where this process writes, and ends with it at the latest. An error when the
    // process cannot be made; what becomes of it, a program that does not run included, is not waited
    // for.
    android::base::Result<bool> start(const std::string& name, const StartCommand& command);

  private:
    struct Started {
        android::base::unique_fd process;  // readable once it has ended
        Clock::time_point at;
    };

    const Clock::duration mPeriod;
    std::map<std::string, Started> mStarted;
};

}  // namespace servicemanager
