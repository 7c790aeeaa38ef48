// SPDX-License-Identifier: Apache-2.0
//
// A design as events over time, and what a phone can make of it.
#pragma once

#include <vector>

#include "vibctl/play/plan.h"

namespace vibctl {

// How long a transient event is felt, as long as the shortest primitives take.
constexpr double kTransientSeconds = 0.020;

struct HapticEvent {
    int line = 0;  // where it is written
    bool isTransient = false;
    double time = 0;  // in seconds, as is the duration
    double duration = 0;
    double intensity = 1;    // 0 to 1
    double sharpness = 0.5;  // 0 to 1
};

// A point of the line that all intensities are multiplied by. Between two points it is straight,
// but for a point that jumps: until then the one before it holds.
struct CurvePoint {
    double time = 0;
    double level = 1;
    bool jumps = false;
};

struct HapticDesign {
    std::vector<HapticEvent> events;  // in the order of their times
    std::vector<CurvePoint> curve;
};

// Adds the calls, and a note for each event.
void planDesign(const HapticDesign& design, const Offers& offers, Plan& plan);

}  // namespace vibctl
