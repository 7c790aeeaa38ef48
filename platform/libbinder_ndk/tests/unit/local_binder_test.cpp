// SPDX-License-Identifier: Apache-2.0
//
// Local objects, without any driver: classes, references, transactions, what they answer.
#include <unistd.h>

#include <android/binder_auto_utils.h>
#include <android/binder_ibinder_platform.h>
#include <android/binder_parcel_utils.h>
#include <android/binder_shell.h>
#include <android/binder_stability.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/libbinder_ndk/platform_include/binder_context_manager.h"
#include "platform/libbinder_ndk/src/binder.h"
#include "platform/libbinder_ndk/src/call_context.h"
#include "platform/libbinder_ndk/tests/unit/fake_kernel.h"

namespace binder_test {
namespace {

using testing::ElementsAre;

struct State {
    int created = 0;
    int destroyed = 0;
    int calls = 0;
    std::vector<std::string> arguments;
    binder_status_t answer = STATUS_OK;
};

void* onCreate(void* args) {
    ++static_cast<State*>(args)->created;
    return args;
}

void onDestroy(void* state) {
    ++static_cast<State*>(state)->destroyed;
}

State& stateOf(AIBinder* binder) {
    return *static_cast<State*>(AIBinder_getUserData(binder));
}

binder_status_t onTransact(AIBinder* binder, transaction_code_t code, const AParcel* in,
                           AParcel* out) {
    ++stateOf(binder).calls;
    int32_t number = 0;
    if (const auto status = AParcel_readInt32(in, &number); status != STATUS_OK) return status;
    AParcel_writeInt32(out, number + static_cast<int32_t>(code));
    return stateOf(binder).answer;
}

binder_status_t keepArguments(AIBinder* binder, const char** args, uint32_t count) {
    stateOf(binder).arguments.assign(args, args + count);
    return stateOf(binder).answer;
}

AIBinder_Class* defineClass(const char* descriptor = "test.ILocal") {
    return AIBinder_Class_define(descriptor, onCreate, onDestroy, onTransact);
}

class LocalBinder : public testing::Test {
  protected:
    ~LocalBinder() override { binder_ndk::CallContext::current() = {}; }

    // A raw transaction as the driver would deliver it.
    binder_status_t deliver(uint32_t code, const std::vector<uint32_t>& request = {},
                            std::vector<binder_size_t> offsets = {}) {
        binder_ndk::Parcel in;
        binder_ndk::Parcel out;
        mKernel.deliver(Buffer(request, std::move(offsets)), &in);
        const auto status = mBinder->transact(code, in, &out, 0);
        mReply = words(out);
        return status;
    }

    FakeKernel mKernel;
    State mState;
    AIBinder_Class* const mClass = defineClass();
    ndk::SpAIBinder mOwner{AIBinder_new(mClass, &mState)};
    AIBinder* const mBinder = mOwner.get();
    std::vector<uint32_t> mReply;
};

// "test.ILocal": 11 units.
const std::vector<uint32_t> kToken = {0x80000000, 0xffffffff, 0x53595354, 11,         0x00650074,
                                      0x00740073, 0x0049002e, 0x006f004c, 0x00610063, 0x0000006c};

std::vector<uint32_t> withToken(std::vector<uint32_t> arguments) {
    auto request = kToken;
    request.insert(request.end(), arguments.begin(), arguments.end());
    return request;
}

TEST(Classes, NullArgumentsDefineNothing) {
    EXPECT_EQ(nullptr, AIBinder_Class_define(nullptr, onCreate, onDestroy, onTransact));
    EXPECT_EQ(nullptr, AIBinder_Class_define("x", nullptr, onDestroy, onTransact));
    EXPECT_EQ(nullptr, AIBinder_Class_define("x", onCreate, nullptr, onTransact));
    EXPECT_EQ(nullptr, AIBinder_Class_define("x", onCreate, onDestroy, nullptr));
    EXPECT_EQ(nullptr, AIBinder_new(nullptr, nullptr));
}

TEST(Classes, SameTextIsAnotherClass) {
    const std::string text = "test.ISame";
    const AIBinder_Class* const one = defineClass(text.c_str());
    const AIBinder_Class* const two = defineClass("test.ISame");
    EXPECT_NE(one, two);
    EXPECT_STREQ("test.ISame", AIBinder_Class_getDescriptor(one));
    EXPECT_NE(text.c_str(), AIBinder_Class_getDescriptor(one));
}

TEST(ClassesDeathTest, NullClassAborts) {
    EXPECT_DEATH(AIBinder_Class_setOnDump(nullptr, nullptr), "class is null");
    EXPECT_DEATH(AIBinder_Class_setHandleShellCommand(nullptr, nullptr), "class is null");
    EXPECT_DEATH(AIBinder_Class_getDescriptor(nullptr), "class is null");
}

TEST_F(LocalBinder, UserDataLivesFromNewToTheLastReference) {
    EXPECT_EQ(1, mState.created);
    EXPECT_EQ(&mState, AIBinder_getUserData(mBinder));
    EXPECT_EQ(1, AIBinder_debugGetRefCount(mBinder));
    AIBinder_incStrong(mBinder);
    EXPECT_EQ(2, AIBinder_debugGetRefCount(mBinder));
    AIBinder_decStrong(mBinder);
    EXPECT_EQ(0, mState.destroyed);
    mOwner.set(nullptr);
    EXPECT_EQ(1, mState.destroyed);
}

TEST_F(LocalBinder, IsAliveAndNotRemote) {
    EXPECT_FALSE(AIBinder_isRemote(mBinder));
    EXPECT_TRUE(AIBinder_isAlive(mBinder));
    EXPECT_EQ(STATUS_OK, AIBinder_ping(mBinder));
    EXPECT_EQ(mClass, AIBinder_getClass(mBinder));
}

TEST(NullBinder, IsAnsweredAsTheInterfaceSays) {
    AIBinder* extension = nullptr;
    EXPECT_FALSE(AIBinder_isRemote(nullptr));
    EXPECT_FALSE(AIBinder_isAlive(nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_ping(nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_dump(nullptr, -1, nullptr, 0));
    EXPECT_EQ(-1, AIBinder_debugGetRefCount(nullptr));
    EXPECT_FALSE(AIBinder_associateClass(nullptr, defineClass()));
    EXPECT_EQ(nullptr, AIBinder_getClass(nullptr));
    EXPECT_EQ(nullptr, AIBinder_getUserData(nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_getExtension(nullptr, &extension));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_setExtension(nullptr, nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_linkToDeath(nullptr, nullptr, nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_unlinkToDeath(nullptr, nullptr, nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_prepareTransaction(nullptr, nullptr));
    EXPECT_EQ(nullptr, AIBinder_Weak_new(nullptr));
    EXPECT_EQ(nullptr, AIBinder_Weak_promote(nullptr));
    EXPECT_EQ(nullptr, AIBinder_Weak_clone(nullptr));
    AIBinder_Weak_delete(nullptr);
    AIBinder_incStrong(nullptr);
    AIBinder_decStrong(nullptr);
}

TEST_F(LocalBinder, AssociationNeedsTheVeryClass) {
    EXPECT_TRUE(AIBinder_associateClass(mBinder, mClass));
    EXPECT_FALSE(AIBinder_associateClass(mBinder, defineClass()));
    EXPECT_FALSE(AIBinder_associateClass(mBinder, defineClass("test.IOther")));
    EXPECT_FALSE(AIBinder_associateClass(mBinder, nullptr));
    EXPECT_EQ(mClass, AIBinder_getClass(mBinder));
}

TEST_F(LocalBinder, WeakReferencePromotesWhileTheObjectLives) {
    ndk::ScopedAIBinder_Weak weak(AIBinder_Weak_new(mBinder));
    ndk::ScopedAIBinder_Weak clone(AIBinder_Weak_clone(weak.get()));
    EXPECT_EQ(mBinder, weak.promote().get());
    EXPECT_EQ(1, AIBinder_debugGetRefCount(mBinder));
    mOwner.set(nullptr);
    EXPECT_EQ(1, mState.destroyed);
    EXPECT_EQ(nullptr, weak.promote().get());
    EXPECT_EQ(nullptr, clone.promote().get());
}

TEST_F(LocalBinder, OrdersPutNullFirst) {
    const ndk::SpAIBinder other(AIBinder_new(mClass, &mState));
    EXPECT_TRUE(AIBinder_lt(nullptr, mBinder));
    EXPECT_FALSE(AIBinder_lt(mBinder, nullptr));
    EXPECT_FALSE(AIBinder_lt(nullptr, nullptr));
    EXPECT_FALSE(AIBinder_lt(mBinder, mBinder));
    EXPECT_NE(AIBinder_lt(mBinder, other.get()), AIBinder_lt(other.get(), mBinder));

    const ndk::ScopedAIBinder_Weak one(AIBinder_Weak_new(mBinder));
    const ndk::ScopedAIBinder_Weak same(AIBinder_Weak_new(mBinder));
    const ndk::ScopedAIBinder_Weak two(AIBinder_Weak_new(other.get()));
    EXPECT_TRUE(AIBinder_Weak_lt(nullptr, one.get()));
    EXPECT_FALSE(AIBinder_Weak_lt(one.get(), nullptr));
    EXPECT_FALSE(AIBinder_Weak_lt(nullptr, nullptr));
    EXPECT_FALSE(AIBinder_Weak_lt(one.get(), same.get()));
    EXPECT_FALSE(AIBinder_Weak_lt(same.get(), one.get()));
    EXPECT_EQ(AIBinder_lt(mBinder, other.get()), AIBinder_Weak_lt(one.get(), two.get()));
}

TEST_F(LocalBinder, ExtensionIsHeldAndReplaced) {
    State extensionState;
    State laterState;
    ndk::SpAIBinder extension(AIBinder_new(mClass, &extensionState));
    ndk::SpAIBinder later(AIBinder_new(mClass, &laterState));
    AIBinder* found = mBinder;
    EXPECT_EQ(STATUS_OK, AIBinder_getExtension(mBinder, &found));
    EXPECT_EQ(nullptr, found);
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_setExtension(mBinder, nullptr));

    EXPECT_EQ(STATUS_OK, AIBinder_setExtension(mBinder, extension.get()));
    EXPECT_EQ(STATUS_OK, AIBinder_getExtension(mBinder, &found));
    EXPECT_EQ(extension.get(), found);
    EXPECT_EQ(3, AIBinder_debugGetRefCount(found));
    AIBinder_decStrong(found);
    extension.set(nullptr);
    EXPECT_EQ(0, extensionState.destroyed);

    EXPECT_EQ(STATUS_OK, AIBinder_setExtension(mBinder, later.get()));
    EXPECT_EQ(1, extensionState.destroyed);
    mOwner.set(nullptr);
    later.set(nullptr);
    EXPECT_EQ(1, laterState.destroyed);
}

TEST_F(LocalBinder, DeathLinksAreForProxies) {
    const ndk::ScopedAIBinder_DeathRecipient recipient(AIBinder_DeathRecipient_new([](void*) {}));
    EXPECT_EQ(STATUS_INVALID_OPERATION, AIBinder_linkToDeath(mBinder, recipient.get(), nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_linkToDeath(mBinder, nullptr, nullptr));
    EXPECT_EQ(nullptr, AIBinder_DeathRecipient_new(nullptr));
    AIBinder_DeathRecipient_delete(nullptr);
}

TEST_F(LocalBinder, RequestStartsWithTheInterfaceToken) {
    AParcel* in = nullptr;
    ASSERT_EQ(STATUS_OK, AIBinder_prepareTransaction(mBinder, &in));
    EXPECT_EQ(kToken, words(in));
    AParcel_delete(in);
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_prepareTransaction(mBinder, nullptr));
}

TEST(InterfaceToken, SizesOfThePlatformsInterfaces) {
    const std::pair<const char*, int32_t> cases[] = {
            {"android.hardware.vibrator.IVibrator", 88},
            {"android.hardware.vibrator.IVibratorCallback", 104},
            {"android.os.IServiceManager", 72},
    };
    for (const auto& [descriptor, size] : cases) {
        State state;
        const ndk::SpAIBinder binder(AIBinder_new(defineClass(descriptor), &state));
        AParcel* in = nullptr;
        ASSERT_EQ(STATUS_OK, AIBinder_prepareTransaction(binder.get(), &in));
        EXPECT_EQ(size, AParcel_getDataSize(in)) << descriptor;
        AParcel_delete(in);
    }
}

TEST_F(LocalBinder, TransactionIsAPlainCall) {
    AParcel* in = nullptr;
    ndk::ScopedAParcel out;
    AIBinder_prepareTransaction(mBinder, &in);
    AParcel_writeInt32(in, 40);
    EXPECT_EQ(STATUS_OK, AIBinder_transact(mBinder, 2, &in, out.getR(), FLAG_ONEWAY));
    EXPECT_EQ(nullptr, in);
    int32_t number = 0;
    EXPECT_EQ(STATUS_OK, AParcel_readInt32(out.get(), &number));
    EXPECT_EQ(42, number);
    EXPECT_TRUE(mKernel.sent.empty());
}

TEST_F(LocalBinder, FailedTransactionHasNoReply) {
    AParcel* in = nullptr;
    AParcel* out = nullptr;
    AIBinder_prepareTransaction(mBinder, &in);
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA, AIBinder_transact(mBinder, 2, &in, &out, 0));
    EXPECT_EQ(nullptr, in);
    EXPECT_EQ(nullptr, out);
}

TEST_F(LocalBinder, TransactChecksInOrder) {
    const ndk::SpAIBinder other(AIBinder_new(mClass, &mState));
    AParcel* out = nullptr;
    const auto prepared = [&] {
        AParcel* in = nullptr;
        EXPECT_EQ(STATUS_OK, AIBinder_prepareTransaction(other.get(), &in));
        return in;
    };
    const auto transact = [&](AIBinder* binder, transaction_code_t code, AParcel* in,
                              AParcel** reply, binder_flags_t flags) {
        const auto status = AIBinder_transact(binder, code, &in, reply, flags);
        EXPECT_EQ(nullptr, in) << "the request is consumed whatever happens";
        return status;
    };
    constexpr transaction_code_t kReserved = 0x5f504e47;
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_transact(nullptr, kReserved, nullptr, nullptr, 2));
    EXPECT_EQ(STATUS_UNKNOWN_TRANSACTION, transact(nullptr, kReserved, prepared(), nullptr, 2));
    EXPECT_EQ(STATUS_UNKNOWN_TRANSACTION, transact(mBinder, 0, prepared(), &out, 0));
    EXPECT_EQ(STATUS_UNKNOWN_TRANSACTION, transact(mBinder, 0x01000000, prepared(), &out, 0));
    EXPECT_EQ(STATUS_BAD_VALUE, transact(nullptr, 1, prepared(), nullptr, 0x02));
    EXPECT_EQ(STATUS_BAD_VALUE, transact(nullptr, 1, prepared(), nullptr, 0x10));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, transact(nullptr, 1, prepared(), &out, 0));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, transact(mBinder, 1, nullptr, &out, 0));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, transact(mBinder, 1, prepared(), nullptr, 0));
    EXPECT_EQ(STATUS_BAD_VALUE, transact(mBinder, 1, prepared(), &out, 0))
            << "prepared for another binder";
    EXPECT_EQ(STATUS_BAD_VALUE, transact(mBinder, 1, AParcel_create(), &out, 0));
    EXPECT_EQ(0, mState.calls);
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA,
              transact(other.get(), 0x00ffffff, prepared(), &out, 0x10000021))
            << "delivered: all flags allowed";
    EXPECT_EQ(1, mState.calls);
}

TEST_F(LocalBinder, UserCodesNeedTheRightToken) {
    EXPECT_EQ(STATUS_OK, deliver(5, withToken({1})));
    EXPECT_THAT(mReply, ElementsAre(6U));
    EXPECT_EQ(STATUS_BAD_TYPE, deliver(5, {}));
    EXPECT_EQ(STATUS_BAD_TYPE, deliver(5, {0x80000000, 0xffffffff, 0x53595354}));
    auto vendor = withToken({1});
    vendor[2] = 0x564e4452;
    EXPECT_EQ(STATUS_BAD_TYPE, deliver(5, vendor));
    auto other = withToken({1});
    other[8] = 0x00610064;
    EXPECT_EQ(STATUS_BAD_TYPE, deliver(5, other));
    EXPECT_EQ(1, mState.calls);
}

TEST_F(LocalBinder, StatusesWithoutANameAreReplaced) {
    mState.answer = -5;
    EXPECT_EQ(STATUS_UNKNOWN_ERROR, deliver(1, withToken({1})));
    mState.answer = STATUS_TIMED_OUT;
    EXPECT_EQ(STATUS_TIMED_OUT, deliver(1, withToken({1})));
}

TEST_F(LocalBinder, ReservedCodesAreAnsweredWithoutAToken) {
    EXPECT_EQ(STATUS_OK, deliver(0x5f504e47));
    EXPECT_THAT(mReply, ElementsAre());
    EXPECT_EQ(STATUS_OK, deliver(0x5f455854));
    EXPECT_THAT(mReply, ElementsAre(0x73622a85U, 0x113U, 0U, 0U, 0U, 0U, 1U));
    EXPECT_EQ(STATUS_OK, deliver(0x5f504944));
    EXPECT_THAT(mReply, ElementsAre(static_cast<uint32_t>(getpid())));
    EXPECT_EQ(STATUS_OK, deliver(0x5f4e5446));
    EXPECT_THAT(mReply, ElementsAre(11U, 0x00650074U, 0x00740073U, 0x0049002eU, 0x006f004cU,
                                    0x00610063U, 0x0000006cU));
    EXPECT_EQ(STATUS_OK, deliver(0x5f535052, {1, 2, 3}));
    EXPECT_THAT(mReply, ElementsAre());
    for (const uint32_t code : {0U, 0x01000000U, 0x5f545754U, 0x5f4c494bU, 0xffffffffU})
        EXPECT_EQ(STATUS_UNKNOWN_TRANSACTION, deliver(code));
    EXPECT_EQ(0, mState.calls);
}

TEST_F(LocalBinder, SentObjectCarriesKeyCookieAndSystemStability) {
    const ndk::ScopedAParcel parcel(AParcel_create());
    EXPECT_EQ(STATUS_OK, AParcel_writeStrongBinder(parcel.get(), mBinder));
    EXPECT_EQ(2, AIBinder_debugGetRefCount(mBinder)) << "the parcel holds it";
    const auto all = words(parcel.get());
    ASSERT_EQ(7U, all.size());
    EXPECT_EQ(0x73622a85U, all[0]);
    EXPECT_EQ(0x113U, all[1]);
    EXPECT_NE(0U, all[2] | all[3]);
    EXPECT_EQ(reinterpret_cast<uint64_t>(mBinder), all[4] | uint64_t{all[5]} << 32);
    EXPECT_EQ(0x0c000001U, all[6]);
    EXPECT_EQ(0U, (*parcel.get())->offsets()[0]);

    ndk::SpAIBinder read;
    AParcel_setDataPosition(parcel.get(), 0);
    EXPECT_EQ(STATUS_OK, AParcel_readStrongBinder(parcel.get(), read.getR()));
    EXPECT_EQ(mBinder, read.get());
    AParcel_reset(parcel.get());
    EXPECT_EQ(2, AIBinder_debugGetRefCount(mBinder));
}

TEST_F(LocalBinder, RequestingTheCallersContextShowsInTheFlags) {
    AIBinder_setRequestingSid(mBinder, true);
    const ndk::ScopedAParcel parcel(AParcel_create());
    AParcel_writeStrongBinder(parcel.get(), mBinder);
    EXPECT_EQ(0x1113U, words(parcel.get())[1]);
}

TEST_F(LocalBinder, AppendingAnObjectTakesAReference) {
    const ndk::ScopedAParcel from(AParcel_create());
    ndk::ScopedAParcel to(AParcel_create());
    AParcel_writeStrongBinder(from.get(), mBinder);
    EXPECT_EQ(STATUS_OK, AParcel_appendFrom(from.get(), to.get(), 0, 28));
    EXPECT_EQ(3, AIBinder_debugGetRefCount(mBinder));
    EXPECT_EQ(words(from.get()), words(to.get()));
    to.set(nullptr);
    EXPECT_EQ(2, AIBinder_debugGetRefCount(mBinder));

    to.set(AParcel_create());
    EXPECT_EQ(STATUS_OK, AParcel_appendFrom(from.get(), to.get(), 0, 20));
    EXPECT_EQ(0U, (*to.get())->offsetCount()) << "a part of an object is plain data";
    EXPECT_EQ(2, AIBinder_debugGetRefCount(mBinder));
}

TEST_F(LocalBinder, StabilityMarks) {
    const auto word = [](AIBinder* binder) {
        const ndk::ScopedAParcel parcel(AParcel_create());
        AParcel_writeStrongBinder(parcel.get(), binder);
        return words(parcel.get())[6];
    };
    State state;
    const ndk::SpAIBinder vendor(AIBinder_new(mClass, &state));
    const ndk::SpAIBinder vintf(AIBinder_new(mClass, &state));
    AIBinder_markVendorStability(vendor.get());
    AIBinder_markVendorStability(vendor.get());
    AIBinder_markVintfStability(vintf.get());
    AIBinder_markCompilationUnitStability(mBinder);
    EXPECT_EQ(0x03000001U, word(vendor.get()));
    EXPECT_EQ(0x3f000001U, word(vintf.get()));
    EXPECT_EQ(0x0c000001U, word(mBinder));
    EXPECT_TRUE(AIBinder_requiresVintfDeclaration(vintf.get()));
    EXPECT_FALSE(AIBinder_requiresVintfDeclaration(vendor.get()));
    EXPECT_FALSE(AIBinder_requiresVintfDeclaration(nullptr));
    AIBinder_forceDowngradeToVendorStability(vintf.get());
    EXPECT_EQ(0x03000001U, word(vintf.get()));
}

TEST_F(LocalBinder, AnotherStabilityMarkAborts) {
    AIBinder_markVintfStability(mBinder);
    EXPECT_DEATH(AIBinder_markVendorStability(mBinder), "cannot be marked");
    EXPECT_DEATH(AIBinder_markSystemStability(nullptr), "local binder");
}

TEST_F(LocalBinder, CallerIsThisProcessOutsideTransactions) {
    EXPECT_EQ(getuid(), AIBinder_getCallingUid());
    EXPECT_EQ(getpid(), AIBinder_getCallingPid());
    EXPECT_EQ(nullptr, AIBinder_getCallingSid());
}

TEST_F(LocalBinder, DumpWithoutAFunctionIsOk) {
    EXPECT_EQ(STATUS_OK, AIBinder_dump(mBinder, -1, nullptr, 0));
    EXPECT_EQ(STATUS_OK, deliver(0x5f444d50));
}

TEST_F(LocalBinder, DumpGetsTheArgumentsThatAreThere) {
    AIBinder_Class_setOnDump(mClass, [](AIBinder* binder, int, const char** args, uint32_t count) {
        return keepArguments(binder, args, count);
    });
    const char* args[] = {"one", "two"};
    EXPECT_EQ(STATUS_OK, AIBinder_dump(mBinder, 1, args, 2));
    EXPECT_THAT(mState.arguments, ElementsAre("one", "two"));

    // Ten announced, two sent, the second null.
    EXPECT_EQ(STATUS_OK, deliver(0x5f444d50,
                                 {0x66642a85, 0x17f, 0xffffffff, 0, 0, 0, 10,  //
                                  1, 0x00000061, 0xffffffff},
                                 {0}));
    EXPECT_THAT(mState.arguments, ElementsAre("a", ""));
    EXPECT_EQ(STATUS_OK,
              deliver(0x5f444d50, {0x66642a85, 0x17f, 0xffffffff, 0, 0, 0, 0x7fffffff}, {0}));
    EXPECT_THAT(mState.arguments, ElementsAre());
    mState.answer = STATUS_BAD_VALUE;
    EXPECT_EQ(STATUS_BAD_VALUE, deliver(0x5f444d50));
}

TEST_F(LocalBinder, DumpsResultIsAnsweredAsItIs) {
    AIBinder_Class_setOnDump(mClass, [](AIBinder* binder, int, const char** args, uint32_t count) {
        return keepArguments(binder, args, count);
    });
    for (const binder_status_t result : {5, -4444}) {
        mState.answer = result;
        EXPECT_EQ(result, deliver(0x5f444d50));
    }
}

class ShellCommand : public LocalBinder {
  protected:
    // Three descriptors, no arguments, no shell callback, a result receiver on handle 9.
    binder_status_t command(uid_t uid, uint32_t type = 0x66642a85) {
        std::vector<uint32_t> request;
        const auto object = [&](uint32_t objectType, uint32_t handle) {
            request.insert(request.end(), {objectType, 0x17f, handle, 0, 0, 0});
        };
        for (int i = 0; i < 3; ++i) object(type, 0x7ffffff0);
        request.push_back(0);
        object(0x73622a85, 0);
        request.push_back(1);
        object(0x73682a85, 9);
        request.push_back(0x0c000001);
        binder_ndk::CallContext::current().uid = uid;
        const std::vector<binder_size_t> offsets =
                type == 0x66642a85 ? std::vector<binder_size_t>{0, 24, 48, 104}
                                   : std::vector<binder_size_t>{104};
        return deliver(0x5f434d44, request, offsets);
    }

    // What was sent to the receiver: its token, then the result.
    uint32_t result() {
        EXPECT_EQ(1U, mKernel.sent.size());
        const SentTransaction& sent = mKernel.sent.at(0);
        EXPECT_EQ(9U, sent.handle);
        EXPECT_EQ(1U, sent.code);
        EXPECT_EQ(1U, sent.flags & 1U);
        // 39 characters: 3 words, count, 20 words of string.
        EXPECT_EQ(25U, sent.words.size());
        EXPECT_EQ(39U, sent.words.at(3));
        return sent.words.back();
    }
};

TEST_F(ShellCommand, WithoutAFunctionTheReceiverIsToldSo) {
    EXPECT_EQ(STATUS_OK, command(2000));
    EXPECT_EQ(static_cast<uint32_t>(-38), result());
}

TEST_F(ShellCommand, IsForRootAndShellOnly) {
    AIBinder_Class_setHandleShellCommand(
            mClass, [](AIBinder* binder, int, int, int, const char** args, uint32_t count) {
                return keepArguments(binder, args, count);
            });
    EXPECT_EQ(STATUS_PERMISSION_DENIED, command(1000));
    EXPECT_EQ(0xffffffffU, result());
    mKernel.sent.clear();
    EXPECT_EQ(STATUS_OK, command(0));
    EXPECT_EQ(0U, result());
    mKernel.sent.clear();
    mState.answer = STATUS_TIMED_OUT;
    EXPECT_EQ(STATUS_TIMED_OUT, command(2000));
    EXPECT_EQ(static_cast<uint32_t>(-110), result());
}

TEST_F(ShellCommand, ResultIsSentAsItIs) {
    AIBinder_Class_setHandleShellCommand(
            mClass, [](AIBinder* binder, int, int, int, const char** args, uint32_t count) {
                return keepArguments(binder, args, count);
            });
    for (const binder_status_t status : {7, -4444}) {
        mState.answer = status;
        EXPECT_EQ(status, command(2000));
        EXPECT_EQ(static_cast<uint32_t>(status), result());
        mKernel.sent.clear();
    }
}

TEST_F(ShellCommand, NeedsItsDescriptors) {
    AIBinder_Class_setHandleShellCommand(
            mClass, [](AIBinder* binder, int, int, int, const char** args, uint32_t count) {
                return keepArguments(binder, args, count);
            });
    EXPECT_EQ(STATUS_BAD_VALUE, command(0, 0x12345678));
    EXPECT_EQ(0xffffffffU, result());
}

}  // namespace
}  // namespace binder_test
