// SPDX-License-Identifier: Apache-2.0
//
// The process's one force-feedback effect and what is sent along with it. Plain values without a
// lock: the driver plays one effect at a time, and callers that overlap overwrite each other.
#pragma once

#include <linux/input.h>

#include <cstdint>

namespace aidl::android::hardware::vibrator {

struct ForceFeedbackEffect {
    // Number of 16-bit values in indexPair, as the record's custom_len counts them.
    static constexpr uint32_t kIndexPairLength = 2;

    // <linux/input.h>, sent as it stands: FF_PERIODIC with the waveform FF_CUSTOM. Its id is -1
    // while the driver holds no effect of this process; custom_data points to indexPair except
    // while a composite waveform is uploaded.
    ff_effect record;
    // 0, and the index of a stored effect; index 0 is plain timed vibration.
    int16_t indexPair[kIndexPairLength];
    // The event to be written next; its type is always EV_FF and its time zero.
    input_event event;
};

extern ForceFeedbackEffect forceFeedbackEffect;

}  // namespace aidl::android::hardware::vibrator
