// SPDX-License-Identifier: Apache-2.0
// Runs inside the guest and prints how long the service takes to start, and what a call costs
// beside the least a call can cost: a ping of the same process straight through the driver.
//
// Measured in rounds, a few calls of each kind in turn, so that whatever else the machine does
// falls on all kinds alike; medians, because emulated time has a long tail.
#include <aidl/android/hardware/vibrator/IVibrator.h>
#include <android/binder_manager.h>
#include <fmt/format.h>
#include <signal.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "command.h"
#include "phone_control.h"
#include "raw_binder.h"

namespace {

using aidl::android::hardware::vibrator::IVibrator;
using qvx::test::Phone;
using qvx::test::RawBinder;
using qvx::test::RequestBytes;
using qvx::test::runCommand;

constexpr const char* kService = QVX_BIN_FOLDER "/android.hardware.vibrator-service.quorvan";
constexpr const char* kInstance = "android.hardware.vibrator.IVibrator/default";
constexpr uint32_t kPing = 0x5f504e47;
constexpr uint32_t kGetCapabilities = 1;
constexpr int kRounds = 200;
constexpr int kCallsPerRound = 5;
constexpr int kStarts = 7;

using Microseconds = std::chrono::duration<double, std::micro>;

double timed(const std::function<void()>& action) {
    const auto start = std::chrono::steady_clock::now();
    action();
    return Microseconds(std::chrono::steady_clock::now() - start).count();
}

struct Series {
    const char* name;
    std::function<void()> call;
    std::vector<double> samples;

    double quantile(double q) const {
        std::vector<double> sorted = samples;
        std::sort(sorted.begin(), sorted.end());
        return sorted[static_cast<size_t>(q * static_cast<double>(sorted.size() - 1))];
    }
};

void measure(std::vector<Series>* series) {
    for (int round = 0; round < kRounds; ++round) {
        for (Series& one : *series) {
            for (int i = 0; i < kCallsPerRound; ++i) one.samples.push_back(timed(one.call));
        }
    }
}

void print(const std::vector<Series>& series) {
    const double baseline = series.front().quantile(0.5);
    fmt::print("{:<44} {:>10} {:>10} {:>8}\n", "call", "median us", "95 % us", "ratio");
    for (const Series& one : series) {
        fmt::print("{:<44} {:>10.0f} {:>10.0f} {:>8.2f}\n", one.name, one.quantile(0.5),
                   one.quantile(0.95), one.quantile(0.5) / baseline);
    }
}

// Milliseconds from starting the service's process to its name being known, by asking over and
// over.
double startToRegistered() {
    const Phone phone("leds", {"--no-service"});
    const auto start = std::chrono::steady_clock::now();
    std::thread service([] { runCommand({"phone", "exec", "--user", "1000", "--", kService}); });
    double milliseconds = 0;
    {
        RawBinder binder;
        while (!binder.checkService(kInstance)) std::this_thread::yield();
        milliseconds = Microseconds(std::chrono::steady_clock::now() - start).count() / 1000;
    }
    kill(phone.servicePid(), SIGKILL);
    service.join();
    return milliseconds;
}

}  // namespace

int main() {
    Series starts{"start of the service to registered", nullptr, {}};
    for (int i = 0; i < kStarts; ++i) starts.samples.push_back(startToRegistered());
    fmt::print("{}: median {:.0f} ms, best {:.0f} ms, worst {:.0f} ms of {}\n\n", starts.name,
               starts.quantile(0.5), starts.quantile(0), starts.quantile(1), kStarts);

    if (runCommand({"phone", "up", "--profile", "leds"}).status != 0) {
        fmt::print(stderr, "binder_figures: the phone does not come up\n");
        return 1;
    }
    int status = 0;
    {
        RawBinder raw;
        const auto handle = raw.checkService(kInstance);
        const auto vibrator =
                IVibrator::fromBinder(ndk::SpAIBinder(AServiceManager_checkService(kInstance)));
        if (handle && vibrator) {
            const auto request = RequestBytes().token("android.hardware.vibrator.IVibrator").data();
            std::vector<Series> series = {
                    {"raw ping", [&] { raw.transact(*handle, kPing, RequestBytes()); }, {}},
                    {"ping through the library",
                     [&] { AIBinder_ping(vibrator->asBinder().get()); },
                     {}},
                    {"raw getCapabilities",
                     [&] { raw.transact(*handle, kGetCapabilities, request); },
                     {}},
                    {"getCapabilities through the generated client",
                     [&] {
                         int32_t capabilities = 0;
                         vibrator->getCapabilities(&capabilities);
                     },
                     {}},
            };
            measure(&series);
            print(series);
        } else {
            fmt::print(stderr, "binder_figures: the service is not registered\n");
            status = 1;
        }
    }
    runCommand({"phone", "down"});
    return status;
}
