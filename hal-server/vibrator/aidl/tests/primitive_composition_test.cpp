// SPDX-License-Identifier: Apache-2.0
//
// Which compositions of primitives are refused, and the string that is made of the others. How that
// string is played is in composition_queue_test.cpp and composition_upload_test.cpp.
#include <cmath>
#include <limits>
#include <memory>
#include <string>
#include <vector>

#include "tests/composition_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::ElementsAreArray;
using ::testing::IsEmpty;
using Primitive = CompositePrimitive;

// A hardware layer that takes every waveform string and keeps the last.
class WaveformTaker : public HwApi {
  public:
    bool setAndTriggerOwt_primitve(std::string text) override {
        taken.push_back(text);
        return true;
    }

    std::vector<std::string> taken;
};

// Both ways in which a composition is handed to the driver.
class Composing : public VibratorTest {
  protected:
    Composing() {
        kernel.addNode(kLeds + "cp_trigger_index");
        kernel.addNode(kLeds + "cp_trigger_queue", "unset");
        hwApi = std::make_shared<WaveformTaker>();
        vibrator = ndk::SharedRefBase::make<Vibrator>(hwApi);
        kernel.clear();
        log.clear();
    }

    // On force feedback, returns when the composition is over, so that no thread outlives the test.
    ndk::ScopedAStatus compose(const Composite& composite, bool onForceFeedback) {
        useForceFeedback = onForceFeedback;
        log.clear();
        const auto completion = ndk::SharedRefBase::make<CountingCallback>();
        ndk::ScopedAStatus status = vibrator->compose(composite, completion);
        EXPECT_TRUE(!onForceFeedback || !status.isOk() || completion->waitForCall());
        return status;
    }

    // The string that reaches the driver.
    std::string textOf(const Composite& composite, bool onForceFeedback) {
        const ndk::ScopedAStatus status = compose(composite, onForceFeedback);
        if (!status.isOk()) return "exception " + std::to_string(status.getExceptionCode());
        if (!onForceFeedback) return kernel.text(kLeds + "cp_trigger_queue");
        return hwApi->taken.empty() ? "no text" : hwApi->taken.back();
    }

    std::shared_ptr<WaveformTaker> hwApi;
    std::shared_ptr<Vibrator> vibrator;
};

struct Refusal {
    const char* name;
    Composite composite;
    binder_exception_t exception;
    std::vector<std::string> lines;
};

class RefusedComposition : public Composing, public ::testing::WithParamInterface<Refusal> {};

TEST_P(RefusedComposition, SaysWhyAndPlaysNothing) {
    for (const bool onForceFeedback : {false, true}) {
        EXPECT_EQ(exceptionOf(compose(GetParam().composite, onForceFeedback)),
                  GetParam().exception);
        EXPECT_THAT(log.lines(), ElementsAreArray(GetParam().lines));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_THAT(hwApi->taken, IsEmpty());
}

const Refusal kRefusals[] = {
        {"ElevenEffects",
         Composite(11, after(0, Primitive::CLICK)),
         EX_ILLEGAL_ARGUMENT,
         {"E V_2_0: Vibrator compose : 11 size", "E V_2_0:  e.size error "}},
        {"ElevenEffectsAreNotLookedAt",
         Composite(11, after(1001, static_cast<Primitive>(9), 7.0F)),
         EX_ILLEGAL_ARGUMENT,
         {"E V_2_0: Vibrator compose : 11 size", "E V_2_0:  e.size error "}},
        {"EmptyList",
         {},
         EX_ILLEGAL_ARGUMENT,
         {"E V_2_0: Vibrator compose : 0 size", "E V_2_0: effectBuilder is null"}},
        {"OnlyNoopsWithoutDelays",
         {after(0, Primitive::NOOP), after(0, Primitive::NOOP)},
         EX_ILLEGAL_ARGUMENT,
         {"E V_2_0: Vibrator compose : 2 size", "E V_2_0:  CompositePrimitive is NOOP ",
          "E V_2_0:  CompositePrimitive is NOOP ", "E V_2_0: effectBuilder is null"}},
        {"DelayOf1001",
         {after(1001, Primitive::CLICK)},
         EX_ILLEGAL_ARGUMENT,
         {"E V_2_0: Vibrator compose : 1 size", "E V_2_0:  e.delayMs error "}},
        {"LongestDelayThereIs",
         {after(kIntMax, Primitive::NOOP)},
         EX_ILLEGAL_ARGUMENT,
         {"E V_2_0: Vibrator compose : 1 size", "E V_2_0:  e.delayMs error "}},
        {"DelayBeforePrimitiveAndScale",
         {after(1001, static_cast<Primitive>(9), 7.0F)},
         EX_ILLEGAL_ARGUMENT,
         {"E V_2_0: Vibrator compose : 1 size", "E V_2_0:  e.delayMs error "}},
        {"PrimitiveNine",
         {after(0, static_cast<Primitive>(9))},
         EX_UNSUPPORTED_OPERATION,
         {"E V_2_0: Vibrator compose : 1 size"}},
        {"NegativePrimitiveAfterItsDelay",
         {after(5, static_cast<Primitive>(-1))},
         EX_UNSUPPORTED_OPERATION,
         {"E V_2_0: Vibrator compose : 1 size", "E  delayMs : 5"}},
        {"PrimitiveBeforeScale",
         {after(0, static_cast<Primitive>(kIntMin), 7.0F)},
         EX_UNSUPPORTED_OPERATION,
         {"E V_2_0: Vibrator compose : 1 size"}},
        {"ScaleAboveOne",
         {after(0, Primitive::CLICK, std::nextafter(1.0F, 2.0F))},
         EX_ILLEGAL_ARGUMENT,
         {"E V_2_0: Vibrator compose : 1 size", "E V_2_0:  e.scale error "}},
        {"ScaleBelowZero",
         {after(0, Primitive::CLICK, -std::numeric_limits<float>::denorm_min())},
         EX_ILLEGAL_ARGUMENT,
         {"E V_2_0: Vibrator compose : 1 size", "E V_2_0:  e.scale error "}},
        {"InfiniteScale",
         {after(0, Primitive::CLICK, kInfinity)},
         EX_ILLEGAL_ARGUMENT,
         {"E V_2_0: Vibrator compose : 1 size", "E V_2_0:  e.scale error "}},
        {"InfinitelyNegativeScale",
         {after(0, Primitive::CLICK, -kInfinity)},
         EX_ILLEGAL_ARGUMENT,
         {"E V_2_0: Vibrator compose : 1 size", "E V_2_0:  e.scale error "}},
};

INSTANTIATE_TEST_SUITE_P(Compose, RefusedComposition, ::testing::ValuesIn(kRefusals),
                         [](const auto& refusal) { return refusal.param.name; });

TEST_F(Composing, BadLaterEffectIsRefusedAfterTheEarlierWereChecked) {
    EXPECT_EQ(exceptionOf(compose({after(7, Primitive::CLICK), after(0, Primitive::THUD, 2.0F)},
                                  false)),
              EX_ILLEGAL_ARGUMENT);
    EXPECT_THAT(log.lines(),
                ElementsAre("E V_2_0: Vibrator compose : 2 size", "E  delayMs : 7",
                            "E V_2_0: 7,1.10000,", "E V_2_0: Vibrator getPrimitiveDuration ",
                            "E  durationMs : 20", "E V_2_0:  e.scale error "));
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

struct Text {
    const char* name;
    Composite composite;
    const char* forceFeedback;
    const char* queue;
};

class CompositionText : public Composing, public ::testing::WithParamInterface<Text> {};

TEST_P(CompositionText, IsThatOfItsDelaysAndWaveforms) {
    EXPECT_EQ(textOf(GetParam().composite, true), GetParam().forceFeedback);
    EXPECT_EQ(textOf(GetParam().composite, false), GetParam().queue);
}

const Text kTexts[] = {
        {"ClickAfterADelay", {after(50, Primitive::CLICK)}, "50,1.100,", "50,1.10000,0"},
        {"ClickWithoutADelay", {after(0, Primitive::CLICK)}, "1.100,", "1.10000,0"},
        {"EveryPrimitive",
         {after(0, Primitive::CLICK), after(0, Primitive::THUD), after(0, Primitive::SPIN),
          after(0, Primitive::QUICK_RISE), after(0, Primitive::SLOW_RISE),
          after(0, Primitive::QUICK_FALL), after(0, Primitive::LIGHT_TICK),
          after(0, Primitive::LOW_TICK)},
         "1.100,124.100,123.100,121.100,122.100,120.100,41.100,119.100,",
         "1.10000,124.10000,123.10000,121.10000,122.10000,120.10000,41.10000,119.10000,0"},
        {"LongestDelay", {after(1000, Primitive::THUD)}, "1000,124.100,", "1000,124.10000,0"},
        {"NegativeDelay", {after(-1, Primitive::CLICK)}, "-1,1.100,", "-1,1.10000,0"},
        {"MostNegativeDelay",
         {after(kIntMin, Primitive::CLICK)},
         "-2147483648,1.100,",
         "-2147483648,1.10000,0"},
        {"TenEffects", Composite(10, after(1, Primitive::LOW_TICK)),
         "1,119.100,1,119.100,1,119.100,1,119.100,1,119.100,"
         "1,119.100,1,119.100,1,119.100,1,119.100,1,119.100,",
         "1,119.10000,1,119.10000,1,119.10000,1,119.10000,1,119.10000,"
         "1,119.10000,1,119.10000,1,119.10000,1,119.10000,1,119.10000,0"},
        {"NoopWithADelay", {after(20, Primitive::NOOP)}, "20,", "20,0"},
        {"NoopBetweenClicks",
         {after(0, Primitive::CLICK), after(0, Primitive::NOOP), after(0, Primitive::CLICK)},
         "1.100,1.100,",
         "1.10000,1.10000,0"},
        {"ScaleOfANoopIsNotLookedAt",
         {after(20, Primitive::NOOP, 7.0F), after(0, Primitive::NOOP, kNan)},
         "20,",
         "20,0"},
        {"ScaleZero", {after(0, Primitive::CLICK, 0.0F)}, "1.1,", "1.0,0"},
        {"ScaleNegativeZero", {after(0, Primitive::CLICK, -0.0F)}, "1.1,", "1.0,0"},
        {"ScaleNotANumber", {after(0, Primitive::CLICK, kNan)}, "1.0,", "1.0,0"},
        // Above 0 there is no least amplitude on force feedback; the compiler refuses 0.
        {"ScaleTiny",
         {after(0, Primitive::CLICK, std::numeric_limits<float>::denorm_min())},
         "1.0,",
         "1.0,0"},
        {"ScaleOneTenThousandth", {after(0, Primitive::CLICK, 0.0001F)}, "1.0,", "1.1,0"},
        {"ScaleJustUnderOnePercent", {after(0, Primitive::CLICK, 0.0099F)}, "1.0,", "1.99,0"},
        {"ScaleOnePercent", {after(0, Primitive::CLICK, 0.01F)}, "1.1,", "1.100,0"},
        // In double precision these two would come out one less.
        {"Scale29Percent", {after(0, Primitive::CLICK, 0.29F)}, "1.29,", "1.2900,0"},
        {"Scale58Percent", {after(0, Primitive::CLICK, 0.58F)}, "1.58,", "1.5800,0"},
        {"ScaleIsTruncated", {after(0, Primitive::CLICK, 0.99999F)}, "1.99,", "1.9999,0"},
        {"ScaleOne", {after(0, Primitive::CLICK, 1.0F)}, "1.100,", "1.10000,0"},
};

INSTANTIATE_TEST_SUITE_P(Compose, CompositionText, ::testing::ValuesIn(kTexts),
                         [](const auto& text) { return text.param.name; });

TEST_F(Composing, PlatformNumberingChangesTheTextOnForceFeedbackOnly) {
    useKypIndex = true;
    const Composite composite = {after(0, Primitive::CLICK), after(0, Primitive::THUD),
                                 after(0, Primitive::LIGHT_TICK)};
    EXPECT_EQ(textOf(composite, true), "10.100,140.100,50.100,");
    EXPECT_THAT(log.lines(), Contains("E V_2_0: [getPrimitiveDetails]kyp index transform"));
    EXPECT_EQ(textOf(composite, false), "1.10000,124.10000,41.10000,0");
}

TEST_F(Composing, EveryStepIsLogged) {
    EXPECT_TRUE(compose({after(50, Primitive::CLICK), after(0, Primitive::NOOP),
                         after(30, Primitive::NOOP), after(20, Primitive::SPIN, 0.5F)},
                        true)
                        .isOk());
    EXPECT_THAT(
            log.lines(),
            ElementsAre("E V_2_0: Vibrator compose : 4 size", "E  delayMs : 50",
                        "E V_2_0: 50,1.100,", "E V_2_0: Vibrator getPrimitiveDuration ",
                        "E  durationMs : 20", "E V_2_0:  CompositePrimitive is NOOP ",
                        "E  delayMs : 30", "E V_2_0:  CompositePrimitive is NOOP ",
                        "E  delayMs : 20", "E V_2_0: 50,1.100,30,20,123.50,",
                        "E V_2_0: Vibrator getPrimitiveDuration ", "E  durationMs : 130",
                        "E  totaldelay : 100 totalDuration : 150",
                        "E V_2_0: Effect cmd : 50,1.100,30,20,123.50,",
                        "E V_2_0: compose setAndTriggerOwt_Primitive pass",
                        "I Starting compose on another thread", "I Notifying compose complete"));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-CORE"));
}

TEST_F(Composing, TotalsHoldTenOfTheMostNegativeDelays) {
    EXPECT_TRUE(compose(Composite(10, after(kIntMin, Primitive::CLICK)), false).isOk());
    EXPECT_THAT(log.lines(), Contains("E  totaldelay : -21474836480 totalDuration : 200"));
}

// A service with lengths of its own, to see through which table the composition asks.
class WithOwnDurations : public Vibrator {
  public:
    using Vibrator::Vibrator;
    ndk::ScopedAStatus getPrimitiveDuration(CompositePrimitive /*primitive*/,
                                            int32_t* _aidl_return) override {
        *_aidl_return = 7;
        return ndk::ScopedAStatus::ok();
    }
};

TEST_F(Composing, LengthsAreAskedOfTheObjectItself) {
    vibrator = ndk::SharedRefBase::make<WithOwnDurations>(hwApi);
    EXPECT_TRUE(compose({after(0, Primitive::CLICK), after(0, Primitive::THUD)}, false).isOk());
    EXPECT_THAT(log.lines(), Contains("E  durationMs : 7"));
    EXPECT_THAT(log.lines(), Contains("E  totaldelay : 0 totalDuration : 14"));
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
