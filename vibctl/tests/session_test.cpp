// SPDX-License-Identifier: Apache-2.0
#include "vibctl/session.h"

#include <gtest/gtest.h>

namespace vibctl {
namespace {

std::string problemOf(const std::string& text) {
    CommandLine line;
    const Problem problem = parseSessionLine(text, line);
    EXPECT_TRUE(line.json) << text;
    return problem.value_or("no problem");
}

TEST(SessionLine, IsACommandLineInJson) {
    CommandLine line;
    EXPECT_FALSE(
            parseSessionLine(R"(["std","compose","0,CLICK,1","--callback","--wait","2"])", line));
    EXPECT_EQ(line.command, "std");
    EXPECT_EQ(line.method, "compose");
    EXPECT_EQ(line.arguments, std::vector<std::string>{"0,CLICK,1"});
    EXPECT_TRUE(line.callback);
    EXPECT_EQ(line.wait, std::chrono::seconds(2));
}

TEST(SessionLine, ThatIsNoneIsToldWhatIsAccepted) {
    constexpr const char* kAccepted = R"(session: a list such as ["std","on","500"] is accepted)";
    EXPECT_EQ(problemOf("[\"std\""),
              std::string(kAccepted) + "; line 1: Missing ',' or ']' in array declaration");
    EXPECT_EQ(problemOf("{\"method\": \"off\"}"), kAccepted);
    EXPECT_EQ(problemOf("[\"std\",\"on\",500]"), kAccepted);
    EXPECT_EQ(problemOf("[]"), "session: a call begins with std or ext, not \"\"");
    EXPECT_EQ(problemOf(R"(["doctor"])"), "session: a call begins with std or ext, not \"doctor\"");
    for (const char* text : {R"(["std","on","--help"])", R"(["std","help"])",
                             R"(["std","off","--off-on-interrupt"])"}) {
        EXPECT_EQ(problemOf(text),
                  "session: of the options --callback, --wait and --timeout are accepted")
                << text;
    }
    EXPECT_EQ(problemOf(R"(["std","off","--bogus"])").substr(0, 24), "unknown option \"--bogus\"");
}

}  // namespace
}  // namespace vibctl
