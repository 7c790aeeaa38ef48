// SPDX-License-Identifier: Apache-2.0
//
// A service that stands in for the vibrator's, to show what the client makes of answers that the
// real one seldom gives.
#pragma once

namespace fake {

// Registers the standard interface with the extension attached, in this process. What it does is
// told by the argument it is called with:
//
//     on(N)                    N = 1: an exception with a message; 2: service-specific error 7;
//                              3: the process dies before it answers; 4: it never answers; else ok
//     off()                    ok
//     perform(effect, ...)     calls back at once; the result is the caller's uid
//     compose(effects)         calls back after the first entry's delay; never when that is 0; the
//                              process dies 200 ms later when it is 1000
//     composePwle(segments)    calls back after the first segment, which is a brake
//     setAmplitude(amplitude)  ok for nan only, else EX_ILLEGAL_ARGUMENT
//     getCompositionSizeMax()  how often off() was called
//     dump()                   writes 100000 times "x"
//
// of the extension: setAmplitude(amplitude) is ok for -1 only, else EX_ILLEGAL_ARGUMENT;
// hasFeature(name) is true for "--json" only. Everything else is STATUS_UNKNOWN_TRANSACTION.
void registerServices();

}  // namespace fake
