// SPDX-License-Identifier: Apache-2.0
//
// AStatus and the status header.
#include <tuple>

#include <android/binder_auto_utils.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/libbinder_ndk/tests/unit/fake_kernel.h"

namespace binder_test {
namespace {

using ndk::ScopedAStatus;
using testing::ElementsAre;
using testing::IsEmpty;

TEST(Status, ValuesAreThePlatforms) {
    EXPECT_EQ(0, STATUS_OK);
    EXPECT_EQ(-2147483648LL, STATUS_UNKNOWN_ERROR);
    EXPECT_EQ(-2147483647, STATUS_BAD_TYPE);
    EXPECT_EQ(-2147483646, STATUS_FAILED_TRANSACTION);
    EXPECT_EQ(-2147483641, STATUS_FDS_NOT_ALLOWED);
    EXPECT_EQ(-2147483640, STATUS_UNEXPECTED_NULL);
    EXPECT_EQ(-1, STATUS_PERMISSION_DENIED);
    EXPECT_EQ(-2, STATUS_NAME_NOT_FOUND);
    EXPECT_EQ(-11, STATUS_WOULD_BLOCK);
    EXPECT_EQ(-12, STATUS_NO_MEMORY);
    EXPECT_EQ(-17, STATUS_ALREADY_EXISTS);
    EXPECT_EQ(-19, STATUS_NO_INIT);
    EXPECT_EQ(-22, STATUS_BAD_VALUE);
    EXPECT_EQ(-32, STATUS_DEAD_OBJECT);
    EXPECT_EQ(-38, STATUS_INVALID_OPERATION);
    EXPECT_EQ(-61, STATUS_NOT_ENOUGH_DATA);
    EXPECT_EQ(-74, STATUS_UNKNOWN_TRANSACTION);
    EXPECT_EQ(-75, STATUS_BAD_INDEX);
    EXPECT_EQ(-110, STATUS_TIMED_OUT);
}

TEST(Status, OkIsOneSharedObject) {
    AStatus* const one = AStatus_newOk();
    EXPECT_EQ(one, AStatus_newOk());
    AStatus_delete(one);
    EXPECT_TRUE(AStatus_isOk(one));
    EXPECT_EQ(EX_NONE, AStatus_getExceptionCode(one));
    EXPECT_EQ(STATUS_OK, AStatus_getStatus(one));
    EXPECT_EQ(0, AStatus_getServiceSpecificError(one));
    EXPECT_STREQ("", AStatus_getMessage(one));
    AStatus_delete(nullptr);
}

TEST(Status, ExceptionCarriesItsMessage) {
    const auto status =
            ScopedAStatus::fromExceptionCodeWithMessage(EX_ILLEGAL_ARGUMENT, "not that");
    EXPECT_FALSE(status.isOk());
    EXPECT_EQ(EX_ILLEGAL_ARGUMENT, status.getExceptionCode());
    EXPECT_STREQ("not that", status.getMessage());
    EXPECT_EQ(STATUS_OK, status.getStatus());
}

TEST(Status, NoExceptionIsOk) {
    EXPECT_TRUE(ScopedAStatus::fromExceptionCode(EX_NONE).isOk());
    EXPECT_TRUE(ScopedAStatus::fromStatus(STATUS_OK).isOk());
}

TEST(Status, ServiceSpecificErrorIsAnErrorEvenWhenZero) {
    const auto five = ScopedAStatus::fromServiceSpecificErrorWithMessage(5, "five");
    EXPECT_EQ(EX_SERVICE_SPECIFIC, five.getExceptionCode());
    EXPECT_EQ(5, five.getServiceSpecificError());
    EXPECT_STREQ("five", five.getMessage());
    EXPECT_FALSE(ScopedAStatus::fromServiceSpecificError(0).isOk());
    EXPECT_EQ(0, ScopedAStatus::fromExceptionCode(EX_SERVICE_SPECIFIC).getServiceSpecificError());
}

TEST(Status, TransportFailure) {
    const auto status = ScopedAStatus::fromStatus(STATUS_DEAD_OBJECT);
    EXPECT_EQ(EX_TRANSACTION_FAILED, status.getExceptionCode());
    EXPECT_EQ(STATUS_DEAD_OBJECT, status.getStatus());
    EXPECT_EQ(0, status.getServiceSpecificError());
    EXPECT_STREQ("", status.getMessage());
    EXPECT_EQ(STATUS_FAILED_TRANSACTION,
              ScopedAStatus::fromExceptionCode(EX_TRANSACTION_FAILED).getStatus());
}

TEST(Status, UnknownExceptionsBecomeTransactionFailures) {
    for (const int32_t exception : {1, -10, -128, -130, 77}) {
        const auto status = ScopedAStatus::fromExceptionCode(exception);
        EXPECT_EQ(EX_TRANSACTION_FAILED, status.getExceptionCode());
        EXPECT_EQ(STATUS_FAILED_TRANSACTION, status.getStatus());
    }
}

TEST(Status, UnknownStatusesBecomeUnknownError) {
    EXPECT_EQ(STATUS_UNKNOWN_ERROR, ScopedAStatus::fromStatus(-5).getStatus());
    EXPECT_EQ(STATUS_UNKNOWN_ERROR, ScopedAStatus::fromStatus(1).getStatus());
}

TEST(Status, EmptyOwnerIsNotOk) {
    EXPECT_FALSE(ScopedAStatus().isOk());
}

TEST(Status, Descriptions) {
    const std::tuple<ScopedAStatus, const char*> cases[] = {
            {ScopedAStatus::ok(), "No error"},
            {ScopedAStatus::fromExceptionCode(EX_UNSUPPORTED_OPERATION),
             "Status(-7, EX_UNSUPPORTED_OPERATION): ''"},
            {ScopedAStatus::fromExceptionCodeWithMessage(EX_ILLEGAL_STATE, "off"),
             "Status(-5, EX_ILLEGAL_STATE): 'off'"},
            {ScopedAStatus::fromServiceSpecificErrorWithMessage(-3, "no"),
             "Status(-8, EX_SERVICE_SPECIFIC): '-3: no'"},
            {ScopedAStatus::fromServiceSpecificError(5), "Status(-8, EX_SERVICE_SPECIFIC): '5: '"},
            {ScopedAStatus::fromStatus(STATUS_UNKNOWN_TRANSACTION),
             "Status(-129, EX_TRANSACTION_FAILED): 'UNKNOWN_TRANSACTION: '"},
            {ScopedAStatus::fromStatus(STATUS_DEAD_OBJECT),
             "Status(-129, EX_TRANSACTION_FAILED): 'DEAD_OBJECT: '"},
            {ScopedAStatus::fromStatus(STATUS_UNKNOWN_ERROR),
             "Status(-129, EX_TRANSACTION_FAILED): 'UNKNOWN_ERROR: '"},
    };
    for (const auto& [status, text] : cases) EXPECT_EQ(text, status.getDescription());
}

class StatusHeader : public testing::Test {
  protected:
    std::vector<uint32_t> written(const ScopedAStatus& status) {
        AParcel_reset(mParcel.get());
        EXPECT_EQ(STATUS_OK, AParcel_writeStatusHeader(mParcel.get(), status.get()));
        return words(mParcel.get());
    }

    binder_status_t read(const std::vector<uint32_t>& dataWords, ScopedAStatus* status) {
        status->set(nullptr);
        mKernel.deliver(Buffer(dataWords), mParcel.get());
        return AParcel_readStatusHeader(mParcel.get(), status->getR());
    }

    FakeKernel mKernel;
    ndk::ScopedAParcel mParcel{AParcel_create()};
};

TEST_F(StatusHeader, Bytes) {
    EXPECT_THAT(written(ScopedAStatus::ok()), ElementsAre(0U));
    EXPECT_THAT(written(ScopedAStatus::fromExceptionCode(EX_UNSUPPORTED_OPERATION)),
                ElementsAre(0xfffffff9U, 0U, 0U, 0U));
    EXPECT_THAT(written(ScopedAStatus::fromExceptionCodeWithMessage(EX_ILLEGAL_ARGUMENT, "bad")),
                ElementsAre(0xfffffffdU, 3U, 0x00610062U, 0x00000064U, 0U));
    EXPECT_THAT(written(ScopedAStatus::fromServiceSpecificError(5)),
                ElementsAre(0xfffffff8U, 0U, 0U, 0U, 5U));
    EXPECT_THAT(written(ScopedAStatus::fromExceptionCode(EX_PARCELABLE)),
                ElementsAre(0xfffffff7U, 0U, 0U, 0U, 0U));
}

TEST_F(StatusHeader, TransportFailureIsReturnedAndNotWritten) {
    const auto status = ScopedAStatus::fromStatus(STATUS_TIMED_OUT);
    EXPECT_EQ(STATUS_TIMED_OUT, AParcel_writeStatusHeader(mParcel.get(), status.get()));
    EXPECT_THAT(words(mParcel.get()), IsEmpty());
}

TEST_F(StatusHeader, ComesBack) {
    ScopedAStatus status;
    EXPECT_EQ(STATUS_OK, read({0, 4}, &status));
    EXPECT_TRUE(status.isOk());
    EXPECT_EQ(4, AParcel_getDataPosition(mParcel.get()));

    EXPECT_EQ(STATUS_OK, read({0xfffffffd, 3, 0x00610062, 0x64, 0}, &status));
    EXPECT_EQ(EX_ILLEGAL_ARGUMENT, status.getExceptionCode());
    EXPECT_STREQ("bad", status.getMessage());

    EXPECT_EQ(STATUS_OK, read({0xfffffff8, 0, 0, 0, 5}, &status));
    EXPECT_EQ(5, status.getServiceSpecificError());
}

TEST_F(StatusHeader, ReplyHeaderIsSkippedAndReadsAsSuccess) {
    ScopedAStatus status;
    EXPECT_EQ(STATUS_OK, read({0xffffff80, 12, 0xaaaaaaaa, 0xbbbbbbbb, 7}, &status));
    EXPECT_TRUE(status.isOk());
    int32_t next = 0;
    EXPECT_EQ(STATUS_OK, AParcel_readInt32(mParcel.get(), &next));
    EXPECT_EQ(7, next);
}

TEST_F(StatusHeader, StackTraceIsSkipped) {
    ScopedAStatus status;
    EXPECT_EQ(STATUS_OK, read({0xfffffff8, 0, 0, 8, 0xaaaaaaaa, 0xbbbbbbbb, 6}, &status));
    EXPECT_EQ(6, status.getServiceSpecificError());
}

TEST_F(StatusHeader, MalformedHeadersLeaveTheStatusAlone) {
    const std::pair<std::vector<uint32_t>, binder_status_t> cases[] = {
            {{}, STATUS_NOT_ENOUGH_DATA},
            {{0xfffffffd}, STATUS_UNEXPECTED_NULL},                     // no message
            {{0xfffffffd, 0xffffffff, 0}, STATUS_UNEXPECTED_NULL},      // null message
            {{0xfffffffd, 0, 0}, STATUS_NOT_ENOUGH_DATA},               // no stack trace size
            {{0xfffffffd, 0, 0, 0xffffffff}, STATUS_UNKNOWN_ERROR},     // negative
            {{0xfffffffd, 0, 0, 4}, STATUS_UNKNOWN_ERROR},              // beyond the data
            {{0xfffffff8, 0, 0, 0}, STATUS_NOT_ENOUGH_DATA},            // no service error
            {{0xfffffff7, 0, 0, 0, 0x7fffffff}, STATUS_UNKNOWN_ERROR},  // blob beyond the data
            {{0xffffff80}, STATUS_NOT_ENOUGH_DATA},                     // no header size
            {{0xffffff80, 0x7fffffff, 0}, STATUS_UNKNOWN_ERROR},
            {{0xffffff80, 0x80000000, 0}, STATUS_UNKNOWN_ERROR},
    };
    for (const auto& [dataWords, expected] : cases) {
        AStatus* untouched = nullptr;
        mKernel.deliver(Buffer(dataWords), mParcel.get());
        EXPECT_EQ(expected, AParcel_readStatusHeader(mParcel.get(), &untouched));
        EXPECT_EQ(nullptr, untouched);
    }
}

TEST_F(StatusHeader, UnknownExceptionKeepsItsNumberInTheDescription) {
    ScopedAStatus status;
    EXPECT_EQ(STATUS_OK, read({77, 1, 0x78, 0}, &status));
    EXPECT_EQ(EX_TRANSACTION_FAILED, status.getExceptionCode());
    EXPECT_EQ("Status(77, 77): 'x'", status.getDescription());
}

}  // namespace
}  // namespace binder_test
