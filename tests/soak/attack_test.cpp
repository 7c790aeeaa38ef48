// SPDX-License-Identifier: Apache-2.0
//
// Everything that is known to have hurt the service or the service manager, all of it at once and for
// as long as SOAK_SECONDS says, while an honest client asks for the capabilities.
#include <sys/mman.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <functional>
#include <memory>
#include <new>
#include <thread>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/soak/footprint.h"
#include "tests/soak/user.h"
#include "tests/support/kernel_log.h"
#include "tests/support/phone_control.h"
#include "tests/support/process.h"
#include "tests/support/process_view.h"

namespace qvx::test {
namespace {

using handset::RawBinder;
using handset::RequestBytes;
using std::chrono::milliseconds;

constexpr const char* kManager = "android.os.IServiceManager";
constexpr uint32_t kExtension = 0x5f455854;  // '_EXT'
constexpr uint32_t kVintf = 0x3f000001;
constexpr uint32_t kSystemStability = 0x0c000000;
constexpr uint32_t kOne = 0x3f800000;  // 1.0 as a float
constexpr int kPerConnection = 200;

RequestBytes standard() {
    return RequestBytes().token("android.hardware.vibrator.IVibrator");
}

RequestBytes composition(int count, int32_t delayMs, uint64_t callback) {
    RequestBytes request = standard().int32(count);
    for (int i = 0; i < count; ++i) request.int32(1).int32(16).int32(delayMs).int32(1).word(kOne);
    return request.binder(callback, kVintf);
}

// One attack: `number` counts the requests of a connection, and the handle is the service's.
struct Attack {
    uid_t uid;
    void (*strike)(RawBinder& binder, uint32_t service, int number);
};

// Callbacks that are never served: the client says nothing when it is asked or told.
void beSilent(RawBinder& binder, uint32_t service, int number) {
    binder.transact(service, 3, standard().int32(1).binder(static_cast<uint64_t>(number), kVintf));
}

// Ten seconds until the callback, which never returns.
void composeForLong(RawBinder& binder, uint32_t service, int number) {
    binder.transact(service, 12, composition(10, 1000, static_cast<uint64_t>(number)));
}

void fillTheService(RawBinder& binder, uint32_t service, int number) {
    binder.transact(service, 12, composition(44000, 0, static_cast<uint64_t>(number)));
}

// Each packet is of a type that there is not, which is worth a line of the log.
void fillTheLog(RawBinder& binder, uint32_t service, int) {
    const auto extension = binder.transact(service, kExtension, RequestBytes());
    if (extension.handles.empty()) return;
    RequestBytes request = RequestBytes().token("vendor.quorvan.hardware.vibrator.IZelVibrator");
    request.int32(339);
    for (int i = 0; i < 339; ++i) {
        request.int32(1).int32(24).int32(1).int32(2).int32(77).int32(3).int32(4);
    }
    binder.transact(extension.handles[0], 22, request.int32(10000));
}

void waitForManyNames(RawBinder& binder, uint32_t, int number) {
    binder.transact(0, 5,
                    RequestBytes()
                            .token(kManager)
                            .string16("name" + std::to_string(number))
                            .binder(static_cast<uint64_t>(number), kSystemStability));
}

// A name of many lines, which is refused and logged.
void registerNonsense(RawBinder& binder, uint32_t, int number) {
    binder.transact(0, 3,
                    RequestBytes()
                            .token(kManager)
                            .string16(std::string(1000, '\n'))
                            .binder(static_cast<uint64_t>(number), kSystemStability)
                            .int32(0)
                            .int32(8));
}

void makeNoise(RawBinder& binder, uint32_t service, int number) {
    const auto code = static_cast<uint32_t>(number % 26);
    binder.transact(service, code, standard().bytes(static_cast<size_t>(number) * 97, 0xa5));
    binder.transact(0, code, RequestBytes().token(kManager).bytes(4000, 0x7f));
}

constexpr Attack kAttacks[] = {{10001, beSilent},         {10002, composeForLong},
                               {10003, fillTheService},   {1000, fillTheLog},
                               {10004, waitForManyNames}, {10005, registerNonsense},
                               {10006, makeNoise}};

void attackForEver(const Attack& attack) {
    for (;;) {
        RawBinder binder;
        const auto service = binder.checkService(kService);
        if (!service) continue;
        for (int i = 1; i <= kPerConnection; ++i) attack.strike(binder, *service, i);
    }
}

// What the honest client saw, in memory that both processes have.
struct Pings {
    std::atomic<size_t> count = 0;
    std::atomic<int> refused = 0;
    std::array<int64_t, 100000> us{};
};

void pingForEver(Pings* pings) {
    Client client;
    while (!client.connect()) std::this_thread::sleep_for(milliseconds(5));
    while (pings->count < pings->us.size()) {
        int32_t capabilities = 0;
        const int64_t begin = monotonicUs();
        if (!client.standard().getCapabilities(&capabilities).isOk() || capabilities != 60) {
            ++pings->refused;
        }
        pings->us[pings->count] = monotonicUs() - begin;
        ++pings->count;
        std::this_thread::sleep_for(milliseconds(20));
    }
}

TEST(Attack, OfEveryKindAtOnceLeavesAnotherClientItsAnswers) {
    const ExpectBinderComplaints provoked;  // KernelComplaints looks at each of them
    const KernelComplaints kernel;
    const Phone phone("ff");
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    const int servicePid = phone.servicePid();
    auto* const pings = new (mmap(nullptr, sizeof(Pings), PROT_READ | PROT_WRITE,
                                  MAP_SHARED | MAP_ANONYMOUS, -1, 0)) Pings;
    {
        std::vector<std::unique_ptr<Process>> attackers;
        for (const Attack& attack : kAttacks) {
            attackers.push_back(
                    std::make_unique<Process>(attack.uid, [&] { attackForEver(attack); }));
        }
        const Process honest(2000, [&] { pingForEver(pings); });
        std::this_thread::sleep_for(soakTime(10));
    }
    const size_t count = pings->count;
    ASSERT_GT(count, 10U);
    std::sort(pings->us.begin(), pings->us.begin() + static_cast<ptrdiff_t>(count));
    const double median = static_cast<double>(pings->us[count / 2]) / 1e3;
    const double worst = static_cast<double>(pings->us[count - 1]) / 1e3;
    std::printf("attack: %zu answers to another client, median %.1f ms, worst %.1f ms\n", count,
                median, worst);
    EXPECT_LT(median, 100);
    EXPECT_LT(worst, 1000);
    EXPECT_EQ(pings->refused, 0);
    EXPECT_EQ(phone.servicePid(), servicePid) << "the service was started again";
    // The last composition ends ten seconds after it began.
    for (int i = 0; i < 150 && entriesOf(servicePid, "task").size() > 1; ++i) {
        std::this_thread::sleep_for(milliseconds(100));
    }
    EXPECT_EQ(entriesOf(servicePid, "task").size(), 1U);
    EXPECT_LT(privateMemory(servicePid), 3 * 1024);
    EXPECT_THAT(kernel.next(), testing::IsEmpty());
}

}  // namespace
}  // namespace qvx::test
