// SPDX-License-Identifier: Apache-2.0
//
// Counts what the calling thread takes from the heap and gives back, whichever function it uses
// (the thread sanitizer does not tell of blocks of a wanted alignment):
//
//     const AllocationCounter counter;
//     ... call the code under test ...
//     EXPECT_EQ(counter.taken(), 0U);
#pragma once

#include <cstddef>

class AllocationCounter {
  public:
    // Counting begins. One at a time in a thread.
    AllocationCounter();
    AllocationCounter(const AllocationCounter&) = delete;
    AllocationCounter& operator=(const AllocationCounter&) = delete;

    // Blocks taken since then.
    size_t taken() const;

    // Blocks taken and not given back since then; negative when older ones were given back.
    ptrdiff_t held() const;

  private:
    const size_t mTaken;
    const size_t mGivenBack;
};
