// SPDX-License-Identifier: Apache-2.0
//
// Options, and where the arguments begin.
#include "vibctl/command_line.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace vibctl {
namespace {

using std::chrono::milliseconds;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

using WordList = std::vector<std::string>;

CommandLine lineOf(const WordList& words) {
    CommandLine line;
    const Problem problem = parseCommandLine(words, line);
    EXPECT_FALSE(problem) << *problem;
    return line;
}

std::string problemWith(const WordList& words) {
    CommandLine line;
    return parseCommandLine(words, line).value_or("no problem");
}

TEST(CommandLine, FindsCommandMethodAndArguments) {
    const CommandLine line = lineOf({"std", "perform", "CLICK", "STRONG"});
    EXPECT_EQ(line.command, "std");
    EXPECT_EQ(line.method, "perform");
    EXPECT_THAT(line.arguments, ElementsAre("CLICK", "STRONG"));
    EXPECT_FALSE(line.json || line.callback || line.help || line.version);
    EXPECT_EQ(line.wait, milliseconds(5000));
    EXPECT_EQ(line.timeout, milliseconds(5000));
}

TEST(CommandLine, MayBeEmpty) {
    const CommandLine line = lineOf({});
    EXPECT_EQ(line.command, "");
    EXPECT_EQ(line.method, "");
    EXPECT_THAT(line.arguments, IsEmpty());
}

TEST(CommandLine, NegativeNumbersAreArguments) {
    EXPECT_THAT(lineOf({"ext", "setAmplitude", "-1"}).arguments, ElementsAre("-1"));
    EXPECT_THAT(lineOf({"std", "perform", "-1", "0"}).arguments, ElementsAre("-1", "0"));
    EXPECT_THAT(lineOf({"std", "setAmplitude", "-inf"}).arguments, ElementsAre("-inf"));
    EXPECT_THAT(lineOf({"std", "compose", "-5,CLICK,1"}).arguments, ElementsAre("-5,CLICK,1"));
}

TEST(CommandLine, OptionsMayStandAnywhere) {
    for (const WordList& words : {WordList{"--json", "--wait", "2", "std", "on", "5"},
                                  WordList{"std", "--json", "--wait", "2", "on", "5"},
                                  WordList{"std", "on", "--json", "--wait", "2", "5"},
                                  WordList{"std", "on", "5", "--wait=2", "--json"}}) {
        const CommandLine line = lineOf(words);
        EXPECT_TRUE(line.json);
        EXPECT_EQ(line.wait, milliseconds(2000));
        EXPECT_EQ(line.command, "std");
        EXPECT_EQ(line.method, "on");
        EXPECT_THAT(line.arguments, ElementsAre("5"));
    }
}

TEST(CommandLine, CallbackMayStandAnywhereAfterTheMethod) {
    for (const WordList& words :
         {WordList{"std", "compose", "--callback", "0,CLICK,1", "5,TICK,1"},
          WordList{"std", "compose", "0,CLICK,1", "--callback", "5,TICK,1"},
          WordList{"std", "compose", "0,CLICK,1", "5,TICK,1", "--callback"}}) {
        const CommandLine line = lineOf(words);
        EXPECT_TRUE(line.callback);
        EXPECT_THAT(line.arguments, ElementsAre("0,CLICK,1", "5,TICK,1"));
    }
}

TEST(CommandLine, TwoDashesAloneEndTheOptions) {
    const CommandLine line = lineOf({"ext", "hasFeature", "--", "--json"});
    EXPECT_FALSE(line.json);
    EXPECT_THAT(line.arguments, ElementsAre("--json"));
    EXPECT_THAT(lineOf({"ext", "hasFeature", "--", "--"}).arguments, ElementsAre("--"));
}

TEST(CommandLine, WaitIsAFractionOfADayAtMost) {
    EXPECT_EQ(lineOf({"--wait", "0.25", "std"}).wait, milliseconds(250));
    EXPECT_EQ(lineOf({"--wait", "0", "std"}).wait, milliseconds(0));
    EXPECT_EQ(lineOf({"--wait", "86400", "std"}).wait, milliseconds(86400000));
}

TEST(CommandLine, RefusesAnotherWait) {
    EXPECT_EQ(problemWith({"--wait", "soon", "list"}),
              "--wait \"soon\" is not a number of seconds from 0 to 86400");
    EXPECT_EQ(problemWith({"--wait=-1", "list"}),
              "--wait \"-1\" is not a number of seconds from 0 to 86400");
    EXPECT_EQ(problemWith({"--wait", "nan"}),
              "--wait \"nan\" is not a number of seconds from 0 to 86400");
    EXPECT_EQ(problemWith({"--wait", "86401"}),
              "--wait \"86401\" is not a number of seconds from 0 to 86400");
    EXPECT_EQ(problemWith({"list", "--wait"}), "--wait needs its SECONDS");
}

TEST(CommandLine, RefusesUnknownOptions) {
    EXPECT_EQ(problemWith({"--jsn", "std", "off"}),
              "unknown option \"--jsn\"; there are --json, --timeout SECONDS, --wait SECONDS, "
              "--callback, --off-on-interrupt, --amplitudes A,..., --repeat COUNT, --explain, "
              "--help, --version");
    EXPECT_NE(problemWith({"std", "on", "--500"}), "no problem");
    EXPECT_NE(problemWith({"--json=1", "list"}), "no problem");
}

TEST(CommandLine, OptionsGoOnlyWithCommandsThatTakeThem) {
    EXPECT_EQ(problemWith({"list", "--wait", "2"}), "list takes no --wait, unlike std, ext");
    EXPECT_EQ(problemWith({"doctor", "--off-on-interrupt"}),
              "doctor takes no --off-on-interrupt, unlike std, ext");
    EXPECT_EQ(lineOf({"--timeout=0.5", "list"}).timeout, milliseconds(500));
    EXPECT_TRUE(lineOf({"std", "--off-on-interrupt", "off"}).offOnInterrupt);
}

TEST(CommandLine, WithAProblemStillTellsWhatWasUnderstood) {
    CommandLine line;
    const WordList words = {"--bogus", "std", "on", "--json", "--wait=soon"};
    EXPECT_TRUE(parseCommandLine(words, line).has_value());
    EXPECT_TRUE(line.json);
    EXPECT_EQ(line.command, "std");
    EXPECT_EQ(line.method, "on");
}

TEST(CommandLine, HelpHasThreeSpellings) {
    EXPECT_EQ(lineOf({"help"}).command, "help");
    EXPECT_EQ(lineOf({"-h"}).command, "help");
    EXPECT_TRUE(lineOf({"--help"}).help);
}

}  // namespace
}  // namespace vibctl
