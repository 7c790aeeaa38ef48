// SPDX-License-Identifier: Apache-2.0
#include "vibctl/call_record.h"

#include <gtest/gtest.h>

namespace vibctl {
namespace {

TEST(CallRecord, HasTheCallAsItWasAskedForAndItsAnswer) {
    CommandLine line;
    line.command = "std";
    line.method = "on";
    line.arguments = {"500"};
    line.callback = true;
    Outcome outcome;
    outcome.sentMicroseconds = 8122500;
    outcome.microseconds = 1412;
    EXPECT_EQ(recordLine(line, "on", outcome, 230, 1000),
              R"({"us":8122500,"pid":230,"uid":1000,"call":["std","on","500","--callback"],)"
              R"("answer":{"iface":"std","method":"on","exception":0,"status":0,"message":"",)"
              R"("result":null,"callback":null,"us":1412,"name":"EX_NONE","text":"ok"}})");
}

}  // namespace
}  // namespace vibctl
