// SPDX-License-Identifier: Apache-2.0
//
// Permission bits.
#include "handset/driver/permission.h"

#include <fcntl.h>

#include <gtest/gtest.h>

namespace handset {
namespace {

constexpr Attributes kNodeAttributes{0664, 1000, 1000};
constexpr Attributes kReadOnlyNode{0444, 1000, 1000};
constexpr Attributes kWriteOnlyNode{0220, 1000, 1000};

TEST(Permission, AnOpenAsksForWhatItsModeSays) {
    EXPECT_EQ(wantedBy(O_RDONLY | O_NONBLOCK), kMayRead);
    EXPECT_EQ(wantedBy(O_WRONLY | O_TRUNC), kMayWrite);
    EXPECT_EQ(wantedBy(O_RDWR), kMayRead | kMayWrite);
}

TEST(Permission, TruncationNeedsWritingToo) {
    EXPECT_EQ(neededBy(O_RDONLY), kMayRead);
    EXPECT_EQ(neededBy(O_RDONLY | O_TRUNC), kMayRead | kMayWrite);
    EXPECT_EQ(neededBy(O_WRONLY | O_TRUNC), kMayWrite);
}

TEST(Permission, RootMayDoAnything) {
    EXPECT_TRUE(grants({0000, 1000, 1000}, {0, 0, {}}, kMayRead | kMayWrite));
}

TEST(Permission, TheOwnerHasTheOwnersBits) {
    EXPECT_TRUE(grants(kNodeAttributes, {1000, 1000, {}}, kMayRead | kMayWrite));
    EXPECT_TRUE(grants(kReadOnlyNode, {1000, 1000, {}}, kMayRead));
    EXPECT_FALSE(grants(kReadOnlyNode, {1000, 1000, {}}, kMayRead | kMayWrite));
    EXPECT_FALSE(grants(kWriteOnlyNode, {1000, 1000, {}}, kMayRead));
}

TEST(Permission, TheGroupHasTheGroupsBitsByEitherMembership) {
    EXPECT_TRUE(grants(kNodeAttributes, {2000, 1000, {}}, kMayWrite));
    EXPECT_TRUE(grants(kNodeAttributes, {2000, 2000, {5, 1000}}, kMayWrite));
    EXPECT_FALSE(grants(kNodeAttributes, {2000, 2000, {5, 1001}}, kMayWrite));
}

TEST(Permission, TheOwnersBitsComeBeforeTheGroups) {
    EXPECT_FALSE(grants({0060, 1000, 1000}, {1000, 1000, {1000}}, kMayRead));
}

TEST(Permission, OthersMayReadButNotWrite) {
    EXPECT_TRUE(grants(kNodeAttributes, {2000, 2000, {}}, kMayRead));
    EXPECT_FALSE(grants(kNodeAttributes, {2000, 2000, {}}, kMayWrite));
    EXPECT_FALSE(grants(kNodeAttributes, {2000, 2000, {}}, kMayRead | kMayWrite));
}

}  // namespace
}  // namespace handset
