// SPDX-License-Identifier: Apache-2.0
//
// References across processes, and the death of one side.
#include <atomic>
#include <thread>

#include <android/binder_manager.h>
#include <android/binder_process.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/libbinder_ndk/tests/guest/test_service.h"
#include "tests/support/kernel_log.h"

namespace binder_test {
namespace {

ndk::SpAIBinder giveObject(const ndk::SpAIBinder& service) {
    ndk::SpAIBinder object;
    EXPECT_EQ(STATUS_OK, AParcel_readStrongBinder(call(service, kGiveObject).get(), object.getR()));
    return object;
}

TEST(References, ObjectLivesAsLongAsARemoteReference) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        auto object = giveObject(binder);
        EXPECT_EQ(1, callForInt(binder, kLiveObjects));
        EXPECT_EQ(STATUS_OK, AIBinder_ping(object.get()));
        EXPECT_EQ(1, AIBinder_debugGetRefCount(object.get()));
        object.set(nullptr);
        EXPECT_TRUE(eventually([&] { return callForInt(binder, kLiveObjects) == 0; }));
    });
}

TEST(References, ObjectDiesWithTheClientProcess) {
    const Process service = startService();
    inProcess(kRoot, [] {
        const auto binder = find(testName());
        auto* const leaked = new ndk::SpAIBinder(giveObject(binder));
        EXPECT_NE(nullptr, leaked->get());
        EXPECT_EQ(1, callForInt(binder, kLiveObjects));
    });
    inProcess(kRoot, [] {
        const auto binder = find(testName());
        EXPECT_TRUE(eventually([&] { return callForInt(binder, kLiveObjects) == 0; }));
    });
}

TEST(References, UnreadObjectOfAReplyIsReleased) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        for (int i = 0; i < 100; ++i) call(binder, kGiveObject);
        EXPECT_TRUE(eventually([&] { return callForInt(binder, kLiveObjects) == 0; }));
    });
}

TEST(References, ManyObjectsComeAndGo) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        std::vector<ndk::SpAIBinder> objects;
        for (int i = 0; i < 500; ++i) {
            objects.push_back(giveObject(binder));
            if (i % 3 == 0) objects.erase(objects.begin());
        }
        EXPECT_TRUE(eventually([&] {
            return callForInt(binder, kLiveObjects) == static_cast<int32_t>(objects.size());
        }));
        objects.clear();
        EXPECT_TRUE(eventually([&] { return callForInt(binder, kLiveObjects) == 0; }));
    });
}

TEST(References, HandlesAreReusedByManyThreadsAtOnce) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        std::vector<std::thread> threads;
        for (int t = 0; t < 4; ++t) {
            threads.emplace_back([&] {
                for (int i = 0; i < 200; ++i) {
                    const auto object = giveObject(binder);
                    EXPECT_EQ(STATUS_OK, AIBinder_ping(object.get()));
                }
            });
        }
        for (std::thread& thread : threads) thread.join();
        EXPECT_TRUE(eventually([&] { return callForInt(binder, kLiveObjects) == 0; }));
    });
}

TEST(References, OneObjectSentToManyThreadsIsOneProxy) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        std::vector<std::thread> threads;
        for (int t = 0; t < 4; ++t) {
            threads.emplace_back([&] {
                for (int i = 0; i < 200; ++i) {
                    ndk::SpAIBinder extension;
                    EXPECT_EQ(STATUS_OK, AIBinder_getExtension(binder.get(), extension.getR()));
                    EXPECT_TRUE(AIBinder_associateClass(extension.get(), callbackClass()));
                    EXPECT_EQ(-i, callForInt(extension, FIRST_CALL_TRANSACTION,
                                             [i](AParcel* to) { AParcel_writeInt32(to, i); }));
                }
            });
        }
        for (std::thread& thread : threads) thread.join();
    });
}

TEST(References, OwnObjectComesBackAsItself) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        const auto mine = makeCallback([](int32_t number) { return number; });
        ndk::SpAIBinder returned;
        const auto reply = call(binder, kEchoBinder,
                                [&](AParcel* to) { AParcel_writeStrongBinder(to, mine.get()); });
        ASSERT_EQ(STATUS_OK, AParcel_readStrongBinder(reply.get(), returned.getR()));
        EXPECT_EQ(mine.get(), returned.get());
        EXPECT_FALSE(AIBinder_isRemote(returned.get()));

        const auto theirs = giveObject(binder);
        bool own = false;
        AParcel_readBool(call(binder, kIsOwn,
                              [&](AParcel* to) {
                                  AParcel_writeStrongBinder(to, theirs.get());
                              }).get(),
                         &own);
        EXPECT_TRUE(own);
    });
}

TEST(References, NullBinderStaysNull) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        ndk::SpAIBinder returned = makeService();
        const auto reply = call(binder, kEchoBinder,
                                [](AParcel* to) { AParcel_writeStrongBinder(to, nullptr); });
        returned.set(nullptr);
        EXPECT_EQ(STATUS_OK, AParcel_readStrongBinder(reply.get(), returned.getR()));
        EXPECT_EQ(nullptr, returned.get());
    });
}

TEST(References, SentObjectIsHeldByTheReceiverAndThenLetGo) {
    const Process service = startService();
    inProcess(kRoot, [] {
        ABinderProcess_startThreadPool();  // someone has to be told of the release
        const auto binder = find(testName());
        auto mine = makeCallback([](int32_t number) { return number; });
        EXPECT_EQ(1, AIBinder_debugGetRefCount(mine.get()));
        call(binder, kKeep, [&](AParcel* to) { AParcel_writeStrongBinder(to, mine.get()); });
        EXPECT_EQ(2, AIBinder_debugGetRefCount(mine.get()));

        ndk::ScopedAIBinder_Weak weak(AIBinder_Weak_new(mine.get()));
        mine.set(nullptr);
        EXPECT_NE(nullptr, weak.promote().get()) << "the service still holds it";
        call(binder, kDropKept);
        EXPECT_TRUE(eventually([&] { return weak.promote().get() == nullptr; }));
    });
}

TEST(References, WeakReferenceToAProxyEndsWithIt) {
    const Process service = startService();
    inProcess(kRoot, [] {
        auto binder = find(testName());
        auto object = giveObject(binder);
        ndk::ScopedAIBinder_Weak weak(AIBinder_Weak_new(object.get()));
        EXPECT_EQ(object.get(), weak.promote().get());
        object.set(nullptr);
        EXPECT_EQ(nullptr, weak.promote().get());
        EXPECT_TRUE(eventually([&] { return callForInt(binder, kLiveObjects) == 0; }))
                << "a weak reference keeps nothing remote";
    });
}

// The driver notes on the kernel log that a call failed because its target is gone.
class Death : public testing::Test {
  protected:
    void TearDown() override {
        // The driver works off a dead process a moment later.
        std::this_thread::sleep_for(std::chrono::milliseconds(100));
    }

  private:
    const qvx::test::ExpectBinderComplaints mComplaints;
};

TEST_F(Death, ServiceDyingInTheMiddleOfACallIsADeadObject) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        binder_status_t status = STATUS_OK;
        call(binder, kDie, nullptr, &status);
        EXPECT_EQ(STATUS_DEAD_OBJECT, status);
        EXPECT_FALSE(AIBinder_isAlive(binder.get()));
        EXPECT_EQ(STATUS_DEAD_OBJECT, AIBinder_ping(binder.get()));
        call(binder, kEcho, nullptr, &status);
        EXPECT_EQ(STATUS_DEAD_OBJECT, status);
        ndk::SpAIBinder extension;
        EXPECT_EQ(STATUS_DEAD_OBJECT, AIBinder_getExtension(binder.get(), extension.getR()));
    });
}

TEST_F(Death, LinksFireOnceEachAndRefuseAfterwards) {
    Process service = startService();
    inProcess(kRoot, [&] {
        ABinderProcess_startThreadPool();
        const auto binder = find(testName());
        std::atomic<int> told{0};
        const ndk::ScopedAIBinder_DeathRecipient recipient(AIBinder_DeathRecipient_new(
                [](void* cookie) { ++*static_cast<std::atomic<int>*>(cookie); }));
        EXPECT_EQ(STATUS_OK, AIBinder_linkToDeath(binder.get(), recipient.get(), &told));
        EXPECT_EQ(STATUS_OK, AIBinder_linkToDeath(binder.get(), recipient.get(), &told));
        EXPECT_EQ(STATUS_OK, AIBinder_linkToDeath(binder.get(), recipient.get(), &told));
        EXPECT_EQ(STATUS_OK, AIBinder_unlinkToDeath(binder.get(), recipient.get(), &told));
        service.kill();
        EXPECT_TRUE(eventually([&] { return told == 2; }));
        EXPECT_FALSE(AIBinder_isAlive(binder.get()));
        EXPECT_EQ(STATUS_NAME_NOT_FOUND,
                  AIBinder_unlinkToDeath(binder.get(), recipient.get(), &told));
        EXPECT_EQ(STATUS_DEAD_OBJECT, AIBinder_linkToDeath(binder.get(), recipient.get(), &told));
        EXPECT_EQ(2, told);
    });
}

TEST_F(Death, LinkToAnObjectAlreadyDeadIsStillTold) {
    Process service = startService();
    inProcess(kRoot, [&] {
        ABinderProcess_startThreadPool();
        const auto binder = find(testName());
        service.kill();
        EXPECT_TRUE(eventually([&] { return AIBinder_ping(binder.get()) == STATUS_DEAD_OBJECT; }));
        std::atomic<int> told{0};
        const ndk::ScopedAIBinder_DeathRecipient recipient(AIBinder_DeathRecipient_new(
                [](void* cookie) { ++*static_cast<std::atomic<int>*>(cookie); }));
        EXPECT_EQ(STATUS_OK, AIBinder_linkToDeath(binder.get(), recipient.get(), &told));
        EXPECT_TRUE(eventually([&] { return told == 1; }));
    });
}

TEST_F(Death, DeletedRecipientIsSilent) {
    Process service = startService();
    inProcess(kRoot, [&] {
        ABinderProcess_startThreadPool();
        const auto binder = find(testName());
        std::atomic<int> told{0};
        std::atomic<int> other{0};
        const auto count = [](void* cookie) { ++*static_cast<std::atomic<int>*>(cookie); };
        ndk::ScopedAIBinder_DeathRecipient deleted(AIBinder_DeathRecipient_new(count));
        const ndk::ScopedAIBinder_DeathRecipient kept(AIBinder_DeathRecipient_new(count));
        EXPECT_EQ(STATUS_OK, AIBinder_linkToDeath(binder.get(), deleted.get(), &told));
        EXPECT_EQ(STATUS_OK, AIBinder_linkToDeath(binder.get(), kept.get(), &other));
        deleted.set(nullptr);
        service.kill();
        EXPECT_TRUE(eventually([&] { return other == 1; }));
        EXPECT_EQ(0, told);
    });
}

TEST_F(Death, LinksCanBeTakenBackAndMadeAgain) {
    Process service = startService();
    inProcess(kRoot, [&] {
        ABinderProcess_startThreadPool();
        const auto binder = find(testName());
        std::atomic<int> told{0};
        const ndk::ScopedAIBinder_DeathRecipient recipient(AIBinder_DeathRecipient_new(
                [](void* cookie) { ++*static_cast<std::atomic<int>*>(cookie); }));
        for (int i = 0; i < 200; ++i) {
            EXPECT_EQ(STATUS_OK, AIBinder_linkToDeath(binder.get(), recipient.get(), &told));
            EXPECT_EQ(STATUS_OK, AIBinder_unlinkToDeath(binder.get(), recipient.get(), &told));
        }
        EXPECT_EQ(STATUS_OK, AIBinder_linkToDeath(binder.get(), recipient.get(), &told));
        service.kill();
        EXPECT_TRUE(eventually([&] { return told == 1; }));
    });
}

TEST_F(Death, ServiceIsToldOfTheDeathOfItsClient) {
    const Process service = startService();
    inProcess(kApp, [] {
        const auto binder = find(testName());
        const auto mine = makeCallback([](int32_t number) { return number; });
        call(binder, kWatch, [&](AParcel* to) { AParcel_writeStrongBinder(to, mine.get()); });
        EXPECT_EQ(0, callForInt(binder, kDeaths));
    });
    inProcess(kRoot, [] {
        const auto binder = find(testName());
        EXPECT_TRUE(eventually([&] { return callForInt(binder, kDeaths) == 1; }));
    });
}

TEST_F(Death, DroppedProxyNeverFires) {
    Process service = startService();
    inProcess(kRoot, [&] {
        ABinderProcess_startThreadPool();
        auto binder = find(testName());
        std::atomic<int> told{0};
        const ndk::ScopedAIBinder_DeathRecipient recipient(AIBinder_DeathRecipient_new(
                [](void* cookie) { ++*static_cast<std::atomic<int>*>(cookie); }));
        EXPECT_EQ(STATUS_OK, AIBinder_linkToDeath(binder.get(), recipient.get(), &told));
        binder.set(nullptr);
        service.kill();
        std::this_thread::sleep_for(std::chrono::milliseconds(200));
        EXPECT_EQ(0, told);
    });
}

}  // namespace
}  // namespace binder_test
