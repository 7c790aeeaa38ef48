// SPDX-License-Identifier: Apache-2.0
//
// Words in, calls of IVibrator out: what reaches the service for every form of argument, and what
// is made of its answer.
#include <cmath>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "vibctl/find_method.h"
#include "vibctl/tests/prepared_call.h"

namespace vibctl {
namespace {

using aidl::android::hardware::vibrator::Braking;
using aidl::android::hardware::vibrator::CompositeEffect;
using aidl::android::hardware::vibrator::CompositePrimitive;
using aidl::android::hardware::vibrator::Effect;
using aidl::android::hardware::vibrator::EffectStrength;
using aidl::android::hardware::vibrator::IVibratorCallbackDefault;
using aidl::android::hardware::vibrator::IVibratorDefault;
using aidl::android::hardware::vibrator::PrimitivePwle;
using ::testing::_;
using ::testing::DoAll;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SaveArg;
using ::testing::SetArgPointee;
using ::testing::Truly;

class MockVibrator : public IVibratorDefault {
  public:
    using Status = ndk::ScopedAStatus;
    MOCK_METHOD(Status, getCapabilities, (int32_t*), (override));
    MOCK_METHOD(Status, off, (), (override));
    MOCK_METHOD(Status, on, (int32_t, const Callback&), (override));
    MOCK_METHOD(Status, perform, (Effect, EffectStrength, const Callback&, int32_t*), (override));
    MOCK_METHOD(Status, getSupportedEffects, (std::vector<Effect>*), (override));
    MOCK_METHOD(Status, setAmplitude, (float), (override));
    MOCK_METHOD(Status, setExternalControl, (bool), (override));
    MOCK_METHOD(Status, getPrimitiveDuration, (CompositePrimitive, int32_t*), (override));
    MOCK_METHOD(Status, compose, (const std::vector<CompositeEffect>&, const Callback&),
                (override));
    MOCK_METHOD(Status, alwaysOnEnable, (int32_t, Effect, EffectStrength), (override));
    MOCK_METHOD(Status, getResonantFrequency, (float*), (override));
    MOCK_METHOD(Status, getBandwidthAmplitudeMap, (std::vector<float>*), (override));
    MOCK_METHOD(Status, composePwle, (const std::vector<PrimitivePwle>&, const Callback&),
                (override));
};

class StandardCall : public ::testing::Test {
  protected:
    // Makes the call that the words ask for.
    Outcome call(const std::vector<std::string>& words, const Callback& callback = nullptr) {
        return makeCall("std", words, *mVibrator, callback);
    }

    std::shared_ptr<MockVibrator> mVibrator = ndk::SharedRefBase::make<MockVibrator>();
};

TEST(StandardTable, HasEveryMethodInOrder) {
    std::vector<std::string> names;
    for (const auto& method : standardMethods()) names.emplace_back(method.name);
    EXPECT_THAT(names, ElementsAre("getCapabilities", "off", "on", "perform", "getSupportedEffects",
                                   "setAmplitude", "setExternalControl", "getCompositionDelayMax",
                                   "getCompositionSizeMax", "getSupportedPrimitives",
                                   "getPrimitiveDuration", "compose", "getSupportedAlwaysOnEffects",
                                   "alwaysOnEnable", "alwaysOnDisable", "getResonantFrequency",
                                   "getQFactor", "getFrequencyResolution", "getFrequencyMinimum",
                                   "getBandwidthAmplitudeMap", "getPwlePrimitiveDurationMax",
                                   "getPwleCompositionSizeMax", "getSupportedBraking",
                                   "composePwle", "getInterfaceVersion", "getInterfaceHash"));
}

TEST(StandardTable, NamesAsManyParametersAsTheMethodTakes) {
    for (const auto& method : standardMethods()) {
        EXPECT_EQ(method.parameterNames().size(), method.accepted().size()) << method.name;
    }
}

TEST(StandardTable, OnlyCompositionsAwaitTheirCompletion) {
    std::vector<std::string> awaited;
    for (const auto& method : standardMethods()) {
        if (method.traits.awaitsCompletion) awaited.emplace_back(method.name);
    }
    EXPECT_THAT(awaited, ElementsAre("compose", "composePwle"));
}

TEST_F(StandardCall, WithoutArgumentsOrResult) {
    EXPECT_CALL(*mVibrator, off()).WillOnce(answerOk());
    const Outcome outcome = call({"off"});
    EXPECT_EQ(outcome.exception, EX_NONE);
    EXPECT_EQ(outcome.result, "null");
    EXPECT_EQ(humanLine("off", outcome), "off: ok");
    EXPECT_GE(outcome.microseconds, 0);
}

TEST_F(StandardCall, PassesAnInteger) {
    EXPECT_CALL(*mVibrator, on(-5, Callback())).WillOnce(answerOk());
    call({"on", "-5"});
}

TEST_F(StandardCall, PassesEnumeratorsByNameAndByNumber) {
    EXPECT_CALL(*mVibrator, perform(Effect::CLICK, EffectStrength::STRONG, Callback(), _))
            .WillOnce(DoAll(SetArgPointee<3>(60), answerOk()));
    const Outcome outcome = call({"perform", "click", "2"});
    EXPECT_EQ(outcome.result, "60");
    EXPECT_EQ(humanLine("perform", outcome), "perform: ok, 60 ms");
}

TEST_F(StandardCall, PassesNumbersThatAreNoEnumerators) {
    EXPECT_CALL(*mVibrator,
                perform(static_cast<Effect>(-1), static_cast<EffectStrength>(3), Callback(), _))
            .WillOnce(answerOk());
    call({"perform", "-1", "3"});
}

TEST_F(StandardCall, PassesTheCallback) {
    const Callback callback = ndk::SharedRefBase::make<IVibratorCallbackDefault>();
    EXPECT_CALL(*mVibrator, on(100, callback)).WillOnce(answerOk());
    call({"on", "100"}, callback);
}

TEST_F(StandardCall, PassesNan) {
    EXPECT_CALL(*mVibrator, setAmplitude(Truly([](float value) {
        return std::isnan(value);
    }))).WillOnce(answerOk());
    call({"setAmplitude", "nan"});
}

TEST_F(StandardCall, PassesABoolean) {
    EXPECT_CALL(*mVibrator, setExternalControl(true)).WillOnce(answerOk());
    call({"setExternalControl", "true"});
}

TEST_F(StandardCall, PassesThreeArgumentsInOrder) {
    EXPECT_CALL(*mVibrator, alwaysOnEnable(1, Effect::THUD, EffectStrength::LIGHT))
            .WillOnce(answerOk());
    call({"alwaysOnEnable", "1", "THUD", "LIGHT"});
}

TEST_F(StandardCall, PassesACompositionInOrder) {
    std::vector<CompositeEffect> composite;
    EXPECT_CALL(*mVibrator, compose(_, Callback()))
            .WillOnce(DoAll(SaveArg<0>(&composite), answerOk()));
    call({"compose", "50,CLICK,1.0", "-1,99,nan"});
    ASSERT_EQ(composite.size(), 2u);
    EXPECT_EQ(composite[0].delayMs, 50);
    EXPECT_EQ(composite[0].primitive, CompositePrimitive::CLICK);
    EXPECT_EQ(composite[0].scale, 1.0F);
    EXPECT_EQ(composite[1].delayMs, -1);
    EXPECT_EQ(composite[1].primitive, static_cast<CompositePrimitive>(99));
    EXPECT_TRUE(std::isnan(composite[1].scale));
}

TEST_F(StandardCall, PassesAnEmptyComposition) {
    EXPECT_CALL(*mVibrator, compose(IsEmpty(), Callback())).WillOnce(answerOk());
    call({"compose"});
}

TEST_F(StandardCall, MakesTheSameCallAgainWithFreshValues) {
    EXPECT_CALL(*mVibrator, getSupportedEffects(_)).WillOnce([](std::vector<Effect>* effects) {
        EXPECT_THAT(*effects, IsEmpty());
        return ndk::ScopedAStatus::ok();
    });
    call({"getSupportedEffects"});
}

TEST_F(StandardCall, PassesPwleSegmentsOfBothKinds) {
    std::vector<PrimitivePwle> composite;
    EXPECT_CALL(*mVibrator, composePwle(_, Callback()))
            .WillOnce(DoAll(SaveArg<0>(&composite), answerOk()));
    call({"composePwle", "active,0.5,150,0.25,140.5,100", "brake,CLAB,20"});
    ASSERT_EQ(composite.size(), 2u);
    ASSERT_EQ(composite[0].getTag(), PrimitivePwle::active);
    const auto& active = composite[0].get<PrimitivePwle::active>();
    EXPECT_EQ(active.startAmplitude, 0.5F);
    EXPECT_EQ(active.startFrequency, 150.0F);
    EXPECT_EQ(active.endAmplitude, 0.25F);
    EXPECT_EQ(active.endFrequency, 140.5F);
    EXPECT_EQ(active.duration, 100);
    ASSERT_EQ(composite[1].getTag(), PrimitivePwle::braking);
    const auto& braking = composite[1].get<PrimitivePwle::braking>();
    EXPECT_EQ(braking.braking, Braking::CLAB);
    EXPECT_EQ(braking.duration, 20);
}

TEST_F(StandardCall, ReportsCapabilities) {
    EXPECT_CALL(*mVibrator, getCapabilities(_)).WillOnce(DoAll(SetArgPointee<0>(36), answerOk()));
    const Outcome outcome = call({"getCapabilities"});
    EXPECT_EQ(outcome.result, "36");
    EXPECT_EQ(humanLine("getCapabilities", outcome),
              "getCapabilities: ok, 36 (AMPLITUDE_CONTROL COMPOSE_EFFECTS)");
}

TEST_F(StandardCall, ReportsAListOfEnumerators) {
    EXPECT_CALL(*mVibrator, getSupportedEffects(_))
            .WillOnce(DoAll(SetArgPointee<0>(std::vector<Effect>{
                                    Effect::CLICK, Effect::DOUBLE_CLICK, Effect::HEAVY_CLICK}),
                            answerOk()));
    const Outcome outcome = call({"getSupportedEffects"});
    EXPECT_EQ(outcome.result, "[0,1,5]");
    EXPECT_EQ(outcome.text, "CLICK DOUBLE_CLICK HEAVY_CLICK");
}

TEST_F(StandardCall, ReportsFloats) {
    EXPECT_CALL(*mVibrator, getResonantFrequency(_))
            .WillOnce(DoAll(SetArgPointee<0>(150.5F), answerOk()));
    const Outcome single = call({"getResonantFrequency"});
    EXPECT_EQ(single.result, "150.5");
    EXPECT_EQ(single.text, "150.5 Hz");
    EXPECT_CALL(*mVibrator, getBandwidthAmplitudeMap(_))
            .WillOnce(DoAll(SetArgPointee<0>(std::vector<float>{0.1F, 1.0F}), answerOk()));
    EXPECT_EQ(call({"getBandwidthAmplitudeMap"}).result, "[0.1,1.0]");
}

TEST_F(StandardCall, ReportsAnExceptionWithoutResult) {
    EXPECT_CALL(*mVibrator, getPrimitiveDuration(CompositePrimitive::SPIN, _))
            .WillOnce(DoAll(SetArgPointee<1>(130), [](auto&&...) {
                return ndk::ScopedAStatus::fromExceptionCode(EX_UNSUPPORTED_OPERATION);
            }));
    const Outcome outcome = call({"getPrimitiveDuration", "SPIN"});
    EXPECT_EQ(outcome.exception, EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(outcome.result, "null");
    EXPECT_EQ(humanLine("getPrimitiveDuration", outcome),
              "getPrimitiveDuration: EX_UNSUPPORTED_OPERATION; this phone does not offer it: see "
              "vibctl info");
}

TEST_F(StandardCall, ReportsVersionAndHash) {
    EXPECT_EQ(call({"getInterfaceVersion"}).result, "0") << "of the default implementation";
    EXPECT_EQ(call({"getInterfaceHash"}).result, "\"\"");
}

}  // namespace
}  // namespace vibctl
