// SPDX-License-Identifier: Apache-2.0
//
// Predefined effects beside their table: the strengths, what is refused, and the double click.
#include <cerrno>
#include <memory>
#include <string>
#include <system_error>
#include <thread>

#include "tests/force_feedback_phone.h"
#include "tests/refused_threads.h"
#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Operation;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::StartsWith;

constexpr char kDoubleClickEnd[] =
        "I HW_API: End perform on another thread - performEffect_DOUBLE_CLICK";

// A phone of the LED class whose perform method follows from the nodes that a test adds.
class Effects : public ServiceTest {
  protected:
    Effects() {
        addLedsClass();
        kernel.addNode(kLeds + "intensity");
    }

    // What preparePerform does with an effect that it does not know.
    void expectUnsupported(HwApi& hwApi) {
        for (const Effect effect :
             {Effect::THUD, Effect::POP, Effect::RINGTONE_1, Effect::TEXTURE_TICK,
              static_cast<Effect>(22), static_cast<Effect>(-1),
              static_cast<Effect>(-2147483647 - 1), static_cast<Effect>(2147483647)}) {
            log.clear();
            kernel.clear();
            int durationMs = 32;
            EXPECT_FALSE(hwApi.preparePerform(effect, 10000, durationMs));
            EXPECT_EQ(durationMs, 42);
            EXPECT_THAT(log.lines(),
                        ElementsAre("I HW_API: [preparePerform]amplitude: 10000",
                                    "I HW_API: [preparePerform]Fail - unsupported effect"));
            EXPECT_THAT(kernel.calls(), IsEmpty());
        }
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
    for (const int strength : {3, 127, -1, -128}) {
        log.clear();
        EXPECT_EQ(hwApi->setPerformAmplitude(static_cast<EffectStrength>(strength)), 0);
        EXPECT_THAT(log.lines(), ElementsAre("I HW_API: setPerformAmplitude not supports : %d"));
    }
}

using UnsupportedEffect = Effects;

TEST_F(UnsupportedEffect, AddsTenToWhatWasPassedOnAPhoneWithPatterns) {
    kernel.addNode(kLeds + "cp_trigger_index");
    expectUnsupported(*makeHwApi());
}

TEST_F(UnsupportedEffect, AddsTenToWhatWasPassedOnAPhoneWithPackets) {
    kernel.addNode(kLeds + "haptic_engine");
    expectUnsupported(*makeHwApi());
}

TEST_F(UnsupportedEffect, AddsTenToWhatWasPassedOnAPhoneWithAmplitude) {
    expectUnsupported(*makeHwApi());
}

TEST_F(UnsupportedEffect, WithoutAPerformMethodTheDurationIsLeftAlone) {
    kernel.removeNode(kLeds + "intensity");
    const auto hwApi = makeHwApi();
    for (const Effect effect :
         {Effect::CLICK, Effect::DOUBLE_CLICK, Effect::TICK, Effect::HEAVY_CLICK, Effect::THUD}) {
        log.clear();
        int durationMs = 32;
        EXPECT_FALSE(hwApi->preparePerform(effect, 10000, durationMs));
        EXPECT_EQ(durationMs, 32);
        EXPECT_THAT(log.lines(),
                    ElementsAre("I HW_API: [preparePerform]amplitude: 10000",
                                "I HW_API: [preparePerform]Fail - unsupported in case of "
                                "PERFORM_NONE"));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

using EffectsByPacket = Effects;

TEST_F(EffectsByPacket, AmplitudeCountsTwice) {
    static constexpr struct {
        int amplitude;
        const char* tick;
        const char* heavyClick;
    } kPackets[] = {
            {1, "4 7 0 2050 0\n", "4 7 0 2000 1\n"},
            {3400, "4 7 1156 2050 0\n", "4 7 1156 2000 1\n"},
            {6700, "4 7 4489 2050 0\n", "4 7 4489 2000 1\n"},
            {10000, "4 7 10000 2050 0\n", "4 7 10000 2000 1\n"},
    };
    kernel.addNode(kLeds + "haptic_engine");
    const auto hwApi = makeHwApi();
    int durationMs = 0;
    for (const auto& packet : kPackets) {
        EXPECT_TRUE(hwApi->preparePerform(Effect::TICK, packet.amplitude, durationMs));
        EXPECT_EQ(kernel.text(kLeds + "haptic_engine"), packet.tick);
        EXPECT_TRUE(hwApi->preparePerform(Effect::HEAVY_CLICK, packet.amplitude, durationMs));
        EXPECT_EQ(kernel.text(kLeds + "haptic_engine"), packet.heavyClick);
    }
}

using EffectsByAmplitude = Effects;

TEST_F(EffectsByAmplitude, DoubleClickPulsesEvenWhereTheAmplitudeIsRefused) {
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kLeds + "intensity", .operation = Operation::kWrite, .error = EIO});
    int durationMs = 0;
    EXPECT_FALSE(hwApi->preparePerform(Effect::DOUBLE_CLICK, 10000, durationMs));
    ASSERT_TRUE(log.waitFor(kDoubleClickEnd));
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/activate \"0\\n\"",
                                             "/sys/class/leds/vibrator/state \"1\\n\"",
                                             "/sys/class/leds/vibrator/duration \"10\\n\"",
                                             "/sys/class/leds/vibrator/activate \"1\\n\"",
                                             "/sys/class/leds/vibrator/state \"1\\n\"",
                                             "/sys/class/leds/vibrator/duration \"15\\n\"",
                                             "/sys/class/leds/vibrator/activate \"1\\n\""));
}

using DoubleClick = Effects;

TEST_F(DoubleClick, StopsThenPulsesForTenAndFifteenMillisecondsSeventyApart) {
    const auto hwApi = makeHwApi();
    hwApi->performEffect_DOUBLE_CLICK();
    ASSERT_TRUE(log.waitFor(kDoubleClickEnd));
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/leds/vibrator/activate O_RDWR",
                            "write /sys/class/leds/vibrator/activate \"0\\n\"",
                            "close /sys/class/leds/vibrator/activate",
                            "open /sys/class/leds/vibrator/state O_RDWR",
                            "write /sys/class/leds/vibrator/state \"1\\n\"",
                            "close /sys/class/leds/vibrator/state",
                            "open /sys/class/leds/vibrator/duration O_RDWR",
                            "write /sys/class/leds/vibrator/duration \"10\\n\"",
                            "close /sys/class/leds/vibrator/duration",
                            "open /sys/class/leds/vibrator/activate O_RDWR",
                            "write /sys/class/leds/vibrator/activate \"1\\n\"",
                            "close /sys/class/leds/vibrator/activate", "sleep 70 ms",
                            "open /sys/class/leds/vibrator/state O_RDWR",
                            "write /sys/class/leds/vibrator/state \"1\\n\"",
                            "close /sys/class/leds/vibrator/state",
                            "open /sys/class/leds/vibrator/duration O_RDWR",
                            "write /sys/class/leds/vibrator/duration \"15\\n\"",
                            "close /sys/class/leds/vibrator/duration",
                            "open /sys/class/leds/vibrator/activate O_RDWR",
                            "write /sys/class/leds/vibrator/activate \"1\\n\"",
                            "close /sys/class/leds/vibrator/activate"));
}

TEST_F(DoubleClick, LogsItsBeginningAndItsEnd) {
    const auto hwApi = makeHwApi();
    hwApi->performEffect_DOUBLE_CLICK();
    ASSERT_TRUE(log.waitFor(kDoubleClickEnd));
    EXPECT_EQ(log.lines().front(),
              "I HW_API: Start perform on another thread - performEffect_DOUBLE_CLICK");
    EXPECT_EQ(log.lines().back(), kDoubleClickEnd);
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-CORE"));
}

TEST_F(DoubleClick, GoesOnWhateverTheDriverRefuses) {
    const auto hwApi = makeHwApi();
    for (const char* leaf : {"activate", "duration", "state"}) {
        kernel.addFault(
                {.path = kLeds + leaf, .operation = Operation::kWrite, .error = EIO, .times = 0});
    }
    hwApi->performEffect_DOUBLE_CLICK();
    ASSERT_TRUE(log.waitFor(kDoubleClickEnd));
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/leds/vibrator/activate O_RDWR",
                            "write /sys/class/leds/vibrator/activate \"0\\n\" = EIO",
                            "close /sys/class/leds/vibrator/activate",
                            "open /sys/class/leds/vibrator/state O_RDWR",
                            "write /sys/class/leds/vibrator/state \"1\\n\" = EIO",
                            "close /sys/class/leds/vibrator/state", "sleep 70 ms",
                            "open /sys/class/leds/vibrator/state O_RDWR",
                            "write /sys/class/leds/vibrator/state \"1\\n\" = EIO",
                            "close /sys/class/leds/vibrator/state"));
}

TEST_F(DoubleClick, KeepsTheHardwareLayerUntilItIsOver) {
    auto hwApi = makeHwApi();
    const std::weak_ptr<HwApi> watch = hwApi;
    kernel.holdSleeps(true);
    hwApi->performEffect_DOUBLE_CLICK();
    hwApi.reset();
    ASSERT_TRUE(kernel.waitForCalls(13));  // the first pulse, and asleep
    EXPECT_FALSE(watch.expired());
    kernel.holdSleeps(false);
    ASSERT_TRUE(log.waitFor(kDoubleClickEnd));
    EXPECT_EQ(kernel.text(kLeds + "duration"), "15\n");
    while (!watch.expired()) std::this_thread::yield();  // the last owner is the thread
}

class DoubleClickWithoutThreads : public Effects {
  protected:
    // Plays a double click where no thread can be had, and another where one can.
    void expectRefusedThenPlayed() {
        const auto hwApi = makeHwApi();
        {
            const fake::RefusedThreads threads;
            int durationMs = 0;
            EXPECT_NO_THROW(
                    EXPECT_FALSE(hwApi->preparePerform(Effect::DOUBLE_CLICK, 10000, durationMs)));
            EXPECT_EQ(durationMs, 95);
            EXPECT_EQ(threads.count(), 1U);
        }
        EXPECT_THAT(kernel.writes(),
                    ElementsAre("/sys/class/leds/vibrator/intensity \"10000\\n\""));
        int durationMs = 0;
        EXPECT_TRUE(hwApi->preparePerform(Effect::DOUBLE_CLICK, 10000, durationMs));
        EXPECT_TRUE(log.waitFor(kDoubleClickEnd));
    }
};

TEST_F(DoubleClickWithoutThreads, RaisesTheSystemsErrorAndPlaysNothing) {
    const auto hwApi = makeHwApi();
    const fake::RefusedThreads threads;
    try {
        hwApi->performEffect_DOUBLE_CLICK();
        ADD_FAILURE() << "a thread was made";
    } catch (const std::system_error& error) {
        EXPECT_EQ(error.code(), std::errc::resource_unavailable_try_again);
        EXPECT_THAT(error.what(), StartsWith("thread constructor failed"));
    }
    EXPECT_EQ(hwApi.use_count(), 1);
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_THAT(log.lines(), IsEmpty());
}

TEST_F(DoubleClickWithoutThreads, IsRefusedOnAPhoneWithAmplitude) {
    expectRefusedThenPlayed();
}

TEST_F(DoubleClickWithoutThreads, IsRefusedOnAPhoneWithPackets) {
    kernel.addNode(kLeds + "haptic_engine");
    expectRefusedThenPlayed();
}

TEST_F(DoubleClickWithoutThreads, IsPlayedOnAPhoneWithPatterns) {
    kernel.addNode(kLeds + "cp_trigger_index");
    const auto hwApi = makeHwApi();
    const fake::RefusedThreads threads;
    int durationMs = 0;
    EXPECT_TRUE(hwApi->preparePerform(Effect::DOUBLE_CLICK, 10000, durationMs));
    EXPECT_EQ(durationMs, 110);
    EXPECT_EQ(threads.count(), 0U);
}

// A phone whose double click would be pulsed on the force-feedback device, were it asked to.
using DoubleClickOnForceFeedback = ForceFeedbackPhone;

TEST_F(DoubleClickOnForceFeedback, UploadsEachPulseWithItsLength) {
    const auto hwApi = makeHwApi();
    hwApi->performEffect_DOUBLE_CLICK();
    ASSERT_TRUE(log.waitFor(kDoubleClickEnd));
    EXPECT_THAT(
            kernel.calls(),
            ElementsAre(
                    "open /dev/input/event7 O_RDWR", "event type=21 code=65535 value=0",
                    R"(upload id=-1 type=0x51 waveform=0x5d length=10 delay=0 custom="00 00 00 00")",
                    "event type=21 code=0 value=1", "sleep 70 ms", "erase id=0",
                    R"(upload id=-1 type=0x51 waveform=0x5d length=15 delay=0 custom="00 00 00 00")",
                    "event type=21 code=0 value=1"));
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
