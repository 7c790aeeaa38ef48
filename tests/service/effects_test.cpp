// SPDX-License-Identifier: Apache-2.0
//
// Predefined effects: every cell of the effect table with its bytes and length, the strengths, and
// the double click.
#include <cerrno>
#include <memory>
#include <string>
#include <system_error>
#include <thread>

#include "service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using imitated::Operation;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr char kDoubleClickEnd[] =
        "I HW_API: End perform on another thread - performEffect_DOUBLE_CLICK";

// A phone of the LED class whose perform method follows from the nodes that a test adds.
class Effects : public ServiceTest {
  protected:
    Effects() {
        addLedsClass();
        kernel.addNode(kLeds + "intensity");
    }
};

using Strength = Effects;

TEST_F(Strength, EachHasItsAmplitude) {
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->setPerformAmplitude(EffectStrength::LIGHT), 3400);
    EXPECT_EQ(hwApi->setPerformAmplitude(EffectStrength::MEDIUM), 6700);
    EXPECT_EQ(hwApi->setPerformAmplitude(EffectStrength::STRONG), 10000);
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: setPerformAmplitude : 3400",
                                         "I HW_API: setPerformAmplitude : 6700",
                                         "I HW_API: setPerformAmplitude : 10000"));
}

TEST_F(Strength, OthersHaveNoneAndTheLineIsNotFilledIn) {
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->setPerformAmplitude(static_cast<EffectStrength>(3)), 0);
    EXPECT_EQ(hwApi->setPerformAmplitude(static_cast<EffectStrength>(-1)), 0);
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: setPerformAmplitude not supports : %d",
                                         "I HW_API: setPerformAmplitude not supports : %d"));
}

class EffectsByIndex : public Effects {
  protected:
    EffectsByIndex() { kernel.addNode(kLeds + "cp_trigger_index"); }

    void expectPattern(Effect effect, const std::string& pattern, int expectedMs,
                       const std::string& name) {
        const auto hwApi = makeHwApi();
        int durationMs = 0;
        EXPECT_TRUE(hwApi->preparePerform(effect, 6700, durationMs));
        EXPECT_EQ(durationMs, expectedMs);
        EXPECT_THAT(kernel.writes(),
                    ElementsAre("/sys/class/leds/vibrator/intensity \"6700\\n\"",
                                "/sys/class/leds/vibrator/cp_trigger_index \"" + pattern + "\\n\"",
                                "/sys/class/leds/vibrator/state \"1\\n\"",
                                "/sys/class/leds/vibrator/duration \"1000\\n\"",
                                "/sys/class/leds/vibrator/activate \"1\\n\""));
        EXPECT_EQ(log.lines()[0], "I HW_API: [preparePerform]amplitude: 6700");
        EXPECT_EQ(log.lines()[1], "I HW_API: [preparePerform]" + name);
    }
};

TEST_F(EffectsByIndex, ClickIsPattern10For60Ms) {
    expectPattern(Effect::CLICK, "10", 60, "CLICK");
}

TEST_F(EffectsByIndex, DoubleClickIsPattern14For110Ms) {
    expectPattern(Effect::DOUBLE_CLICK, "14", 110, "DOUBLE_CLICK");
}

TEST_F(EffectsByIndex, TickIsPattern50For60Ms) {
    expectPattern(Effect::TICK, "50", 60, "TICK");
}

TEST_F(EffectsByIndex, HeavyClickIsPattern23For110Ms) {
    expectPattern(Effect::HEAVY_CLICK, "23", 110, "HEAVY_CLICK");
}

TEST_F(EffectsByIndex, FailedPatternStillSetsTheDuration) {
    const auto hwApi = makeHwApi();
    kernel.addFault(
            {.path = kLeds + "cp_trigger_index", .operation = Operation::kWrite, .error = EIO});
    int durationMs = 0;
    EXPECT_FALSE(hwApi->preparePerform(Effect::CLICK, 6700, durationMs));
    EXPECT_EQ(durationMs, 60);
}

class EffectsByPacket : public Effects {
  protected:
    EffectsByPacket() { kernel.addNode(kLeds + "haptic_engine"); }
};

TEST_F(EffectsByPacket, ClickIsAPulseFor17Ms) {
    const auto hwApi = makeHwApi();
    int durationMs = 0;
    EXPECT_TRUE(hwApi->preparePerform(Effect::CLICK, 3400, durationMs));
    EXPECT_EQ(durationMs, 17);
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/intensity \"3400\\n\"",
                                             "/sys/class/leds/vibrator/state \"1\\n\"",
                                             "/sys/class/leds/vibrator/duration \"7\\n\"",
                                             "/sys/class/leds/vibrator/activate \"1\\n\""));
}

TEST_F(EffectsByPacket, TickIsOnePacketFor17Ms) {
    const auto hwApi = makeHwApi();
    int durationMs = 0;
    EXPECT_TRUE(hwApi->preparePerform(Effect::TICK, 10000, durationMs));
    EXPECT_EQ(durationMs, 17);
    EXPECT_THAT(kernel.writes(),
                ElementsAre("/sys/class/leds/vibrator/haptic_engine \"4 7 10000 2050 0\\n\"",
                            "/sys/class/leds/vibrator/state \"1\\n\"",
                            "/sys/class/leds/vibrator/duration \"1\\n\"",
                            "/sys/class/leds/vibrator/activate \"1\\n\""));
}

TEST_F(EffectsByPacket, HeavyClickIsOnePacketWithOverdriveFor17Ms) {
    const auto hwApi = makeHwApi();
    int durationMs = 0;
    EXPECT_TRUE(hwApi->preparePerform(Effect::HEAVY_CLICK, 10000, durationMs));
    EXPECT_EQ(durationMs, 17);
    EXPECT_EQ(kernel.text(kLeds + "haptic_engine"), "4 7 10000 2000 1\n");
}

TEST_F(EffectsByPacket, AmplitudeCountsTwiceInAPacket) {
    const auto hwApi = makeHwApi();
    int durationMs = 0;
    EXPECT_TRUE(hwApi->preparePerform(Effect::TICK, 6700, durationMs));
    EXPECT_EQ(kernel.text(kLeds + "haptic_engine"), "4 7 4489 2050 0\n");
}

TEST_F(EffectsByPacket, DoubleClickPulsesTwiceFor95Ms) {
    const auto hwApi = makeHwApi();
    int durationMs = 0;
    EXPECT_TRUE(hwApi->preparePerform(Effect::DOUBLE_CLICK, 10000, durationMs));
    EXPECT_EQ(durationMs, 95);
    ASSERT_TRUE(log.waitFor(kDoubleClickEnd));
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/intensity \"10000\\n\"",
                                             "/sys/class/leds/vibrator/activate \"0\\n\"",
                                             "/sys/class/leds/vibrator/state \"1\\n\"",
                                             "/sys/class/leds/vibrator/duration \"10\\n\"",
                                             "/sys/class/leds/vibrator/activate \"1\\n\"",
                                             "/sys/class/leds/vibrator/state \"1\\n\"",
                                             "/sys/class/leds/vibrator/duration \"15\\n\"",
                                             "/sys/class/leds/vibrator/activate \"1\\n\""));
}

using EffectsByAmplitude = Effects;

TEST_F(EffectsByAmplitude, ClickTickAndHeavyClickArePulsesFor17Ms) {
    const auto hwApi = makeHwApi();
    for (const Effect effect : {Effect::CLICK, Effect::TICK, Effect::HEAVY_CLICK}) {
        kernel.clear();
        int durationMs = 0;
        EXPECT_TRUE(hwApi->preparePerform(effect, 10000, durationMs));
        EXPECT_EQ(durationMs, 17);
        EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/intensity \"10000\\n\"",
                                                 "/sys/class/leds/vibrator/state \"1\\n\"",
                                                 "/sys/class/leds/vibrator/duration \"7\\n\"",
                                                 "/sys/class/leds/vibrator/activate \"1\\n\""));
    }
}

TEST_F(EffectsByAmplitude, RefusedAmplitudeStartsNothing) {
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kLeds + "intensity", .operation = Operation::kWrite, .error = EIO});
    int durationMs = 0;
    EXPECT_FALSE(hwApi->preparePerform(Effect::CLICK, 10000, durationMs));
    EXPECT_EQ(durationMs, 17);
    EXPECT_THAT(kernel.writes(), IsEmpty());
}

TEST_F(EffectsByAmplitude, FailedPulseFails) {
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kLeds + "activate", .operation = Operation::kWrite, .error = EIO});
    int durationMs = 0;
    EXPECT_FALSE(hwApi->preparePerform(Effect::HEAVY_CLICK, 10000, durationMs));
    EXPECT_EQ(durationMs, 17);
}

TEST_F(EffectsByAmplitude, DoubleClickPulsesEvenWhereTheAmplitudeIsRefused) {
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kLeds + "intensity", .operation = Operation::kWrite, .error = EIO});
    int durationMs = 0;
    EXPECT_FALSE(hwApi->preparePerform(Effect::DOUBLE_CLICK, 10000, durationMs));
    EXPECT_EQ(durationMs, 95);
    ASSERT_TRUE(log.waitFor(kDoubleClickEnd));
    EXPECT_EQ(kernel.text(kLeds + "duration"), "15\n");
}

TEST_F(EffectsByAmplitude, OtherEffectsAreRefusedAndAddTenToWhatWasPassed) {
    const auto hwApi = makeHwApi();
    for (const Effect effect :
         {Effect::THUD, Effect::POP, static_cast<Effect>(6), static_cast<Effect>(-1)}) {
        log.clear();
        int durationMs = 32;
        EXPECT_FALSE(hwApi->preparePerform(effect, 10000, durationMs));
        EXPECT_EQ(durationMs, 42);
        EXPECT_THAT(log.lines(),
                    ElementsAre("I HW_API: [preparePerform]amplitude: 10000",
                                "I HW_API: [preparePerform]Fail - unsupported effect"));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(EffectsByAmplitude, WithoutAMethodNothingHappensToTheDuration) {
    kernel.removeNode(kLeds + "intensity");
    const auto hwApi = makeHwApi();
    int durationMs = 32;
    EXPECT_FALSE(hwApi->preparePerform(Effect::CLICK, 10000, durationMs));
    EXPECT_EQ(durationMs, 32);
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [preparePerform]amplitude: 10000",
                                         "I HW_API: [preparePerform]Fail - unsupported in case of "
                                         "PERFORM_NONE"));
}

using DoubleClick = Effects;

TEST_F(DoubleClick, PausesSeventyMillisecondsBetweenItsPulses) {
    const auto hwApi = makeHwApi();
    hwApi->performEffect_DOUBLE_CLICK();
    ASSERT_TRUE(log.waitFor(kDoubleClickEnd));
    EXPECT_EQ(log.lines().front(),
              "I HW_API: Start perform on another thread - performEffect_DOUBLE_CLICK");
    EXPECT_EQ(kernel.calls()[3 + 9], "sleep 70 ms");
    EXPECT_EQ(kernel.calls().size(), 3U + 9U + 1U + 9U);
}

TEST_F(DoubleClick, KeepsTheHardwareLayerUntilItIsOver) {
    auto hwApi = makeHwApi();
    const std::weak_ptr<HwApi> watch = hwApi;
    hwApi->performEffect_DOUBLE_CLICK();
    hwApi.reset();
    ASSERT_TRUE(log.waitFor(kDoubleClickEnd));
    EXPECT_EQ(kernel.text(kLeds + "duration"), "15\n");
    while (!watch.expired()) std::this_thread::yield();  // the last owner is the thread
}

// A double click that finds no thread.
class WithoutThreads : public HwApi {
  public:
    void performEffect_DOUBLE_CLICK() override {
        throw std::system_error(std::make_error_code(std::errc::resource_unavailable_try_again));
    }
};

TEST_F(DoubleClick, WithoutAThreadTheEffectFailsAndNothingIsThrown) {
    WithoutThreads hwApi;
    int durationMs = 0;
    EXPECT_NO_THROW(EXPECT_FALSE(hwApi.preparePerform(Effect::DOUBLE_CLICK, 10000, durationMs)));
    EXPECT_EQ(durationMs, 95);
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
