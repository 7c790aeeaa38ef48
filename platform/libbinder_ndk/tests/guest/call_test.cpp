// SPDX-License-Identifier: Apache-2.0
//
// Calls between two processes over the driver.
#include <dlfcn.h>
#include <fcntl.h>
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

TEST(Calls, TwoWayCallReturnsTheReply) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        EXPECT_TRUE(AIBinder_isRemote(binder.get()));
        EXPECT_EQ(41, echo(binder, 41));
        EXPECT_EQ(-1, echo(binder, -1));
    });
}

TEST(Symbols, CarryTheVersionNodesOfThePlatform) {
    for (const char* const symbol :
         {"ABinderProcess_handlePolledCommands", "ABinderProcess_setupPolling",
          "AIBinder_getCallingSid", "AIBinder_setRequestingSid"}) {
        EXPECT_NE(nullptr, dlvsym(RTLD_DEFAULT, symbol, "LIBBINDER_NDK31")) << symbol;
    }
}

TEST(Calls, PingAnswersAndTheObjectIsAlive) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        EXPECT_EQ(STATUS_OK, AIBinder_ping(binder.get()));
        EXPECT_TRUE(AIBinder_isAlive(binder.get()));
    });
}

TEST(Calls, AssociationAsksForTheDescriptor) {
    const Process service = startService();
    inProcess(kRoot, [] {
        const ndk::SpAIBinder binder(AServiceManager_checkService(testName().c_str()));
        EXPECT_EQ(nullptr, AIBinder_getClass(binder.get()));
        EXPECT_FALSE(AIBinder_associateClass(binder.get(), callbackClass()));
        EXPECT_EQ(nullptr, AIBinder_getClass(binder.get()));
        EXPECT_TRUE(AIBinder_associateClass(binder.get(), serviceClass()));
        EXPECT_EQ(serviceClass(), AIBinder_getClass(binder.get()));
        EXPECT_TRUE(AIBinder_associateClass(binder.get(), serviceClass()));
        EXPECT_FALSE(AIBinder_associateClass(binder.get(), callbackClass()));
        EXPECT_EQ(nullptr, AIBinder_getUserData(binder.get()));
    });
}

TEST(Calls, ServiceSeesTheCallersEffectiveUser) {
    const Process service = startService();
    for (const uid_t uid : {kRoot, kSystem, kShell, kApp}) {
        inProcess(uid, [uid] {
            const auto binder = find(testName());
            const auto reply = call(binder, kCaller);
            int32_t seenUid = -1;
            int32_t seenPid = -1;
            AParcel_readInt32(reply.get(), &seenUid);
            AParcel_readInt32(reply.get(), &seenPid);
            EXPECT_EQ(static_cast<int32_t>(uid), seenUid);
            EXPECT_EQ(getpid(), seenPid);
            // Outside a transaction it is the process itself.
            EXPECT_EQ(uid, AIBinder_getCallingUid());
            EXPECT_EQ(getpid(), AIBinder_getCallingPid());
        });
    }
}

TEST(Calls, OnewayCallsArriveInOrder) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        for (int32_t i = 0; i < 50; ++i) {
            binder_status_t status = STATUS_UNKNOWN_ERROR;
            const auto reply = call(
                    binder, kRemember, [i](AParcel* to) { AParcel_writeInt32(to, i); }, &status,
                    FLAG_ONEWAY);
            EXPECT_EQ(STATUS_OK, status);
            ASSERT_NE(nullptr, reply.get());
            EXPECT_EQ(0, AParcel_getDataSize(reply.get()));
        }
        std::vector<int32_t> remembered;
        ndk::AParcel_readVector(call(binder, kRemembered).get(), &remembered);
        std::vector<int32_t> expected;
        for (int32_t i = 0; i < 50; ++i) expected.push_back(i);
        // The synchronous question does not wait for the oneway queue: ask until all are there.
        EXPECT_TRUE(eventually([&] {
            ndk::AParcel_readVector(call(binder, kRemembered).get(), &remembered);
            return remembered.size() == expected.size();
        }));
        EXPECT_EQ(expected, remembered);
    });
}

TEST(Calls, WaitingThreadServesNestedCalls) {
    const Process service = startService();
    inProcess(kApp, [] {
        // This process has no serving thread: only the one that waits can answer.
        const auto binder = find(testName());
        uid_t callbackUid = 0;
        pid_t callbackPid = 0;
        const auto callback = makeCallback([&](int32_t number) {
            callbackUid = AIBinder_getCallingUid();
            callbackPid = AIBinder_getCallingPid();
            return number * 2;
        });
        EXPECT_EQ(42, callForInt(binder, kCallBack, [&](AParcel* to) {
                      AParcel_writeStrongBinder(to, callback.get());
                      AParcel_writeInt32(to, 21);
                  }));
        EXPECT_EQ(kSystem, callbackUid);
        EXPECT_NE(0, callbackPid);
        EXPECT_EQ(kApp, AIBinder_getCallingUid()) << "the identity is restored";
        EXPECT_EQ(getpid(), AIBinder_getCallingPid());
    });
}

TEST(Calls, NestedCallsGoDeep) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        // Callback and service call each other until the number has counted down.
        std::function<int32_t(int32_t)> answer;
        const auto descend = [&](int32_t number) -> int32_t {
            const auto next = makeCallback(answer);
            return callForInt(binder, kCallBack, [&](AParcel* to) {
                AParcel_writeStrongBinder(to, next.get());
                AParcel_writeInt32(to, number);
            });
        };
        answer = [&](int32_t number) { return number == 0 ? 0 : 1 + descend(number - 1); };
        EXPECT_EQ(20, descend(20));
        EXPECT_EQ(5, echo(binder, 5));
    });
}

TEST(Calls, NestingEndsAtAFixedDepth) {
    const Process service = startService();
    inProcess(kApp, [] {
        const auto binder = find(testName());
        int depth = 0;
        binder_status_t status = STATUS_OK;
        std::function<int32_t(int32_t)> answer;
        const auto descend = [&] {
            const auto next = makeCallback(answer);
            call(
                    binder, kCallBack,
                    [&](AParcel* to) {
                        AParcel_writeStrongBinder(to, next.get());
                        AParcel_writeInt32(to, 0);
                    },
                    &status);
        };
        answer = [&](int32_t number) {
            if (++depth < 5000) descend();
            return number;
        };
        descend();
        EXPECT_EQ(32, depth);
        EXPECT_EQ(5, echo(binder, 5));
    });
    inProcess(kRoot, [] { EXPECT_EQ(7, echo(find(testName()), 7)); });
}

TEST(Calls, CallbackOfAnotherInterfaceRefusesTheCall) {
    const Process service = startService();
    inProcess(kRoot, [] {
        const auto binder = find(testName());
        const auto wrong = makeService();
        binder_status_t status = STATUS_OK;
        call(
                binder, kCallBack,
                [&](AParcel* to) {
                    AParcel_writeStrongBinder(to, wrong.get());
                    AParcel_writeInt32(to, 1);
                },
                &status);
        EXPECT_EQ(STATUS_BAD_TYPE, status);
    });
}

TEST(Calls, StatusTravelsAloneAndUnchanged) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        for (const binder_status_t sent :
             {STATUS_BAD_VALUE, STATUS_PERMISSION_DENIED, STATUS_UNKNOWN_TRANSACTION,
              STATUS_UNEXPECTED_NULL, STATUS_TIMED_OUT}) {
            binder_status_t status = STATUS_OK;
            const auto reply = call(
                    binder, kAnswerStatus, [&](AParcel* to) { AParcel_writeInt32(to, sent); },
                    &status);
            EXPECT_EQ(sent, status);
            EXPECT_EQ(nullptr, reply.get());
        }
    });
}

TEST(Calls, StatusWithoutANameBecomesUnknownError) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        for (const int32_t sent : {-5, -9999, 7}) {
            binder_status_t status = STATUS_OK;
            call(
                    binder, kAnswerStatus, [&](AParcel* to) { AParcel_writeInt32(to, sent); },
                    &status);
            EXPECT_EQ(STATUS_UNKNOWN_ERROR, status);
        }
    });
}

TEST(Calls, UnknownUserCodeIsAnswered) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        binder_status_t status = STATUS_OK;
        call(binder, 0x00ffffff, nullptr, &status);
        EXPECT_EQ(STATUS_UNKNOWN_TRANSACTION, status);
    });
}

TEST(Calls, ExtensionIsReachedThroughItsParent) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        ndk::SpAIBinder extension;
        ASSERT_EQ(STATUS_OK, AIBinder_getExtension(binder.get(), extension.getR()));
        ASSERT_NE(nullptr, extension.get());
        ASSERT_TRUE(AIBinder_associateClass(extension.get(), callbackClass()));
        EXPECT_EQ(-7, callForInt(extension, FIRST_CALL_TRANSACTION,
                                 [](AParcel* to) { AParcel_writeInt32(to, 7); }));

        ndk::SpAIBinder again;
        ASSERT_EQ(STATUS_OK, AIBinder_getExtension(binder.get(), again.getR()));
        EXPECT_EQ(extension.get(), again.get()) << "one remote object is one AIBinder";

        ndk::SpAIBinder none;
        EXPECT_EQ(STATUS_OK, AIBinder_getExtension(extension.get(), none.getR()));
        EXPECT_EQ(nullptr, none.get());
        EXPECT_EQ(STATUS_INVALID_OPERATION, AIBinder_setExtension(binder.get(), extension.get()));
    });
}

TEST(Calls, DumpReachesTheObjectWithItsArguments) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        int ends[2];
        ASSERT_EQ(0, pipe(ends));
        const char* args[] = {"-a", "\xc3\xa4", ""};
        EXPECT_EQ(STATUS_OK, AIBinder_dump(binder.get(), ends[1], args, 3));
        char text[64] = {};
        EXPECT_EQ(12, read(ends[0], text, sizeof text - 1));
        EXPECT_STREQ("dump: -a \xc3\xa4 ", text);
        EXPECT_EQ(0, close(ends[0])) << "the descriptors stay the caller's";
        EXPECT_EQ(0, close(ends[1]));
    });
}

TEST(Calls, DescriptorArrivesAsADuplicate) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        int ends[2];
        ASSERT_EQ(0, pipe(ends));
        const int32_t before = callForInt(binder, kDescriptors);
        call(binder, kWriteTo,
             [&](AParcel* to) { AParcel_writeParcelFileDescriptor(to, ends[1]); });
        char text[8] = {};
        EXPECT_EQ(5, read(ends[0], text, sizeof text - 1));
        EXPECT_STREQ("hello", text);
        EXPECT_EQ(before, callForInt(binder, kDescriptors));
        close(ends[0]);
        close(ends[1]);
    });
}

TEST(Calls, LargeBytesSurvive) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        std::vector<uint8_t> sent(200001);
        for (size_t i = 0; i < sent.size(); ++i) sent[i] = static_cast<uint8_t>(i * 7);
        std::vector<uint8_t> received;
        const auto reply =
                call(binder, kEchoBytes, [&](AParcel* to) { ndk::AParcel_writeVector(to, sent); });
        EXPECT_EQ(STATUS_OK, ndk::AParcel_readVector(reply.get(), &received));
        EXPECT_EQ(sent, received);
    });
}

TEST(Calls, BufferSpaceDoesNotLeak) {
    callService(kRoot, [](const ndk::SpAIBinder& binder) {
        const int before = countDescriptors();
        const int32_t serviceBefore = callForInt(binder, kDescriptors);
        for (int32_t i = 0; i < 20000; ++i) ASSERT_EQ(i, echo(binder, i));
        // Half a buffer each: space lost anywhere would show at once.
        const std::vector<uint8_t> half(450000);
        for (int i = 0; i < 20; ++i) {
            const auto reply = call(binder, kEchoBytes,
                                    [&](AParcel* to) { ndk::AParcel_writeVector(to, half); });
            ASSERT_NE(nullptr, reply.get()) << "call " << i;
        }
        EXPECT_EQ(before, countDescriptors());
        EXPECT_EQ(serviceBefore, callForInt(binder, kDescriptors));
    });
}

}  // namespace
}  // namespace binder_test
