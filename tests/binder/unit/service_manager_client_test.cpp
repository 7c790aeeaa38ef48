// SPDX-License-Identifier: Apache-2.0
// What the AServiceManager functions send, and what they make of the answers.
#include <android/binder_auto_utils.h>
#include <android/binder_manager.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "fake_kernel.h"

namespace binder_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class ServiceManagerClient : public testing::Test {
  protected:
    // Answers user codes with `reply`, pings with nothing.
    void answerWith(Buffer reply) {
        kernel_.answer = [this, reply](const SentTransaction& sent, Buffer* out) {
            if (sent.code <= 0x00ffffff) {
                asked_ = sent;
                *out = reply;
            }
            return STATUS_OK;
        };
    }

    FakeKernel kernel_;
    SentTransaction asked_{};
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
    EXPECT_EQ(0U, asked_.handle);
    EXPECT_EQ(3U, asked_.code);
    EXPECT_EQ(0U, asked_.flags);
    EXPECT_EQ(50U, asked_.words.size()) << "200 bytes";
    EXPECT_THAT(asked_.offsets, ElementsAre(164U));
    EXPECT_EQ(26U, asked_.words[3]);
    EXPECT_EQ(43U, asked_.words[18]);
    EXPECT_EQ(0x73622a85U, asked_.words[41]);
    EXPECT_EQ(0x0c000001U, asked_.words[47]);
    EXPECT_EQ(0U, asked_.words[48]);
    EXPECT_EQ(8U, asked_.words[49]);
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
    EXPECT_EQ(2U, asked_.code);
    EXPECT_THAT(std::vector<uint32_t>(asked_.words.begin() + 18, asked_.words.end()),
                ElementsAre(2U, 0x00620061U, 0U));
    EXPECT_EQ(binder.get(), ndk::SpAIBinder(AServiceManager_getService("ab")).get());
    EXPECT_EQ(2U, asked_.code);
    EXPECT_EQ(binder.get(), ndk::SpAIBinder(AServiceManager_waitForService("ab")).get());
    EXPECT_EQ(1U, asked_.code);
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
    EXPECT_EQ(7U, asked_.code);
    EXPECT_FALSE(AServiceManager_isDeclared(nullptr));
    answerWith(Buffer({0, 0}));
    EXPECT_FALSE(AServiceManager_isDeclared("a.b.IC/default"));
    answerWith(Buffer({0xffffffff, 0, 0, 0}));
    EXPECT_FALSE(AServiceManager_isDeclared("a.b.IC/default"));

    answerWith(Buffer({0, 0xffffffff}));
    EXPECT_FALSE(AServiceManager_isUpdatableViaApex("a.b.IC/default"));
    EXPECT_EQ(9U, asked_.code);
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
    EXPECT_EQ(8U, asked_.code);
    EXPECT_THAT(names, ElementsAre("a", "b"));
    names.clear();
    answerWith(Buffer({0, 0x7fffffff, 1, 0x61}));
    AServiceManager_forEachDeclaredInstance("a.b.IC", &names, collect);
    EXPECT_THAT(names, ElementsAre("a"));
    names.clear();
    answerWith(Buffer({0, 0xffffffff}));
    AServiceManager_forEachDeclaredInstance("a.b.IC", &names, collect);
    EXPECT_THAT(names, IsEmpty());
}

TEST_F(ServiceManagerClient, LazyServicesStay) {
    AServiceManager_forceLazyServicesPersist(true);
    AServiceManager_setActiveServicesCallback(nullptr, nullptr);
    EXPECT_FALSE(AServiceManager_tryUnregister());
    AServiceManager_reRegister();
}

}  // namespace
}  // namespace binder_test
