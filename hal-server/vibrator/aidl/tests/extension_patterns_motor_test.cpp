// SPDX-License-Identifier: Apache-2.0
//
// The extension's stored patterns on a force feedback motor, once and repeating.
#include <cerrno>

#include "tests/extension_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

class ExtensionPatternOnForceFeedback : public ExtensionTest {
  protected:
    ExtensionPatternOnForceFeedback() { addForceFeedback(); }
};

constexpr char kGain5000[] = "event type=21 code=96 value=5000";

TEST_F(ExtensionPatternOnForceFeedback, OnceIsGainUploadAndStart) {
    const auto extension = makeExtension();
    EXPECT_TRUE(extension->performPrebakedHapticPattern(23, 5000, false).isOk());
    EXPECT_THAT(kernel.calls(), ElementsAre("open /dev/input/event7 O_RDWR", kGain5000,
                                            "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                                            "custom=\"00 00 17 00\"",
                                            "event type=21 code=0 value=1"));
    EXPECT_THAT(log.lines(),
                ElementsAre("I V_4_0: performPrebakedHapticPattern 23 : 5000 : 0",
                            "I HW_API: [setForceFeedbackAmplitude]amplitude: 5000",
                            "I HW_API: [writeInputEvent]Input Node File Open: /dev/input/event7",
                            "I HW_API: [uploadForceFeedbackeffect]ioctl success ,uploaded effect "
                            "with ID: 0",
                            "I HW_API: do_on for timeoutMs: 1000",
                            "I HW_API: [triggerForceFeedbackVibration]on: 1"));
}

TEST_F(ExtensionPatternOnForceFeedback, OnceIndexZeroIsUploadedButNotStarted) {
    const auto extension = makeExtension();
    EXPECT_TRUE(extension->performPrebakedHapticPattern(0, 5000, false).isOk());
    EXPECT_THAT(kernel.calls(), ElementsAre("open /dev/input/event7 O_RDWR", kGain5000,
                                            "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                                            "custom=\"00 00 00 00\""));
}

TEST_F(ExtensionPatternOnForceFeedback, OnceFailedGainOrUploadHasNoLineOfItsOwn) {
    const auto extension = makeExtension();
    kernel.addFault({.path = kMotorDevice, .operation = Operation::kWrite, .error = ENODEV});
    EXPECT_EQ(exceptionOf(extension->performPrebakedHapticPattern(23, 5000, false)),
              EX_ILLEGAL_STATE);
    EXPECT_EQ(log.lines().back(),
              "I HW_API: [writeInputEvent]write fail: /dev/input/event7 ,errno: 19");
    kernel.addFault({.path = kMotorDevice, .operation = Operation::kIoctl, .error = ENOSPC});
    EXPECT_EQ(exceptionOf(extension->performPrebakedHapticPattern(23, 5000, false)),
              EX_ILLEGAL_STATE);
    EXPECT_EQ(log.lines().back(),
              "I HW_API: [uploadForceFeedbackeffect]ioctl fail: /dev/input/event7 ,errno: 28");
    EXPECT_THAT(log.lines(), Not(Contains(HasSubstr("do_on"))));
}

TEST_F(ExtensionPatternOnForceFeedback, OnceFailedStartIsLogged) {
    const auto extension = makeExtension();
    kernel.addFault(
            {.path = kMotorDevice, .operation = Operation::kWrite, .error = ENODEV, .after = 1});
    EXPECT_EQ(exceptionOf(extension->performPrebakedHapticPattern(23, 5000, false)),
              EX_ILLEGAL_STATE);
    EXPECT_EQ(log.lines().back(), "I V_4_0: performPrebakedHapticPattern on fail");
}

TEST_F(ExtensionPatternOnForceFeedback, RepeatedIsGainAndALoopedWaveform) {
    const auto extension = makeExtension();
    EXPECT_TRUE(extension->performPrebakedHapticPattern(5, 5000, true).isOk());
    EXPECT_THAT(kernel.calls(), ElementsAre("open /dev/input/event7 O_RDWR", kGain5000,
                                            "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                                            "custom=\"00 00 01 ff 00 64 05 00 00 00 00 0a\"",
                                            "event type=21 code=0 value=1"));
    EXPECT_EQ(log.line(0), "I V_4_0: performPrebakedHapticPattern 5 : 5000 : 1");
    EXPECT_THAT(log.lines(), Contains("I HW_API: [setAndTriggerOwt]str: 5.100, 10, ~"));
    EXPECT_THAT(log.lines(), Not(Contains(HasSubstr("do_on"))));
}

TEST_F(ExtensionPatternOnForceFeedback, RepeatedIndexZeroIsAnIllegalStateAndSendsNothing) {
    const auto extension = makeExtension();
    EXPECT_EQ(exceptionOf(extension->performPrebakedHapticPattern(0, 5000, true)),
              EX_ILLEGAL_STATE);
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_THAT(log.lines(),
                ElementsAre("I V_4_0: performPrebakedHapticPattern 0 : 5000 : 1",
                            "I V_4_0: performPrebakedHapticPattern Cannot use patternIndex 0 with "
                            "repeat"));
}

TEST_F(ExtensionPatternOnForceFeedback, RepeatedFailedGainHasNoLineOfItsOwn) {
    const auto extension = makeExtension();
    kernel.addFault({.path = kMotorDevice, .operation = Operation::kWrite, .error = ENODEV});
    EXPECT_EQ(exceptionOf(extension->performPrebakedHapticPattern(5, 5000, true)),
              EX_ILLEGAL_STATE);
    EXPECT_EQ(log.lines().back(),
              "I HW_API: [writeInputEvent]write fail: /dev/input/event7 ,errno: 19");
}

TEST_F(ExtensionPatternOnForceFeedback, RepeatedFailedUploadOrStartIsLogged) {
    const auto extension = makeExtension();
    kernel.addFault({.path = kMotorDevice, .operation = Operation::kIoctl, .error = ENOSPC});
    EXPECT_EQ(exceptionOf(extension->performPrebakedHapticPattern(5, 5000, true)),
              EX_ILLEGAL_STATE);
    EXPECT_EQ(log.lines().back(), "I V_4_0: performPrebakedHapticPattern setAndTriggerOwt fail");
    log.clear();
    kernel.addFault(
            {.path = kMotorDevice, .operation = Operation::kWrite, .error = ENODEV, .after = 1});
    EXPECT_EQ(exceptionOf(extension->performPrebakedHapticPattern(5, 5000, true)),
              EX_ILLEGAL_STATE);
    EXPECT_EQ(log.lines().back(), "I V_4_0: performPrebakedHapticPattern setAndTriggerOwt fail");
}

TEST_F(ExtensionPatternOnForceFeedback, InterruptedCallsAreRepeated) {
    const auto extension = makeExtension();
    for (const Operation operation : {Operation::kOpen, Operation::kWrite, Operation::kIoctl}) {
        kernel.addFault({.path = kMotorDevice, .operation = operation, .error = EINTR, .times = 2});
    }
    EXPECT_TRUE(extension->performPrebakedHapticPattern(23, 5000, false).isOk());
}

}  // namespace
}  // namespace aidl::vendor::quorvan::hardware::vibrator
