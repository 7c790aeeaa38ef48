// SPDX-License-Identifier: Apache-2.0
//
// Requests no well-behaved client sends, straight through the driver: each gets the platform's
// status, none reaches the motor, and the service goes on.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/common/raw_binder.h"
#include "tests/support/kernel_log.h"
#include "tests/support/phone_control.h"

namespace qvx::test {
namespace {

using handset::RawBinder;
using handset::RawReply;
using handset::RequestBytes;

using testing::IsEmpty;

constexpr const char* kDescriptor = "android.hardware.vibrator.IVibrator";
constexpr const char* kInstance = "android.hardware.vibrator.IVibrator/default";

constexpr int32_t kBadType = -2147483647;
constexpr int32_t kUnexpectedNull = -2147483640;
constexpr int32_t kNoMemory = -12;
constexpr int32_t kBadValue = -22;
constexpr int32_t kNotEnoughData = -61;
constexpr int32_t kUnknownTransaction = -74;

constexpr uint32_t kGetCapabilities = 1;
constexpr uint32_t kOn = 3;
constexpr uint32_t kPerform = 4;
constexpr uint32_t kCompose = 12;
constexpr uint32_t kComposePwle = 24;

class MalformedTransaction : public testing::Test {
  protected:
    void SetUp() override {
        ASSERT_EQ(mPhone.up().status, 0) << mPhone.up().out << mPhone.up().err;
        ASSERT_TRUE(mBinder.isOpen());
        const std::optional<uint32_t> handle = mBinder.checkService(kInstance);
        ASSERT_TRUE(handle.has_value());
        mService = *handle;
        mPhone.reset();
    }

    // Every request was refused before the motor, and the service still answers.
    void TearDown() override {
        EXPECT_THAT(mPhone.writes(), IsEmpty());
        const RawReply alive = mBinder.transact(mService, kGetCapabilities, token().data());
        EXPECT_EQ(alive.kind, RawReply::Kind::kData);
        EXPECT_EQ(alive.word(0), 0);
    }

    static RequestBytes token() { return RequestBytes().token(kDescriptor); }

    void expectStatus(uint32_t code, const RequestBytes& request, int32_t status) {
        const RawReply reply = mBinder.transact(mService, code, request.data());
        EXPECT_EQ(reply.kind, RawReply::Kind::kStatus);
        EXPECT_EQ(reply.status, status);
    }

    const Phone mPhone{"leds"};
    RawBinder mBinder;
    uint32_t mService = 0;
};

TEST_F(MalformedTransaction, EmptyRequestIsBadType) {
    expectStatus(kOn, RequestBytes(), kBadType);
}

TEST_F(MalformedTransaction, TokenCutShortIsBadType) {
    expectStatus(kOn, RequestBytes().int32(-2147483647 - 1).int32(-1), kBadType);
}

TEST_F(MalformedTransaction, OtherHeaderWordIsBadType) {
    expectStatus(kOn,
                 RequestBytes()
                         .int32(-2147483647 - 1)
                         .int32(-1)
                         .int32(0x564e4452)
                         .string16(kDescriptor)
                         .int32(100)
                         .nullBinder(),
                 kBadType);
}

TEST_F(MalformedTransaction, OtherDescriptorIsBadType) {
    expectStatus(kOn,
                 RequestBytes().token("android.hardware.light.ILights").int32(100).nullBinder(),
                 kBadType);
}

TEST_F(MalformedTransaction, DescriptorLongerThanTheRequestIsBadType) {
    expectStatus(
            kOn,
            RequestBytes().int32(-2147483647 - 1).int32(-1).int32(0x53595354).int32(0x7ffffff0),
            kBadType);
}

TEST_F(MalformedTransaction, UnknownCodesAreUnknownTransactions) {
    for (const uint32_t code : {0U, 25U, 1000U, 0x00fffffdU, 0x01000000U, 0x5f545754U}) {
        expectStatus(code, token(), kUnknownTransaction);
    }
}

TEST_F(MalformedTransaction, MissingIntegerIsNotEnoughData) {
    expectStatus(kOn, token(), kNotEnoughData);
}

TEST_F(MalformedTransaction, MissingObjectIsBadType) {
    expectStatus(kOn, token().int32(100), kBadType);
}

TEST_F(MalformedTransaction, ObjectThatTheDriverNeverSawIsBadType) {
    expectStatus(kOn,
                 token().int32(100)
                         .int32(0x73622a85)
                         .int32(0x113)
                         .int32(1)
                         .int32(0)
                         .int32(1)
                         .int32(0)
                         .int32(0x0c000001),
                 kBadType);
}

TEST_F(MalformedTransaction, NullArrayIsNoMemory) {
    expectStatus(kCompose, token().int32(-1).nullBinder(), kNoMemory);
}

TEST_F(MalformedTransaction, ArrayLengthBelowMinusOneIsBadValue) {
    expectStatus(kCompose, token().int32(-2).nullBinder(), kBadValue);
}

TEST_F(MalformedTransaction, NullElementIsUnexpectedNull) {
    expectStatus(kCompose, token().int32(1).int32(0).nullBinder(), kUnexpectedNull);
}

TEST_F(MalformedTransaction, NegativeParcelableSizeIsBadValue) {
    expectStatus(kCompose, token().int32(1).int32(1).int32(-16).nullBinder(), kBadValue);
}

TEST_F(MalformedTransaction, UnknownUnionTagIsBadValue) {
    expectStatus(kComposePwle, token().int32(1).int32(1).int32(2).nullBinder(), kBadValue);
}

TEST_F(MalformedTransaction, ArrayLongerThanAnyMemoryIsRefused) {
    const RawReply reply =
            mBinder.transact(mService, kCompose, token().int32(0x7fffffff).int32(1).data());
    EXPECT_EQ(reply.kind, RawReply::Kind::kStatus);
    EXPECT_LT(reply.status, 0);
}

TEST_F(MalformedTransaction, TruncatedEnumIsNotEnoughData) {
    expectStatus(kPerform, token().int32(0), kNotEnoughData);
}

TEST_F(MalformedTransaction, TrailingBytesAreIgnored) {
    const RawReply reply =
            mBinder.transact(mService, kGetCapabilities, token().bytes(65536, 0xa5).data());
    EXPECT_EQ(reply.kind, RawReply::Kind::kData);
    EXPECT_EQ(reply.word(0), 0);
}

TEST_F(MalformedTransaction, RequestBeyondTheReceiversBufferIsRefusedByTheDriver) {
    const ExpectBinderComplaints provoked;
    const RawReply reply =
            mBinder.transact(mService, kGetCapabilities, token().bytes(2 << 20, 0).data());
    EXPECT_EQ(reply.kind, RawReply::Kind::kFailed);
}

TEST_F(MalformedTransaction, OffsetsOutsideTheDataAreRefusedByTheDriver) {
    const ExpectBinderComplaints provoked;
    const RawReply reply =
            mBinder.transact(mService, kOn, token().int32(100).nullBinder().data(), {4096});
    EXPECT_EQ(reply.kind, RawReply::Kind::kFailed);
}

}  // namespace
}  // namespace qvx::test
