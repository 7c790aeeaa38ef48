// SPDX-License-Identifier: Apache-2.0
//
// Parcelables of older and newer senders, and malformed ones.
#include <aidl/android/hardware/vibrator/ActivePwle.h>
#include <aidl/android/hardware/vibrator/CompositeEffect.h>
#include <aidl/android/hardware/vibrator/PrimitivePwle.h>
#include <aidl/sample/Lists.h>
#include <aidl/sample/Nothing.h>
#include <aidl/sample/Scalars.h>
#include <aidl/sample/Shape.h>
#include <gtest/gtest.h>

#include "platform/aidl/tests/words.h"

namespace {

using aidl::android::hardware::vibrator::CompositeEffect;
using aidl::android::hardware::vibrator::CompositePrimitive;
using aidl::android::hardware::vibrator::PrimitivePwle;
using aidl::sample::Lists;
using aidl::sample::Scalars;
using aidl::sample::Shape;

template <typename T>
binder_status_t read(const Words& words, T* value, int32_t* position = nullptr) {
    const ndk::ScopedAParcel parcel = parcelOf(words);
    const binder_status_t status = value->readFromParcel(parcel.get());
    if (position != nullptr) *position = AParcel_getDataPosition(parcel.get());
    return status;
}

TEST(ReadParcelable, ShorterOneLeavesTheMissingFieldsAlone) {
    CompositeEffect effect;
    effect.primitive = CompositePrimitive::SPIN;
    effect.scale = 0.25f;
    int32_t position = 0;
    EXPECT_EQ(read({8, 50, 99, 99}, &effect, &position), STATUS_OK);
    EXPECT_EQ(effect.delayMs, 50);
    EXPECT_EQ(effect.primitive, CompositePrimitive::SPIN);
    EXPECT_EQ(effect.scale, 0.25f);
    EXPECT_EQ(position, 8);
}

TEST(ReadParcelable, LongerOneIsSkippedToItsEnd) {
    CompositeEffect effect;
    int32_t position = 0;
    EXPECT_EQ(read({24, 50, 1, 0x3f800000, 0xdeadbeef, 0xdeadbeef, 77}, &effect, &position),
              STATUS_OK);
    EXPECT_EQ(effect.delayMs, 50);
    EXPECT_EQ(effect.scale, 1.0f);
    EXPECT_EQ(position, 24);
}

TEST(ReadParcelable, NewerOneWithoutKnownFieldsIsSkipped) {
    aidl::sample::Nothing nothing;
    int32_t position = 0;
    EXPECT_EQ(read({12, 1, 2, 3}, &nothing, &position), STATUS_OK);
    EXPECT_EQ(position, 12);
}

TEST(ReadParcelable, SizeOfItsOwnWordIsAnOlderOneWithoutFields) {
    CompositeEffect effect;
    effect.delayMs = 8;
    int32_t position = 0;
    EXPECT_EQ(read({4, 50}, &effect, &position), STATUS_OK);
    EXPECT_EQ(effect.delayMs, 8);
    EXPECT_EQ(position, 4);
}

TEST(ReadParcelable, SizeThatEndsInsideAFieldStillReadsTheField) {
    CompositeEffect effect;
    int32_t position = 0;
    EXPECT_EQ(read({6, 50, 99}, &effect, &position), STATUS_OK);
    EXPECT_EQ(effect.delayMs, 50);
    EXPECT_EQ(position, 6);
}

TEST(ReadParcelable, NegativeSizeIsABadValue) {
    CompositeEffect effect;
    EXPECT_EQ(read({0xffffffff, 1, 2, 3}, &effect), STATUS_BAD_VALUE);
    EXPECT_EQ(read({0x80000000, 1, 2, 3}, &effect), STATUS_BAD_VALUE);
}

TEST(ReadParcelable, EndBeyondTheLargestPositionIsABadValue) {
    const ndk::ScopedAParcel parcel = parcelOf({0, 0x7fffffff, 1, 2, 3});
    AParcel_setDataPosition(parcel.get(), 4);
    CompositeEffect effect;
    EXPECT_EQ(effect.readFromParcel(parcel.get()), STATUS_BAD_VALUE);
}

TEST(ReadParcelable, MissingSizeOrFieldIsNotEnoughData) {
    CompositeEffect effect;
    EXPECT_EQ(read({}, &effect), STATUS_NOT_ENOUGH_DATA);
    EXPECT_EQ(read({16, 50, 1}, &effect), STATUS_NOT_ENOUGH_DATA);
}

TEST(ReadParcelable, AnnouncedSizeIsNotComparedWithTheParcel) {
    CompositeEffect effect;
    int32_t position = 0;
    EXPECT_EQ(read({0x1000, 50, 1, 0x3f800000}, &effect, &position), STATUS_OK);
    EXPECT_EQ(position, 0x1000);
}

TEST(ReadParcelable, NullTextIsUnexpected) {
    Scalars scalars;
    EXPECT_EQ(read({0x40, 1, 2, 3, 4, 5, 6, 7, 8, 9, 0xffffffff}, &scalars),
              STATUS_UNEXPECTED_NULL);
}

TEST(ReadParcelable, NullListHasNoMemoryAndOneWithANegativeLengthIsABadValue) {
    Lists lists;
    EXPECT_EQ(read({0x100, 0xffffffff}, &lists), STATUS_NO_MEMORY);
    EXPECT_EQ(read({0x100, 0xfffffffe}, &lists), STATUS_BAD_VALUE);
}

TEST(ReadParcelable, ListShorterThanAnnouncedHasNoMemory) {
    Lists lists;
    EXPECT_EQ(read({0x100, 0, 0x7fffffff, 1}, &lists), STATUS_NO_MEMORY);
}

TEST(ReadUnion, UnknownTagIsABadValue) {
    PrimitivePwle primitive;
    EXPECT_EQ(read({2, 1, 0x18, 0, 0, 0, 0, 0}, &primitive), STATUS_BAD_VALUE);
    EXPECT_EQ(read({0xffffffff, 1, 0x18, 0, 0, 0, 0, 0}, &primitive), STATUS_BAD_VALUE);
}

TEST(ReadUnion, NullFieldIsUnexpectedUnlessItMayBe) {
    Shape shape;
    EXPECT_EQ(read({2, 0}, &shape), STATUS_UNEXPECTED_NULL);
    EXPECT_EQ(read({4, 0}, &shape), STATUS_OK);
    EXPECT_EQ(shape.getTag(), Shape::maybe);
}

TEST(ReadUnion, FailureLeavesTheValueAlone) {
    Shape shape = Shape::make<Shape::name>("kept");
    EXPECT_EQ(read({0}, &shape), STATUS_NOT_ENOUGH_DATA);
    EXPECT_EQ(shape.get<Shape::name>(), "kept");
}

TEST(ReadUnion, MissingTagIsNotEnoughData) {
    Shape shape;
    EXPECT_EQ(read({}, &shape), STATUS_NOT_ENOUGH_DATA);
}

TEST(ReadEnum, AnyNumberIsTaken) {
    CompositeEffect effect;
    EXPECT_EQ(read({16, 0, 0x7fffffff, 0}, &effect), STATUS_OK);
    EXPECT_EQ(effect.primitive, static_cast<CompositePrimitive>(0x7fffffff));
}

TEST(ReadEnum, OfABackingByteTakesTheLowestByte) {
    Shape shape;
    EXPECT_EQ(read({5, 0xffffff04}, &shape), STATUS_OK);
    EXPECT_EQ(shape.get<Shape::color>(), aidl::sample::Color::GREEN);
}

}  // namespace
