// SPDX-License-Identifier: Apache-2.0
//
// Which uids are apps and which are isolated.
#include "platform/servicemanager/caller.h"

#include <gtest/gtest.h>

namespace servicemanager {
namespace {

TEST(CallerUid, SystemPartsAreNotApps) {
    EXPECT_FALSE(isApp(0));
    EXPECT_FALSE(isApp(1000));
    EXPECT_FALSE(isApp(2000));
    EXPECT_FALSE(isApp(9999));
}

TEST(CallerUid, AppsBeginAtTenThousand) {
    EXPECT_TRUE(isApp(10000));
    EXPECT_TRUE(isApp(10123));
    EXPECT_TRUE(isApp(99999));
}

TEST(CallerUid, NobodyCountsAsAnApp) {
    EXPECT_TRUE(isApp(65534));
}

TEST(CallerUid, TheAndroidUserDoesNotMatter) {
    EXPECT_FALSE(isApp(100000));
    EXPECT_FALSE(isApp(1001000));
    EXPECT_TRUE(isApp(110000));
    EXPECT_TRUE(isApp(1010123));
}

TEST(CallerUid, IsolatedProcessesAreTheLastTenThousandOfEachUser) {
    EXPECT_FALSE(isIsolated(0));
    EXPECT_FALSE(isIsolated(89999));
    EXPECT_TRUE(isIsolated(90000));
    EXPECT_TRUE(isIsolated(99999));
    EXPECT_FALSE(isIsolated(100000));
    EXPECT_TRUE(isIsolated(190000));
}

}  // namespace
}  // namespace servicemanager
