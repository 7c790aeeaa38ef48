// SPDX-License-Identifier: Apache-2.0
//
// Keeping a caller waiting.
#pragma once

#include <atomic>
#include <chrono>

#include <fuse_lowlevel.h>

#include "handset/driver/fault.h"

namespace handset {

// Waits before a request is answered. False as soon as a signal interrupts the caller or
// `stopping` is set; the request then wants EINTR for an answer.
bool delayRequest(fuse_req_t request, std::chrono::milliseconds delay,
                  const std::atomic<bool>& stopping);

// Meets the fault that is due, if any: its error, or EINTR where its delay was cut short, or 0.
int meetFault(fuse_req_t request, const FaultAction& fault, const std::atomic<bool>& stopping);

}  // namespace handset
