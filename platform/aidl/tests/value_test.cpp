// SPDX-License-Identifier: Apache-2.0
//
// Generated parcelables, unions and enumerations as C++ values: defaults, strings, comparison.
#include <cstring>
#include <limits>
#include <type_traits>

#include <aidl/android/hardware/vibrator/CompositeEffect.h>
#include <aidl/android/hardware/vibrator/Effect.h>
#include <aidl/android/hardware/vibrator/EffectStrength.h>
#include <aidl/android/hardware/vibrator/PrimitivePwle.h>
#include <aidl/sample/Color.h>
#include <aidl/sample/Defaults.h>
#include <aidl/sample/Lists.h>
#include <aidl/sample/Nothing.h>
#include <aidl/sample/Nullables.h>
#include <aidl/sample/Point.h>
#include <aidl/sample/Scalars.h>
#include <aidl/sample/Shape.h>
#include <aidl/sample/Size.h>
#include <aidl/vendor/quorvan/hardware/vibrator/ZelFifoType.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace {

using ::testing::ElementsAre;

using aidl::android::hardware::vibrator::CompositeEffect;
using aidl::android::hardware::vibrator::CompositePrimitive;
using aidl::android::hardware::vibrator::Effect;
using aidl::android::hardware::vibrator::EffectStrength;
using aidl::android::hardware::vibrator::PrimitivePwle;
using aidl::sample::Color;
using aidl::sample::Defaults;
using aidl::sample::Point;
using aidl::sample::Scalars;
using aidl::sample::Shape;
using aidl::sample::Size;

TEST(Enum, BackingTypeIsByteUnlessNamed) {
    EXPECT_TRUE((std::is_same_v<std::underlying_type_t<EffectStrength>, int8_t>));
    EXPECT_TRUE((std::is_same_v<std::underlying_type_t<Color>, int8_t>));
    EXPECT_TRUE((std::is_same_v<std::underlying_type_t<Effect>, int32_t>));
    EXPECT_TRUE((std::is_same_v<std::underlying_type_t<Size>, int64_t>));
}

TEST(Enum, ValuesCountUpFromTheOneBefore) {
    EXPECT_EQ(static_cast<int>(Color::RED), 0);
    EXPECT_EQ(static_cast<int>(Color::GREEN), 4);
    EXPECT_EQ(static_cast<int>(Color::BLUE), 5);
    EXPECT_EQ(static_cast<int>(Color::CRIMSON), 0);
    EXPECT_EQ(static_cast<int>(Color::DARK), -128);
    EXPECT_EQ(static_cast<int64_t>(Size::LARGE), 4294967296);
    EXPECT_EQ(static_cast<int>(Effect::TEXTURE_TICK), 21);
}

TEST(Enum, TextIsTheFirstNameOfTheValue) {
    EXPECT_EQ(toString(Effect::HEAVY_CLICK), "HEAVY_CLICK");
    EXPECT_EQ(toString(Color::CRIMSON), "RED");
}

TEST(Enum, TextOfAnUnknownValueIsItsNumber) {
    EXPECT_EQ(toString(static_cast<Effect>(-7)), "-7");
    EXPECT_EQ(toString(static_cast<Color>(65)), "65");
    EXPECT_EQ(toString(static_cast<Size>(4294967297)), "4294967297");
}

TEST(Enum, RangeVisitsTheValuesInOrderOfDeclaration) {
    std::vector<Color> colors;
    for (const Color color : ndk::enum_range<Color>()) colors.push_back(color);
    EXPECT_THAT(colors,
                ElementsAre(Color::RED, Color::GREEN, Color::BLUE, Color::CRIMSON, Color::DARK));
    EXPECT_EQ(ndk::internal::enum_values<Effect>.size(), 22U);
    using FifoType = aidl::vendor::quorvan::hardware::vibrator::ZelFifoType;
    EXPECT_EQ(ndk::internal::enum_values<FifoType>.size(), 26U);
}

TEST(Parcelable, FieldsWithoutDefaultAreZero) {
    // Memory that held something else: what is not initialised shows.
    alignas(Scalars) unsigned char memory[sizeof(Scalars)];
    std::memset(memory, 0xa5, sizeof memory);
    auto* const scalars = new (memory) Scalars;
    EXPECT_FALSE(scalars->flag);
    EXPECT_EQ(scalars->small, 0);
    EXPECT_EQ(scalars->letter, u'\0');
    EXPECT_EQ(scalars->number, 0);
    EXPECT_EQ(scalars->big, 0);
    EXPECT_EQ(scalars->ratio, 0.0f);
    EXPECT_EQ(scalars->precise, 0.0);
    EXPECT_EQ(scalars->text, "");
    EXPECT_EQ(scalars->color, Color::RED);
    EXPECT_EQ(static_cast<int64_t>(scalars->size), 0);
    scalars->~Scalars();
}

TEST(Parcelable, DefaultsOfTheFileAreKept) {
    const Defaults defaults;
    EXPECT_TRUE(defaults.flag);
    EXPECT_EQ(defaults.small, -1);
    EXPECT_EQ(defaults.letter, u'q');
    EXPECT_EQ(defaults.number, 42);
    EXPECT_EQ(defaults.big, std::numeric_limits<int64_t>::min());
    EXPECT_EQ(defaults.ratio, 0.5f);
    EXPECT_EQ(defaults.precise, -2.5);
    EXPECT_EQ(defaults.text, "say \"hi\"");
    EXPECT_EQ(defaults.color, Color::BLUE);
    EXPECT_THAT(defaults.numbers, ElementsAre(1, 2, 3));
    EXPECT_THAT(defaults.bytes, ElementsAre(255, 127));
    EXPECT_THAT(defaults.colors, ElementsAre(Color::GREEN));
    EXPECT_EQ(CompositeEffect().primitive, CompositePrimitive::NOOP);
}

TEST(Parcelable, TextNamesTheFields) {
    CompositeEffect effect;
    effect.delayMs = 50;
    effect.primitive = CompositePrimitive::CLICK;
    effect.scale = 0.5f;
    EXPECT_EQ(effect.toString(), "CompositeEffect{delayMs: 50, primitive: CLICK, scale: 0.500000}");
    EXPECT_EQ(aidl::sample::Nothing().toString(), "Nothing{}");
}

TEST(Parcelable, TextShowsListsAndNulls) {
    aidl::sample::Lists lists;
    lists.flags = {true, false};
    lists.colors = {Color::BLUE, static_cast<Color>(9)};
    EXPECT_EQ(lists.toString(),
              "Lists{flags: [true, false], bytes: [], letters: [], numbers: [], bigs: [], "
              "ratios: [], precises: [], texts: [], colors: [BLUE, 9], sizes: [], points: [], "
              "names: []}");
    aidl::sample::Nullables nulls;
    nulls.point = Point();
    EXPECT_EQ(nulls.toString(),
              "Nullables{text: (null), point: Point{x: 3, y: 0.000000}, shape: (null), "
              "numbers: (null), texts: (null), colors: (null), points: (null), listener: , "
              "binder: (null), file: (null)}");
}

TEST(Parcelable, ComparisonGoesFieldByField) {
    Point less;
    Point more;
    less.x = 1;
    less.y = 9.0f;
    more.x = 2;
    more.y = 0.0f;
    EXPECT_TRUE(less < more);
    EXPECT_TRUE(less <= more);
    EXPECT_TRUE(less != more);
    EXPECT_FALSE(less == more);
    EXPECT_FALSE(less > more);
    EXPECT_FALSE(less >= more);
    more = less;
    EXPECT_TRUE(less == more);
    EXPECT_TRUE(less <= more);
    EXPECT_TRUE(less >= more);
    EXPECT_FALSE(less != more);
    more.y = 10.0f;
    EXPECT_TRUE(less < more);
}

TEST(Parcelable, CarriesItsNameStabilityAndSizeMark) {
    EXPECT_STREQ(CompositeEffect::descriptor, "android.hardware.vibrator.CompositeEffect");
    EXPECT_STREQ(Point::descriptor, "sample.Point");
    EXPECT_EQ(CompositeEffect::_aidl_stability, ndk::STABILITY_VINTF);
    EXPECT_EQ(PrimitivePwle::_aidl_stability, ndk::STABILITY_VINTF);
    EXPECT_EQ(Point::_aidl_stability, ndk::STABILITY_LOCAL);
    EXPECT_TRUE((std::is_same_v<Point::fixed_size, std::true_type>));
    EXPECT_TRUE((std::is_same_v<CompositeEffect::fixed_size, std::false_type>));
    EXPECT_EQ(static_cast<int>(Defaults::BASE), 40);
}

TEST(Union, StartsWithTheFirstFieldAndItsDefault) {
    const Shape shape;
    EXPECT_EQ(shape.getTag(), Shape::id);
    EXPECT_EQ(shape.get<Shape::id>(), 7);
    EXPECT_EQ(PrimitivePwle().getTag(), PrimitivePwle::active);
}

TEST(Union, IsMadeFromAFieldsValue) {
    const Shape shape = std::string("circle");
    EXPECT_EQ(shape.getTag(), Shape::name);
    EXPECT_EQ(shape.get<Shape::name>(), "circle");
    EXPECT_EQ(Shape(std::in_place_index<3>, 2, Color::BLUE).get<Shape::colors>().size(), 2U);
}

TEST(Union, SetChangesTheTag) {
    Shape shape;
    shape.set<Shape::name>("square");
    EXPECT_EQ(shape.getTag(), Shape::name);
    shape.get<Shape::name>() += "!";
    EXPECT_EQ(shape.get<Shape::name>(), "square!");
}

TEST(Union, CopiesAndMoves) {
    Shape shape = Shape::make<Shape::name>("square");
    Shape copy = shape;
    EXPECT_EQ(copy, shape);
    const Shape moved = std::move(copy);
    EXPECT_EQ(moved.get<Shape::name>(), "square");
    copy = moved;
    EXPECT_EQ(copy, moved);
}

TEST(UnionDeathTest, GettingAnotherFieldAborts) {
    const Shape shape;
    EXPECT_DEATH(static_cast<void>(shape.get<Shape::name>()), "getTag\\(\\) == tag");
}

TEST(Union, ComparisonLooksAtTheTagFirst) {
    EXPECT_TRUE(Shape(99) < Shape::make<Shape::name>("a"));
    EXPECT_TRUE(Shape(1) < Shape(2));
    EXPECT_TRUE(Shape(2) >= Shape(2));
    EXPECT_TRUE(Shape(2) != Shape::make<Shape::color>(Color::RED));
}

TEST(Union, TextNamesTheFieldThatIsSet) {
    EXPECT_EQ(Shape().toString(), "Shape{id: 7}");
    EXPECT_EQ(Shape::make<Shape::color>(Color::GREEN).toString(), "Shape{color: GREEN}");
    EXPECT_EQ(Shape::make<Shape::maybe>().toString(), "Shape{maybe: (null)}");
}

TEST(Union, CarriesItsConstants) {
    EXPECT_STREQ(Shape::KIND, "shape");
}

}  // namespace
