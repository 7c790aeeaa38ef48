// SPDX-License-Identifier: Apache-2.0
//
// What is played: calls of the service at their times, whatever they were written as.
#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <vector>

#include "vibctl/arguments.h"
#include "vibctl/command_line.h"

namespace vibctl {

struct TimedCall {
    std::chrono::microseconds at{};  // from the start
    std::string iface;               // "std" or "ext"
    std::vector<std::string> words;  // the method and its arguments
    std::optional<bool> callback{};  // whether to pass one; compositions get one unless told
    std::optional<unsigned> uid{};   // the user who makes it, unless whoever plays
};

// The call as it would be written on a command line; a composition has a callback unless told.
CommandLine commandLineOf(const TimedCall& timed);

struct Plan {
    std::vector<TimedCall> calls;    // in the order of their times
    std::vector<std::string> notes;  // a line for each event: what became of it, what was lost
};

// What the service in front of us can do with a design.
struct Offers {
    bool amplitude = false;     // std setAmplitude
    bool compositions = false;  // std compose
    bool packets = false;       // ext performHapticEngine
};

// The steps of a pattern, in milliseconds, first a pause: pause, vibration, pause, ... With
// amplitudes, one for each step, a step vibrates where that is above 0. Played `repeat` times.
struct Pattern {
    std::vector<std::string> durations;
    std::string amplitudes;  // "0,1,0,0.5"; empty when not given
    int repeat = 1;
};

// Each of these says what is wrong, with its line and key, and then `plan` is not to be played.

Problem planPattern(const Pattern& pattern, const Offers& offers, Plan& plan);

// A sequence: on each line an object like
//
//     {"at": 120.5, "iface": "std", "method": "on", "args": [100]}
//
// with `at` in milliseconds from the start, never before the line above. `iface` is "std" when it is
// missing; `args` are strings, numbers and booleans; `callback`, a boolean, and `uid` are those of
// TimedCall. Empty lines count for nothing.
Problem planSequence(const std::string& text, Plan& plan);

// An AHAP document: transient and continuous events with intensity and sharpness, parameters and
// parameter curves of the intensity. Becomes packets where those are offered, else one or more
// compositions when all events are transient, else steps of amplitude and duration.
Problem planAhap(const std::string& text, const Offers& offers, Plan& plan);

// True when the text is one document with a "Pattern", rather than a sequence.
bool isAhap(const std::string& text);

}  // namespace vibctl
