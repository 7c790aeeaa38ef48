// SPDX-License-Identifier: Apache-2.0
//
// The one effect of the process on the force-feedback device: what is sent, to the byte, what is
// logged, and what is left after a failure.
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "tests/force_feedback_phone.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class ForceFeedback : public ForceFeedbackPhone {
  protected:
    const std::shared_ptr<HwApi> hwApi = makeHwApi();
};

// The record up to its pointer, least significant bytes first as on every phone: type, id,
// direction, trigger button and interval, replay length and delay, two bytes of filling, then
// waveform, period, magnitude, offset, phase, four of envelope, two of filling, custom length.
const Bytes kFreshRecord = {0x51, 0, 0xff, 0xff, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0,  //
                            0x5d, 0, 0,    0,    0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0,  //
                            0,    0, 0,    0,    2, 0, 0, 0};
const Bytes kFreshEvent = {0, 0, 0, 0, 0,    0, 0, 0, 0, 0, 0, 0,
                           0, 0, 0, 0, 0x15, 0, 0, 0, 0, 0, 0, 0};

static_assert(sizeof(ff_effect) == 48);
static_assert(sizeof(input_event) == 24);

TEST_F(ForceFeedback, InitialisationResetsRecordIndexAndEvent) {
    memset(&forceFeedbackEffect, 0xa5, sizeof(forceFeedbackEffect));
    hwApi->initForceFeedbackEffect();
    EXPECT_EQ(bytesOf(&forceFeedbackEffect.record, 40), kFreshRecord);
    EXPECT_EQ(forceFeedbackEffect.record.u.periodic.custom_data, forceFeedbackEffect.indexPair);
    EXPECT_EQ(bytesOf(forceFeedbackEffect.indexPair, 4), Bytes({0, 0, 0, 0}));
    EXPECT_EQ(bytesOf(&forceFeedbackEffect.event, 24), kFreshEvent);
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [initForceFeedbackEffect]"));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-CORE"));
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(ForceFeedback, FirstUploadOpensTheDeviceAndSendsTheRecord) {
    EXPECT_TRUE(hwApi->uploadForceFeedbackeffect());
    EXPECT_THAT(kernel.calls(), ElementsAre("open /dev/input/event7 O_RDWR",
                                            "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                                            "custom=\"00 00 00 00\""));
    EXPECT_THAT(motor->requests, ElementsAre(0x40304580));
    EXPECT_THAT(motor->records, ElementsAre(kFreshRecord));
    EXPECT_THAT(motor->customData, ElementsAre(forceFeedbackEffect.indexPair));
    EXPECT_EQ(forceFeedbackEffect.record.id, 0);
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: [uploadForceFeedbackeffect]Input Node File Open: "
                            "/dev/input/event7",
                            "I HW_API: [uploadForceFeedbackeffect]ioctl success ,uploaded effect "
                            "with ID: 0"));
}

TEST_F(ForceFeedback, LaterUploadErasesTheEffectBeforeAndKeepsTheDeviceOpen) {
    EXPECT_TRUE(hwApi->uploadForceFeedbackeffect());
    kernel.clear();
    log.clear();
    EXPECT_TRUE(hwApi->uploadForceFeedbackeffect());
    EXPECT_THAT(kernel.calls(), ElementsAre("erase id=0",
                                            "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                                            "custom=\"00 00 00 00\""));
    EXPECT_THAT(motor->requests, ElementsAre(0x40304580, 0x40044581, 0x40304580));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: [uploadForceFeedbackeffect]ioctl success ,uploaded effect "
                            "with ID: 0"));
}

TEST_F(ForceFeedback, DescriptorZeroIsAsGoodAsAnother) {
    const int kept = dup(STDIN_FILENO);
    close(STDIN_FILENO);
    EXPECT_TRUE(hwApi->uploadForceFeedbackeffect());
    EXPECT_EQ(inputFD, 0);
    EXPECT_TRUE(hwApi->setForceFeedbackAmplitude(5000));
    EXPECT_THAT(kernel.calls(), Contains("open /dev/input/event7 O_RDWR").Times(1));
    closeMotor();
    if (kept >= 0) dup2(kept, STDIN_FILENO);
    close(kept);
}

TEST_F(ForceFeedback, FailedOpenIsLoggedAndTriedAgainByTheNextCall) {
    kernel.addFault({.path = kMotorNode, .operation = Operation::kOpen, .error = EACCES});
    EXPECT_FALSE(hwApi->uploadForceFeedbackeffect());
    EXPECT_EQ(inputFD, -1);
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: [uploadForceFeedbackeffect]Input Node File Open: "
                            "/dev/input/event7",
                            "I HW_API: [uploadForceFeedbackeffect]open fail: /dev/input/event7 "
                            ",errno: 13"));
    EXPECT_TRUE(hwApi->uploadForceFeedbackeffect());
    EXPECT_GE(inputFD, 0);
}

TEST_F(ForceFeedback, MissingDeviceIsTriedByEveryCall) {
    kernel.removeNode(kMotorNode);
    EXPECT_FALSE(hwApi->uploadForceFeedbackeffect());
    EXPECT_FALSE(hwApi->writeInputEvent());
    EXPECT_THAT(kernel.calls(), ElementsAre("open /dev/input/event7 O_RDWR = ENOENT",
                                            "open /dev/input/event7 O_RDWR = ENOENT"));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: [uploadForceFeedbackeffect]Input Node File Open: "
                            "/dev/input/event7",
                            "I HW_API: [uploadForceFeedbackeffect]open fail: /dev/input/event7 "
                            ",errno: 2",
                            "I HW_API: [writeInputEvent]Input Node File Open: /dev/input/event7",
                            "I HW_API: [writeInputEvent]open fail: /dev/input/event7 ,errno: 2"));
}

TEST_F(ForceFeedback, FailedEraseKeepsTheIdAndUploadsNothing) {
    EXPECT_TRUE(hwApi->uploadForceFeedbackeffect());
    kernel.clear();
    log.clear();
    kernel.addFault({.path = kMotorNode, .operation = Operation::kIoctl, .error = EIO});
    EXPECT_FALSE(hwApi->uploadForceFeedbackeffect());
    EXPECT_EQ(forceFeedbackEffect.record.id, 0);
    EXPECT_THAT(kernel.calls(), ElementsAre("erase id=0 = EIO"));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: [uploadForceFeedbackeffect]Clear Memory - ioctl fail: "
                            "/dev/input/event7 ,errno: 5"));
    EXPECT_TRUE(hwApi->uploadForceFeedbackeffect());
    EXPECT_THAT(kernel.calls(), Contains("erase id=0"));
}

TEST_F(ForceFeedback, FailedUploadLeavesNoEffect) {
    EXPECT_TRUE(hwApi->uploadForceFeedbackeffect());
    log.clear();
    kernel.addFault(
            {.path = kMotorNode, .operation = Operation::kIoctl, .error = ENOSPC, .after = 1});
    EXPECT_FALSE(hwApi->uploadForceFeedbackeffect());
    EXPECT_EQ(forceFeedbackEffect.record.id, -1);
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [uploadForceFeedbackeffect]ioctl fail: "
                                         "/dev/input/event7 ,errno: 28"));
    kernel.clear();
    EXPECT_TRUE(hwApi->uploadForceFeedbackeffect());
    EXPECT_THAT(kernel.calls(), ElementsAre("upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                                            "custom=\"00 00 00 00\""));
}

TEST_F(ForceFeedback, InterruptedCallsAreRepeated) {
    kernel.addFault(
            {.path = kMotorNode, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    kernel.addFault(
            {.path = kMotorNode, .operation = Operation::kIoctl, .error = EINTR, .times = 2});
    kernel.addFault(
            {.path = kMotorNode, .operation = Operation::kWrite, .error = EINTR, .times = 2});
    EXPECT_TRUE(hwApi->setForceFeedbackDuration(500));
    EXPECT_TRUE(hwApi->triggerForceFeedbackVibration(true));
    const std::string upload =
            "upload id=-1 type=0x51 waveform=0x5d length=500 delay=0 custom=\"00 00 00 00\"";
    const std::string event = "event type=21 code=0 value=1";
    EXPECT_THAT(kernel.calls(), ElementsAre("open /dev/input/event7 O_RDWR = EINTR",
                                            "open /dev/input/event7 O_RDWR = EINTR",
                                            "open /dev/input/event7 O_RDWR", upload + " = EINTR",
                                            upload + " = EINTR", upload, event + " = EINTR",
                                            event + " = EINTR", event));
    kernel.clear();
    kernel.addFault({.path = kMotorNode, .operation = Operation::kIoctl, .error = EINTR});
    EXPECT_TRUE(hwApi->uploadForceFeedbackeffect());
    EXPECT_THAT(kernel.calls(), ElementsAre("erase id=0 = EINTR", "erase id=0", upload));
}

TEST_F(ForceFeedback, DurationIsTheReplayLength) {
    EXPECT_TRUE(hwApi->setForceFeedbackDuration(500));
    Bytes expected = kFreshRecord;
    expected[10] = 0xf4;
    expected[11] = 0x01;
    EXPECT_THAT(motor->records, ElementsAre(expected));
}

struct Stored {
    int given;
    uint16_t stored;
};

TEST_F(ForceFeedback, DurationIsStoredInSixteenBits) {
    for (const auto [given, stored] :
         {Stored{0, 0}, Stored{65535, 65535}, Stored{65536, 0}, Stored{65537, 1}, Stored{-1, 65535},
          Stored{-2147483647 - 1, 0}}) {
        EXPECT_TRUE(hwApi->setForceFeedbackDuration(given));
        EXPECT_EQ(forceFeedbackEffect.record.replay.length, stored) << given;
    }
}

TEST_F(ForceFeedback, IndexIsTheSecondValueOfThePairAndHasNoLength) {
    EXPECT_TRUE(hwApi->setForceFeedbackDuration(500));
    kernel.clear();
    EXPECT_TRUE(hwApi->setForceFeedbackIndex(0x1234));
    EXPECT_THAT(kernel.calls(), ElementsAre("erase id=0",
                                            "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                                            "custom=\"00 00 34 12\""));
}

TEST_F(ForceFeedback, IndexZeroKeepsTheLength) {
    EXPECT_TRUE(hwApi->setForceFeedbackDuration(500));
    kernel.clear();
    EXPECT_TRUE(hwApi->setForceFeedbackIndex(0));
    EXPECT_THAT(kernel.calls(),
                ElementsAre("erase id=0",
                            "upload id=-1 type=0x51 waveform=0x5d length=500 delay=0 "
                            "custom=\"00 00 00 00\""));
}

TEST_F(ForceFeedback, IndexIsStoredInSixteenBitsAndJudgedInThirtyTwo) {
    EXPECT_TRUE(hwApi->setForceFeedbackDuration(500));
    // Not zero, so the length goes; nothing of it in the low half, so the pair says plain
    // vibration.
    EXPECT_TRUE(hwApi->setForceFeedbackIndex(65536));
    EXPECT_EQ(forceFeedbackEffect.indexPair[1], 0);
    EXPECT_EQ(forceFeedbackEffect.record.replay.length, 0);
    EXPECT_TRUE(hwApi->setForceFeedbackDuration(250));
    EXPECT_EQ(forceFeedbackEffect.record.replay.length, 250);
    EXPECT_TRUE(hwApi->setForceFeedbackIndex(-1));
    EXPECT_EQ(forceFeedbackEffect.indexPair[1], -1);
    EXPECT_TRUE(hwApi->setForceFeedbackIndex(0x18005));
    EXPECT_EQ(forceFeedbackEffect.indexPair[1], -32763);
    EXPECT_EQ(forceFeedbackEffect.indexPair[0], 0);
}

TEST_F(ForceFeedback, DurationIsIgnoredWhileAStoredEffectIsChosen) {
    EXPECT_TRUE(hwApi->setForceFeedbackIndex(5));
    kernel.clear();
    log.clear();
    EXPECT_TRUE(hwApi->setForceFeedbackDuration(500));
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_THAT(log.lines(), IsEmpty());
    EXPECT_EQ(forceFeedbackEffect.record.replay.length, 0);
    EXPECT_TRUE(hwApi->setForceFeedbackIndex(0));
    kernel.clear();
    EXPECT_TRUE(hwApi->setForceFeedbackDuration(500));
    EXPECT_THAT(kernel.calls(),
                ElementsAre("erase id=0",
                            "upload id=-1 type=0x51 waveform=0x5d length=500 delay=0 "
                            "custom=\"00 00 00 00\""));
}

TEST_F(ForceFeedback, FailedUploadFailsTheSettersAndKeepsWhatWasSet) {
    kernel.addFault({.path = kMotorNode, .operation = Operation::kIoctl, .error = EIO, .times = 2});
    EXPECT_FALSE(hwApi->setForceFeedbackDuration(500));
    EXPECT_EQ(forceFeedbackEffect.record.replay.length, 500);
    EXPECT_FALSE(hwApi->setForceFeedbackIndex(5));
    EXPECT_EQ(forceFeedbackEffect.indexPair[1], 5);
}

TEST_F(ForceFeedback, AmplitudeIsAGainEvent) {
    EXPECT_TRUE(hwApi->setForceFeedbackAmplitude(5000));
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /dev/input/event7 O_RDWR", "event type=21 code=96 value=5000"));
    EXPECT_THAT(motor->events, ElementsAre(Bytes({0, 0, 0, 0,    0, 0,    0, 0,    0,    0, 0, 0, 0,
                                                  0, 0, 0, 0x15, 0, 0x60, 0, 0x88, 0x13, 0, 0})));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: [setForceFeedbackAmplitude]amplitude: 5000",
                            "I HW_API: [writeInputEvent]Input Node File Open: /dev/input/event7"));
}

TEST_F(ForceFeedback, AnyGainIsPassedOn) {
    EXPECT_TRUE(hwApi->setForceFeedbackAmplitude(0));
    EXPECT_TRUE(hwApi->setForceFeedbackAmplitude(-1));
    EXPECT_TRUE(hwApi->setForceFeedbackAmplitude(2147483647));
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /dev/input/event7 O_RDWR", "event type=21 code=96 value=0",
                            "event type=21 code=96 value=-1",
                            "event type=21 code=96 value=2147483647"));
}

TEST_F(ForceFeedback, TriggerSendsTheUploadedIdOnAndOff) {
    EXPECT_TRUE(hwApi->setForceFeedbackDuration(500));
    forceFeedbackEffect.record.id = 0x0102;
    log.clear();
    EXPECT_TRUE(hwApi->triggerForceFeedbackVibration(true));
    EXPECT_TRUE(hwApi->triggerForceFeedbackVibration(false));
    EXPECT_THAT(motor->events, ElementsAre(Bytes({0, 0, 0, 0, 0,    0, 0,    0, 0, 0, 0, 0,
                                                  0, 0, 0, 0, 0x15, 0, 0x02, 1, 1, 0, 0, 0}),
                                           Bytes({0, 0, 0, 0, 0,    0, 0,    0, 0, 0, 0, 0,
                                                  0, 0, 0, 0, 0x15, 0, 0x02, 1, 0, 0, 0, 0})));
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [triggerForceFeedbackVibration]on: 1",
                                         "I HW_API: [triggerForceFeedbackVibration]on: 0"));
}

TEST_F(ForceFeedback, TriggerBeforeAnyUploadSendsMinusOne) {
    EXPECT_TRUE(hwApi->triggerForceFeedbackVibration(true));
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /dev/input/event7 O_RDWR", "event type=21 code=65535 value=1"));
    EXPECT_EQ(motor->events[0][18], 0xff);
    EXPECT_EQ(motor->events[0][19], 0xff);
}

TEST_F(ForceFeedback, TriggerAfterGainIsNoGain) {
    EXPECT_TRUE(hwApi->setForceFeedbackDuration(500));
    EXPECT_TRUE(hwApi->setForceFeedbackAmplitude(10000));
    kernel.clear();
    EXPECT_TRUE(hwApi->triggerForceFeedbackVibration(true));
    EXPECT_THAT(kernel.calls(), ElementsAre("event type=21 code=0 value=1"));
}

TEST_F(ForceFeedback, WriteThatTakesNothingIsASuccess) {
    motor->writeResult = 0;
    EXPECT_TRUE(hwApi->writeInputEvent());
    motor->writeResult = 7;
    EXPECT_TRUE(hwApi->writeInputEvent());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /dev/input/event7 O_RDWR", "event type=21 code=0 value=0 = 0",
                            "event type=21 code=0 value=0 = 7"));
}

TEST_F(ForceFeedback, FailedWriteIsLoggedAndKeepsTheDeviceOpen) {
    kernel.addFault({.path = kMotorNode, .operation = Operation::kWrite, .error = ENODEV});
    EXPECT_FALSE(hwApi->writeInputEvent());
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: [writeInputEvent]Input Node File Open: /dev/input/event7",
                            "I HW_API: [writeInputEvent]write fail: /dev/input/event7 ,errno: 19"));
    EXPECT_TRUE(hwApi->writeInputEvent());
    EXPECT_THAT(kernel.calls(), ElementsAre("open /dev/input/event7 O_RDWR",
                                            "event type=21 code=0 value=0 = ENODEV",
                                            "event type=21 code=0 value=0"));
}

TEST_F(ForceFeedback, FailedWriteFailsGainAndTrigger) {
    kernel.addFault({.path = kMotorNode, .operation = Operation::kWrite, .error = EIO, .times = 2});
    EXPECT_FALSE(hwApi->setForceFeedbackAmplitude(5000));
    EXPECT_FALSE(hwApi->triggerForceFeedbackVibration(true));
}

TEST_F(ForceFeedback, EventAndUploadShareTheDescriptor) {
    EXPECT_TRUE(hwApi->writeInputEvent());
    EXPECT_TRUE(hwApi->uploadForceFeedbackeffect());
    EXPECT_EQ(kernel.openDescriptors(), 1U);
    EXPECT_THAT(kernel.calls(), Contains("open /dev/input/event7 O_RDWR").Times(1));
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
