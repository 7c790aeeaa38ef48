// SPDX-License-Identifier: Apache-2.0
//
// An uploaded effect as a journal line.
#pragma once

#include <linux/input.h>

#include <cstdint>
#include <string_view>

#include "handset/driver/journal.h"

namespace handset {

// The line for an upload: the id the client gave, what it got (an id or a negative error), and
// the record field by field, numbers as the kernel has them. `custom` are the bytes of a custom
// waveform, in memory order.
JournalFields uploadLine(const ff_effect& effect, std::string_view custom, int64_t result);

}  // namespace handset
