// SPDX-License-Identifier: Apache-2.0
//
// Keeping a caller waiting.
#pragma once

#include <atomic>
#include <chrono>

#include <fuse_lowlevel.h>

namespace handset {

// Waits before a request is answered. False as soon as a signal interrupts the caller or
// `stopping` is set; the request then wants EINTR for an answer.
bool delayRequest(fuse_req_t request, std::chrono::milliseconds delay,
                  const std::atomic<bool>& stopping);

}  // namespace handset
