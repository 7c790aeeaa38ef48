// SPDX-License-Identifier: Apache-2.0
//
// What generated parcelables and unions write, word by word, and read back.
#include <aidl/android/hardware/vibrator/CompositeEffect.h>
#include <aidl/android/hardware/vibrator/PrimitivePwle.h>
#include <aidl/sample/Awkward.h>
#include <aidl/sample/Lists.h>
#include <aidl/sample/Nothing.h>
#include <aidl/sample/Nullables.h>
#include <aidl/sample/Scalars.h>
#include <aidl/sample/Shape.h>
#include <aidl/vendor/quorvan/hardware/vibrator/ZelHybridHapticEnginePacket.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/aidl/tests/words.h"

namespace {

using ::testing::ElementsAre;

using aidl::android::hardware::vibrator::ActivePwle;
using aidl::android::hardware::vibrator::Braking;
using aidl::android::hardware::vibrator::BrakingPwle;
using aidl::android::hardware::vibrator::CompositeEffect;
using aidl::android::hardware::vibrator::CompositePrimitive;
using aidl::android::hardware::vibrator::PrimitivePwle;
using aidl::sample::Color;
using aidl::sample::Lists;
using aidl::sample::Nullables;
using aidl::sample::Point;
using aidl::sample::Scalars;
using aidl::sample::Shape;
using aidl::sample::Size;
using aidl::vendor::quorvan::hardware::vibrator::ZelHybridHapticEnginePacket;
using aidl::vendor::quorvan::hardware::vibrator::ZelHybridHapticEnginePacketType;

template <typename T>
T rewritten(const T& value) {
    const ndk::ScopedAParcel parcel(AParcel_create());
    EXPECT_EQ(value.writeToParcel(parcel.get()), STATUS_OK);
    EXPECT_EQ(AParcel_setDataPosition(parcel.get(), 0), STATUS_OK);
    T read;
    EXPECT_EQ(read.readFromParcel(parcel.get()), STATUS_OK);
    EXPECT_EQ(AParcel_getDataPosition(parcel.get()), AParcel_getDataSize(parcel.get()));
    return read;
}

Point pointAt(int32_t x, float y) {
    Point point;
    point.x = x;
    point.y = y;
    return point;
}

TEST(Parcelable, CompositeEffectIsItsSizeAndThreeFields) {
    CompositeEffect effect;
    effect.delayMs = 50;
    effect.primitive = CompositePrimitive::CLICK;
    effect.scale = 1.0f;
    EXPECT_THAT(written(effect), ElementsAre(0x10, 0x32, 1, 0x3f800000));
    EXPECT_EQ(rewritten(effect), effect);
}

TEST(Parcelable, HybridPacketIsItsSizeAndFiveFields) {
    ZelHybridHapticEnginePacket packet;
    packet.time = 5;
    packet.intensity = 5000;
    packet.type = static_cast<ZelHybridHapticEnginePacketType>(1);
    packet.value = -3;
    packet.frequency = 170;
    EXPECT_THAT(written(packet), ElementsAre(24, 5, 5000, 1, 0xfffffffd, 170));
    EXPECT_EQ(rewritten(packet), packet);
}

TEST(Parcelable, ScalarsHaveTheirWidthsAndNoPaddingBetween) {
    Scalars scalars;
    scalars.flag = true;
    scalars.small = -2;
    scalars.letter = u'\u00e9';
    scalars.number = 0x01020304;
    scalars.big = 0x1122334455667788;
    scalars.ratio = 1.0f;
    scalars.precise = -2.0;
    scalars.text = "hi";
    scalars.color = Color::BLUE;
    scalars.size = Size::LARGE;
    EXPECT_THAT(written(scalars),
                ElementsAre(0x40, 1, 0xfffffffe, 0xe9, 0x01020304, 0x55667788, 0x11223344,
                            0x3f800000, 0, 0xc0000000, 2, 0x00690068, 0, 5, 0, 1));
    EXPECT_EQ(rewritten(scalars), scalars);
}

TEST(Parcelable, ListsArePackedExceptBooleansAndCharacters) {
    Lists lists;
    lists.flags = {true, false};
    lists.bytes = {1, 2, 255};
    lists.letters = {u'a', u'b'};
    lists.bigs = {1};
    lists.ratios = {1.0f};
    lists.precises = {-2.0};
    lists.texts = {"a", ""};
    lists.colors = {Color::RED, Color::BLUE};
    lists.sizes = {Size::LARGE};
    lists.points = {pointAt(9, 1.0f)};
    lists.names = {"b"};
    EXPECT_THAT(written(lists), ElementsAre(36 * 4,                   //
                                            2, 1, 0,                  // flags
                                            3, 0x00ff0201,            // bytes
                                            2, 0x61, 0x62,            // letters
                                            0,                        // numbers
                                            1, 1, 0,                  // bigs
                                            1, 0x3f800000,            // ratios
                                            1, 0, 0xc0000000,         // precises
                                            2, 1, 0x00000061, 0, 0,   // strings
                                            2, 0x00000500,            // colors
                                            1, 0, 1,                  // sizes
                                            1, 1, 12, 9, 0x3f800000,  // points
                                            1, 1, 0x00000062));       // names
    EXPECT_EQ(rewritten(lists), lists);
}

TEST(Parcelable, NullsHaveTheirOwnMarks) {
    const Nullables nulls;
    EXPECT_THAT(written(nulls), ElementsAre(23 * 4,                            //
                                            0xffffffff,                        // string
                                            0,                                 // point
                                            0,                                 // shape
                                            0xffffffff,                        // numbers
                                            0xffffffff,                        // strings
                                            0xffffffff,                        // colors
                                            0xffffffff,                        // points
                                            0x73622a85, 0x113, 0, 0, 0, 0, 1,  // listener
                                            0x73622a85, 0x113, 0, 0, 0, 0, 1,  // binder
                                            0));                               // file
    EXPECT_EQ(rewritten(nulls), nulls);
}

TEST(Parcelable, NullableFieldsTravelWhenTheyAreSet) {
    Nullables set;
    set.text = "x";
    set.point = pointAt(1, 2.0f);
    set.shape = Shape(4);
    set.numbers = {{5, 6}};
    set.texts = {{"a", std::nullopt}};
    set.colors = {{Color::GREEN}};
    set.points = {{std::nullopt, pointAt(7, 8.0f)}};
    EXPECT_EQ(rewritten(set), set);
}

TEST(Parcelable, WithoutFieldsIsItsSizeAlone) {
    EXPECT_THAT(written(aidl::sample::Nothing()), ElementsAre(4));
    EXPECT_EQ(rewritten(aidl::sample::Nothing()), aidl::sample::Nothing());
}

TEST(Parcelable, FieldNamesDoNotMeetGeneratedOnes) {
    aidl::sample::Awkward awkward;
    awkward.status = 1;
    awkward.parcel = 2;
    awkward.start = 3;
    awkward.size = 4;
    awkward.end = 5;
    awkward.rhs = 6;
    awkward.os = 7;
    EXPECT_THAT(written(awkward), ElementsAre(32, 1, 2, 3, 4, 5, 6, 7));
    EXPECT_EQ(rewritten(awkward), awkward);
}

TEST(Union, IsItsTagAndTheFieldAndHasNoSize) {
    ActivePwle active;
    active.startAmplitude = 0.5f;
    active.startFrequency = 150.0f;
    active.endAmplitude = 0.5f;
    active.endFrequency = 150.0f;
    active.duration = 100;
    EXPECT_THAT(written(PrimitivePwle(active)),
                ElementsAre(0, 1, 0x18, 0x3f000000, 0x43160000, 0x3f000000, 0x43160000, 0x64));

    BrakingPwle braking;
    braking.braking = Braking::CLAB;
    braking.duration = 20;
    EXPECT_THAT(written(PrimitivePwle(braking)), ElementsAre(1, 1, 0xc, 1, 0x14));
    EXPECT_EQ(rewritten(PrimitivePwle(braking)), PrimitivePwle(braking));
}

TEST(Union, FieldTravelsAsAnArgumentOfItsType) {
    EXPECT_THAT(written(Shape()), ElementsAre(0, 7));
    EXPECT_THAT(written(Shape::make<Shape::name>("hi")), ElementsAre(1, 2, 0x00690068, 0));
    EXPECT_THAT(written(Shape::make<Shape::point>(pointAt(1, 1.0f))),
                ElementsAre(2, 1, 12, 1, 0x3f800000));
    EXPECT_THAT(written(Shape::make<Shape::colors>(2U, Color::BLUE)),
                ElementsAre(3, 2, 0x00000505));
    EXPECT_THAT(written(Shape::make<Shape::maybe>()), ElementsAre(4, 0));
    EXPECT_THAT(written(Shape::make<Shape::color>(Color::DARK)), ElementsAre(5, 0xffffff80));
}

TEST(Union, EveryFieldIsReadBack) {
    for (const Shape& shape :
         {Shape(), Shape::make<Shape::name>("n"), Shape::make<Shape::point>(pointAt(1, 2.0f)),
          Shape::make<Shape::colors>(1U, Color::GREEN), Shape::make<Shape::maybe>(),
          Shape::make<Shape::color>(Color::DARK)}) {
        EXPECT_EQ(rewritten(shape), shape) << shape.toString();
    }
}

}  // namespace
