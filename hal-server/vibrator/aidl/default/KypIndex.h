// SPDX-License-Identifier: Apache-2.0
//
// Wavetable numbers on a driver that was switched to the platform's numbering.
#pragma once

#include <cstdint>

namespace aidl::android::hardware::vibrator {

// The number that the entry `index` of the plain wavetable has in the platform's numbering: 0 and
// 100 keep theirs, 119 to 124 move up by 16, all others by 9. Wraps at the ends of 32 bits.
constexpr int32_t toKypIndex(int32_t index) {
    if (index == 0 || index == 100) return index;
    const uint32_t offset = index >= 119 && index <= 124 ? 16 : 9;
    return static_cast<int32_t>(static_cast<uint32_t>(index) + offset);
}

}  // namespace aidl::android::hardware::vibrator
