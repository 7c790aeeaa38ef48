// SPDX-License-Identifier: Apache-2.0
// A fault on the command line.
#include "phone/fault_words.h"

#include <gtest/gtest.h>

namespace handset {
namespace {

TEST(FaultWords, WordsBecomeAnObject) {
    const Result<std::string> fault = faultFromWords(
            {"node=/sys/class/leds/vibrator/state", "op=write", "errno=EIO", "times=1"});
    ASSERT_TRUE(fault);
    EXPECT_EQ(*fault,
              R"({"errno":"EIO","node":"/sys/class/leds/vibrator/state","op":"write","times":1})");
}

TEST(FaultWords, TruthValuesAreNoTexts) {
    const Result<std::string> fault = faultFromWords({"node=motor", "op=upload", "unplug=true"});
    ASSERT_TRUE(fault);
    EXPECT_EQ(*fault, R"({"node":"motor","op":"upload","unplug":true})");
}

TEST(FaultWords, AnObjectIsPassedOn) {
    const Result<std::string> fault = faultFromWords({"{\"node\": \"motor\",\n \"op\": \"open\"}"});
    ASSERT_TRUE(fault);
    EXPECT_EQ(*fault, R"({"node": "motor",  "op": "open"})");
}

TEST(FaultWords, OtherWordsAreRefused) {
    EXPECT_EQ(faultFromWords({"EIO"}).error().text,
              "\"EIO\": a JSON object, or words like node=PATH op=write errno=EIO times=1, "
              "expected");
    EXPECT_EQ(faultFromWords({"=EIO"}).error().text,
              "\"=EIO\": a JSON object, or words like node=PATH op=write errno=EIO times=1, "
              "expected");
    EXPECT_EQ(faultFromWords({"op=read", "op=write"}).error().text, "\"op\" is given twice");
}

}  // namespace
}  // namespace handset
