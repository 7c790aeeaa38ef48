// SPDX-License-Identifier: Apache-2.0
//
// What an init script says about starting a service again.
#include "handset/phone/init_script.h"

#include <gtest/gtest.h>

namespace handset {
namespace {

TEST(InitScript, SaysWhenToStartAgain) {
    const auto script = parseInitScript(
            "# a comment\nservice vendor.vibrator /vendor/bin/vibrator\n    class hal\n"
            "    restart_period 7\n");
    ASSERT_TRUE(script);
    EXPECT_EQ(script->name, "vendor.vibrator");
    EXPECT_EQ(script->serviceClass, "hal");
    EXPECT_EQ(script->period.count(), 7);
    EXPECT_FALSE(script->oneshot);
}

TEST(InitScript, FiveSecondsPassWhereItDoesNotSay) {
    const auto script = parseInitScript("service a /b\n    oneshot\n");
    ASSERT_TRUE(script);
    EXPECT_EQ(script->period.count(), 5);
    EXPECT_TRUE(script->oneshot);
}

TEST(InitScript, WhatItCannotMeanIsRefused) {
    EXPECT_EQ(parseInitScript("service a /b\n    restart_period soon\n").error().message(),
              "restart_period: seconds from 1 on expected, not \"soon\"");
    EXPECT_EQ(parseInitScript("class hal\n").error().message(), "no service in the init script");
}

}  // namespace
}  // namespace handset
