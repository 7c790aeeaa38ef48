// SPDX-License-Identifier: Apache-2.0
//
// A composition on a force-feedback motor: compiled, uploaded, played and notified; and what
// becomes of it when the compiler or the driver refuses it.
#include <cerrno>
#include <limits>
#include <memory>
#include <string>
#include <vector>

#include "tests/composition_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::ElementsAreArray;
using ::testing::IsEmpty;
using ::testing::internal::CaptureStdout;
using ::testing::internal::GetCapturedStdout;
using Primitive = CompositePrimitive;

class UploadedComposition : public ForceFeedbackTest {
  protected:
    // Composes and waits until the callback was called.
    void composeToItsEnd(Vibrator& vibrator, const Composite& composite) {
        const auto completion = ndk::SharedRefBase::make<CountingCallback>();
        ASSERT_TRUE(vibrator.compose(composite, completion).isOk());
        EXPECT_TRUE(completion->waitForCall());
    }
};

TEST_F(UploadedComposition, IsUploadedPlayedAndNotified) {
    const auto vibrator = makeVibrator();
    composeToItsEnd(*vibrator, {after(50, Primitive::CLICK)});
    EXPECT_THAT(
            kernel.calls(),
            ElementsAre("open /dev/input/event7 O_RDWR",
                        "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                        "custom=\"00 00 02 00 00 00 00 00 00 00 00 32 00 64 01 00 00 00 00 00\"",
                        "event type=21 code=0 value=1", "sleep 70 ms"));
}

TEST_F(UploadedComposition, IsLoggedFromItsSizeToItsNotification) {
    const auto vibrator = makeVibrator();
    composeToItsEnd(*vibrator, {after(50, Primitive::CLICK)});
    EXPECT_THAT(
            log.lines(),
            ElementsAre("E V_2_0: Vibrator compose : 1 size", "E  delayMs : 50",
                        "E V_2_0: 50,1.100,", "E V_2_0: Vibrator getPrimitiveDuration ",
                        "E  durationMs : 20", "E  totaldelay : 50 totalDuration : 20",
                        "E V_2_0: Effect cmd : 50,1.100,",
                        "I HW_API: [setAndTriggerOwt_primitve]str: 50,1.100,",
                        "I HW_API: [setAndTriggerOwt_primitve]num_bytes: 20",
                        "I HW_API: [uploadForceFeedbackeffect]Input Node File Open: "
                        "/dev/input/event7",
                        "I HW_API: [uploadForceFeedbackeffect]ioctl success ,uploaded effect with "
                        "ID: 0",
                        "I HW_API: [triggerForceFeedbackVibration]on: 1",
                        "E V_2_0: compose setAndTriggerOwt_Primitive pass",
                        "I Starting compose on another thread", "I Notifying compose complete"));
}

TEST_F(UploadedComposition, OfAPauseAloneIsNotifiedAfterIt) {
    const auto vibrator = makeVibrator();
    composeToItsEnd(*vibrator, {after(20, Primitive::NOOP)});
    EXPECT_THAT(kernel.calls(), ElementsAre("open /dev/input/event7 O_RDWR",
                                            "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                                            "custom=\"00 00 01 00 00 00 00 00 00 00 00 14\"",
                                            "event type=21 code=0 value=1", "sleep 20 ms"));
}

TEST_F(UploadedComposition, UsesThePlatformsNumberingWhereTheDriverWasSwitchedToIt) {
    addKypIndexSwitch();
    const auto vibrator = makeVibrator();
    composeToItsEnd(*vibrator, {after(0, Primitive::CLICK, 0.0F), after(1000, Primitive::THUD)});
    // Amplitude 1 of entry 10 with a pause of 1000 ms, amplitude 100 of entry 140.
    EXPECT_THAT(kernel.calls(),
                Contains("upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                         "custom=\"00 00 02 00 00 01 0a 00 00 00 03 e8 00 64 8c 00 00 00 00 00\""));
    EXPECT_THAT(kernel.calls(), Contains("sleep 1320 ms"));
}

TEST_F(UploadedComposition, OfTenDelayedPrimitivesTakesElevenSections) {
    const auto vibrator = makeVibrator();
    composeToItsEnd(*vibrator, Composite(10, after(1, Primitive::LOW_TICK, 0.29F)));
    EXPECT_THAT(kernel.calls(),
                Contains("upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                         "custom=\"00 00 0b 00 "
                         "00 00 00 00 00 00 00 01 00 1d 77 00 00 00 00 01 00 1d 77 00 00 00 00 01 "
                         "00 1d 77 00 00 00 00 01 00 1d 77 00 00 00 00 01 00 1d 77 00 00 00 00 01 "
                         "00 1d 77 00 00 00 00 01 00 1d 77 00 00 00 00 01 00 1d 77 00 00 00 00 01 "
                         "00 1d 77 00 00 00 00 01 00 1d 77 00 00 00 00 00\""));
    EXPECT_THAT(kernel.calls(), Contains("sleep 210 ms"));
}

TEST_F(UploadedComposition, ReplacesTheOneBefore) {
    const auto vibrator = makeVibrator();
    composeToItsEnd(*vibrator, {after(0, Primitive::CLICK)});
    kernel.clear();
    composeToItsEnd(*vibrator, {after(0, Primitive::THUD)});
    EXPECT_THAT(kernel.calls(), ElementsAre("erase id=0",
                                            "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                                            "custom=\"00 00 01 00 00 64 7c 00 00 00 00 00\"",
                                            "event type=21 code=0 value=1", "sleep 300 ms"));
}

TEST_F(UploadedComposition, LeavesTimedVibrationAsItWas) {
    const auto vibrator = makeVibrator();
    composeToItsEnd(*vibrator, {after(0, Primitive::CLICK)});
    kernel.clear();
    EXPECT_TRUE(vibrator->on(500, nullptr).isOk());
    EXPECT_THAT(kernel.calls(), Contains("upload id=-1 type=0x51 waveform=0x5d length=500 delay=0 "
                                         "custom=\"00 00 00 00\""));
}

TEST_F(UploadedComposition, PendingNotificationIsNotCancelledByOff) {
    const auto vibrator = makeVibrator();
    const auto completion = ndk::SharedRefBase::make<CountingCallback>();
    EXPECT_TRUE(vibrator->compose({after(50, Primitive::CLICK)}, completion).isOk());
    EXPECT_TRUE(vibrator->off().isOk());
    EXPECT_TRUE(completion->waitForCall());
    EXPECT_EQ(completion->calls(), 1);
}

TEST_F(UploadedComposition, InterruptedCallsAreRepeated) {
    const auto vibrator = makeVibrator();
    for (const Operation operation : {Operation::kOpen, Operation::kIoctl, Operation::kWrite}) {
        kernel.addFault({.path = kMotor, .operation = operation, .error = EINTR, .times = 2});
    }
    composeToItsEnd(*vibrator, {after(0, Primitive::CLICK)});
    EXPECT_EQ(kernel.calls().size(), 3U + 3U + 3U + 1U);
}

// A composition that the waveform compiler refuses, and what that says on standard output.
struct UncompilableComposition {
    const char* name;
    CompositeEffect effect;
    const char* text;
    const char* printed;
};

class RefusedByTheCompiler : public ForceFeedbackTest,
                             public ::testing::WithParamInterface<UncompilableComposition> {};

TEST_P(RefusedByTheCompiler, IsAnIllegalStateWithoutACallOfTheDriver) {
    const auto vibrator = makeVibrator();
    const auto completion = ndk::SharedRefBase::make<CountingCallback>();
    CaptureStdout();
    const ndk::ScopedAStatus status = vibrator->compose({GetParam().effect}, completion);
    EXPECT_EQ(GetCapturedStdout(), GetParam().printed);
    EXPECT_EQ(exceptionOf(status), EX_ILLEGAL_STATE);
    EXPECT_THAT(
            linesAfter(log.lines(), std::string("E V_2_0: Effect cmd : ") + GetParam().text),
            ElementsAre(std::string("I HW_API: [setAndTriggerOwt_primitve]str: ") + GetParam().text,
                        "I HW_API: [setAndTriggerOwt_primitve]num_bytes: -22",
                        "E V_2_0: compose setAndTriggerOwt fail"));
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_EQ(completion.use_count(), 1) << "a worker has it";
}

const UncompilableComposition kUncompilable[] = {
        {"NegativeDelay", after(-1, Primitive::CLICK), "-1,1.100,",
         "Delay 18446744073709551615 too long\n"},
        {"MostNegativeDelay", after(std::numeric_limits<int32_t>::min(), Primitive::NOOP),
         "-2147483648,", "Delay 18446744071562067968 too long\n"},
        {"ScaleTooSmallForAnAmplitude", after(0, Primitive::CLICK, 0.0099F), "1.0,",
         "Invalid waveform amplitude: 0\n"},
        {"ScaleNotANumber", after(0, Primitive::CLICK, std::numeric_limits<float>::quiet_NaN()),
         "1.0,", "Invalid waveform amplitude: 0\n"},
};

INSTANTIATE_TEST_SUITE_P(Compose, RefusedByTheCompiler, ::testing::ValuesIn(kUncompilable),
                         [](const auto& composition) { return composition.param.name; });

// A fault of the motor: what is logged once the device is opened, and what was asked of it.
struct MotorFailure {
    const char* name;
    Operation operation;
    int error;
    Lines lines;
    Lines calls;
};

class FailedMotor : public ForceFeedbackTest, public ::testing::WithParamInterface<MotorFailure> {};

TEST_P(FailedMotor, IsAnIllegalStateAndNobodyIsNotified) {
    const auto vibrator = makeVibrator();
    kernel.addFault({.path = kMotor, .operation = GetParam().operation, .error = GetParam().error});
    const auto completion = ndk::SharedRefBase::make<CountingCallback>();
    EXPECT_EQ(exceptionOf(vibrator->compose({after(0, Primitive::CLICK)}, completion)),
              EX_ILLEGAL_STATE);
    EXPECT_THAT(
            linesAfter(
                    log.lines(),
                    "I HW_API: [uploadForceFeedbackeffect]Input Node File Open: /dev/input/event7"),
            ElementsAreArray(GetParam().lines));
    EXPECT_THAT(kernel.calls(), ElementsAreArray(GetParam().calls));
    EXPECT_EQ(completion.use_count(), 1) << "a worker has it";
}

constexpr char kFailed[] = "E V_2_0: compose setAndTriggerOwt fail";

const MotorFailure kMotorFailures[] = {
        {"CannotBeOpened",
         Operation::kOpen,
         EACCES,
         {"I HW_API: [uploadForceFeedbackeffect]open fail: /dev/input/event7 ,errno: 13", kFailed},
         {"open /dev/input/event7 O_RDWR = EACCES"}},
        {"RefusesTheWaveform",
         Operation::kIoctl,
         ENOSPC,
         {"I HW_API: [uploadForceFeedbackeffect]ioctl fail: /dev/input/event7 ,errno: 28", kFailed},
         {"open /dev/input/event7 O_RDWR",
          "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
          "custom=\"00 00 01 00 00 64 01 00 00 00 00 00\" = ENOSPC"}},
        {"RefusesTheStart",
         Operation::kWrite,
         ENODEV,
         {"I HW_API: [uploadForceFeedbackeffect]ioctl success ,uploaded effect with ID: 0",
          "I HW_API: [triggerForceFeedbackVibration]on: 1",
          "I HW_API: [writeInputEvent]write fail: /dev/input/event7 ,errno: 19", kFailed},
         {"open /dev/input/event7 O_RDWR",
          "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
          "custom=\"00 00 01 00 00 64 01 00 00 00 00 00\"",
          "event type=21 code=0 value=1 = ENODEV"}},
};

INSTANTIATE_TEST_SUITE_P(Compose, FailedMotor, ::testing::ValuesIn(kMotorFailures),
                         [](const auto& failure) { return failure.param.name; });

TEST_F(UploadedComposition, ThatCannotReplaceTheOneBeforeIsAnIllegalState) {
    const auto vibrator = makeVibrator();
    composeToItsEnd(*vibrator, {after(0, Primitive::CLICK)});
    kernel.clear();
    log.clear();
    kernel.addFault({.path = kMotor, .operation = Operation::kIoctl, .error = EINVAL});
    const auto completion = ndk::SharedRefBase::make<CountingCallback>();
    EXPECT_EQ(exceptionOf(vibrator->compose({after(0, Primitive::THUD)}, completion)),
              EX_ILLEGAL_STATE);
    EXPECT_THAT(kernel.calls(), ElementsAre("erase id=0 = EINVAL"));
    EXPECT_THAT(linesAfter(log.lines(), "I HW_API: [setAndTriggerOwt_primitve]num_bytes: 12"),
                ElementsAre("I HW_API: [uploadForceFeedbackeffect]Clear Memory - ioctl fail: "
                            "/dev/input/event7 ,errno: 22",
                            "E V_2_0: compose setAndTriggerOwt fail"));
    EXPECT_EQ(completion.use_count(), 1) << "a worker has it";
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
