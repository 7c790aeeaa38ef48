// SPDX-License-Identifier: Apache-2.0
//
// Proxies, their identity and stability, and death links, against the fake driver.
#include <android/binder_auto_utils.h>
#include <android/binder_ibinder_platform.h>
#include <android/binder_stability.h>
#include <binder_context_manager.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/libbinder_ndk/src/call_context.h"
#include "platform/libbinder_ndk/src/death.h"
#include "platform/libbinder_ndk/tests/unit/fake_kernel.h"

namespace binder_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr uint32_t kSystemLevel = 0x0c000001;

AIBinder_Class* defineClass(const char* descriptor) {
    return AIBinder_Class_define(
            descriptor, [](void* args) { return args; }, [](void*) {},
            [](AIBinder*, transaction_code_t, const AParcel*, AParcel*) -> binder_status_t {
                return STATUS_UNKNOWN_TRANSACTION;
            });
}

const std::vector<uint32_t> kDescriptorReply = {3, 0x00620061, 0x00000063};  // "abc"

class RemoteBinder : public testing::Test {
  protected:
    // Reads a proxy out of a received parcel.
    binder_status_t receive(uint32_t handle, uint32_t word, ndk::SpAIBinder* binder) {
        mKernel.deliver(Buffer({0x73682a85, 0x113, handle, 0, 0, 0, word}, {0}), mParcel.get());
        AIBinder* read = nullptr;
        const auto status = AParcel_readStrongBinder(mParcel.get(), &read);
        if (status == STATUS_OK) binder->set(read);
        AParcel_reset(mParcel.get());
        return status;
    }
    ndk::SpAIBinder proxy(uint32_t handle, uint32_t word = kSystemLevel) {
        ndk::SpAIBinder binder;
        EXPECT_EQ(STATUS_OK, receive(handle, word, &binder));
        return binder;
    }
    ndk::SpAIBinder associated(uint32_t handle, uint32_t word = kSystemLevel) {
        static AIBinder_Class* const clazz = defineClass("abc");
        auto binder = proxy(handle, word);
        mKernel.answer = [](const SentTransaction&, Buffer* reply) {
            *reply = Buffer(kDescriptorReply);
            return STATUS_OK;
        };
        EXPECT_TRUE(AIBinder_associateClass(binder.get(), clazz));
        mKernel.answer = nullptr;
        mKernel.sent.clear();
        return binder;
    }
    binder_status_t transact(AIBinder* binder, binder_flags_t flags = 0) {
        AParcel* in = nullptr;
        ndk::ScopedAParcel out;
        if (const auto status = AIBinder_prepareTransaction(binder, &in); status != STATUS_OK)
            return status;
        return AIBinder_transact(binder, 7, &in, out.getR(), flags);
    }

    FakeKernel mKernel;
    ndk::ScopedAParcel mParcel{AParcel_create()};
};

TEST_F(RemoteBinder, OneHandleIsOneProxyAcquiredOnceAndReleasedOnce) {
    auto one = proxy(5);
    auto two = proxy(5);
    EXPECT_EQ(one.get(), two.get());
    EXPECT_TRUE(AIBinder_isRemote(one.get()));
    EXPECT_TRUE(AIBinder_isAlive(one.get()));
    EXPECT_EQ(2, AIBinder_debugGetRefCount(one.get()));
    EXPECT_THAT(mKernel.commands, ElementsAre("acquire 5"));
    one.set(nullptr);
    EXPECT_THAT(mKernel.commands, ElementsAre("acquire 5"));
    two.set(nullptr);
    EXPECT_THAT(mKernel.commands, ElementsAre("acquire 5", "release 5"));
}

TEST_F(RemoteBinder, HandleIsAcquiredAgainAfterItsRelease) {
    { const auto binder = proxy(6); }
    const ndk::SpAIBinder again = proxy(6);
    EXPECT_THAT(mKernel.commands, ElementsAre("acquire 6", "release 6", "acquire 6"));
}

TEST_F(RemoteBinder, WeakReferenceDoesNotHoldTheHandle) {
    auto binder = proxy(7);
    ndk::ScopedAIBinder_Weak weak(AIBinder_Weak_new(binder.get()));
    binder.set(nullptr);
    EXPECT_EQ(nullptr, weak.promote().get());
    EXPECT_THAT(mKernel.commands, ElementsAre("acquire 7", "release 7"));
    const auto next = proxy(7);
    EXPECT_EQ(nullptr, weak.promote().get()) << "another life of the same number";
}

TEST_F(RemoteBinder, IsSentAsItsHandleWithTheWordItCameWith) {
    const auto binder = proxy(0x80000001, 0x3f000002);
    EXPECT_EQ(STATUS_OK, AParcel_writeStrongBinder(mParcel.get(), binder.get()));
    EXPECT_THAT(words(mParcel.get()),
                ElementsAre(0x73682a85U, 0x113U, 0x80000001U, 0U, 0U, 0U, 0x3f000002U));
    EXPECT_EQ(2, AIBinder_debugGetRefCount(binder.get()));
    AParcel_reset(mParcel.get());
    EXPECT_EQ(1, AIBinder_debugGetRefCount(binder.get()));
}

TEST_F(RemoteBinder, StabilityWordIsChecked) {
    ndk::SpAIBinder binder;
    EXPECT_EQ(STATUS_BAD_TYPE, receive(8, 0, &binder));
    EXPECT_EQ(STATUS_BAD_TYPE, receive(8, 0x0c000000, &binder)) << "no version";
    EXPECT_EQ(STATUS_BAD_TYPE, receive(8, 0x00000001, &binder)) << "undeclared";
    EXPECT_EQ(STATUS_BAD_TYPE, receive(8, 0x01000001, &binder)) << "no level";
    EXPECT_EQ(STATUS_OK, receive(8, 0x03000001, &binder));
    ndk::SpAIBinder other;
    EXPECT_EQ(STATUS_BAD_TYPE, receive(8, 0x0c000001, &other)) << "another word for the same proxy";
    EXPECT_EQ(STATUS_BAD_TYPE, receive(8, 0x03000002, &other));
    EXPECT_EQ(STATUS_OK, receive(8, 0x03000001, &other));

    mKernel.deliver(Buffer({0x73682a85, 0x113, 9, 0, 0, 0}, {0}), mParcel.get());
    AIBinder* read = nullptr;
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA, AParcel_readStrongBinder(mParcel.get(), &read));
    EXPECT_EQ(nullptr, read);
}

TEST_F(RemoteBinder, ObjectsThatAreNoneAreBadType) {
    const std::pair<std::vector<uint32_t>, std::vector<binder_size_t>> cases[] = {
            {{}, {}},
            {{0x73682a85, 0x113, 5, 0, 0}, {}},                   // cut off
            {{0x73682a85, 0x113, 5, 0, 0, 0, kSystemLevel}, {}},  // not listed
            {{0x73682a85, 0x113, 0, 0, 0, 0, kSystemLevel}, {}},  // handle 0, not listed
            {{0x73622a85, 0x113, 1, 0, 0, 0, kSystemLevel}, {}},
            {{0x73622a85, 0x113, 0, 0, 1, 0, kSystemLevel}, {}},
            {{0x66642a85, 0x113, 0xffffffff, 0, 0, 0, kSystemLevel}, {0}},  // a descriptor
            {{0x73622a85, 0x113, 0, 0, 0, 0, kSystemLevel}, {}},            // null with a level
    };
    for (const auto& [dataWords, offsets] : cases) {
        mKernel.deliver(Buffer(dataWords, offsets), mParcel.get());
        AIBinder* read = nullptr;
        EXPECT_EQ(STATUS_BAD_TYPE, AParcel_readStrongBinder(mParcel.get(), &read));
        EXPECT_EQ(nullptr, read);
    }
    EXPECT_THAT(mKernel.commands, IsEmpty());
}

TEST_F(RemoteBinder, AssociationAsksOnceAndComparesTheDescriptor) {
    const auto binder = proxy(10);
    mKernel.answer = [](const SentTransaction&, Buffer* reply) {
        *reply = Buffer(kDescriptorReply);
        return STATUS_OK;
    };
    AIBinder_Class* const right = defineClass("abc");
    EXPECT_FALSE(AIBinder_associateClass(binder.get(), defineClass("abd")));
    EXPECT_EQ(nullptr, AIBinder_getClass(binder.get()));
    EXPECT_TRUE(AIBinder_associateClass(binder.get(), right));
    EXPECT_TRUE(AIBinder_associateClass(binder.get(), right));
    EXPECT_FALSE(AIBinder_associateClass(binder.get(), defineClass("abc")));
    ASSERT_EQ(1U, mKernel.sent.size());
    EXPECT_EQ(0x5f4e5446U, mKernel.sent[0].code);
    EXPECT_THAT(mKernel.sent[0].words, IsEmpty());
}

TEST_F(RemoteBinder, AssociationInAServedCallAsksNobody) {
    const auto binder = proxy(13);
    binder_ndk::CallContext& context = binder_ndk::CallContext::current();
    const binder_ndk::CallContext outside = context;
    context = {4711, 10123};
    AIBinder_Class* const clazz = defineClass("abc");
    EXPECT_TRUE(AIBinder_associateClass(binder.get(), clazz));
    EXPECT_FALSE(AIBinder_associateClass(binder.get(), defineClass("abd")));
    context = outside;
    EXPECT_EQ(clazz, AIBinder_getClass(binder.get()));
    EXPECT_THAT(mKernel.sent, IsEmpty());
}

TEST_F(RemoteBinder, AssociationWithADeadObjectFails) {
    const auto binder = proxy(11);
    mKernel.answer = [](const SentTransaction&, Buffer*) { return STATUS_DEAD_OBJECT; };
    EXPECT_FALSE(AIBinder_associateClass(binder.get(), defineClass("abc")));
    EXPECT_FALSE(AIBinder_isAlive(binder.get()));
}

TEST_F(RemoteBinder, TransactionNeedsAClass) {
    AParcel* in = nullptr;
    EXPECT_EQ(STATUS_INVALID_OPERATION, AIBinder_prepareTransaction(proxy(13).get(), &in));
    EXPECT_EQ(nullptr, in);
}

TEST_F(RemoteBinder, TransactionGoesOutWithItsFlags) {
    const auto binder = associated(14);
    EXPECT_EQ(STATUS_OK, transact(binder.get()));
    EXPECT_EQ(STATUS_OK, transact(binder.get(), FLAG_ONEWAY));
    EXPECT_EQ(STATUS_OK, transact(binder.get(), FLAG_CLEAR_BUF));
    ASSERT_EQ(3U, mKernel.sent.size());
    EXPECT_EQ(14U, mKernel.sent[0].handle);
    EXPECT_EQ(7U, mKernel.sent[0].code);
    EXPECT_EQ(0U, mKernel.sent[0].flags);
    EXPECT_EQ(0x01U, mKernel.sent[1].flags);
    EXPECT_EQ(0x20U, mKernel.sent[2].flags);
    EXPECT_THAT(mKernel.sent[0].words,
                ElementsAre(0x80000000U, 0xffffffffU, 0x53595354U, 3U, 0x00620061U, 0x00000063U));
}

TEST_F(RemoteBinder, PrivateFlagDecidesTheLevelAndStaysHere) {
    const auto vendor = associated(15, 0x03000001);
    const auto system = associated(16, 0x0c000001);
    const auto vintf = associated(17, 0x3f000001);
    EXPECT_EQ(STATUS_BAD_TYPE, transact(vendor.get()));
    EXPECT_EQ(STATUS_BAD_TYPE, transact(system.get(), FLAG_PRIVATE_VENDOR));
    EXPECT_THAT(mKernel.sent, IsEmpty());
    EXPECT_EQ(STATUS_OK, transact(vendor.get(), FLAG_PRIVATE_VENDOR));
    EXPECT_EQ(STATUS_OK, transact(system.get()));
    EXPECT_EQ(STATUS_OK, transact(vintf.get()));
    EXPECT_EQ(STATUS_OK, transact(vintf.get(), FLAG_PRIVATE_VENDOR));
    for (const SentTransaction& sent : mKernel.sent) EXPECT_EQ(0U, sent.flags);
    EXPECT_EQ(STATUS_OK, AIBinder_ping(vendor.get())) << "reserved codes are not checked";
}

TEST_F(RemoteBinder, DeadObjectStaysDeadWithoutTraffic) {
    const auto binder = associated(18);
    mKernel.answer = [](const SentTransaction&, Buffer*) { return STATUS_DEAD_OBJECT; };
    EXPECT_EQ(STATUS_DEAD_OBJECT, transact(binder.get()));
    EXPECT_FALSE(AIBinder_isAlive(binder.get()));
    mKernel.sent.clear();
    EXPECT_EQ(STATUS_DEAD_OBJECT, transact(binder.get()));
    EXPECT_EQ(STATUS_DEAD_OBJECT, AIBinder_ping(binder.get()));
    EXPECT_THAT(mKernel.sent, IsEmpty());
}

TEST_F(RemoteBinder, OtherFailuresDoNotKill) {
    const auto binder = associated(19);
    mKernel.answer = [](const SentTransaction&, Buffer*) { return STATUS_FAILED_TRANSACTION; };
    EXPECT_EQ(STATUS_FAILED_TRANSACTION, transact(binder.get()));
    mKernel.answer = [](const SentTransaction&, Buffer*) -> binder_status_t { return -71; };
    EXPECT_EQ(STATUS_UNKNOWN_ERROR, transact(binder.get()));
    EXPECT_TRUE(AIBinder_isAlive(binder.get()));
}

TEST_F(RemoteBinder, ExtensionIsAskedForEachTime) {
    const auto binder = proxy(20);
    mKernel.answer = [](const SentTransaction& sent, Buffer* reply) {
        EXPECT_EQ(0x5f455854U, sent.code);
        *reply = Buffer({0x73682a85, 0x113, 21, 0, 0, 0, kSystemLevel}, {0});
        return STATUS_OK;
    };
    ndk::SpAIBinder one;
    ndk::SpAIBinder two;
    EXPECT_EQ(STATUS_OK, AIBinder_getExtension(binder.get(), one.getR()));
    EXPECT_EQ(STATUS_OK, AIBinder_getExtension(binder.get(), two.getR()));
    EXPECT_EQ(one.get(), two.get());
    EXPECT_EQ(2U, mKernel.sent.size());
    EXPECT_EQ(STATUS_INVALID_OPERATION, AIBinder_setExtension(binder.get(), one.get()));
}

TEST_F(RemoteBinder, AppendedProxyIsReferredTo) {
    const ndk::ScopedAParcel to(AParcel_create());
    mKernel.deliver(Buffer({1, 0x73682a85, 0x113, 22, 0, 0, 0, kSystemLevel}, {4}), mParcel.get());
    EXPECT_EQ(STATUS_OK, AParcel_appendFrom(mParcel.get(), to.get(), 0, 32));
    AParcel_reset(mParcel.get());
    EXPECT_THAT(mKernel.commands, ElementsAre("acquire 22"));
    AParcel_reset(to.get());
    EXPECT_THAT(mKernel.commands, ElementsAre("acquire 22", "release 22"));
}

class DeathLinks : public RemoteBinder {
  protected:
    binder_status_t link(AIBinder* binder, int* told) {
        return AIBinder_linkToDeath(binder, mRecipient.get(), told);
    }
    binder_status_t unlink(AIBinder* binder, int* told) {
        return AIBinder_unlinkToDeath(binder, mRecipient.get(), told);
    }

    ndk::ScopedAIBinder_DeathRecipient mRecipient{
            AIBinder_DeathRecipient_new([](void* told) { ++*static_cast<int*>(told); })};
    int mTold = 0;
    int mOther = 0;
};

TEST_F(DeathLinks, AreAskedForOnceForEachProxy) {
    const auto binder = proxy(30);
    EXPECT_EQ(STATUS_OK, link(binder.get(), &mTold));
    EXPECT_EQ(STATUS_OK, link(binder.get(), &mTold));
    EXPECT_EQ(STATUS_OK, link(binder.get(), &mOther));
    EXPECT_EQ(STATUS_OK, unlink(binder.get(), &mTold));
    EXPECT_EQ(STATUS_OK, unlink(binder.get(), &mTold));
    EXPECT_EQ(STATUS_NAME_NOT_FOUND, unlink(binder.get(), &mTold));
    EXPECT_THAT(mKernel.commands, ElementsAre("acquire 30", "request 30"));
    EXPECT_EQ(STATUS_OK, unlink(binder.get(), &mOther));
    EXPECT_THAT(mKernel.commands, ElementsAre("acquire 30", "request 30", "clear 30"));
    EXPECT_EQ(STATUS_NAME_NOT_FOUND, unlink(binder.get(), &mOther));
}

TEST_F(DeathLinks, FireOnceEach) {
    const auto binder = proxy(31);
    link(binder.get(), &mTold);
    link(binder.get(), &mTold);
    link(binder.get(), &mOther);
    binder_ndk::handleDeathNotice(mKernel.deathCookie);
    EXPECT_EQ(2, mTold);
    EXPECT_EQ(1, mOther);
    EXPECT_FALSE(AIBinder_isAlive(binder.get()));
    EXPECT_THAT(mKernel.commands, ElementsAre("acquire 31", "request 31", "clear 31"));
    binder_ndk::handleDeathNotice(mKernel.deathCookie);
    EXPECT_EQ(2, mTold);
    EXPECT_EQ(STATUS_DEAD_OBJECT, link(binder.get(), &mTold));
    EXPECT_EQ(STATUS_NAME_NOT_FOUND, unlink(binder.get(), &mTold));
}

TEST_F(DeathLinks, VanishWithTheProxyBeforeItsRelease) {
    auto binder = proxy(32);
    link(binder.get(), &mTold);
    binder.set(nullptr);
    EXPECT_THAT(mKernel.commands,
                ElementsAre("acquire 32", "request 32", "clear 32", "release 32"));
    binder_ndk::handleDeathNotice(mKernel.deathCookie);
    EXPECT_EQ(0, mTold);
}

TEST_F(DeathLinks, VanishWithTheRecipient) {
    const auto binder = proxy(33);
    const ndk::ScopedAIBinder_DeathRecipient other(
            AIBinder_DeathRecipient_new([](void* told) { ++*static_cast<int*>(told); }));
    link(binder.get(), &mTold);
    AIBinder_linkToDeath(binder.get(), other.get(), &mOther);
    mRecipient.set(nullptr);
    binder_ndk::handleDeathNotice(mKernel.deathCookie);
    EXPECT_EQ(0, mTold);
    EXPECT_EQ(1, mOther);
}

TEST_F(DeathLinks, MayBeMadeOnAProxyThatOnlyFailed) {
    const auto binder = proxy(34);
    mKernel.answer = [](const SentTransaction&, Buffer*) { return STATUS_DEAD_OBJECT; };
    EXPECT_EQ(STATUS_DEAD_OBJECT, AIBinder_ping(binder.get()));
    EXPECT_EQ(STATUS_OK, link(binder.get(), &mTold));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_linkToDeath(binder.get(), nullptr, nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_unlinkToDeath(binder.get(), nullptr, nullptr));
}

TEST_F(DeathLinks, CallbackMayDropTheProxy) {
    static ndk::SpAIBinder* held = nullptr;
    auto binder = proxy(35);
    held = &binder;
    const ndk::ScopedAIBinder_DeathRecipient dropper(
            AIBinder_DeathRecipient_new([](void*) { held->set(nullptr); }));
    AIBinder_linkToDeath(binder.get(), dropper.get(), nullptr);
    binder_ndk::handleDeathNotice(mKernel.deathCookie);
    EXPECT_EQ(nullptr, binder.get());
    EXPECT_THAT(mKernel.commands,
                ElementsAre("acquire 35", "request 35", "clear 35", "release 35"));
}

}  // namespace
}  // namespace binder_test
