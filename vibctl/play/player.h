// SPDX-License-Identifier: Apache-2.0
//
// Playing a plan: every call at its time, in this process.
#pragma once

#include <chrono>
#include <functional>

#include "vibctl/command_line.h"
#include "vibctl/outcome.h"
#include "vibctl/play/plan.h"

namespace vibctl {

// Asks the service what it can do; `outcome` is that of the first question that did not get through.
Offers askOffers(const CommandLine& line, Outcome& outcome);

// Hears of each call: what it came to, and how many microseconds after its time it was made.
using OnCall = std::function<void(const TimedCall& call, const Outcome& outcome, int64_t late)>;

// When the calls at 0 are due; asked when everything is ready for them.
using Start = std::function<Clock::time_point()>;

// Makes the calls at absolute times. The outcome is that of the first call that failed, else of the
// last; one that does not get through ends the playing.
Outcome playPlan(const Plan& plan, const CommandLine& line, const Start& start,
                 const OnCall& onCall);

}  // namespace vibctl
