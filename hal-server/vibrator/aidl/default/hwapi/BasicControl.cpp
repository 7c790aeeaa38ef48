// SPDX-License-Identifier: Apache-2.0
//
// Basic vibration control: on, off, amplitude, whether the motor runs, and who may ask.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <android-base/logging.h>

#include "Constants.h"
#include "HwApi.h"
#include "hwapi/DriverWriter.h"

namespace aidl::android::hardware::vibrator {

bool HwApi::do_on(int timeoutMs) {
    LOG(INFO) << "HW_API: do_on for timeoutMs: " << timeoutMs;
    if (useForceFeedback) {
        return setForceFeedbackDuration(timeoutMs) && triggerForceFeedbackVibration(true);
    }
    if (useLedsClass) {
        // The kernel's transient trigger: the state to hold, for how long, and go.
        return checked(writeNode(LEDS_STATE, 1), kHardwareLog, "Vibrator on THE_DEVICE_STATE",
                       " error") &&
               checked(writeNode(LEDS_DURATION, timeoutMs), kHardwareLog,
                       "Vibrator on THE_DEVICE_DURATION", " error") &&
               checked(writeNode(LEDS_ACTIVATE, 1), kHardwareLog, "Vibrator on THE_DEVICE_ACTIVATE",
                       " error");
    }
    return checked(writeNode(TIMED_OUTPUT_ENABLE, timeoutMs), kHardwareLog,
                   "Vibrator on THE_DEVICE", " error");
}

bool HwApi::do_off() {
    LOG(INFO) << "HW_API: do_off";
    if (useForceFeedback) return triggerForceFeedbackVibration(false);
    return writeNode(useLedsClass ? LEDS_ACTIVATE : TIMED_OUTPUT_ENABLE, 0);
}

bool HwApi::sendAmplitude(int amplitude) {
    return useForceFeedback ? setForceFeedbackAmplitude(amplitude)
                            : writeNode(THE_DEVICE_INTENSITY, amplitude);
}

bool HwApi::setAmplitude(int amplitude) {
    LOG(INFO) << "HW_API: setAmplitude : INTENSITY " << amplitude;
    if (!isDriverAmplitude(kHardwareLog, "setAmplitude", amplitude)) return false;
    return checked(sendAmplitude(amplitude), kHardwareLog,
                   "setAmplitude : ", useForceFeedback ? "FF INTENSITY error" : "INTENSITY error");
}

bool HwApi::isVibrating() {
    const bool vibrating = readNode(useLedsClass ? LEDS_DURATION : TIMED_OUTPUT_ENABLE) >= 1;
    LOG(INFO) << "HW_API: isVibrating : " << (vibrating ? "true" : "false");
    return vibrating;
}

bool HwApi::checkClientUID(int uid) {
    constexpr int kRoot = 0;
    constexpr int kSystem = 1000;
    return uid == kSystem || uid == kRoot;
}

}  // namespace aidl::android::hardware::vibrator
