// SPDX-License-Identifier: Apache-2.0
//
// Local objects, without any driver: the requests they are sent, and what they answer.
#include <unistd.h>

#include <android/binder_ibinder_platform.h>
#include <android/binder_parcel_utils.h>
#include <android/binder_shell.h>
#include <gmock/gmock.h>

#include "platform/libbinder_ndk/tests/unit/local_binder_test.h"

namespace binder_test {
namespace {

using testing::ElementsAre;

// "test.ILocal": 11 units.
const std::vector<uint32_t> kToken = {0x80000000, 0xffffffff, 0x53595354, 11,         0x00650074,
                                      0x00740073, 0x0049002e, 0x006f004c, 0x00610063, 0x0000006c};

std::vector<uint32_t> withToken(std::vector<uint32_t> arguments) {
    auto request = kToken;
    request.insert(request.end(), arguments.begin(), arguments.end());
    return request;
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
