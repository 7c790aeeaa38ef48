// SPDX-License-Identifier: Apache-2.0
//
// The process-wide paths that probing sets.
#pragma once

#include <string>

#include "HwApi.h"

namespace aidl::android::hardware::vibrator {

inline const std::string* const kNodePaths[] = {
        &THE_DEVICE_FF,
        &THE_DEVICE_INTENSITY,
        &THE_DEVICE_FORCE_TOUCH_INTENSITY,
        &THE_DEVICE_MULTI_FREQ,
        &THE_DEVICE_HAPTIC_ENGINE,
        &THE_DEVICE_HAPTIC_ENGINE_INDEX,
        &THE_DEVICE_HAPTIC_PLAYBACK_QUEUE,
        &THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES,
        &THE_DEVICE_MOTOR_TYPE,
        &THE_DEVICE_EVENT_CMD,
        &THE_DEVICE_PATTERN_LENGTH,
        &THE_DEVICE_EXT_CONTROL,
        &THE_DEVICE_CAL_INTENSITIES,
        &THE_DEVICE_CAL_HAPTIC_INTENSITIES,
        &THE_DEVICE_FIFO_HAPTIC_ENGINE,
        &THE_DEVICE_HYBRID_HAPTIC_ENGINE,
        &THE_DEVICE_ASP_ENABLE,
        &THE_DEVICE_GPIO1_FALL_INDEX,
        &THE_DEVICE_GPIO1_FALL_DIG_SCALE,
        &THE_DEVICE_GPIO1_RISE_INDEX,
        &THE_DEVICE_GPIO1_RISE_DIG_SCALE,
        &THE_DEVICE_VIB_STATE,
};

}  // namespace aidl::android::hardware::vibrator
