// SPDX-License-Identifier: Apache-2.0
//
// The extension's posture queries, which look for single letters in the string of event_cmd.
#include <cerrno>
#include <string>

#include "tests/extension_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::ElementsAre;
using ::testing::Not;
using ::testing::StartsWith;

struct PostureQueryRow {
    const char* name;
    Query query;
    std::string letters;
};

class PostureQuery : public ExtensionTest, public testing::WithParamInterface<PostureQueryRow> {
  protected:
    PostureQuery() { addLedsClass(); }

    bool answer(Vibrator& extension, bool expected) {
        return ask(extension, GetParam().query, expected);
    }

    // What event_cmd, holding `text`, is taken for.
    bool answerTo(const std::string& text, bool expected) {
        kernel.addNode(kNode, text);
        return answer(*makeExtension(), expected);
    }

    const std::string kNode = kLeds + "event_cmd";
    const std::string line = std::string("I V_4_0: ") + GetParam().name;
};

TEST_P(PostureQuery, OneOfItsLettersIsYes) {
    for (const char letter : GetParam().letters) {
        EXPECT_TRUE(answerTo(std::string("1") + letter + "1\n", true)) << letter;
        EXPECT_THAT(log.lines(),
                    ElementsAre(line, line + " string : 1" + letter + "1 len : 3", line + " TRUE"));
        EXPECT_THAT(kernel.calls(),
                    ElementsAre("open /sys/class/leds/vibrator/event_cmd O_RDWR",
                                std::string("read /sys/class/leds/vibrator/event_cmd 511 \"1") +
                                        letter + "1\\n\"",
                                "close /sys/class/leds/vibrator/event_cmd"));
    }
}

TEST_P(PostureQuery, EveryOtherCharacterIsNo) {
    for (int code = 1; code < 256; ++code) {
        const char character = static_cast<char>(code);
        if (GetParam().letters.find(character) != std::string::npos) continue;
        EXPECT_FALSE(answerTo(std::string(1, character) + "\n", false)) << code;
    }
}

TEST_P(PostureQuery, DigitIsNoAndLogged) {
    EXPECT_FALSE(answerTo("1\n", false));
    EXPECT_THAT(log.lines(), ElementsAre(line, line + " string : 1 len : 1", line + " FALSE"));
}

TEST_P(PostureQuery, LastByteIsDroppedWhateverItIs) {
    const std::string letter = GetParam().letters.substr(0, 1);
    EXPECT_FALSE(answerTo(letter, false));
    EXPECT_THAT(log.lines(), ElementsAre(line, line + " string :  len : 0", line + " FALSE"));
    EXPECT_FALSE(answerTo("1" + letter, false));
    EXPECT_TRUE(answerTo(letter + "1", true));
}

TEST_P(PostureQuery, LineFeedAloneIsNo) {
    EXPECT_FALSE(answerTo("\n", false));
    EXPECT_THAT(log.lines(), ElementsAre(line, line + " string :  len : 0", line + " FALSE"));
}

TEST_P(PostureQuery, TextEndsAtAZeroByte) {
    EXPECT_FALSE(answerTo(std::string("1\0", 2) + GetParam().letters + "\n", false));
}

TEST_P(PostureQuery, LooksNoFurtherThan511Bytes) {
    const std::string letter = GetParam().letters.substr(0, 1);
    EXPECT_TRUE(answerTo(std::string(509, '1') + letter + "\n", true));
    EXPECT_FALSE(answerTo(std::string(510, '1') + letter + "\n", false));
    EXPECT_FALSE(answerTo(std::string(600, '1') + letter + "\n", false));
    EXPECT_EQ(log.line(1), line + " string : " + std::string(510, '1') + " len : 510");
}

TEST_P(PostureQuery, DriverThatClaimsMoreThanItWasAskedForIsLoggedAsAnErrorAndCutOff) {
    kernel.addNode(kNode, std::string(600, '1'));
    const auto extension = makeExtension();
    for (const ssize_t claimed : {512, 4096}) {
        log.clear();
        kernel.addFault({.path = kNode, .operation = Operation::kRead, .result = claimed});
        EXPECT_FALSE(answer(*extension, false));
        EXPECT_THAT(log.lines(),
                    ElementsAre(line, "E Read MAX limit. Always end of string is null",
                                line + " string : " + std::string(511, '1') + " len : 511",
                                line + " FALSE"));
        EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-EXT"));
    }
}

TEST_P(PostureQuery, NodeThatDoesNotOpenIsLoggedAndNo) {
    const auto extension = makeExtension();
    EXPECT_FALSE(answer(*extension, false));
    EXPECT_THAT(log.lines(),
                ElementsAre(line, line + " node: /sys/class/leds/vibrator/event_cmd open failed. "
                                         "errno: 2"));
    log.clear();
    kernel.addNode(kNode, GetParam().letters, Access::kReadOnly);
    EXPECT_FALSE(answer(*extension, false));
    EXPECT_THAT(log.lines(),
                ElementsAre(line, line + " node: /sys/class/leds/vibrator/event_cmd open failed. "
                                         "errno: 13"));
}

TEST_P(PostureQuery, NodeThatCannotBeReadIsLoggedClosedAndNo) {
    kernel.addNode(kNode, GetParam().letters);
    const auto extension = makeExtension();
    kernel.addFault({.path = kNode, .operation = Operation::kRead, .error = EIO});
    EXPECT_FALSE(answer(*extension, false));
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/leds/vibrator/event_cmd O_RDWR",
                                            "read /sys/class/leds/vibrator/event_cmd 511 = EIO",
                                            "close /sys/class/leds/vibrator/event_cmd"));
    EXPECT_THAT(log.lines(),
                ElementsAre(line, line + " node: /sys/class/leds/vibrator/event_cmd read failed. "
                                         "errno: 5"));
}

TEST_P(PostureQuery, NodeWithoutAnyTextIsAReadThatFailed) {
    EXPECT_FALSE(answerTo("", false));
    EXPECT_THAT(log.lines(),
                ElementsAre(line, StartsWith(line + " node: /sys/class/leds/vibrator/event_cmd "
                                                    "read failed. errno: ")));
}

TEST_P(PostureQuery, InterruptedCallsAreRepeated) {
    kernel.addNode(kNode, GetParam().letters);
    const auto extension = makeExtension();
    kernel.addFault({.path = kNode, .operation = Operation::kOpen, .error = EINTR, .times = 3});
    kernel.addFault({.path = kNode, .operation = Operation::kRead, .error = EINTR, .times = 3});
    EXPECT_TRUE(answer(*extension, true));
    EXPECT_EQ(kernel.calls().size(), 9U);
}

TEST_P(PostureQuery, AsksNoFeatureList) {
    kernel.addNode(kFunctions, "INTENSITY\n", Access::kReadOnly);
    EXPECT_TRUE(answerTo("FOLDER\n", true));
    EXPECT_THAT(kernel.calls(), Not(testing::Contains(testing::HasSubstr("functions"))));
}

TEST_P(PostureQuery, OnForceFeedbackIsTheControlClasssNode) {
    removeLedsClass();
    addForceFeedback();
    kernel.addNode(kInputFf + "event_cmd", "TENT\n");
    const auto extension = makeExtension();
    answer(*extension, true);
    EXPECT_EQ(kernel.calls()[0], "open /sys/class/qvx_vib_inputff/control/event_cmd O_RDWR");
}

TEST_P(PostureQuery, WithoutADeviceIsNo) {
    removeLedsClass();
    const auto extension = makeExtension();
    EXPECT_FALSE(answer(*extension, false));
    EXPECT_THAT(log.lines(), ElementsAre(line, line + " node:  open failed. errno: 2"));
}

INSTANTIATE_TEST_SUITE_P(
        Extension, PostureQuery,
        testing::Values(PostureQueryRow{"supportsFolderStatusSetting",
                                        &Vibrator::supportsFolderStatusSetting, "DFLO"},
                        PostureQueryRow{"supportsFolderTentModeStatusSetting",
                                        &Vibrator::supportsFolderTentModeStatusSetting, "ENT"}),
        rowName<PostureQueryRow>);

using PostureQueries = ExtensionTest;

TEST_F(PostureQueries, OnIsBothPosturesAndOneIsNeither) {
    addLedsClass();
    kernel.addNode(kLeds + "event_cmd", "ON\n");
    const auto extension = makeExtension();
    EXPECT_TRUE(ask(*extension, &Vibrator::supportsFolderStatusSetting, true));
    EXPECT_TRUE(ask(*extension, &Vibrator::supportsFolderTentModeStatusSetting, true));
    kernel.addNode(kLeds + "event_cmd", "1\n");
    EXPECT_FALSE(ask(*extension, &Vibrator::supportsFolderStatusSetting, false));
    EXPECT_FALSE(ask(*extension, &Vibrator::supportsFolderTentModeStatusSetting, false));
}

}  // namespace
}  // namespace aidl::vendor::quorvan::hardware::vibrator
