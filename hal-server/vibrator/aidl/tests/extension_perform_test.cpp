// SPDX-License-Identifier: Apache-2.0
//
// The extension's effects: the platform's own, at an amplitude of the client's choice.
#include <cerrno>
#include <memory>
#include <string>

#include "tests/extension_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using core::Effect;
using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

class ExtensionPerform : public ExtensionTest {
  protected:
    ExtensionPerform() {
        addLegacyClass();
        addNodes(kLegacy, {"intensity", "cp_trigger_index"});
    }

    // The exception's number; the duration, which begins as 77, goes to `durationMs`.
    binder_exception_t perform(Vibrator& extension, int32_t effect, int32_t amplitude,
                               const std::shared_ptr<core::IVibratorCallback>& called = nullptr) {
        durationMs = 77;
        return exceptionOf(
                extension.perform(static_cast<Effect>(effect), amplitude, called, &durationMs));
    }

    int32_t durationMs = 77;
};

TEST_F(ExtensionPerform, PlaysTheEffectAtTheAmplitudeAndReturnsItsLength) {
    const auto extension = makeExtension();
    EXPECT_EQ(perform(*extension, 0, 4321), EX_NONE);
    EXPECT_EQ(durationMs, 60);
    EXPECT_THAT(kernel.writes(), ElementsAre(kIntensity + " \"4321\\n\"", kIndex + " \"10\\n\"",
                                             kEnable + " \"1000\\n\""));
    EXPECT_EQ(log.line(0), "I V_4_0: perform for QVX");
    EXPECT_EQ(log.line(1), "I V_4_0: Vibrator perform Effect for QVX : 0 amplitude : 4321");
    EXPECT_EQ(log.line(2), "I HW_API: [preparePerform]amplitude: 4321");
    EXPECT_EQ(log.lines().back(), "I V_4_0: Vibrator perform timeMS return: 60");
}

TEST_F(ExtensionPerform, FourEffectsAreOffered) {
    const struct {
        int32_t effect;
        int32_t durationMs;
        const char* pattern;
    } effects[] = {{0, 60, "10\n"}, {1, 110, "14\n"}, {2, 60, "50\n"}, {5, 110, "23\n"}};
    const auto extension = makeExtension();
    for (const auto& row : effects) {
        for (const int32_t amplitude : {1, 10000}) {
            EXPECT_EQ(perform(*extension, row.effect, amplitude), EX_NONE) << row.effect;
            EXPECT_EQ(durationMs, row.durationMs);
            EXPECT_EQ(kernel.text(kIndex), row.pattern);
            EXPECT_EQ(kernel.text(kIntensity), std::to_string(amplitude) + "\n");
        }
    }
}

TEST_F(ExtensionPerform, OtherEffectsAreNotOffered) {
    const auto extension = makeExtension();
    for (const int32_t effect : {3, 4, 6, 7, 20, 21, -1, kIntMin, kIntMax}) {
        log.clear();
        EXPECT_EQ(perform(*extension, effect, 5000), EX_UNSUPPORTED_OPERATION) << effect;
        EXPECT_EQ(durationMs, 77);
        EXPECT_THAT(log.lines(), ElementsAre("I V_4_0: perform for QVX",
                                             "I V_4_0: Vibrator perform Effect for QVX : " +
                                                     std::to_string(effect) + " amplitude : 5000",
                                             "I V_4_0: Unsupport vibrator perform effect for QVX"));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(ExtensionPerform, AmplitudeOutOfRangeIsAnIllegalArgument) {
    const auto extension = makeExtension();
    for (const int32_t amplitude : {0, -1, 10001, 65537, kIntMin, kIntMax}) {
        log.clear();
        EXPECT_EQ(perform(*extension, 0, amplitude), EX_ILLEGAL_ARGUMENT) << amplitude;
        EXPECT_EQ(durationMs, 77);
        const std::string number = std::to_string(amplitude);
        EXPECT_THAT(
                log.lines(),
                ElementsAre("I V_4_0: perform for QVX",
                            "I V_4_0: Vibrator perform Effect for QVX : 0 amplitude : " + number,
                            "I V_4_0: vibrator perform effect for QVX amplitude is abnormal " +
                                    number));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(ExtensionPerform, CallbackIsNotOffered) {
    const auto extension = makeExtension();
    EXPECT_EQ(perform(*extension, 0, 5000, callback), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(durationMs, 77);
    EXPECT_EQ(log.lines().back(), "I V_4_0: Not support perform() callback");
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(ExtensionPerform, CallbackIsRefusedBeforeTheEffectAndTheEffectBeforeTheAmplitude) {
    const auto extension = makeExtension();
    EXPECT_EQ(perform(*extension, 3, 0, callback), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(log.lines().back(), "I V_4_0: Not support perform() callback");
    EXPECT_EQ(perform(*extension, 3, 0), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(log.lines().back(), "I V_4_0: Unsupport vibrator perform effect for QVX");
}

TEST_F(ExtensionPerform, WithoutAMethodNothingElseIsLookedAt) {
    for (const std::string& node : {kIntensity, kIndex}) kernel.removeNode(node);
    const auto extension = makeExtension();
    EXPECT_EQ(perform(*extension, 0, 0), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(perform(*extension, 3, 0, callback), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(durationMs, 77);
    EXPECT_THAT(log.lines(),
                ElementsAre("I V_4_0: perform for QVX",
                            "I V_4_0: Vibrator perform Effect for QVX : 0 amplitude : 0",
                            "I V_4_0: performEffect PERFORM_NONE", "I V_4_0: perform for QVX",
                            "I V_4_0: Vibrator perform Effect for QVX : 3 amplitude : 0",
                            "I V_4_0: performEffect PERFORM_NONE"));
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(ExtensionPerform, FailingDriverIsAnIllegalStateAndLeavesTheDurationAlone) {
    const auto extension = makeExtension();
    for (const std::string& node : {kIntensity, kIndex, kEnable}) {
        kernel.addFault({.path = node, .operation = Operation::kWrite, .error = EIO});
        EXPECT_EQ(perform(*extension, 0, 5000), EX_ILLEGAL_STATE) << node;
        EXPECT_EQ(durationMs, 77);
        EXPECT_THAT(log.lines(), Not(Contains(HasSubstr("timeMS return"))));
    }
}

TEST_F(ExtensionPerform, HapticEngineMotorTicksByPacket) {
    kernel.removeNode(kIndex);
    kernel.addNode(kLegacy + "haptic_engine");
    const auto extension = makeExtension();
    EXPECT_EQ(perform(*extension, 2, 5000), EX_NONE);
    EXPECT_EQ(durationMs, 17);
    EXPECT_EQ(kernel.text(kLegacy + "haptic_engine"), "4 7 2500 2050 0\n");
}

TEST_F(ExtensionPerform, AmplitudeMotorClicksByPulse) {
    kernel.removeNode(kIndex);
    const auto extension = makeExtension();
    EXPECT_EQ(perform(*extension, 5, 5000), EX_NONE);
    EXPECT_EQ(durationMs, 17);
    EXPECT_THAT(kernel.writes(), ElementsAre(kIntensity + " \"5000\\n\"", kEnable + " \"7\\n\""));
}

TEST_F(ExtensionPerform, OnForceFeedbackPlaysAStoredPattern) {
    kernel.removeNode(kEnable);
    addForceFeedback();
    const auto extension = makeExtension();
    EXPECT_EQ(perform(*extension, 0, 5000), EX_NONE);
    EXPECT_EQ(durationMs, 60);
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /dev/input/event7 O_RDWR", "event type=21 code=96 value=5000",
                            "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                            "custom=\"00 00 0a 00\"",
                            "event type=21 code=0 value=1"));
}

}  // namespace
}  // namespace aidl::vendor::quorvan::hardware::vibrator
