// SPDX-License-Identifier: Apache-2.0
//
// The allocation counter sees every way to the heap.
#include "tests/allocation_counter.h"

#include <cstdlib>
#include <memory>
#include <string>
#include <thread>

#include <gtest/gtest.h>

namespace {

// Keeps the compiler from leaving out a block that is not used.
void use(void* block) {
    asm volatile("" : : "r"(block) : "memory");
}

TEST(AllocationCounter, StartsAtNothing) {
    const AllocationCounter counter;
    EXPECT_EQ(counter.taken(), 0U);
    EXPECT_EQ(counter.held(), 0);
}

TEST(AllocationCounter, SeesNewAndDelete) {
    const AllocationCounter counter;
    auto number = std::make_unique<int>(1);
    use(number.get());
    EXPECT_EQ(counter.taken(), 1U);
    EXPECT_EQ(counter.held(), 1);
    number.reset();
    EXPECT_EQ(counter.taken(), 1U);
    EXPECT_EQ(counter.held(), 0);
}

TEST(AllocationCounter, SeesTheCLibrarysFunctions) {
    const AllocationCounter counter;
    void* blocks[] = {malloc(1), calloc(1, 1), realloc(nullptr, 1)};
    EXPECT_EQ(counter.taken(), 3U);
    for (void*& block : blocks) {
        use(block);
        free(block);
    }
    EXPECT_EQ(counter.held(), 0);
}

TEST(AllocationCounter, SeesNothingOfOtherThreads) {
    const AllocationCounter counter;
    std::thread thread([] { use(std::make_unique<int>(1).get()); });
    const size_t before = counter.taken();  // the thread's own start
    thread.join();
    EXPECT_EQ(counter.taken(), before);
}

}  // namespace
