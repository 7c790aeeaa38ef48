// SPDX-License-Identifier: Apache-2.0
//
// A process that has reached its limit of threads: the test program's own pthread_create stands
// before the C library's.
#pragma once

#include <cstddef>

namespace fake {

// While it exists every pthread_create fails with EAGAIN. One at a time.
class RefusedThreads {
  public:
    RefusedThreads();
    ~RefusedThreads();
    RefusedThreads(const RefusedThreads&) = delete;
    RefusedThreads& operator=(const RefusedThreads&) = delete;

    // How many threads were asked for since this object was made.
    size_t count() const;
};

}  // namespace fake
