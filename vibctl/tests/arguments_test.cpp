// SPDX-License-Identifier: Apache-2.0
//
// Single words as values, and what is said about those that are none.
#include "vibctl/arguments.h"

#include <cmath>
#include <limits>

#include <aidl/android/hardware/vibrator/Effect.h>
#include <aidl/android/hardware/vibrator/EffectStrength.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace vibctl {
namespace {

using aidl::android::hardware::vibrator::Effect;
using aidl::android::hardware::vibrator::EffectStrength;

// The value of a word that must be one.
template <typename T>
T valueOf(const std::string& word) {
    T value{};
    const Problem problem = Argument<T>::parse("X", word, value);
    EXPECT_FALSE(problem) << *problem;
    return value;
}

// What is said about a word that must not be one.
template <typename T>
std::string problemWith(const std::string& word) {
    T value{};
    return Argument<T>::parse("X", word, value).value_or("no problem");
}

TEST(IntegerArgument, TakesTheWholeRange) {
    EXPECT_EQ(valueOf<int32_t>("0"), 0);
    EXPECT_EQ(valueOf<int32_t>("500"), 500);
    EXPECT_EQ(valueOf<int32_t>("-1"), -1);
    EXPECT_EQ(valueOf<int32_t>("+7"), 7);
    EXPECT_EQ(valueOf<int32_t>("007"), 7);
    EXPECT_EQ(valueOf<int32_t>("2147483647"), 2147483647);
    EXPECT_EQ(valueOf<int32_t>("-2147483648"), std::numeric_limits<int32_t>::min());
}

TEST(IntegerArgument, RefusesEverythingElse) {
    EXPECT_EQ(problemWith<int32_t>("abc"),
              "X \"abc\" is not an integer from -2147483648 to 2147483647");
    for (const char* word : {"", " 1", "1 ", "1.0", "1e3", "0x10", "--1", "+-1", "-", "+", "nan",
                             "2147483648", "-2147483649", "99999999999999999999"}) {
        EXPECT_NE(problemWith<int32_t>(word), "no problem") << word;
    }
}

TEST(IntegerArgument, KeepsControlCharactersOutOfTheMessage) {
    EXPECT_EQ(problemWith<int32_t>("1\n"),
              "X \"1\\n\" is not an integer from -2147483648 to 2147483647");
}

TEST(FloatArgument, TakesNumbers) {
    EXPECT_EQ(valueOf<float>("0.5"), 0.5F);
    EXPECT_EQ(valueOf<float>("1"), 1.0F);
    EXPECT_EQ(valueOf<float>("-0.25"), -0.25F);
    EXPECT_EQ(valueOf<float>("+2"), 2.0F);
    EXPECT_EQ(valueOf<float>("1e-3"), 0.001F);
    EXPECT_EQ(valueOf<float>(".5"), 0.5F);
}

TEST(FloatArgument, TakesNanAndInfinities) {
    EXPECT_TRUE(std::isnan(valueOf<float>("nan")));
    EXPECT_TRUE(std::isnan(valueOf<float>("NaN")));
    EXPECT_EQ(valueOf<float>("inf"), std::numeric_limits<float>::infinity());
    EXPECT_EQ(valueOf<float>("-inf"), -std::numeric_limits<float>::infinity());
}

TEST(FloatArgument, RefusesEverythingElse) {
    EXPECT_EQ(problemWith<float>("half"),
              "X \"half\" is not a number a float can hold (nor nan, inf, -inf)");
    for (const char* word : {"", " 1", "1 ", "0,5", "1e99", "-", "--1", "0x1p3"}) {
        EXPECT_NE(problemWith<float>(word), "no problem") << word;
    }
}

TEST(BoolArgument, TakesTrueAndFalseInAnyCaseAndTheDigits) {
    EXPECT_TRUE(valueOf<bool>("true"));
    EXPECT_TRUE(valueOf<bool>("TRUE"));
    EXPECT_TRUE(valueOf<bool>("1"));
    EXPECT_FALSE(valueOf<bool>("false"));
    EXPECT_FALSE(valueOf<bool>("False"));
    EXPECT_FALSE(valueOf<bool>("0"));
}

TEST(BoolArgument, RefusesEverythingElse) {
    EXPECT_EQ(problemWith<bool>("maybe"), "X \"maybe\" is neither true nor false");
    EXPECT_EQ(problemWith<bool>("2"), "X \"2\" is neither true nor false");
    EXPECT_EQ(problemWith<bool>(""), "X \"\" is neither true nor false");
}

TEST(StringArgument, TakesAnyWord) {
    EXPECT_EQ(valueOf<std::string>("HAPTIC_ENGINE"), "HAPTIC_ENGINE");
    EXPECT_EQ(valueOf<std::string>(""), "");
    EXPECT_EQ(valueOf<std::string>("a b,c"), "a b,c");
}

TEST(EnumeratorArgument, TakesNamesInAnyCase) {
    EXPECT_EQ(valueOf<Effect>("CLICK"), Effect::CLICK);
    EXPECT_EQ(valueOf<Effect>("heavy_click"), Effect::HEAVY_CLICK);
    EXPECT_EQ(valueOf<Effect>("Texture_Tick"), Effect::TEXTURE_TICK);
    EXPECT_EQ(valueOf<EffectStrength>("strong"), EffectStrength::STRONG);
}

TEST(EnumeratorArgument, TakesAnyNumberOfTheBackingType) {
    EXPECT_EQ(valueOf<Effect>("5"), Effect::HEAVY_CLICK);
    EXPECT_EQ(valueOf<Effect>("-1"), static_cast<Effect>(-1));
    EXPECT_EQ(valueOf<Effect>("2147483647"), static_cast<Effect>(2147483647));
    EXPECT_EQ(valueOf<EffectStrength>("3"), static_cast<EffectStrength>(3));
    EXPECT_EQ(valueOf<EffectStrength>("-128"), static_cast<EffectStrength>(-128));
    EXPECT_EQ(valueOf<EffectStrength>("127"), static_cast<EffectStrength>(127));
}

TEST(EnumeratorArgument, RefusesOtherNamesAndNumbersBeyondTheBackingType) {
    EXPECT_EQ(problemWith<EffectStrength>("hard"),
              "X \"hard\" is neither a number from -128 to 127 nor one of LIGHT, MEDIUM, STRONG");
    EXPECT_EQ(problemWith<EffectStrength>("128"),
              "X \"128\" is neither a number from -128 to 127 nor one of LIGHT, MEDIUM, STRONG");
    EXPECT_NE(problemWith<EffectStrength>(""), "no problem");
    EXPECT_NE(problemWith<EffectStrength>("LIGH"), "no problem");
    EXPECT_NE(problemWith<Effect>("2147483648"), "no problem");
}

TEST(EnumeratorArgument, ListsNamesWithTheirNumbers) {
    EXPECT_EQ(Argument<EffectStrength>::accepted(), "LIGHT 0, MEDIUM 1, STRONG 2, or any number");
}

TEST(Packet, FillsItsFieldsInOrder) {
    int32_t first = 0;
    float second = 0;
    Effect third{};
    EXPECT_FALSE(parsePacket("FIRST,SECOND,THIRD", "-3,0.5,tick", first, second, third));
    EXPECT_EQ(first, -3);
    EXPECT_EQ(second, 0.5F);
    EXPECT_EQ(third, Effect::TICK);
}

TEST(Packet, NamesTheFieldThatIsWrong) {
    int32_t first = 0;
    bool second = false;
    EXPECT_EQ(parsePacket("FIRST,SECOND", "1,x", first, second),
              "packet \"1,x\": SECOND \"x\" is neither true nor false");
    EXPECT_EQ(parsePacket("FIRST,SECOND", "1 ,x", first, second),
              "packet \"1 ,x\": FIRST \"1 \" is not an integer from -2147483648 to 2147483647");
    EXPECT_EQ(parsePacket("FIRST,SECOND", ",true", first, second),
              "packet \",true\": FIRST \"\" is not an integer from -2147483648 to 2147483647");
}

TEST(Packet, CountsItsFields) {
    int32_t first = 0;
    int32_t second = 0;
    EXPECT_EQ(parsePacket("FIRST,SECOND", "1", first, second),
              "packet \"1\": 1 field where 2 are wanted: FIRST,SECOND");
    EXPECT_EQ(parsePacket("FIRST,SECOND", "1,2,3", first, second),
              "packet \"1,2,3\": 3 fields where 2 are wanted: FIRST,SECOND");
    EXPECT_EQ(parsePacket("FIRST,SECOND", "1,2,", first, second),
              "packet \"1,2,\": 3 fields where 2 are wanted: FIRST,SECOND");
}

}  // namespace
}  // namespace vibctl
