// SPDX-License-Identifier: Apache-2.0
//
// What a daemon tells systemd about itself.
#pragma once

namespace servicemanager {

// Sends a state as sd_notify(3) lists them, "READY=1". Nothing happens where systemd, or whoever
// started this process, does not ask for it.
void notifySystemd(const char* state);

// True when a unit with WatchdogSec= wants "WATCHDOG=1" from time to time.
bool systemdWatches();

}  // namespace servicemanager
