// SPDX-License-Identifier: Apache-2.0
//
// Runs in a guest whose clock counts instructions (handset/run --counted), beside a phone that is up,
// and prints what a call costs, kernel and both processes together, beside the same call by a bare
// loop: one ioctl a call, the last reply's buffer freed with the next request, nothing else.
//
// Measured in rounds, a few calls of each kind in turn, so that whatever else the guest does falls on
// all kinds alike.
#include <linux/android/binder.h>
#include <sys/ioctl.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <functional>
#include <vector>

#include <aidl/android/hardware/vibrator/IVibrator.h>
#include <android/binder_manager.h>
#include <fmt/format.h>

#include "handset/common/raw_binder.h"

namespace {

using aidl::android::hardware::vibrator::IVibrator;
using handset::RawBinder;
using handset::RequestBytes;

constexpr const char* kInstance = "android.hardware.vibrator.IVibrator/default";
constexpr uint32_t kPing = 0x5f504e47;
constexpr uint32_t kGetInterfaceVersion = 0xffffff;
constexpr int kRounds = 200;
constexpr int kCallsPerRound = 5;

// The least that a two-way call of a service can be.
class BareLoop {
  public:
    // Takes the open driver `fd`, which stays the caller's, and a handle known there.
    BareLoop(int fd, uint32_t handle, uint32_t code, const std::vector<uint8_t>& data) : mFd(fd) {
        mOut.transaction.target.handle = handle;
        mOut.transaction.code = code;
        mOut.transaction.data_size = data.size();
        mOut.transaction.data.ptr.buffer = reinterpret_cast<binder_uintptr_t>(data.data());
    }

    // False when the call failed.
    bool call() {
        // The first call has nothing to free.
        const size_t skipped = mOut.buffer == 0 ? offsetof(Out, transactionCommand) : 0;
        binder_write_read exchange{};
        exchange.write_size = sizeof(mOut) - skipped;
        exchange.write_buffer = reinterpret_cast<binder_uintptr_t>(&mOut) + skipped;
        for (;;) {
            std::array<uint8_t, 256> in;
            exchange.read_size = in.size();
            exchange.read_buffer = reinterpret_cast<binder_uintptr_t>(in.data());
            exchange.read_consumed = 0;
            if (ioctl(mFd, BINDER_WRITE_READ, &exchange) < 0) return false;
            for (size_t at = 0; at + 4 <= exchange.read_consumed;) {
                uint32_t command = 0;
                memcpy(&command, in.data() + at, sizeof(command));
                at += sizeof(command);
                if (command == BR_REPLY) {
                    binder_transaction_data reply;
                    memcpy(&reply, in.data() + at, sizeof(reply));
                    mOut.buffer = reply.data.ptr.buffer;
                    return true;
                }
                if (command == BR_DEAD_REPLY || command == BR_FAILED_REPLY) return false;
                at += _IOC_SIZE(command);
            }
            exchange.write_size = exchange.write_consumed = 0;
        }
    }

  private:
    struct __attribute__((packed)) Out {
        uint32_t freeCommand = BC_FREE_BUFFER;
        binder_uintptr_t buffer = 0;
        uint32_t transactionCommand = BC_TRANSACTION;
        binder_transaction_data transaction{};
    };

    int mFd;
    Out mOut;
};

// One kind of call: how often it is made, what a call cost.
struct Series {
    const char* name;
    size_t floor;  // the series it stands beside
    std::function<bool()> call;
    std::vector<int64_t> samples;

    int64_t quantile(double q) const {
        std::vector<int64_t> sorted = samples;
        std::sort(sorted.begin(), sorted.end());
        return sorted[static_cast<size_t>(q * static_cast<double>(sorted.size() - 1))];
    }
};

bool measure(std::vector<Series>* series) {
    using Clock = std::chrono::steady_clock;
    for (int round = 0; round < kRounds; ++round) {
        for (Series& one : *series) {
            for (int i = 0; i < kCallsPerRound; ++i) {
                const Clock::time_point start = Clock::now();
                if (!one.call()) return false;
                one.samples.push_back(std::chrono::nanoseconds(Clock::now() - start).count());
            }
        }
    }
    return true;
}

void print(const std::vector<Series>& series) {
    fmt::print("{:>6} {:>10} {:>10}  {}\n", "ratio", "median", "99 %", "call");
    for (const Series& one : series) {
        const auto floor = static_cast<double>(series[one.floor].quantile(0.5));
        const int64_t median = one.quantile(0.5);
        fmt::print("{:>6.2f} {:>10} {:>10}  {}\n", static_cast<double>(median) / floor, median,
                   one.quantile(0.99), one.name);
    }
}

int run() {
    RawBinder raw;
    const auto handle = raw.checkService(kInstance);
    const auto vibrator =
            IVibrator::fromBinder(ndk::SpAIBinder(AServiceManager_checkService(kInstance)));
    if (!handle || !vibrator) {
        fmt::print(stderr, "binder_figures: the service is not registered\n");
        return 1;
    }
    const auto request = RequestBytes().token("android.hardware.vibrator.IVibrator").data();
    BareLoop ping(raw.descriptor(), *handle, kPing, {});
    BareLoop version(raw.descriptor(), *handle, kGetInterfaceVersion, request);
    const auto remoteVersion = [&] {
        // The generated client asks once and remembers.
        int32_t answer = 0;
        const auto client = IVibrator::fromBinder(vibrator->asBinder());
        return client->getInterfaceVersion(&answer).isOk();
    };
    std::vector<Series> series = {
            {"ping, bare loop", 0, [&] { return ping.call(); }, {}},
            {"ping, AIBinder_ping",
             0,
             [&] { return AIBinder_ping(vibrator->asBinder().get()) == STATUS_OK; },
             {}},
            {"getInterfaceVersion, bare loop", 2, [&] { return version.call(); }, {}},
            {"getInterfaceVersion, generated client", 2, remoteVersion, {}},
            {"getQFactor, refused, with its log lines",
             2,
             [&] {
                 float factor = 0;
                 return vibrator->getQFactor(&factor).getExceptionCode() ==
                        EX_UNSUPPORTED_OPERATION;
             },
             {}},
    };
    if (!measure(&series)) {
        fmt::print(stderr, "binder_figures: a call failed\n");
        return 1;
    }
    print(series);
    return 0;
}

}  // namespace

int main() {
    return run();
}
