// SPDX-License-Identifier: Apache-2.0
//
// What the AServiceManager functions send, and what they make of the answers.
#include <cstdlib>
#include <cstring>

#include <aidl/android/os/IClientCallback.h>
#include <android/binder_auto_utils.h>
#include <android/binder_manager.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/libbinder_ndk/src/binder.h"
#include "platform/libbinder_ndk/tests/unit/fake_kernel.h"

namespace binder_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class ServiceManagerClient : public testing::Test {
  protected:
    // Answers user codes with `reply`, pings with nothing.
    void answerWith(Buffer reply) {
        mKernel.answer = [this, reply](const SentTransaction& sent, Buffer* out) {
            if (sent.code <= 0x00ffffff) {
                mAsked = sent;
                *out = reply;
            }
            return STATUS_OK;
        };
    }

    FakeKernel mKernel;
    SentTransaction mAsked{};
};

TEST_F(ServiceManagerClient, AddServiceSendsTheExactRequest) {
    answerWith(Buffer({0}));
    const ndk::SpAIBinder binder(
            AIBinder_new(AIBinder_Class_define(
                                 "x", [](void* args) { return args; }, [](void*) {},
                                 [](AIBinder*, transaction_code_t, const AParcel*,
                                    AParcel*) -> binder_status_t { return STATUS_OK; }),
                         nullptr));
    EXPECT_EQ(EX_NONE, AServiceManager_addService(binder.get(),
                                                  "android.hardware.vibrator.IVibrator/default"));
    EXPECT_EQ(0U, mAsked.handle);
    EXPECT_EQ(3U, mAsked.code);
    EXPECT_EQ(0U, mAsked.flags);
    EXPECT_EQ(50U, mAsked.words.size()) << "200 bytes";
    EXPECT_THAT(mAsked.offsets, ElementsAre(164U));
    EXPECT_EQ(26U, mAsked.words[3]);
    EXPECT_EQ(43U, mAsked.words[18]);
    EXPECT_EQ(0x73622a85U, mAsked.words[41]);
    EXPECT_EQ(0x0c000001U, mAsked.words[47]);
    EXPECT_EQ(0U, mAsked.words[48]);
    EXPECT_EQ(8U, mAsked.words[49]);
}

TEST_F(ServiceManagerClient, AddServiceReturnsTheException) {
    answerWith(Buffer({0xfffffffd, 0, 0, 0}));
    const ndk::SpAIBinder binder(
            AIBinder_new(AIBinder_Class_define(
                                 "x", [](void* args) { return args; }, [](void*) {},
                                 [](AIBinder*, transaction_code_t, const AParcel*,
                                    AParcel*) -> binder_status_t { return STATUS_OK; }),
                         nullptr));
    EXPECT_EQ(EX_ILLEGAL_ARGUMENT, AServiceManager_addService(binder.get(), "x"));
    EXPECT_EQ(EX_ILLEGAL_ARGUMENT, AServiceManager_addService(nullptr, "x"));
    EXPECT_EQ(EX_ILLEGAL_ARGUMENT, AServiceManager_addService(binder.get(), nullptr));
    answerWith(Buffer());
    EXPECT_EQ(EX_TRANSACTION_FAILED, AServiceManager_addService(binder.get(), "x"))
            << "a reply without a header";
    EXPECT_EQ(STATUS_UNKNOWN_ERROR, AServiceManager_registerLazyService(binder.get(), "x"));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AServiceManager_registerLazyService(nullptr, "x"));
}

TEST_F(ServiceManagerClient, CheckServiceReturnsTheBinder) {
    answerWith(Buffer({0, 0x73682a85, 0x113, 4, 0, 0, 0, 0x0c000001}, {4}));
    const ndk::SpAIBinder binder(AServiceManager_checkService("ab"));
    EXPECT_NE(nullptr, binder.get());
    EXPECT_EQ(2U, mAsked.code);
    EXPECT_THAT(std::vector<uint32_t>(mAsked.words.begin() + 18, mAsked.words.end()),
                ElementsAre(2U, 0x00620061U, 0U));
    EXPECT_EQ(binder.get(), ndk::SpAIBinder(AServiceManager_getService("ab")).get());
    EXPECT_EQ(2U, mAsked.code);
    EXPECT_EQ(binder.get(), ndk::SpAIBinder(AServiceManager_waitForService("ab")).get());
    EXPECT_EQ(1U, mAsked.code);
}

TEST_F(ServiceManagerClient, NoServiceAndEveryErrorIsNull) {
    answerWith(Buffer({0, 0x73622a85, 0x113, 0, 0, 0, 0, 1}));
    EXPECT_EQ(nullptr, AServiceManager_checkService("ab"));
    answerWith(Buffer({0xffffffff, 0, 0, 0}));
    EXPECT_EQ(nullptr, AServiceManager_checkService("ab"));
    EXPECT_EQ(nullptr, AServiceManager_waitForService("ab"));
    answerWith(Buffer({0}));
    EXPECT_EQ(nullptr, AServiceManager_checkService("ab"));
    EXPECT_EQ(nullptr, AServiceManager_checkService(nullptr));
    EXPECT_EQ(nullptr, AServiceManager_getService(nullptr));
    EXPECT_EQ(nullptr, AServiceManager_waitForService(nullptr));
}

TEST_F(ServiceManagerClient, QuestionsAboutDeclarations) {
    answerWith(Buffer({0, 1}));
    EXPECT_TRUE(AServiceManager_isDeclared("a.b.IC/default"));
    EXPECT_EQ(7U, mAsked.code);
    EXPECT_FALSE(AServiceManager_isDeclared(nullptr));
    answerWith(Buffer({0, 0}));
    EXPECT_FALSE(AServiceManager_isDeclared("a.b.IC/default"));
    answerWith(Buffer({0xffffffff, 0, 0, 0}));
    EXPECT_FALSE(AServiceManager_isDeclared("a.b.IC/default"));

    answerWith(Buffer({0, 0xffffffff}));
    EXPECT_FALSE(AServiceManager_isUpdatableViaApex("a.b.IC/default"));
    EXPECT_EQ(9U, mAsked.code);
    answerWith(Buffer({0, 1, 0x61}));
    EXPECT_TRUE(AServiceManager_isUpdatableViaApex("a.b.IC/default"));
}

TEST_F(ServiceManagerClient, DeclaredInstancesAreHandedOver) {
    std::vector<std::string> names;
    const auto collect = [](const char* name, void* to) {
        static_cast<std::vector<std::string>*>(to)->push_back(name);
    };
    answerWith(Buffer({0, 2, 1, 0x61, 1, 0x62}));
    AServiceManager_forEachDeclaredInstance("a.b.IC", &names, collect);
    EXPECT_EQ(8U, mAsked.code);
    EXPECT_THAT(names, ElementsAre("a", "b"));
    names.clear();
    answerWith(Buffer({0, 0x7fffffff, 1, 0x61}));
    AServiceManager_forEachDeclaredInstance("a.b.IC", &names, collect);
    EXPECT_THAT(names, IsEmpty());
    answerWith(Buffer({0, 0xffffffff}));
    AServiceManager_forEachDeclaredInstance("a.b.IC", &names, collect);
    EXPECT_THAT(names, IsEmpty());
}

// A process with one lazy service. The service manager accepts everything unless told otherwise.
// Lives in a child of its own, since what is registered stays so.
class LazyService : public ServiceManagerClient {
  protected:
    void start() {
        mKernel.answer = [this](const SentTransaction& sent, Buffer* out) {
            if (sent.code > 0x00ffffff) return STATUS_OK;
            mCodes.push_back(sent.code);
            if (sent.code == 10) {
                // registerClientCallback ends with the callback's cookie and stability; the driver
                // would refer to it for the service manager.
                uint64_t cookie = 0;
                std::memcpy(&cookie, &sent.words.end()[-3], sizeof cookie);
                mCallback = binder_ndk::LocalBinder::fromCookie(cookie);
                mCallback->incStrong();
            }
            const bool refuse = sent.code == 11 && mHasSecretClient;
            *out = refuse ? Buffer({0xfffffffb, 0, 0, 0}) : Buffer({0});
            return STATUS_OK;
        };
        const ndk::SpAIBinder binder(
                AIBinder_new(AIBinder_Class_define(
                                     "x", [](void* args) { return args; }, [](void*) {},
                                     [](AIBinder*, transaction_code_t, const AParcel*,
                                        AParcel*) -> binder_status_t { return STATUS_OK; }),
                             nullptr));
        EXPECT_EQ(STATUS_OK, AServiceManager_registerLazyService(binder.get(), "x"));
        EXPECT_THAT(mCodes, ElementsAre(3U, 10U));
        mCodes.clear();
    }
    void tell(bool hasClients) {
        mCallback->incStrong();
        aidl::android::os::IClientCallback::fromBinder(ndk::SpAIBinder(mCallback))
                ->onClients(nullptr, hasClients);
    }
    // The end of a test in the child: the process has gone on.
    [[noreturn]] static void goneOn() { std::_Exit(testing::Test::HasFailure() ? 1 : 99); }

    std::vector<uint32_t> mCodes;
    AIBinder* mCallback = nullptr;
    bool mHasSecretClient = false;
};

TEST_F(LazyService, EndsTheProcessWhenItsLastClientIsGone) {
    const auto life = [this] {
        start();
        tell(true);
        EXPECT_THAT(mCodes, IsEmpty());
        tell(false);
        goneOn();
    };
    EXPECT_EXIT(life(), testing::ExitedWithCode(0), "no service of this process has a client");
}

TEST_F(LazyService, IsRegisteredAgainWhenTheServiceManagerKnowsOfAClient) {
    const auto life = [this] {
        start();
        mHasSecretClient = true;
        tell(true);
        tell(false);
        EXPECT_THAT(mCodes, ElementsAre(11U));
        AServiceManager_reRegister();
        EXPECT_THAT(mCodes, ElementsAre(11U)) << "it was never taken out";
        goneOn();
    };
    EXPECT_EXIT(life(), testing::ExitedWithCode(99), "");
}

TEST_F(LazyService, StaysAsLongAsTheProgramWants) {
    const auto life = [this] {
        start();
        AServiceManager_forceLazyServicesPersist(true);
        tell(true);
        tell(false);
        EXPECT_THAT(mCodes, IsEmpty());
        AServiceManager_forceLazyServicesPersist(false);
        goneOn();
    };
    EXPECT_EXIT(life(), testing::ExitedWithCode(0), "");
}

TEST_F(LazyService, LeavesTheDecisionToAProgramThatTakesIt) {
    static std::vector<bool> told;
    const auto life = [this] {
        start();
        AServiceManager_setActiveServicesCallback(
                [](bool hasClients, void*) {
                    told.push_back(hasClients);
                    return true;
                },
                nullptr);
        tell(true);
        tell(true);
        tell(false);
        EXPECT_THAT(told, ElementsAre(true, false));
        EXPECT_TRUE(AServiceManager_tryUnregister());
        AServiceManager_reRegister();
        EXPECT_THAT(mCodes, ElementsAre(11U, 3U));
        goneOn();
    };
    EXPECT_EXIT(life(), testing::ExitedWithCode(99), "");
}

}  // namespace
}  // namespace binder_test
