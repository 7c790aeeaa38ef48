// SPDX-License-Identifier: Apache-2.0
//
// Which reads of a node go through one showing of its text.
#include "handset/driver/read_session.h"

#include <gtest/gtest.h>

namespace handset {
namespace {

// A node whose text is another one each time it is shown: "first", "other", "third".
class ShownText : public testing::Test {
  protected:
    std::string read(size_t offset, size_t size) {
        static constexpr const char* kTexts[] = {"first", "other", "third"};
        return mShowing.read(offset, size, [this] { return kTexts[mShown++]; });
    }

    ReadSession mShowing;
    int mShown = 0;
};

TEST_F(ShownText, ReadsThatFollowEachOtherTakePiecesOfOne) {
    EXPECT_EQ(read(0, 2), "fi");
    EXPECT_EQ(read(2, 2), "rs");
    EXPECT_EQ(read(4, 9), "t");
    EXPECT_EQ(read(5, 9), "");
    EXPECT_EQ(mShown, 1);
}

TEST_F(ShownText, TheBeginningIsShownAnew) {
    EXPECT_EQ(read(0, 9), "first");
    EXPECT_EQ(read(0, 9), "other");
}

TEST_F(ShownText, AnotherPlaceIsShownAnew) {
    EXPECT_EQ(read(0, 2), "fi");
    EXPECT_EQ(read(3, 9), "er");
    EXPECT_EQ(read(1, 1), "h");
    EXPECT_EQ(read(2, 1), "i");
}

TEST_F(ShownText, AFirstReadPastTheBeginningShowsToo) {
    EXPECT_EQ(read(3, 9), "st");
}

TEST_F(ShownText, PastTheEndThereIsNothing) {
    EXPECT_EQ(read(5, 9), "");
    EXPECT_EQ(read(100, 9), "");
}

}  // namespace
}  // namespace handset
