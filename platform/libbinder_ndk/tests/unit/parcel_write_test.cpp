// SPDX-License-Identifier: Apache-2.0
//
// What the writing functions put on the wire.
#include <fcntl.h>
#include <unistd.h>

#include <android/binder_parcel.h>
#include <android/binder_parcel_platform.h>
#include <android/binder_parcel_utils.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/libbinder_ndk/tests/unit/fake_kernel.h"

namespace binder_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class ParcelWrite : public testing::Test {
  protected:
    AParcel* parcel() { return mOwn.get(); }
    std::vector<uint32_t> written() { return words(mOwn.get()); }

  private:
    FakeKernel mKernel;
    ndk::ScopedAParcel mOwn{AParcel_create()};
};

TEST_F(ParcelWrite, NarrowScalarsTakeAWord) {
    EXPECT_EQ(STATUS_OK, AParcel_writeBool(parcel(), true));
    EXPECT_EQ(STATUS_OK, AParcel_writeBool(parcel(), false));
    EXPECT_EQ(STATUS_OK, AParcel_writeByte(parcel(), -2));
    EXPECT_EQ(STATUS_OK, AParcel_writeByte(parcel(), 127));
    EXPECT_EQ(STATUS_OK, AParcel_writeChar(parcel(), u'\xffff'));
    EXPECT_THAT(written(), ElementsAre(1U, 0U, 0xfffffffeU, 0x7fU, 0xffffU));
}

TEST_F(ParcelWrite, WideScalarsAreNotAlignedToEight) {
    AParcel_writeInt32(parcel(), -1);
    AParcel_writeInt64(parcel(), 0x1122334455667788);
    AParcel_writeUint64(parcel(), 0xffffffff00000001);
    AParcel_writeFloat(parcel(), 1.0F);
    AParcel_writeDouble(parcel(), 1.0);
    AParcel_writeUint32(parcel(), 0x80000000);
    EXPECT_THAT(written(), ElementsAre(0xffffffffU, 0x55667788U, 0x11223344U, 1U, 0xffffffffU,
                                       0x3f800000U, 0U, 0x3ff00000U, 0x80000000U));
}

TEST_F(ParcelWrite, StringIsUtf16WithTerminatorAndPadding) {
    EXPECT_EQ(STATUS_OK, AParcel_writeString(parcel(), "", 0));
    EXPECT_EQ(STATUS_OK, AParcel_writeString(parcel(), "bad", 3));
    EXPECT_EQ(STATUS_OK, AParcel_writeString(parcel(), "ab", 2));
    EXPECT_EQ(STATUS_OK, AParcel_writeString(parcel(), nullptr, -1));
    EXPECT_THAT(written(), ElementsAre(0U, 0U,                        // ""
                                       3U, 0x00610062U, 0x00000064U,  // "bad"
                                       2U, 0x00620061U, 0U,           // "ab", padded
                                       0xffffffffU));
}

TEST_F(ParcelWrite, EmbeddedZeroSurvives) {
    EXPECT_EQ(STATUS_OK, AParcel_writeString(parcel(), "a\0b", 3));
    EXPECT_THAT(written(), ElementsAre(3U, 0x00000061U, 0x00000062U));
}

TEST_F(ParcelWrite, OtherCharactersMayComeBehindAnyNumberOfAscii) {
    EXPECT_EQ(STATUS_OK, AParcel_writeString(parcel(), "abcdefgh\xc3\xa4", 10));
    EXPECT_EQ(STATUS_OK, AParcel_writeString(parcel(), "abcdefg\xc3\xa4x", 10));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_writeString(parcel(), "abcdefgh\xc3", 9));
    EXPECT_THAT(written(),
                ElementsAre(9U, 0x00620061U, 0x00640063U, 0x00660065U, 0x00680067U, 0x000000e4U, 9U,
                            0x00620061U, 0x00640063U, 0x00660065U, 0x00e40067U, 0x00000078U));
}

TEST_F(ParcelWrite, SupplementaryCharactersBecomeSurrogatePairs) {
    EXPECT_EQ(STATUS_OK, AParcel_writeString(parcel(), "\xf0\x9f\x98\x80", 4));
    EXPECT_THAT(written(), ElementsAre(2U, 0xde00d83dU, 0U));
}

TEST_F(ParcelWrite, CutOffSequenceIsBadValue) {
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_writeString(parcel(), "ab\xe2\x82", 4));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_writeString(parcel(), "\xf0", 1));
    EXPECT_THAT(written(), IsEmpty());
}

TEST_F(ParcelWrite, OtherMalformedUtf8IsNotDetected) {
    // A stray continuation byte stands for itself; wrong continuation bytes are masked.
    EXPECT_EQ(STATUS_OK, AParcel_writeString(parcel(), "\x80", 1));
    EXPECT_EQ(STATUS_OK, AParcel_writeString(parcel(), "\xc3\x41", 2));
    EXPECT_THAT(written(), ElementsAre(1U, 0x00000080U, 1U, 0x000000c1U));
}

TEST_F(ParcelWrite, StringLengthMustFitItsPointer) {
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_writeString(parcel(), nullptr, 0));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_writeString(parcel(), nullptr, 3));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_writeString(parcel(), nullptr, -2));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_writeString(parcel(), "abc", -1));
    EXPECT_THAT(written(), IsEmpty());
}

TEST_F(ParcelWrite, PackedArrays) {
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeVector(parcel(), std::vector<int32_t>{1, -1}));
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeVector(parcel(), std::vector<int64_t>{5}));
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeVector(parcel(), std::vector<float>{0.5F}));
    EXPECT_THAT(written(), ElementsAre(2U, 1U, 0xffffffffU, 1U, 5U, 0U, 1U, 0x3f000000U));
}

TEST_F(ParcelWrite, ByteArrayIsPackedAndZeroPadded) {
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeVector(
                                 parcel(), std::vector<uint8_t>{0x11, 0x22, 0x33, 0x44, 0x55}));
    EXPECT_THAT(written(), ElementsAre(5U, 0x44332211U, 0x00000055U));
}

TEST_F(ParcelWrite, BoolAndCharArraysTakeAWordForEachElement) {
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeVector(parcel(), std::vector<bool>{true, false, true}));
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeVector(parcel(), std::vector<char16_t>{u'a', u'b'}));
    EXPECT_THAT(written(), ElementsAre(3U, 1U, 0U, 1U, 2U, 0x61U, 0x62U));
}

TEST_F(ParcelWrite, StringArray) {
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeVector(parcel(), std::vector<std::string>{"a", ""}));
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeVector(
                                 parcel(), std::optional<std::vector<std::optional<std::string>>>(
                                                   {std::nullopt, std::string("b")})));
    EXPECT_THAT(written(),
                ElementsAre(2U, 1U, 0x00000061U, 0U, 0U, 2U, 0xffffffffU, 1U, 0x00000062U));
}

TEST_F(ParcelWrite, NullAndEmptyArrays) {
    EXPECT_EQ(STATUS_OK, AParcel_writeInt32Array(parcel(), nullptr, -1));
    EXPECT_EQ(STATUS_OK, AParcel_writeInt32Array(parcel(), nullptr, 0));
    EXPECT_EQ(STATUS_OK, AParcel_writeCharArray(parcel(), nullptr, -1));
    EXPECT_EQ(STATUS_OK, AParcel_writeCharArray(parcel(), nullptr, 0));
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeVector(parcel(), std::optional<std::vector<bool>>()));
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeVector(parcel(), std::optional<std::vector<uint8_t>>()));
    EXPECT_THAT(written(), ElementsAre(0xffffffffU, 0U, 0xffffffffU, 0U, 0xffffffffU, 0xffffffffU));
}

TEST_F(ParcelWrite, ArrayLengthMustFitItsPointer) {
    const int32_t data[] = {1};
    const char16_t text[] = {u'a'};
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_writeInt32Array(parcel(), nullptr, 1));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_writeInt32Array(parcel(), data, -1));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_writeInt32Array(parcel(), data, -2));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_writeInt32Array(parcel(), nullptr, -2));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_writeCharArray(parcel(), nullptr, 1));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_writeCharArray(parcel(), text, -1));
    EXPECT_THAT(written(), IsEmpty());
}

TEST_F(ParcelWrite, NullBinderIsPlainDataWithUndeclaredStability) {
    EXPECT_EQ(STATUS_OK, AParcel_writeStrongBinder(parcel(), nullptr));
    EXPECT_THAT(written(), ElementsAre(0x73622a85U, 0x113U, 0U, 0U, 0U, 0U, 1U));
    EXPECT_EQ(0U, (*parcel())->offsetCount());
}

TEST_F(ParcelWrite, DescriptorIsDuplicatedAndOwned) {
    int ends[2];
    ASSERT_EQ(0, pipe(ends));
    EXPECT_EQ(STATUS_OK, AParcel_writeParcelFileDescriptor(parcel(), ends[1]));
    const auto all = written();
    ASSERT_EQ(8U, all.size());
    EXPECT_EQ(1U, all[0]);
    EXPECT_EQ(0U, all[1]);
    EXPECT_EQ(0x66642a85U, all[2]);
    EXPECT_EQ(0x17fU, all[3]);
    const int copy = static_cast<int>(all[4]);
    EXPECT_NE(ends[1], copy);
    EXPECT_EQ(FD_CLOEXEC, fcntl(copy, F_GETFD));
    EXPECT_EQ(0U, all[5]);
    EXPECT_EQ(1U, all[6]);
    EXPECT_EQ(0U, all[7]);
    ASSERT_EQ(1U, (*parcel())->offsetCount());
    EXPECT_EQ(8U, (*parcel())->offsets()[0]);

    AParcel_reset(parcel());
    EXPECT_EQ(-1, fcntl(copy, F_GETFD)) << "closed with the parcel";
    EXPECT_EQ(0, close(ends[0]));
    EXPECT_EQ(0, close(ends[1])) << "the original stays the caller's";
}

TEST_F(ParcelWrite, NullDescriptorIsAZeroAndOthersAreRefused) {
    EXPECT_EQ(STATUS_OK, AParcel_writeParcelFileDescriptor(parcel(), -1));
    EXPECT_THAT(written(), ElementsAre(0U));
    EXPECT_EQ(STATUS_UNKNOWN_ERROR, AParcel_writeParcelFileDescriptor(parcel(), -2));
    EXPECT_EQ(STATUS_UNKNOWN_ERROR, AParcel_writeParcelFileDescriptor(parcel(), 9999));
    EXPECT_THAT(written(), ElementsAre(0U));
}

TEST_F(ParcelWrite, GapLeftByThePositionIsZeroed) {
    AParcel_writeInt32(parcel(), -1);
    EXPECT_EQ(STATUS_OK, AParcel_setDataPosition(parcel(), 16));
    EXPECT_EQ(16, AParcel_getDataSize(parcel()));
    AParcel_writeInt32(parcel(), -1);
    EXPECT_THAT(written(), ElementsAre(0xffffffffU, 0U, 0U, 0U, 0xffffffffU));
}

TEST_F(ParcelWrite, EarlierBytesMayBePatchedButNotObjects) {
    AParcel_writeInt32(parcel(), 0);
    AParcel_writeParcelFileDescriptor(parcel(), 0);
    const int32_t end = AParcel_getDataPosition(parcel());
    AParcel_setDataPosition(parcel(), 0);
    EXPECT_EQ(STATUS_OK, AParcel_writeInt32(parcel(), end));
    AParcel_setDataPosition(parcel(), 12);
    EXPECT_EQ(STATUS_PERMISSION_DENIED, AParcel_writeInt32(parcel(), 7));
    AParcel_setDataPosition(parcel(), 8);
    EXPECT_EQ(STATUS_PERMISSION_DENIED, AParcel_writeInt64(parcel(), 7));
    EXPECT_EQ(static_cast<uint32_t>(end), written()[0]);
}

TEST_F(ParcelWrite, PositionPastTheLimitIsRefused) {
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_setDataPosition(parcel(), -1));
    EXPECT_EQ(STATUS_OK, AParcel_setDataPosition(parcel(), 0x7fffffff));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_writeInt32(parcel(), 1));
    AParcel_setDataPosition(parcel(), 0);
    EXPECT_THAT(written(), IsEmpty());
}

TEST_F(ParcelWrite, LargeParcelKeepsItsBytes) {
    for (int32_t i = 0; i < 100000; ++i) AParcel_writeInt32(parcel(), i);
    const auto all = written();
    ASSERT_EQ(100000U, all.size());
    for (uint32_t i = 0; i < all.size(); ++i) ASSERT_EQ(i, all[i]);
}

TEST_F(ParcelWrite, AppendCopiesARange) {
    const ndk::ScopedAParcel from(AParcel_create());
    for (int32_t i = 1; i <= 4; ++i) AParcel_writeInt32(from.get(), i);
    AParcel_writeInt32(parcel(), 9);
    EXPECT_EQ(STATUS_OK, AParcel_appendFrom(from.get(), parcel(), 4, 8));
    EXPECT_THAT(written(), ElementsAre(9U, 2U, 3U));
    EXPECT_EQ(STATUS_OK, AParcel_appendFrom(from.get(), parcel(), 0, 0));
    EXPECT_EQ(STATUS_OK, AParcel_appendFrom(from.get(), parcel(), 16, 0));
    EXPECT_THAT(written(), ElementsAre(9U, 2U, 3U));
}

TEST_F(ParcelWrite, AppendOutsideTheSourceIsBadValue) {
    const ndk::ScopedAParcel from(AParcel_create());
    AParcel_writeInt32(from.get(), 1);
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_appendFrom(from.get(), parcel(), 0, 8));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_appendFrom(from.get(), parcel(), 8, 4));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_appendFrom(from.get(), parcel(), -4, 4));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_appendFrom(from.get(), parcel(), 0, -1));
    EXPECT_EQ(STATUS_BAD_VALUE, AParcel_appendFrom(from.get(), parcel(), 4, 0x7fffffff));
    EXPECT_THAT(written(), IsEmpty());
}

TEST_F(ParcelWrite, AppendDuplicatesDescriptors) {
    const ndk::ScopedAParcel from(AParcel_create());
    AParcel_writeParcelFileDescriptor(from.get(), 0);
    const int first = static_cast<int>(words(from.get())[4]);
    AParcel_writeInt32(parcel(), 5);
    EXPECT_EQ(STATUS_OK,
              AParcel_appendFrom(from.get(), parcel(), 0, AParcel_getDataSize(from.get())));
    const int second = static_cast<int>(written()[5]);
    EXPECT_NE(first, second);
    EXPECT_EQ(12U, (*parcel())->offsets()[0]);
    AParcel_reset(from.get());
    EXPECT_EQ(-1, fcntl(first, F_GETFD));
    EXPECT_EQ(FD_CLOEXEC, fcntl(second, F_GETFD));
}

TEST_F(ParcelWrite, ResetEmptiesAndTheParcelIsUsableAgain) {
    AParcel_writeInt32(parcel(), 5);
    AParcel_markSensitive(parcel());
    EXPECT_EQ(STATUS_OK, AParcel_reset(parcel()));
    EXPECT_EQ(0, AParcel_getDataSize(parcel()));
    EXPECT_EQ(0, AParcel_getDataPosition(parcel()));
    AParcel_writeInt32(parcel(), 6);
    EXPECT_THAT(written(), ElementsAre(6U));
}

TEST_F(ParcelWrite, NullParcelMayBeDeleted) {
    AParcel_delete(nullptr);
    EXPECT_TRUE(AParcel_getAllowFds(parcel()));
}

}  // namespace
}  // namespace binder_test
