// SPDX-License-Identifier: Apache-2.0
//
// The driver's pattern queue: 65534 goes to the pattern-index node, the queue text to the queue
// node, and a start of 1000 ms makes the driver play it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace aidl::android::hardware::vibrator {

// The pattern index that makes the driver play its queue.
inline constexpr int kQueueIndex = 0xFFFE;

// A pattern ends by itself; the motor only has to be started, for milliseconds that do not count.
inline constexpr int kPatternTriggerMs = 1000;

inline constexpr size_t kQueueEntrySize = 32;

// The text that repeats one pattern for ever, for example "5.100, 10, 0~" for pattern 5 at
// amplitude 10000. It lies in `buffer`, where a terminating zero byte follows it.
std::string_view formatQueueEntry(int32_t patternIndex, int32_t amplitude,
                                  char (&buffer)[kQueueEntrySize]);

}  // namespace aidl::android::hardware::vibrator
