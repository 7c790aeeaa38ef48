// SPDX-License-Identifier: Apache-2.0
//
// Amplitudes as the driver counts them, from 1 to 10000, and those of the interface, 0.0 to 1.0.
#pragma once

#include <cstdint>

namespace aidl::android::hardware::vibrator {

// Whether the driver takes `amplitude`. 0 is not among them: the motor is switched off instead.
constexpr bool isDriverAmplitude(int32_t amplitude) {
    return amplitude >= 1 && amplitude <= 10000;
}

// `amplitude` (0.0 to 1.0, or not a number) times `full`, in single precision, truncated. Not a
// number becomes 0, where the language leaves the conversion open.
constexpr int32_t toDriverAmplitude(float amplitude, float full) {
    const float scaled = amplitude * full;
    return scaled >= 1.0F ? static_cast<int32_t>(scaled) : 0;
}

}  // namespace aidl::android::hardware::vibrator
