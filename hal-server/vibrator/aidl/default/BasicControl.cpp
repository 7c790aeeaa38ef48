// SPDX-License-Identifier: Apache-2.0
//
// Basic vibration control: on, off, amplitude, whether the motor runs, and who may ask.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <android-base/logging.h>

#include "Amplitude.h"
#include "Constants.h"
#include "HwApi.h"

namespace aidl::android::hardware::vibrator {

bool HwApi::do_on(int timeoutMs) {
    LOG(INFO) << "HW_API: do_on for timeoutMs: " << timeoutMs;
    if (useForceFeedback) {
        return setForceFeedbackDuration(timeoutMs) && triggerForceFeedbackVibration(true);
    }
    if (useLedsClass) {
        // The kernel's transient trigger: the state to hold, for how long, and go.
        if (!writeNode(LEDS_STATE, 1)) {
            LOG(INFO) << "HW_API: Vibrator on THE_DEVICE_STATE error";
            return false;
        }
        if (!writeNode(LEDS_DURATION, timeoutMs)) {
            LOG(INFO) << "HW_API: Vibrator on THE_DEVICE_DURATION error";
            return false;
        }
        if (!writeNode(LEDS_ACTIVATE, 1)) {
            LOG(INFO) << "HW_API: Vibrator on THE_DEVICE_ACTIVATE error";
            return false;
        }
        return true;
    }
    if (!writeNode(TIMED_OUTPUT_ENABLE, timeoutMs)) {
        LOG(INFO) << "HW_API: Vibrator on THE_DEVICE error";
        return false;
    }
    return true;
}

bool HwApi::do_off() {
    LOG(INFO) << "HW_API: do_off";
    if (useForceFeedback) return triggerForceFeedbackVibration(false);
    return writeNode(useLedsClass ? LEDS_ACTIVATE : TIMED_OUTPUT_ENABLE, 0);
}

bool HwApi::setAmplitude(int amplitude) {
    LOG(INFO) << "HW_API: setAmplitude : INTENSITY " << amplitude;
    if (!isDriverAmplitude(amplitude)) {
        LOG(INFO) << "HW_API: setAmplitude amplitude is abnormal " << amplitude;
        return false;
    }
    if (useForceFeedback) {
        if (!setForceFeedbackAmplitude(amplitude)) {
            LOG(INFO) << "HW_API: setAmplitude : FF INTENSITY error";
            return false;
        }
        return true;
    }
    if (!writeNode(THE_DEVICE_INTENSITY, amplitude)) {
        LOG(INFO) << "HW_API: setAmplitude : INTENSITY error";
        return false;
    }
    return true;
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
