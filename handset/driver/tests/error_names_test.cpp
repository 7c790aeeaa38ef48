// SPDX-License-Identifier: Apache-2.0
//
// Error names, both ways.
#include "handset/driver/error_names.h"

#include <cerrno>

#include <gtest/gtest.h>

namespace handset {
namespace {

TEST(ErrorNames, KnowsTheNumbersOfTheNames) {
    EXPECT_EQ(errorNumber("EIO"), 5);
    EXPECT_EQ(errorNumber("EINTR"), 4);
    EXPECT_EQ(errorNumber("EACCES"), 13);
    EXPECT_EQ(errorNumber("ENODEV"), 19);
    EXPECT_EQ(errorNumber("ENOSPC"), 28);
    EXPECT_EQ(errorNumber("EHWPOISON"), 133);
}

TEST(ErrorNames, KnowsSecondNames) {
    EXPECT_EQ(errorNumber("EWOULDBLOCK"), 11);
    EXPECT_EQ(errorNumber("EOPNOTSUPP"), 95);
    EXPECT_EQ(errorNumber("ENOTSUP"), 95);
}

TEST(ErrorNames, RefusesWhatIsNoName) {
    EXPECT_EQ(errorNumber(""), std::nullopt);
    EXPECT_EQ(errorNumber("eio"), std::nullopt);
    EXPECT_EQ(errorNumber("EIO "), std::nullopt);
    EXPECT_EQ(errorNumber("5"), std::nullopt);
    EXPECT_EQ(errorNumber("EFOO"), std::nullopt);
}

TEST(ErrorNames, NamesNumbers) {
    EXPECT_EQ(errorName(5), "EIO");
    EXPECT_EQ(errorName(4), "EINTR");
    EXPECT_EQ(errorName(11), "EAGAIN");
    EXPECT_EQ(errorName(777), "777");
}

}  // namespace
}  // namespace handset
