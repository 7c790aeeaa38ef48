// SPDX-License-Identifier: Apache-2.0
//
// The standard service on a phone with a force-feedback motor, down to the device: on, off,
// amplitude, and the end that closes it.
#include <cerrno>
#include <limits>
#include <memory>
#include <string>

#include "Vibrator.h"
#include "tests/force_feedback_phone.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class VibratorOnForceFeedback : public ForceFeedbackPhone {
  protected:
    VibratorOnForceFeedback() {
        kernel.clear();
        log.clear();
    }

    std::shared_ptr<Vibrator> vibrator = ndk::SharedRefBase::make<Vibrator>(makeHwApi());
};

TEST_F(VibratorOnForceFeedback, OnUploadsThatLengthAndStartsIt) {
    EXPECT_TRUE(vibrator->on(500, nullptr).isOk());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /dev/input/event7 O_RDWR",
                            "upload id=-1 type=0x51 waveform=0x5d length=500 delay=0 "
                            "custom=\"00 00 00 00\"",
                            "event type=21 code=0 value=1"));
    EXPECT_THAT(log.lines(),
                ElementsAre("E V_2_0: Vibrator on for timeoutMs: 500",
                            "I HW_API: do_on for timeoutMs: 500",
                            "I HW_API: [uploadForceFeedbackeffect]Input Node File Open: "
                            "/dev/input/event7",
                            "I HW_API: [uploadForceFeedbackeffect]ioctl success ,uploaded effect "
                            "with ID: 0",
                            "I HW_API: [triggerForceFeedbackVibration]on: 1"));
}

TEST_F(VibratorOnForceFeedback, SecondOnErasesTheFirstEffect) {
    EXPECT_TRUE(vibrator->on(500, nullptr).isOk());
    kernel.clear();
    EXPECT_TRUE(vibrator->on(70000, nullptr).isOk());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("erase id=0",
                            "upload id=-1 type=0x51 waveform=0x5d length=4464 delay=0 "
                            "custom=\"00 00 00 00\"",
                            "event type=21 code=0 value=1"));
}

TEST_F(VibratorOnForceFeedback, OnWithAStoredEffectOnlyStartsIt) {
    forceFeedbackEffect.indexPair[1] = 23;
    EXPECT_TRUE(vibrator->on(500, nullptr).isOk());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /dev/input/event7 O_RDWR", "event type=21 code=65535 value=1"));
}

TEST_F(VibratorOnForceFeedback, OffStopsWhatWasUploaded) {
    EXPECT_TRUE(vibrator->on(500, nullptr).isOk());
    kernel.clear();
    EXPECT_TRUE(vibrator->off().isOk());
    EXPECT_THAT(kernel.calls(), ElementsAre("event type=21 code=0 value=0"));
}

TEST_F(VibratorOnForceFeedback, FailingDeviceIsAnIllegalState) {
    kernel.addFault(
            {.path = kMotorNode, .operation = Operation::kOpen, .error = ENODEV, .times = 3});
    EXPECT_EQ(vibrator->on(500, nullptr).getExceptionCode(), EX_ILLEGAL_STATE);
    EXPECT_EQ(vibrator->off().getExceptionCode(), EX_ILLEGAL_STATE);
    EXPECT_EQ(vibrator->setAmplitude(0.5F).getExceptionCode(), EX_ILLEGAL_STATE);
    EXPECT_TRUE(vibrator->on(500, nullptr).isOk());
}

TEST_F(VibratorOnForceFeedback, AmplitudeIsTheGainInTenThousandths) {
    EXPECT_TRUE(vibrator->setAmplitude(0.5F).isOk());
    EXPECT_TRUE(vibrator->setAmplitude(1.0F).isOk());
    EXPECT_TRUE(vibrator->setAmplitude(0.00001F).isOk());
    EXPECT_TRUE(vibrator->setAmplitude(std::numeric_limits<float>::quiet_NaN()).isOk());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /dev/input/event7 O_RDWR", "event type=21 code=96 value=5000",
                            "event type=21 code=96 value=10000", "event type=21 code=96 value=0",
                            "event type=21 code=96 value=0"));
    EXPECT_THAT(log.lines(), Contains("I HW_API: [setForceFeedbackAmplitude]amplitude: 5000"));
}

TEST_F(VibratorOnForceFeedback, AmplitudeOutOfRangeIsRefusedAndTheDeviceNotOpened) {
    for (const float amplitude : {0.0F, -0.5F, 1.0001F}) {
        EXPECT_EQ(vibrator->setAmplitude(amplitude).getExceptionCode(), EX_ILLEGAL_ARGUMENT);
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(VibratorOnForceFeedback, EndClosesTheDeviceAndKeepsItsNumber) {
    EXPECT_TRUE(vibrator->on(500, nullptr).isOk());
    const int number = inputFD;
    kernel.clear();
    log.clear();
    vibrator.reset();
    EXPECT_THAT(kernel.calls(), ElementsAre("close /dev/input/event7"));
    EXPECT_THAT(log.lines(),
                ElementsAre("E V_2_0: Vibrator::~Vibrator()", "E V_2_0: inputFD close"));
    EXPECT_EQ(inputFD, number);
    inputFD = -1;  // closed already
}

TEST_F(VibratorOnForceFeedback, EndWithoutARequestHasNothingToClose) {
    kernel.clear();
    log.clear();
    vibrator.reset();
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_THAT(log.lines(), ElementsAre("E V_2_0: Vibrator::~Vibrator()"));
}

TEST_F(VibratorOnForceFeedback, EndAfterAFailedOpenHasNothingToClose) {
    kernel.addFault({.path = kMotorNode, .operation = Operation::kOpen, .error = EACCES});
    EXPECT_FALSE(vibrator->on(500, nullptr).isOk());
    log.clear();
    vibrator.reset();
    EXPECT_THAT(log.lines(), ElementsAre("E V_2_0: Vibrator::~Vibrator()"));
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
