// SPDX-License-Identifier: Apache-2.0
//
// A fault on the command line.
#include "handset/phone/fault_arguments.h"

#include <gtest/gtest.h>

namespace handset {
namespace {

using android::base::Result;

TEST(FaultArguments, WordsBecomeAnObject) {
    const Result<std::string> fault = faultFromArguments(
            {"node=/sys/class/leds/vibrator/state", "op=write", "errno=EIO", "times=1"});
    ASSERT_TRUE(fault);
    EXPECT_EQ(*fault,
              R"({"errno":"EIO","node":"/sys/class/leds/vibrator/state","op":"write","times":1})");
}

TEST(FaultArguments, TruthValuesAreNoTexts) {
    const Result<std::string> fault =
            faultFromArguments({"node=motor", "op=upload", "unplug=true"});
    ASSERT_TRUE(fault);
    EXPECT_EQ(*fault, R"({"node":"motor","op":"upload","unplug":true})");
}

TEST(FaultArguments, NegativeNumbersAreNumbers) {
    EXPECT_EQ(*faultFromArguments({"short=-1", "errno=-"}), R"({"errno":"-","short":-1})");
}

TEST(FaultArguments, AnObjectIsPassedOn) {
    const Result<std::string> fault =
            faultFromArguments({"{\"node\": \"motor\",\n \"op\": \"open\"}"});
    ASSERT_TRUE(fault);
    EXPECT_EQ(*fault, R"({"node": "motor",  "op": "open"})");
}

TEST(FaultArguments, OtherWordsAreRefused) {
    EXPECT_EQ(faultFromArguments({"EIO"}).error().message(),
              "\"EIO\": a JSON object, or words like node=PATH op=write errno=EIO times=1, "
              "expected");
    EXPECT_EQ(faultFromArguments({"=EIO"}).error().message(),
              "\"=EIO\": a JSON object, or words like node=PATH op=write errno=EIO times=1, "
              "expected");
    EXPECT_EQ(faultFromArguments({"op=read", "op=write"}).error().message(),
              "\"op\" is given twice");
}

}  // namespace
}  // namespace handset
