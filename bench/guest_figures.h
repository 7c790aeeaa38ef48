// SPDX-License-Identifier: Apache-2.0
//
// What the programs share that count instructions in a guest: a phone, processes, and series of counts.
#pragma once

#include <sys/types.h>

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "tests/support/all_requests.h"

namespace bench {

inline constexpr const char* kInstance = "android.hardware.vibrator.IVibrator/default";
inline constexpr const char* kNoLog = "/dev/null";

// Ends the program with one line.
[[noreturn]] void fail(const std::string& what);

// Runs the command phone, which has to succeed.
void phone(const std::vector<std::string>& words);

// Runs `work` for the profile `name` on the kernel module's nodes, without a service.
void withPhone(const char* name, const std::function<void()>& work);

// The path of the service's program.
std::string serviceProgram();

// Lets a process run without being preempted, so that the scheduler takes the same way in every call:
// of real-time processes of one priority, none interrupts another that wakes it.
void runSteadily(pid_t process);

// A process, running steadily, that does `work`, its standard error in the file `log`.
pid_t inChild(const char* log, const std::function<void()>& work);
void endChild(pid_t child);

// The service, running steadily, alone and with its own log, while the object lives.
class Service {
  public:
    explicit Service(const char* log);
    ~Service() { endChild(pid); }
    Service(const Service&) = delete;
    Service& operator=(const Service&) = delete;

    const pid_t pid;
    const qvx::test::Services clients;
};

// A bare service (see bare_binder.h) on a device that the phone does not use, as the service's user.
// `prepare` runs before that, as root; false ends the process.
pid_t startBareService(const std::function<bool()>& prepare,
                       const std::function<size_t(uint32_t code)>& work);

// The open driver of that device, once the service answers.
int connectBare();

// Some requests end on a thread of the service's own, which is over when this returns.
void letThreadsEnd();

// Instructions since the guest's start, in a guest whose clock counts them.
int64_t now();

// Puts the kernel's random pool, which takes in every input event, into the same state again.
void alignRandomPool();

// Counts of the same thing.
class Series {
  public:
    // Counts one call.
    template <typename Call>
    void measure(const Call& call) {
        alignRandomPool();
        const int64_t start = now();
        call();
        add(now() - start);
    }
    void add(int64_t count) { mSamples.push_back(count); }

    int64_t quantile(double q);
    int64_t median() { return quantile(0.5); }

  private:
    std::vector<int64_t> mSamples;
};

}  // namespace bench
