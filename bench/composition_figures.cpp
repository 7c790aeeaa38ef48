// SPDX-License-Identifier: Apache-2.0
//
// Runs inside the guest and prints how late clients hear that their composition is over: the time
// from the call to the callback, less the composition's length. Beside it, how late a plain sleep
// of that length ends in this process, which is the least that can be expected here.
//
// Compositions and sleeps take turns, so that whatever else the machine does falls on both alike.
#include <time.h>

#include <algorithm>
#include <cstdio>
#include <vector>

#include <fmt/format.h>

#include "tests/support/command.h"
#include "tests/system/composition_client.h"

namespace {

using qvx::test::clickAfter;
using qvx::test::composeAndWait;
using qvx::test::IVibrator;
using qvx::test::monotonicMs;
using qvx::test::runCommand;

constexpr int kRounds = 50;
constexpr int32_t kDelaysMs[] = {0, 80, 480};
constexpr int32_t kClickMs = 20;

double sleepMs(int32_t lengthMs) {
    const double before = monotonicMs();
    const timespec length = {lengthMs / 1000, lengthMs % 1000 * 1000000L};
    nanosleep(&length, nullptr);
    return monotonicMs() - before;
}

struct Lateness {
    std::vector<double> sleeps;
    std::vector<double> calls;
    std::vector<double> callbacks;
};

// Short when a callback does not come.
Lateness measure(IVibrator& vibrator, int32_t delayMs) {
    const int32_t lengthMs = delayMs + kClickMs;
    Lateness lateness;
    for (int round = 0; round < kRounds; ++round) {
        const auto composed = composeAndWait(vibrator, clickAfter(delayMs));
        if (!composed) break;
        lateness.callbacks.push_back(composed->notified - composed->called - lengthMs);
        lateness.calls.push_back(composed->returned - composed->called);
        lateness.sleeps.push_back(sleepMs(lengthMs) - lengthMs);
    }
    return lateness;
}

double quantile(std::vector<double> samples, double q) {
    std::sort(samples.begin(), samples.end());
    return samples[static_cast<size_t>(q * static_cast<double>(samples.size() - 1))];
}

void print(const char* what, int32_t lengthMs, const std::vector<double>& samples,
           double baseline) {
    fmt::print("{:<22} {:>9} {:>8.2f} {:>8.2f} {:>8.2f} {:>8.2f} {:>8.2f}\n", what, lengthMs,
               quantile(samples, 0), quantile(samples, 0.5), quantile(samples, 0.95),
               quantile(samples, 1), quantile(samples, 0.5) / baseline);
}

bool measureAll() {
    const auto vibrator = qvx::test::connectForCallbacks();
    if (vibrator == nullptr) {
        fmt::print(stderr, "composition_figures: the service is not registered\n");
        return false;
    }
    fmt::print("{:<22} {:>9} {:>8} {:>8} {:>8} {:>8} {:>8}\n", "ms", "length", "min", "median",
               "95 %", "max", "ratio");
    for (const int32_t delayMs : kDelaysMs) {
        const Lateness lateness = measure(*vibrator, delayMs);
        if (lateness.callbacks.size() != kRounds) {
            fmt::print(stderr, "composition_figures: a composition was not notified\n");
            return false;
        }
        const double baseline = quantile(lateness.sleeps, 0.5);
        print("sleep: late by", delayMs + kClickMs, lateness.sleeps, baseline);
        print("call: takes", delayMs + kClickMs, lateness.calls, baseline);
        print("callback: late by", delayMs + kClickMs, lateness.callbacks, baseline);
    }
    return true;
}

}  // namespace

int main() {
    if (runCommand({"phone", "up", "--profile", "ff"}).status != 0) {
        fmt::print(stderr, "composition_figures: the phone does not come up\n");
        return 1;
    }
    const bool measured = measureAll();
    runCommand({"phone", "down"});
    return measured ? 0 : 1;
}
