// SPDX-License-Identifier: Apache-2.0
//
// The segment string of a piecewise-linear composition: a header, then one group of fields for each
// segment. A 100 ms ramp that stays at half amplitude and 150 Hz reads
//
//   S:0,WF:4,RP:0,WT:0,T0:0,L0:0.5,F0:150,C0:1,B0:0,AR0:0,V0:0,T1:100,L1:0.5,F1:150,C1:1,...
//
// that is, a lead-in of 0 ms to where the ramp starts, and the ramp itself. Floats have six
// significant digits.
#pragma once

#include <cstdint>
#include <optional>
#include <ostream>
#include <string>
#include <vector>

#include <aidl/android/hardware/vibrator/Braking.h>
#include <aidl/android/hardware/vibrator/PrimitivePwle.h>

namespace aidl::android::hardware::vibrator {

// Each appends fields of the segment with that number.
void constructActiveDefaults(std::ostream& text, const int& segment);
void constructActiveSegment(std::ostream& text, const int& segment, int duration, float amplitude,
                            float frequency);
void constructBrakingSegment(std::ostream& text, const int& segment, int duration, Braking braking);

struct PwleSequence {
    std::string text;
    // Sum of the durations. Negative when those are: nothing refuses a negative duration, and 64
    // bits hold the sum of any list.
    int64_t totalMs;
};

// Empty when an entry is out of range: amplitudes 0.0 to 0.98256, frequencies 140.0 to 160.0 Hz,
// durations below 16384 ms, braking below 2. An entry of a kind that is not known is left out.
std::optional<PwleSequence> buildPwleSequence(const std::vector<PrimitivePwle>& composite);

}  // namespace aidl::android::hardware::vibrator
