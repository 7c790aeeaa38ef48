// SPDX-License-Identifier: Apache-2.0
//
// What the binder library says to the driver, overheard: in the program that this is linked into,
// ioctl is one that can listen before it does what the C library's does.
#pragma once

#include <linux/android/binder.h>

#include <cstddef>
#include <cstdint>
#include <functional>
#include <vector>

namespace bench {

// A request as it was sent, and the size of its answer.
struct Overheard {
    std::vector<uint8_t> request;
    std::vector<binder_size_t> offsets;  // of the objects in it
    size_t replySize = 0;
};

// The last request that `call` makes.
Overheard overhear(const std::function<void()>& call);

}  // namespace bench
