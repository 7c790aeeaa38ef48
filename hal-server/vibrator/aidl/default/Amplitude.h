// SPDX-License-Identifier: Apache-2.0
//
// Amplitudes of the interface, 0.0 to 1.0, as the driver counts them.
#pragma once

#include <cstdint>

namespace aidl::android::hardware::vibrator {

// `amplitude` (0.0 to 1.0, or not a number) times `full`, in single precision, truncated. Not a
// number becomes 0, where the language leaves the conversion open.
constexpr int32_t toDriverAmplitude(float amplitude, float full) {
    const float scaled = amplitude * full;
    return scaled >= 1.0F ? static_cast<int32_t>(scaled) : 0;
}

}  // namespace aidl::android::hardware::vibrator
