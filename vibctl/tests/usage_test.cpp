// SPDX-License-Identifier: Apache-2.0
//
// The one line that each wrong command line gets.
#include "vibctl/usage.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "vibctl/find_method.h"

namespace vibctl {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::StartsWith;

using WordList = std::vector<std::string>;

// What is said about `words`, the first of which is the method.
std::string problemWith(const std::string& iface, const WordList& words, bool callback) {
    CommandLine line;
    line.command = iface;
    line.callback = callback;
    if (!words.empty()) {
        line.method = words[0];
        line.arguments.assign(words.begin() + 1, words.end());
    }
    const Method* method = nullptr;
    Call call;
    Problem problem = findMethod(line, method);
    if (!problem) problem = prepareCall(line, *method, call);
    return problem.value_or("no problem");
}

std::string withStandard(const WordList& words, bool callback = false) {
    return problemWith("std", words, callback);
}

std::string withExtension(const WordList& words, bool callback = false) {
    return problemWith("ext", words, callback);
}

TEST(UnknownMethod, GetsTheNamesNearIt) {
    EXPECT_EQ(withStandard({"preform"}), "std: unknown method \"preform\"; did you mean perform");
    EXPECT_EQ(withStandard({"Perform"}), "std: unknown method \"Perform\"; did you mean perform");
    EXPECT_EQ(withStandard({"setamplitude"}),
              "std: unknown method \"setamplitude\"; did you mean setAmplitude");
    EXPECT_EQ(withStandard({"getPwle"}),
              "std: unknown method \"getPwle\"; did you mean getPwlePrimitiveDurationMax, "
              "getPwleCompositionSizeMax");
    EXPECT_EQ(withExtension({"performHaptic"}),
              "ext: unknown method \"performHaptic\"; did you mean performHapticEngine");
}

TEST(UnknownMethod, FarFromAllGetsAllNames) {
    const std::string problem = withStandard({"vibrate"});
    EXPECT_THAT(problem, StartsWith("std: unknown method \"vibrate\"; there are getCapabilities, "
                                    "off, on, perform, getSupportedEffects, setAmplitude, "));
    EXPECT_THAT(problem, HasSubstr(", composePwle, getInterfaceVersion, getInterfaceHash"));
    EXPECT_THAT(problem, Not(HasSubstr("\n")));
}

TEST(UnknownMethod, WithoutAnyGetsAllNames) {
    EXPECT_THAT(withExtension({}),
                StartsWith("ext: no method given; there are supportsAmplitudeControl, "));
}

TEST(UnknownMethod, OfTheOtherInterfaceIsUnknownHere) {
    EXPECT_THAT(withStandard({"hasFeature"}), StartsWith("std: unknown method \"hasFeature\"; "));
    EXPECT_THAT(withExtension({"compose"}), StartsWith("ext: unknown method \"compose\"; "));
}

TEST(ArgumentCount, ThatIsWrongShowsTheUsage) {
    EXPECT_EQ(withStandard({"off", "1"}),
              "std off: takes 0 arguments, got 1; usage: vibctl std off");
    EXPECT_EQ(withStandard({"on"}),
              "std on: takes 1 argument, got 0; usage: vibctl std on TIMEOUT_MS [--callback]");
    EXPECT_EQ(withStandard({"perform", "CLICK"}),
              "std perform: takes 2 arguments, got 1; usage: vibctl std perform EFFECT STRENGTH "
              "[--callback]");
    EXPECT_EQ(withExtension({"performPlaybackEngine", "true"}),
              "ext performPlaybackEngine: takes at least 2 arguments, got 1; usage: vibctl ext "
              "performPlaybackEngine REPEAT REPEAT_COUNT PATTERN_INDEX,LEVEL,OPTION...");
    EXPECT_EQ(withExtension({"performHapticEngine"}),
              "ext performHapticEngine: takes at least 1 argument, got 0; usage: vibctl ext "
              "performHapticEngine AMPLITUDE TIME,INTENSITY,FREQUENCY,OVERDRIVE...");
}

TEST(BadArgument, IsNamedWithWhatIsAccepted) {
    EXPECT_EQ(withStandard({"on", "abc"}),
              "std on: TIMEOUT_MS \"abc\" is not an integer from -2147483648 to 2147483647; usage: "
              "vibctl std on TIMEOUT_MS [--callback]");
    EXPECT_EQ(withStandard({"perform", "CLICK", "hard"}),
              "std perform: STRENGTH \"hard\" is neither a number from -128 to 127 nor one of "
              "LIGHT, MEDIUM, STRONG; usage: vibctl std perform EFFECT STRENGTH [--callback]");
    EXPECT_EQ(
            withStandard({"setAmplitude", "half"}),
            "std setAmplitude: AMPLITUDE \"half\" is not a number a float can hold (nor nan, inf, "
            "-inf); usage: vibctl std setAmplitude AMPLITUDE");
    EXPECT_EQ(
            withStandard({"setExternalControl", "yes"}),
            "std setExternalControl: ENABLED \"yes\" is neither true nor false; usage: vibctl std "
            "setExternalControl ENABLED");
}

TEST(BadPacket, IsShownWithTheFieldThatIsWrong) {
    EXPECT_EQ(withStandard({"compose", "0,CLICK,1", "50,CLICK"}),
              "std compose: packet \"50,CLICK\": 2 fields where 3 are wanted: "
              "DELAY_MS,PRIMITIVE,SCALE; usage: vibctl std compose DELAY_MS,PRIMITIVE,SCALE... "
              "[--callback]");
    EXPECT_EQ(withStandard({"compose", "0,CLICK,much"}),
              "std compose: packet \"0,CLICK,much\": SCALE \"much\" is not a number a float can "
              "hold (nor nan, inf, -inf); usage: vibctl std compose DELAY_MS,PRIMITIVE,SCALE... "
              "[--callback]");
    EXPECT_EQ(withExtension({"performHapticEngine", "1", "7,x,0,0"}),
              "ext performHapticEngine: packet \"7,x,0,0\": INTENSITY \"x\" is not an integer from "
              "-2147483648 to 2147483647; usage: vibctl ext performHapticEngine AMPLITUDE "
              "TIME,INTENSITY,FREQUENCY,OVERDRIVE...");
    EXPECT_THAT(withExtension({"performHybridHapticEngine", "1", "1,2,3,4"}),
                HasSubstr("packet \"1,2,3,4\": 4 fields where 5 are wanted: "
                          "TIME,INTENSITY,TYPE,VALUE,FREQUENCY; "));
    EXPECT_THAT(withExtension({"performPlaybackEngine", "false", "0", ""}),
                HasSubstr("packet \"\": 1 field where 3 are wanted: PATTERN_INDEX,LEVEL,OPTION; "));
}

TEST(BadPwleSegment, IsShownWithWhatIsWrong) {
    EXPECT_THAT(withStandard({"composePwle", "pause,1"}),
                StartsWith("std composePwle: packet \"pause,1\": begins with neither active nor "
                           "brake; usage: "));
    EXPECT_THAT(withStandard({"composePwle", ""}), HasSubstr("begins with neither"));
    EXPECT_THAT(withStandard({"composePwle", "active"}),
                HasSubstr("packet \"active\": 0 fields where 5 are wanted: "
                          "START_AMPLITUDE,START_FREQUENCY,END_AMPLITUDE,END_FREQUENCY,"
                          "DURATION_MS; "));
    EXPECT_THAT(withStandard({"composePwle", "brake,HARD,5"}),
                HasSubstr("BRAKING \"HARD\" is neither a number from -2147483648 to 2147483647 nor "
                          "one of NONE, CLAB; "));
}

TEST(CallbackOption, GoesOnlyWithMethodsThatTakeOne) {
    EXPECT_EQ(withStandard({"off"}, true),
              "std off: takes no --callback, unlike on, perform, compose, composePwle; usage: "
              "vibctl std off");
    EXPECT_EQ(withExtension({"setAmplitude", "1"}, true),
              "ext setAmplitude: takes no --callback, unlike perform; usage: vibctl ext "
              "setAmplitude AMPLITUDE");
    EXPECT_EQ(withStandard({"perform", "CLICK", "LIGHT"}, true), "no problem");
    EXPECT_EQ(withExtension({"perform", "CLICK", "1"}, true), "no problem");
}

TEST(UnknownCommand, GetsTheOnesThereAre) {
    EXPECT_EQ(unknownCommand("foo"),
              "unknown command \"foo\"; there are std, ext, info, dump, raw, play, session, list, "
              "doctor and help");
    EXPECT_EQ(unknownCommand(""),
              "no command given; there are std, ext, info, dump, raw, play, session, list, doctor "
              "and "
              "help");
}

TEST(Help, OfAMethodSaysWhatItsArgumentsAccept) {
    const Method* method = nullptr;
    CommandLine line;
    line.command = "std";
    line.method = "alwaysOnDisable";
    ASSERT_FALSE(findMethod(line, method));
    EXPECT_EQ(helpOf("std", *method), "vibctl std alwaysOnDisable ID\n  ID: an integer\n");
    line.method = "compose";
    ASSERT_FALSE(findMethod(line, method));
    EXPECT_EQ(helpOf("std", *method),
              "vibctl std compose DELAY_MS,PRIMITIVE,SCALE... [--callback]\n"
              "  DELAY_MS,PRIMITIVE,SCALE...: any count of these; PRIMITIVE is NOOP 0, CLICK 1, "
              "THUD 2, SPIN 3, QUICK_RISE 4, SLOW_RISE 5, QUICK_FALL 6, LIGHT_TICK 7, LOW_TICK 8, "
              "or any number\n");
}

TEST(Help, OfAnInterfaceListsItsMethods) {
    const std::string standard = helpOfInterface("std");
    EXPECT_THAT(standard, StartsWith("vibctl std METHOD [ARG...], with METHOD one of\n"
                                     "  getCapabilities\n"
                                     "  off\n"
                                     "  on TIMEOUT_MS [--callback]\n"
                                     "  perform EFFECT STRENGTH [--callback]\n"));
    EXPECT_THAT(helpOfInterface("ext"), HasSubstr("\n  hasFeature FEATURE_NAME\n"));
}

}  // namespace
}  // namespace vibctl
