// SPDX-License-Identifier: Apache-2.0
//
// How a process serves, with threads, with one or polled, and how its service is found.
#include <signal.h>
#include <sys/select.h>
#include <unistd.h>

#include <thread>

#include <android/binder_manager.h>
#include <android/binder_parcel_utils.h>
#include <android/binder_process.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/libbinder_ndk/tests/guest/test_service.h"
#include "tests/support/kernel_log.h"

namespace binder_test {
namespace {

TEST(Calls, OneThreadServesOneCallAfterTheOther) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        std::vector<std::thread> callers;
        for (int i = 0; i < 4; ++i) {
            callers.emplace_back(
                    [&] { call(binder, kSleep, [](AParcel* to) { AParcel_writeInt32(to, 30); }); });
        }
        for (std::thread& caller : callers) caller.join();
        bool overlaps = true;
        AParcel_readBool(call(binder, kOverlaps).get(), &overlaps);
        EXPECT_FALSE(overlaps);
    });
}

TEST(Calls, PoolThreadsServeSideBySideAndAreNamed) {
    const Process service(kSystem, [](const Process::Ready& ready) {
        const auto binder = makeService();
        ABinderProcess_setThreadPoolMaxThreadCount(3);
        ABinderProcess_startThreadPool();
        ASSERT_EQ(EX_NONE, AServiceManager_addService(binder.get(), testName().c_str()));
        ready();
        ABinderProcess_joinThreadPool();
    });
    inProcess(kRoot, [] {
        const auto binder = find(testName());
        std::vector<std::thread> callers;
        for (int i = 0; i < 5; ++i) {
            callers.emplace_back([&] {
                call(binder, kSleep, [](AParcel* to) { AParcel_writeInt32(to, 300); });
            });
        }
        for (std::thread& caller : callers) caller.join();
        bool overlaps = false;
        AParcel_readBool(call(binder, kOverlaps).get(), &overlaps);
        EXPECT_TRUE(overlaps);

        std::string thread;
        ndk::AParcel_readString(call(binder, kThreadName).get(), &thread);
        EXPECT_THAT(thread, testing::MatchesRegex("Binder:[0-9]+_[1-5]"));
    });
}

TEST(Calls, NewProxiesAreFoundByTheSamePointer) {
    const Process service = startService();
    inProcess(kRoot, [] {
        const ndk::SpAIBinder one(AServiceManager_checkService(testName().c_str()));
        const ndk::SpAIBinder two(AServiceManager_getService(testName().c_str()));
        const ndk::SpAIBinder three(AServiceManager_waitForService(testName().c_str()));
        EXPECT_EQ(one.get(), two.get());
        EXPECT_EQ(one.get(), three.get());
        EXPECT_EQ(3, AIBinder_debugGetRefCount(one.get()));
    });
}

TEST(Calls, UnknownServiceIsNull) {
    inProcess(kApp, [] {
        EXPECT_EQ(nullptr, AServiceManager_checkService("no.such.service"));
        EXPECT_FALSE(AServiceManager_isDeclared("no.such.service"));
    });
}

TEST(Calls, WaitForServiceIsToldOfTheRegistration) {
    Process waiter(kRoot, [] {
        // With a pool the notice comes at once.
        ABinderProcess_startThreadPool();
        const ndk::SpAIBinder binder(AServiceManager_waitForService(testName().c_str()));
        ASSERT_NE(nullptr, binder.get());
        ASSERT_TRUE(AIBinder_associateClass(binder.get(), serviceClass()));
        EXPECT_EQ(3, echo(binder, 3));
        _exit(testing::Test::HasFailure() ? 1 : 0);
    });
    std::this_thread::sleep_for(std::chrono::milliseconds(300));
    const Process service = startService();
    EXPECT_EQ(0, waiter.wait());
}

TEST(Calls, WaitForServiceWorksWithoutThreads) {
    // The notice of the registration is never fetched, which the driver remarks on.
    const qvx::test::ExpectBinderComplaints complaints;
    Process waiter(kRoot, [] {
        const ndk::SpAIBinder binder(AServiceManager_waitForService(testName().c_str()));
        ASSERT_NE(nullptr, binder.get());
        ASSERT_TRUE(AIBinder_associateClass(binder.get(), serviceClass()));
        EXPECT_EQ(4, echo(binder, 4));
    });
    std::this_thread::sleep_for(std::chrono::milliseconds(300));
    const Process service = startService();
    EXPECT_EQ(0, waiter.wait());
    std::this_thread::sleep_for(std::chrono::milliseconds(100));
}

TEST(Calls, ForkedCopyMayDropReferencesButNotCall) {
    const Process service = startService();
    inProcess(kRoot, [] {
        auto binder = find(testName());
        EXPECT_EQ(0, Process(kRoot, [&] {
                         binder.set(nullptr);
                         ABinderProcess_joinThreadPool();  // returns at once
                     }).wait());
        EXPECT_EQ(128 + SIGABRT, Process(kRoot, [&] { AIBinder_ping(binder.get()); }).wait());
        EXPECT_EQ(8, echo(binder, 8)) << "the parent is not disturbed";
    });
}

TEST(Calls, PolledProcessServes) {
    const Process service(kSystem, [](const Process::Ready& ready) {
        const auto binder = makeService();
        ABinderProcess_setThreadPoolMaxThreadCount(0);
        int fd = -1;
        ASSERT_EQ(STATUS_OK, ABinderProcess_setupPolling(&fd));
        ASSERT_EQ(EX_NONE, AServiceManager_addService(binder.get(), testName().c_str()));
        ready();
        for (;;) {
            fd_set descriptors;
            FD_ZERO(&descriptors);
            FD_SET(fd, &descriptors);
            if (select(fd + 1, &descriptors, nullptr, nullptr, nullptr) == 1)
                ABinderProcess_handlePolledCommands();
        }
    });
    inProcess(kRoot, [] {
        const auto binder = find(testName());
        for (int32_t i = 0; i < 100; ++i) EXPECT_EQ(i, echo(binder, i));
    });
}

}  // namespace
}  // namespace binder_test
