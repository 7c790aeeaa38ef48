// SPDX-License-Identifier: Apache-2.0
//
// The text of open flags.
#include "handset/driver/open_flags.h"

#include <fcntl.h>

#include <gtest/gtest.h>

namespace handset {
namespace {

TEST(OpenFlags, AccessModesStandFirst) {
    EXPECT_EQ(openFlagsText(O_RDONLY), "O_RDONLY");
    EXPECT_EQ(openFlagsText(O_WRONLY), "O_WRONLY");
    EXPECT_EQ(openFlagsText(O_RDWR), "O_RDWR");
}

TEST(OpenFlags, FurtherFlagsStandInAFixedOrder) {
    EXPECT_EQ(openFlagsText(O_TRUNC | O_WRONLY), "O_WRONLY|O_TRUNC");
    EXPECT_EQ(openFlagsText(O_NONBLOCK | O_APPEND | O_TRUNC | O_RDWR),
              "O_RDWR|O_TRUNC|O_APPEND|O_NONBLOCK");
    EXPECT_EQ(openFlagsText(O_CREAT | O_WRONLY | O_EXCL), "O_WRONLY|O_CREAT|O_EXCL");
}

TEST(OpenFlags, SynchronousIsNotNamedTwice) {
    EXPECT_EQ(openFlagsText(O_WRONLY | O_SYNC), "O_WRONLY|O_SYNC");
    EXPECT_EQ(openFlagsText(O_WRONLY | O_DSYNC), "O_WRONLY|O_DSYNC");
}

TEST(OpenFlags, TheKernelsOwnBitsAreLeftOut) {
#if defined(__aarch64__)
    constexpr int kLargeFile = 0400000;
#else
    constexpr int kLargeFile = 0100000;
#endif
    constexpr int kExecuted = 0x20;  // FMODE_EXEC
    EXPECT_EQ(openFlagsText(O_RDWR | kLargeFile | kExecuted), "O_RDWR");
}

}  // namespace
}  // namespace handset
