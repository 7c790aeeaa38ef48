// SPDX-License-Identifier: Apache-2.0
//
// The standard service's predefined effects: what it plays, what it lists, and what it refuses.
#include <cerrno>
#include <memory>
#include <vector>

#include "tests/force_feedback_phone.h"
#include "tests/refused_threads.h"
#include "tests/vibrator_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

using Perform = VibratorTest;

TEST_F(Perform, EffectIsPlayedAndItsLengthReturned) {
    kernel.addNode(kLeds + "intensity");
    kernel.addNode(kLeds + "haptic_engine");
    const auto vibrator = makeVibrator();
    int32_t durationMs = 0;
    EXPECT_TRUE(
            vibrator->perform(Effect::TICK, EffectStrength::STRONG, nullptr, &durationMs).isOk());
    EXPECT_EQ(durationMs, 17);
    EXPECT_EQ(kernel.text(kLeds + "haptic_engine"), "4 7 10000 2050 0\n");
    EXPECT_EQ(log.lines().front(), "E V_2_0: Vibrator perform Effect : 2 EffectStrength : 2");
    EXPECT_EQ(log.lines().back(), "E V_2_0: Vibrator perform timeMS return: 17");
}

TEST_F(Perform, LogsItsOwnLinesAsErrorsAndTheHardwareLayersAsInformation) {
    kernel.addNode(kLeds + "intensity");
    const auto vibrator = makeVibrator();
    int32_t durationMs = 0;
    EXPECT_TRUE(
            vibrator->perform(Effect::CLICK, EffectStrength::MEDIUM, nullptr, &durationMs).isOk());
    EXPECT_THAT(
            log.lines(),
            ElementsAre("E V_2_0: Vibrator perform Effect : 0 EffectStrength : 1",
                        "I HW_API: setPerformAmplitude : 6700",
                        "I HW_API: [preparePerform]amplitude: 6700",
                        "I HW_API: [preparePerform]CLICK",
                        "I HW_API: setAmplitude : INTENSITY 6700",
                        "I HW_API: >> writeNode node:/leds/vibrator/intensity val:6700",
                        "I HW_API: << writeNode node OK : 5", "I HW_API: do_on for timeoutMs: 7",
                        "I HW_API: >> writeNode node:/leds/vibrator/state val:1",
                        "I HW_API: << writeNode node OK : 2",
                        "I HW_API: >> writeNode node:/leds/vibrator/duration val:7",
                        "I HW_API: << writeNode node OK : 2",
                        "I HW_API: >> writeNode node:/leds/vibrator/activate val:1",
                        "I HW_API: << writeNode node OK : 2",
                        "E V_2_0: Vibrator perform timeMS return: 17"));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-CORE"));
}

TEST_F(Perform, DoubleClickReports95MillisecondsAndGoesOnByItself) {
    kernel.addNode(kLeds + "intensity");
    const auto vibrator = makeVibrator();
    int32_t durationMs = 0;
    EXPECT_TRUE(vibrator->perform(Effect::DOUBLE_CLICK, EffectStrength::LIGHT, nullptr, &durationMs)
                        .isOk());
    EXPECT_EQ(durationMs, 95);
    ASSERT_TRUE(
            log.waitFor("I HW_API: End perform on another thread - performEffect_DOUBLE_CLICK"));
    EXPECT_EQ(kernel.text(kLeds + "duration"), "15\n");
}

TEST_F(Perform, DoubleClickWithoutAThreadIsAnIllegalStateAndNothingIsThrown) {
    kernel.addNode(kLeds + "intensity");
    const auto vibrator = makeVibrator();
    const fake::RefusedThreads threads;
    int32_t durationMs = 77;
    EXPECT_NO_THROW(
            EXPECT_EQ(exceptionOf(vibrator->perform(Effect::DOUBLE_CLICK, EffectStrength::LIGHT,
                                                    nullptr, &durationMs)),
                      EX_ILLEGAL_STATE));
    EXPECT_EQ(durationMs, 77);
    EXPECT_EQ(threads.count(), 1U);
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/intensity \"3400\\n\""));
}

TEST_F(Perform, EveryStrengthHasItsAmplitude) {
    kernel.addNode(kLeds + "intensity");
    const auto vibrator = makeVibrator();
    int32_t durationMs = 0;
    EXPECT_TRUE(
            vibrator->perform(Effect::CLICK, EffectStrength::LIGHT, nullptr, &durationMs).isOk());
    EXPECT_EQ(kernel.text(kLeds + "intensity"), "3400\n");
    EXPECT_TRUE(
            vibrator->perform(Effect::CLICK, EffectStrength::MEDIUM, nullptr, &durationMs).isOk());
    EXPECT_EQ(kernel.text(kLeds + "intensity"), "6700\n");
    EXPECT_TRUE(
            vibrator->perform(Effect::CLICK, EffectStrength::STRONG, nullptr, &durationMs).isOk());
    EXPECT_EQ(kernel.text(kLeds + "intensity"), "10000\n");
}

TEST_F(Perform, WithoutAMethodNothingElseIsLookedAt) {
    const auto vibrator = makeVibrator();
    int32_t durationMs = 77;
    EXPECT_EQ(exceptionOf(vibrator->perform(static_cast<Effect>(99), static_cast<EffectStrength>(9),
                                            callback, &durationMs)),
              EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(durationMs, 77);
    EXPECT_THAT(log.lines(), ElementsAre("E V_2_0: Vibrator perform Effect : 99 EffectStrength : 9",
                                         "E V_2_0: performEffect PERFORM_NONE"));
}

TEST_F(Perform, CallbackIsRefusedBeforeTheEffectIsLookedAt) {
    kernel.addNode(kLeds + "intensity");
    const auto vibrator = makeVibrator();
    int32_t durationMs = 0;
    EXPECT_EQ(exceptionOf(vibrator->perform(Effect::THUD, EffectStrength::LIGHT, callback,
                                            &durationMs)),
              EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(log.lines().back(), "E Not support perform() callback");
}

TEST_F(Perform, OtherEffectsAreNotOffered) {
    kernel.addNode(kLeds + "intensity");
    const auto vibrator = makeVibrator();
    for (const int effect : {3, 4, 6, 21, 22, -1, 2147483647, -2147483647 - 1}) {
        int32_t durationMs = 77;
        EXPECT_EQ(exceptionOf(vibrator->perform(static_cast<Effect>(effect), EffectStrength::LIGHT,
                                                nullptr, &durationMs)),
                  EX_UNSUPPORTED_OPERATION);
        EXPECT_EQ(durationMs, 77);
        EXPECT_EQ(log.lines().back(), "E V_2_0: Unsupport vibrator perform effect");
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(Perform, OtherStrengthsAreNotOffered) {
    kernel.addNode(kLeds + "intensity");
    const auto vibrator = makeVibrator();
    for (const int strength : {3, 127, -1, -128}) {
        int32_t durationMs = 77;
        EXPECT_EQ(
                exceptionOf(vibrator->perform(Effect::CLICK, static_cast<EffectStrength>(strength),
                                              nullptr, &durationMs)),
                EX_UNSUPPORTED_OPERATION);
        EXPECT_EQ(durationMs, 77);
        EXPECT_EQ(log.lines().back(), "E V_2_0: Unsupport vibrator perform strength");
    }
    EXPECT_THAT(log.lines(),
                Contains("E V_2_0: Vibrator perform Effect : 0 EffectStrength : -128"));
}

// A hardware layer that knows no amplitude for any strength.
class WithoutAmplitudes : public HwApi {
  public:
    int setPerformAmplitude(EffectStrength /*strength*/) override { return 0; }
};

TEST_F(Perform, StrengthWithoutAmplitudeIsNotOffered) {
    kernel.addNode(kLeds + "intensity");
    const auto vibrator = ndk::SharedRefBase::make<Vibrator>(std::make_shared<WithoutAmplitudes>());
    int32_t durationMs = 0;
    EXPECT_EQ(exceptionOf(vibrator->perform(Effect::CLICK, EffectStrength::LIGHT, nullptr,
                                            &durationMs)),
              EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(log.lines().back(), "E V_2_0: performEffect not support real amplitude");
}

TEST_F(Perform, FailingDriverIsAnIllegalStateWithoutALine) {
    kernel.addNode(kLeds + "intensity");
    const auto vibrator = makeVibrator();
    kernel.addFault({.path = kLeds + "intensity", .operation = Operation::kWrite, .error = EIO});
    int32_t durationMs = 77;
    EXPECT_EQ(exceptionOf(vibrator->perform(Effect::CLICK, EffectStrength::LIGHT, nullptr,
                                            &durationMs)),
              EX_ILLEGAL_STATE);
    EXPECT_EQ(durationMs, 77);
    EXPECT_EQ(log.lines().back(), "I HW_API: setAmplitude : INTENSITY error");
}

// The service on a phone with a force-feedback motor, which it closes at its end.
class PerformOnForceFeedback : public ForceFeedbackPhone {
  protected:
    std::shared_ptr<Vibrator> makeVibrator() {
        auto vibrator = ndk::SharedRefBase::make<Vibrator>(makeHwApi());
        log.clear();
        return vibrator;
    }
    // The number of the closed device is kept; it must not be closed twice.
    ~PerformOnForceFeedback() override { inputFD = -1; }
};

TEST_F(PerformOnForceFeedback, EveryStrengthIsAGain) {
    const auto vibrator = makeVibrator();
    int32_t durationMs = 0;
    EXPECT_TRUE(
            vibrator->perform(Effect::TICK, EffectStrength::LIGHT, nullptr, &durationMs).isOk());
    EXPECT_EQ(durationMs, 60);
    EXPECT_THAT(kernel.calls(), Contains("event type=21 code=96 value=3400"));
    EXPECT_TRUE(
            vibrator->perform(Effect::TICK, EffectStrength::MEDIUM, nullptr, &durationMs).isOk());
    EXPECT_THAT(kernel.calls(), Contains("event type=21 code=96 value=6700"));
    EXPECT_TRUE(
            vibrator->perform(Effect::TICK, EffectStrength::STRONG, nullptr, &durationMs).isOk());
    EXPECT_THAT(kernel.calls(), Contains("event type=21 code=96 value=10000"));
}

TEST_F(PerformOnForceFeedback, UnpluggedMotorIsAnIllegalState) {
    const auto vibrator = makeVibrator();
    kernel.addFault(
            {.path = kMotorNode, .operation = Operation::kWrite, .error = ENODEV, .times = 0});
    int32_t durationMs = 77;
    EXPECT_EQ(exceptionOf(vibrator->perform(Effect::CLICK, EffectStrength::LIGHT, nullptr,
                                            &durationMs)),
              EX_ILLEGAL_STATE);
    EXPECT_EQ(durationMs, 77);
}

TEST_F(PerformOnForceFeedback, FourEffectsAreSupported) {
    const auto vibrator = makeVibrator();
    std::vector<Effect> effects;
    EXPECT_TRUE(vibrator->getSupportedEffects(&effects).isOk());
    EXPECT_THAT(effects, ElementsAre(Effect::CLICK, Effect::DOUBLE_CLICK, Effect::TICK,
                                     Effect::HEAVY_CLICK));
    EXPECT_THAT(log.lines(), ElementsAre("E V_2_0: getSupportedEffects",
                                         "I HW_API: [isAmplitudeControlExist]return true"));
}

using SupportedEffects = VibratorTest;

TEST_F(SupportedEffects, AreFourWithAmplitudeControl) {
    kernel.addNode(kLeds + "intensity");
    const auto vibrator = makeVibrator();
    std::vector<Effect> effects = {Effect::POP};
    EXPECT_TRUE(vibrator->getSupportedEffects(&effects).isOk());
    EXPECT_THAT(effects, ElementsAre(Effect::CLICK, Effect::DOUBLE_CLICK, Effect::TICK,
                                     Effect::HEAVY_CLICK));
    EXPECT_EQ(log.lines().front(), "E V_2_0: getSupportedEffects");
}

TEST_F(SupportedEffects, AreNoneWithout) {
    const auto vibrator = makeVibrator();
    std::vector<Effect> effects = {Effect::POP};
    EXPECT_TRUE(vibrator->getSupportedEffects(&effects).isOk());
    EXPECT_THAT(effects, IsEmpty());
}

TEST_F(SupportedEffects, AlwaysOnOnesAreTheSameAndLogBothLines) {
    kernel.addNode(kLeds + "intensity");
    const auto vibrator = makeVibrator();
    std::vector<Effect> effects;
    EXPECT_TRUE(vibrator->getSupportedAlwaysOnEffects(&effects).isOk());
    EXPECT_THAT(effects, ElementsAre(Effect::CLICK, Effect::DOUBLE_CLICK, Effect::TICK,
                                     Effect::HEAVY_CLICK));
    EXPECT_EQ(log.line(0), "E V_2_0: Vibrator getSupportedAlwaysOnEffects ");
    EXPECT_EQ(log.line(1), "E V_2_0: getSupportedEffects");
}

TEST_F(SupportedEffects, AreFourOnTheLegacyClassToo) {
    for (const char* leaf : {"activate", "duration", "state"}) kernel.removeNode(kLeds + leaf);
    addLegacyClass();
    kernel.addNode(kLegacy + "intensity");
    const auto vibrator = makeVibrator();
    std::vector<Effect> effects;
    EXPECT_TRUE(vibrator->getSupportedEffects(&effects).isOk());
    EXPECT_EQ(effects.size(), 4U);
}

TEST_F(SupportedEffects, AreNoneOnAPhoneThatPlaysThemWithoutAmplitudeControl) {
    kernel.addNode(kLeds + "haptic_engine");
    const auto vibrator = makeVibrator();
    std::vector<Effect> effects;
    EXPECT_TRUE(vibrator->getSupportedEffects(&effects).isOk());
    EXPECT_THAT(effects, IsEmpty());
    int32_t durationMs = 0;
    EXPECT_TRUE(
            vibrator->perform(Effect::TICK, EffectStrength::STRONG, nullptr, &durationMs).isOk());
    EXPECT_EQ(durationMs, 17);
}

// A service whose list is its own, to see through which table the always-on query asks.
class WithOwnEffects : public Vibrator {
  public:
    using Vibrator::Vibrator;
    ndk::ScopedAStatus getSupportedEffects(std::vector<Effect>* _aidl_return) override {
        *_aidl_return = {Effect::THUD};
        return ndk::ScopedAStatus::fromExceptionCode(EX_ILLEGAL_STATE);
    }
};

TEST_F(SupportedEffects, AlwaysOnOnesAreAskedOfTheObjectItself) {
    const auto vibrator = ndk::SharedRefBase::make<WithOwnEffects>(makeHwApi());
    std::vector<Effect> effects;
    EXPECT_EQ(exceptionOf(vibrator->getSupportedAlwaysOnEffects(&effects)), EX_ILLEGAL_STATE);
    EXPECT_THAT(effects, ElementsAre(Effect::THUD));
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
