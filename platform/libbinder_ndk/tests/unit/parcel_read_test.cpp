// SPDX-License-Identifier: Apache-2.0
//
// Reading what others have written, well or badly.
#include <fcntl.h>
#include <unistd.h>

#include <android/binder_parcel.h>
#include <android/binder_parcel_utils.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/libbinder_ndk/tests/unit/fake_kernel.h"

namespace binder_test {
namespace {

using testing::ElementsAre;

// A parcel as received, from its words.
class ParcelRead : public testing::Test {
  protected:
    const AParcel* received(const std::vector<uint32_t>& dataWords,
                            std::vector<binder_size_t> offsets = {}) {
        mKernel.deliver(Buffer(dataWords, std::move(offsets)), mOwn.get());
        return mOwn.get();
    }

    FakeKernel mKernel;
    ndk::ScopedAParcel mOwn{AParcel_create()};
};

TEST_F(ParcelRead, ScalarsComeBack) {
    const AParcel* const parcel =
            received({0xffffffff, 0x55667788, 0x11223344, 0x3f800000, 2, 0xffffff80, 0x00012345});
    int32_t number = 0;
    int64_t wide = 0;
    float real = 0;
    bool boolean = false;
    int8_t byte = 0;
    char16_t character = 0;
    EXPECT_EQ(STATUS_OK, AParcel_readInt32(parcel, &number));
    EXPECT_EQ(STATUS_OK, AParcel_readInt64(parcel, &wide));
    EXPECT_EQ(STATUS_OK, AParcel_readFloat(parcel, &real));
    EXPECT_EQ(STATUS_OK, AParcel_readBool(parcel, &boolean));
    EXPECT_EQ(STATUS_OK, AParcel_readByte(parcel, &byte));
    EXPECT_EQ(STATUS_OK, AParcel_readChar(parcel, &character));
    EXPECT_EQ(-1, number);
    EXPECT_EQ(0x1122334455667788, wide);
    EXPECT_EQ(1.0F, real);
    EXPECT_TRUE(boolean) << "any word but zero";
    EXPECT_EQ(-128, byte) << "the low byte";
    EXPECT_EQ(0x2345, character) << "the low half";
    EXPECT_EQ(28, AParcel_getDataPosition(parcel));
}

TEST_F(ParcelRead, MissingBytesAreNotEnoughDataAndNothingMoves) {
    const AParcel* const parcel = received({7});
    int64_t wide = 3;
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA, AParcel_readInt64(parcel, &wide));
    EXPECT_EQ(3, wide);
    EXPECT_EQ(0, AParcel_getDataPosition(parcel));
    int32_t number = 0;
    EXPECT_EQ(STATUS_OK, AParcel_readInt32(parcel, &number));
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA, AParcel_readInt32(parcel, &number));
    EXPECT_EQ(7, number);
}

TEST_F(ParcelRead, BoolCharAndByteStoreZeroOnFailure) {
    const AParcel* const parcel = received({});
    bool boolean = true;
    int8_t byte = 5;
    char16_t character = u'x';
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA, AParcel_readBool(parcel, &boolean));
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA, AParcel_readByte(parcel, &byte));
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA, AParcel_readChar(parcel, &character));
    EXPECT_FALSE(boolean);
    EXPECT_EQ(0, byte);
    EXPECT_EQ(0, character);
}

TEST_F(ParcelRead, PositionPastTheEndOnlyFailsReads) {
    const AParcel* const parcel = received({1});
    int32_t number = 0;
    EXPECT_EQ(STATUS_OK, AParcel_setDataPosition(parcel, 0x7fffffff));
    EXPECT_EQ(0x7fffffff, AParcel_getDataSize(parcel));
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA, AParcel_readInt32(parcel, &number));
    std::vector<int32_t> list;
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA, ndk::AParcel_readVector(parcel, &list));
    EXPECT_EQ(STATUS_OK, AParcel_setDataPosition(parcel, 0));
    EXPECT_EQ(STATUS_OK, AParcel_readInt32(parcel, &number));
    EXPECT_EQ(1, number);
}

TEST_F(ParcelRead, StringsComeBack) {
    const AParcel* const parcel =
            received({0, 0, 3, 0x00610062, 0x00000064, 3, 0x00000061, 0x00000062, 0xffffffff});
    std::string text = "old";
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readString(parcel, &text));
    EXPECT_EQ("", text);
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readString(parcel, &text));
    EXPECT_EQ("bad", text);
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readString(parcel, &text));
    EXPECT_EQ(std::string("a\0b", 3), text);
    std::optional<std::string> maybe = "old";
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readString(parcel, &maybe));
    EXPECT_EQ(std::nullopt, maybe);
}

TEST_F(ParcelRead, OtherCharactersMayComeBehindAnyNumberOfAscii) {
    const AParcel* const parcel = received({6, 0x00620061, 0x00640063, 0x00e40065, 0,  // "abcdeä"
                                            5, 0x00620061, 0x00640063, 0x00000080});
    std::string text;
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readString(parcel, &text));
    EXPECT_EQ("abcde\xc3\xa4", text);
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readString(parcel, &text));
    EXPECT_EQ("abcd\xc2\x80", text);
}

TEST_F(ParcelRead, SurrogatePairsAreJoinedAndLoneOnesDropped) {
    const AParcel* const parcel = received({5, 0xde00d83d, 0x0061d83d, 0x0000dc00, 1, 0x0000d800});
    std::string text;
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readString(parcel, &text));
    EXPECT_EQ(
            "\xf0\x9f\x98\x80"
            "a",
            text);
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readString(parcel, &text));
    EXPECT_EQ("", text);
}

TEST_F(ParcelRead, WhatIsNoStringLooksLikeNull) {
    const std::vector<std::vector<uint32_t>> cases = {
            {},                           // no length
            {0xffffffff},                 // null
            {0xfffffffe, 0, 0},           // negative
            {0x80000000, 0, 0},           //
            {0x7fffffff, 0, 0},           // more than there is
            {3, 0x00610062},              // too few bytes
            {2, 0x00620061},              // no room for the terminator
            {2, 0x00620061, 0x00000063},  // no terminator
            {0},                          //
            {1, 0x00610062},              //
    };
    for (const auto& dataWords : cases) {
        std::string text;
        EXPECT_EQ(STATUS_UNEXPECTED_NULL, ndk::AParcel_readString(received(dataWords), &text));
        std::optional<std::string> maybe = "old";
        EXPECT_EQ(STATUS_OK, ndk::AParcel_readString(received(dataWords), &maybe));
        EXPECT_EQ(std::nullopt, maybe);
    }
}

TEST_F(ParcelRead, AllocatorMayRefuseAString) {
    const auto refuse = [](void*, int32_t, char**) { return false; };
    const auto forget = [](void*, int32_t, char** buffer) {
        if (buffer != nullptr) *buffer = nullptr;
        return true;
    };
    EXPECT_EQ(STATUS_NO_MEMORY, AParcel_readString(received({1, 0x61}), nullptr, refuse));
    EXPECT_EQ(STATUS_NO_MEMORY, AParcel_readString(received({1, 0x61}), nullptr, forget));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AParcel_readString(received({0xffffffff}), nullptr, refuse));
}

TEST_F(ParcelRead, AllocatorIsToldTheLengthWithItsTerminator) {
    static int32_t told = 0;
    static char storage[8];
    const auto record = [](void*, int32_t length, char** buffer) {
        told = length;
        *buffer = storage;
        return true;
    };
    EXPECT_EQ(STATUS_OK, AParcel_readString(received({1, 0x000000e4}), nullptr, record));
    EXPECT_EQ(3, told);
    EXPECT_STREQ("\xc3\xa4", storage);
    EXPECT_EQ(STATUS_OK, AParcel_readString(received({0, 0}), nullptr, record));
    EXPECT_EQ(1, told);
    EXPECT_STREQ("", storage);
}

TEST_F(ParcelRead, PackedArraysComeBack) {
    const AParcel* const parcel = received({2, 1, 0xffffffff, 5, 0x44332211, 0x55, 1, 5, 0});
    std::vector<int32_t> numbers;
    std::vector<uint8_t> bytes;
    std::vector<int64_t> wide;
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readVector(parcel, &numbers));
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readVector(parcel, &bytes));
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readVector(parcel, &wide));
    EXPECT_THAT(numbers, ElementsAre(1, -1));
    EXPECT_THAT(bytes, ElementsAre(0x11, 0x22, 0x33, 0x44, 0x55));
    EXPECT_THAT(wide, ElementsAre(5));
}

template <typename Vector>
binder_status_t readInto(const AParcel* parcel) {
    Vector vector;
    return ndk::AParcel_readVector(parcel, &vector);
}

TEST_F(ParcelRead, ArrayWithoutALengthIsNotEnoughData) {
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA, readInto<std::vector<int32_t>>(received({})));
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA, readInto<std::vector<bool>>(received({})));
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA, readInto<std::vector<std::string>>(received({})));
}

TEST_F(ParcelRead, ArrayLengthBelowMinusOneIsBadValue) {
    EXPECT_EQ(STATUS_BAD_VALUE, readInto<std::vector<int32_t>>(received({0xfffffffe})));
    EXPECT_EQ(STATUS_BAD_VALUE, readInto<std::vector<char16_t>>(received({0x80000000})));
    EXPECT_EQ(STATUS_BAD_VALUE, readInto<std::vector<std::string>>(received({0xfffffffe})));
}

TEST_F(ParcelRead, NullArrayIsNoMemoryUnlessNullable) {
    EXPECT_EQ(STATUS_NO_MEMORY, readInto<std::vector<int32_t>>(received({0xffffffff})));
    EXPECT_EQ(STATUS_NO_MEMORY, readInto<std::vector<uint8_t>>(received({0xffffffff})));
    EXPECT_EQ(STATUS_NO_MEMORY, readInto<std::vector<bool>>(received({0xffffffff})));
    EXPECT_EQ(STATUS_NO_MEMORY, readInto<std::vector<std::string>>(received({0xffffffff})));
    std::optional<std::vector<int32_t>> maybe = std::vector<int32_t>{1};
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readVector(received({0xffffffff}), &maybe));
    EXPECT_EQ(std::nullopt, maybe);
}

TEST_F(ParcelRead, PackedArrayShorterThanAnnouncedIsNoMemoryWithoutAllocating) {
    for (const uint32_t length : {3U, 0x1000U, 0x40000000U, 0x7fffffffU}) {
        std::vector<int32_t> numbers;
        EXPECT_EQ(STATUS_NO_MEMORY, ndk::AParcel_readVector(received({length, 1, 2}), &numbers));
        EXPECT_EQ(0U, numbers.capacity());
        std::vector<int64_t> wide;
        EXPECT_EQ(STATUS_NO_MEMORY, ndk::AParcel_readVector(received({length, 1, 2}), &wide));
        EXPECT_EQ(0U, wide.capacity());
    }
}

TEST_F(ParcelRead, OtherArraysShorterThanAnnouncedFailAtTheMissingElement) {
    for (const uint32_t length : {3U, 0x1000U, 0x40000000U, 0x7fffffffU}) {
        std::vector<bool> booleans;
        EXPECT_EQ(STATUS_NOT_ENOUGH_DATA,
                  ndk::AParcel_readVector(received({length, 1, 0}), &booleans));
        EXPECT_LE(booleans.size(), 3U);
        std::vector<char16_t> text;
        EXPECT_EQ(STATUS_NOT_ENOUGH_DATA, ndk::AParcel_readVector(received({length, 1, 0}), &text));
        EXPECT_LE(text.size(), 3U);
        std::vector<std::string> texts;
        EXPECT_EQ(STATUS_UNEXPECTED_NULL,
                  ndk::AParcel_readVector(received({length, 0, 0, 0, 0}), &texts));
        EXPECT_LE(texts.size(), 5U);
    }
}

TEST_F(ParcelRead, PlainDataAcrossAnObjectIsDeniedAndStillAdvances) {
    // word, descriptor object of no descriptor, word
    const std::vector<uint32_t> dataWords = {1, 0x66642a85, 0x17f, 0xffffffff, 0, 0, 0, 9};
    const AParcel* const parcel = received(dataWords, {4});
    int32_t number = 0;
    int64_t wide = 0;
    EXPECT_EQ(STATUS_PERMISSION_DENIED, AParcel_readInt64(parcel, &wide));
    EXPECT_EQ(8, AParcel_getDataPosition(parcel));
    EXPECT_EQ(STATUS_PERMISSION_DENIED, AParcel_readInt32(parcel, &number));
    EXPECT_EQ(12, AParcel_getDataPosition(parcel));
    AParcel_setDataPosition(parcel, 24);
    EXPECT_EQ(STATUS_PERMISSION_DENIED, AParcel_readInt32(parcel, &number));
    EXPECT_EQ(STATUS_OK, AParcel_readInt32(parcel, &number));
    EXPECT_EQ(9, number);
    AParcel_setDataPosition(parcel, 0);
    EXPECT_EQ(STATUS_OK, AParcel_readInt32(parcel, &number));
    EXPECT_EQ(1, number);
}

TEST_F(ParcelRead, DescriptorIsDuplicatedForTheReader) {
    const int sent = fcntl(0, F_DUPFD_CLOEXEC, 100);
    const AParcel* const parcel =
            received({1, 0, 0x66642a85, 0x17f, static_cast<uint32_t>(sent), 0, 0, 0}, {8});
    ndk::ScopedFileDescriptor fd;
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readRequiredParcelFileDescriptor(parcel, &fd));
    EXPECT_NE(sent, fd.get());
    EXPECT_EQ(FD_CLOEXEC, fcntl(fd.get(), F_GETFD));
    AParcel_reset(mOwn.get());
    EXPECT_EQ(-1, fcntl(sent, F_GETFD)) << "what was received belongs to the parcel";
    EXPECT_EQ(FD_CLOEXEC, fcntl(fd.get(), F_GETFD));
}

TEST_F(ParcelRead, DescriptorsOfADroppedObjectListAreClosed) {
    const int sent = fcntl(0, F_DUPFD_CLOEXEC, 100);
    received({0x66642a85, 0x17f, static_cast<uint32_t>(sent), 0, 0, 0,  //
              0x77622a85, 0x113, 1, 0, 2, 0},
             {0, 24});
    EXPECT_EQ(-1, fcntl(sent, F_GETFD));
    EXPECT_EQ(0U, (*mOwn.get())->offsetCount());
}

TEST_F(ParcelRead, NullDescriptor) {
    ndk::ScopedFileDescriptor fd;
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readNullableParcelFileDescriptor(received({0}), &fd));
    EXPECT_EQ(-1, fd.get());
    EXPECT_EQ(STATUS_UNEXPECTED_NULL,
              ndk::AParcel_readRequiredParcelFileDescriptor(received({0}), &fd));
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA,
              ndk::AParcel_readRequiredParcelFileDescriptor(received({}), &fd));
    EXPECT_EQ(STATUS_BAD_TYPE,
              ndk::AParcel_readRequiredParcelFileDescriptor(received({1, 0}), &fd));
    EXPECT_EQ(STATUS_BAD_TYPE, ndk::AParcel_readRequiredParcelFileDescriptor(
                                       received({1, 0, 0x66642a85, 0x17f, 0, 0, 0, 0}), &fd))
            << "an object nobody listed";
}

TEST_F(ParcelRead, ReceivedParcelIsCopiedWhenItIsWrittenTo) {
    const std::vector<uint32_t> before = {1, 2, 3};
    received(before);
    AParcel_setDataPosition(mOwn.get(), 4);
    EXPECT_EQ(STATUS_OK, AParcel_writeInt32(mOwn.get(), 7));
    EXPECT_THAT(words(mOwn.get()), ElementsAre(1U, 7U, 3U));
    EXPECT_EQ(0, mKernel.buffersHeld) << "the buffer is given back at once";
}

// Object lists only a broken driver could deliver.
TEST_F(ParcelRead, BadObjectListsAreDropped) {
    const std::vector<uint32_t> dataWords(20, 0x66642a85);  // every word looks like a descriptor
    const std::vector<std::vector<binder_size_t>> lists = {
            {2},                   // misaligned
            {60},                  // runs past the end
            {80},                  // behind the end
            {0xfffffffffffffff8},  // far behind
            {0, 20},               // overlapping
            {24, 0},               // descending
            {0, 0},                // twice
    };
    for (const auto& list : lists) {
        // 0x66642a85 is no open descriptor, so closing what was listed before is harmless.
        received(dataWords, list);
        EXPECT_EQ(0U, (*mOwn.get())->offsetCount());
        uint32_t word = 0;
        EXPECT_EQ(STATUS_OK, AParcel_readUint32(mOwn.get(), &word));
    }
}

}  // namespace
}  // namespace binder_test
