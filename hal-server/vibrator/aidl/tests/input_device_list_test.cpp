// SPDX-License-Identifier: Apache-2.0
//
// Finding the motor in the list of input devices.
#include <cerrno>
#include <cstdlib>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::ElementsAre;
using ::testing::ValuesIn;

const std::string kList = "/proc/bus/input/devices";
const std::string kName = "N: Name=\"qvx_vibrator_inputff\"\n";

class InputDeviceList : public ServiceTest {
  protected:
    // The field's value in a list of this string.
    std::optional<std::string> field(const std::string& text, char key) {
        kernel.addNode(kList, text, Access::kReadOnly);
        return value(key);
    }

    std::optional<std::string> value(char key) {
        const std::unique_ptr<char, decltype(&free)> text(hwApi->get_input_field_value(key), free);
        return text == nullptr ? std::nullopt : std::optional<std::string>(text.get());
    }

    const std::shared_ptr<HwApi> hwApi = makeHwApi();
};

struct ListCase {
    const char* name;
    std::string text;
    std::optional<std::string> handlers;
};

const ListCase kListCases[] = {
        {"OneBlock", kName + "H: Handlers=event7\n\n", "event7"},
        {"TrailingBlanksAreKept", kName + "H: Handlers=event7 \t \n\n", "event7 \t "},
        {"SeveralHandlersAreOneText", kName + "H: Handlers=kbd event7 \n", "kbd event7 "},
        {"SeveralBlocks",
         "N: Name=\"AT Translated Set 2 keyboard\"\nH: Handlers=kbd event0 \n\n" + kName +
                 "P: Phys=qvx/input0\nS: Sysfs=/devices/virtual/input/input7\nU: Uniq=\n"
                 "H: Handlers=event7 \nB: EV=200001\n\n"
                 "N: Name=\"gpio-keys\"\nH: Handlers=event8 \n\n",
         "event7 "},
        {"NameOfAnotherDevice", "N: Name=\"qvx_vibrator_inputff2\"\nH: Handlers=event7\n\n",
         std::nullopt},
        {"NameInAnotherFieldOfAnotherBlock",
         "N: Name=\"keyboard\"\nP: Phys=qvx_vibrator_inputff\nH: Handlers=event0\n\n" + kName +
                 "H: Handlers=event7\n\n",
         "event7"},
        {"NameBehindOtherTextOfItsLine", "X: " + kName + "H: Handlers=event7\n\n", "event7"},
        {"HandlersBeforeTheName", "H: Handlers=event7\n" + kName + "\n", std::nullopt},
        {"BlockWithoutHandlers", kName + "B: EV=200001\n\nH: Handlers=event7\n\n", std::nullopt},
        {"LaterBlockOfTheSameName", kName + "B: EV=200001\n\n" + kName + "H: Handlers=event9\n\n",
         "event9"},
        {"LineOfOneBlankKeepsTheBlockOpen", kName + " \nH: Handlers=event7\n\n", "event7"},
        {"FirstLineOfThatLetterIsTheAnswer", kName + "H: none\nH: Handlers=event7\n\n",
         std::nullopt},
        {"LastLineWithoutLineFeedLosesACharacter", kName + "H: Handlers=event17", "event1"},
        {"EmptyHandlers", kName + "H: Handlers=\n\n", ""},
        {"EmptyHandlersWithoutLineFeed", kName + "H: Handlers=", ""},
        {"EmptyList", "", std::nullopt},
        {"BlankLinesOnly", "\n\n\n", std::nullopt},
        {"NoLineFeedAtAll", "N: Name=\"qvx_vibrator_inputff\"", std::nullopt},
        // Lines are read in pieces of 1023 characters, and each piece counts as a line.
        {"PieceOfALongLineIsJudgedAsALine",
         kName + "B:" + std::string(1021, 'x') + "H: Handlers=event9\n\n", "event9"},
        {"PieceThatIsALineFeedClosesTheBlock",
         kName + "B:" + std::string(1021, 'x') + "\nH: Handlers=event7\n\n", std::nullopt},
        {"LineOf1022CharactersIsRead",
         kName + "B:" + std::string(1020, 'x') + "\nH: Handlers=event7\n\n", "event7"},
        {"NameCutByThePiecesIsNotFound", std::string(1010, 'x') + kName + "H: Handlers=event7\n\n",
         std::nullopt},
        {"LongHandlersEndWithTheirPieceLessACharacter",
         kName + "H: Handlers=" + std::string(1100, 'e') + "\n\n", std::string(1010, 'e')},
};

class TrickyInputDeviceList : public InputDeviceList,
                              public ::testing::WithParamInterface<ListCase> {};

TEST_P(TrickyInputDeviceList, GivesTheHandlersOfTheMotorsBlock) {
    EXPECT_EQ(field(GetParam().text, 'H'), GetParam().handlers);
}

INSTANTIATE_TEST_SUITE_P(Texts, TrickyInputDeviceList, ValuesIn(kListCases),
                         [](const auto& tested) { return tested.param.name; });

TEST_F(InputDeviceList, SysfsFieldIsFoundByItsKey) {
    EXPECT_EQ(field(kName + "S: Sysfs=/devices/virtual/input/input7\nH: Handlers=event7 \n\n", 'S'),
              "/devices/virtual/input/input7");
}

TEST_F(InputDeviceList, FieldThatNobodyReadsIsNone) {
    const std::string text = kName + "P: Phys=qvx/input0\nU: Uniq=\n\n";
    EXPECT_EQ(field(text, 'P'), std::nullopt);
    EXPECT_EQ(field(text, 'N'), std::nullopt);
    EXPECT_EQ(field(text, 'x'), std::nullopt);
}

TEST_F(InputDeviceList, IsOpenedReadAndClosedAndTheFindingSaysOneLine) {
    EXPECT_EQ(field(kName + "H: Handlers=event7\n", 'H'), "event7");
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /proc/bus/input/devices O_RDONLY",
                            "read /proc/bus/input/devices 1024 "
                            "\"N: Name=\\\"qvx_vibrator_inputff\\\"\\nH: Handlers=event7\\n\"",
                            "close /proc/bus/input/devices"));
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [get_input_field_value]fopen done "));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-CORE"));
}

TEST_F(InputDeviceList, SearchInVainSaysThatTheListIsClosed) {
    EXPECT_EQ(field("N: Name=\"keyboard\"\nH: Handlers=event0\n\n", 'H'), std::nullopt);
    EXPECT_EQ(kernel.calls().back(), "close /proc/bus/input/devices");
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [get_input_field_value]fopen done ",
                                         "I HW_API: [get_input_field_value]fopen close()!! "));
}

TEST_F(InputDeviceList, LineWithoutItsFieldSaysNothingMore) {
    EXPECT_EQ(field(kName + "H: none\n", 'H'), std::nullopt);
    EXPECT_EQ(kernel.calls().back(), "close /proc/bus/input/devices");
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [get_input_field_value]fopen done "));
}

TEST_F(InputDeviceList, MissingListIsLogged) {
    EXPECT_EQ(value('H'), std::nullopt);
    EXPECT_THAT(kernel.calls(), ElementsAre("open /proc/bus/input/devices O_RDONLY = ENOENT"));
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [get_input_field_value]fopen error !! "));
}

TEST_F(InputDeviceList, ListThatCannotBeReadHasNoMotor) {
    kernel.addFault({.path = kList, .operation = Operation::kRead, .error = EIO});
    EXPECT_EQ(field(kName + "H: Handlers=event7\n", 'H'), std::nullopt);
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [get_input_field_value]fopen done ",
                                         "I HW_API: [get_input_field_value]fopen close()!! "));
}

TEST_F(InputDeviceList, InterruptedOpenAndReadAreRepeated) {
    kernel.addFault({.path = kList, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    kernel.addFault({.path = kList, .operation = Operation::kRead, .error = EINTR, .times = 3});
    EXPECT_EQ(field(kName + "H: Handlers=event7\n", 'H'), "event7");
}

TEST_F(InputDeviceList, MayArriveInSmallPieces) {
    kernel.addFault({.path = kList, .operation = Operation::kRead, .limit = 3, .times = 0});
    EXPECT_EQ(field(kName + "H: Handlers=event7 \n\n", 'H'), "event7 ");
}

struct FieldCase {
    const char* name;
    std::string line;
    char key;
    std::optional<std::string> value;
    std::string lineAfterwards;
};

const FieldCase kFieldCases[] = {
        {"Handlers", "H: Handlers=event7 \n", 'H', "event7 ", "H: Handlers=event7 "},
        {"Sysfs", "S: Sysfs=/devices/x\n", 'S', "/devices/x", "S: Sysfs=/devices/x"},
        {"PrefixAnywhereInTheLine", "xHandlers=a\n", 'H', "a", "xHandlers=a"},
        {"FirstPrefixCounts", "Handlers=Handlers=a\n", 'H', "Handlers=a", "Handlers=Handlers=a"},
        {"LastCharacterGoesWhateverItIs", "H: Handlers=ab", 'H', "a", "H: Handlers=a"},
        {"NothingBehindThePrefix", "H: Handlers=\n", 'H', "", "H: Handlers="},
        {"PrefixAtTheVeryEnd", "H: Handlers=", 'H', "", "H: Handlers"},
        {"PrefixOfTheOtherKey", "S: Sysfs=/devices/x\n", 'H', std::nullopt,
         "S: Sysfs=/devices/x\n"},
        {"LineWithoutThePrefix", "H: handlers=event7\n", 'H', std::nullopt, "H: handlers=event7\n"},
        {"EmptyLine", "", 'H', std::nullopt, ""},
        {"EmptyLineForSysfs", "", 'S', std::nullopt, ""},
        {"LineFeedOnly", "\n", 'H', std::nullopt, "\n"},
        {"KeyN", "N: Name=\"x\"\n", 'N', std::nullopt, "N: Name=\"x\"\n"},
        {"SmallLetterKey", "H: Handlers=event7\n", 'h', std::nullopt, "H: Handlers=event7\n"},
        {"ZeroKey", "H: Handlers=event7\n", '\0', std::nullopt, "H: Handlers=event7\n"},
};

class ParseField : public ServiceTest, public ::testing::WithParamInterface<FieldCase> {};

TEST_P(ParseField, GivesACopyOfTheValueAndCutsTheLine) {
    const auto hwApi = makeHwApi();
    std::vector<char> line(GetParam().line.begin(), GetParam().line.end());
    line.push_back('\0');
    const std::unique_ptr<char, decltype(&free)> value(
            hwApi->parse_field(line.data(), GetParam().key), free);
    if (GetParam().value) {
        ASSERT_NE(value, nullptr);
        EXPECT_EQ(value.get(), *GetParam().value);
    } else {
        EXPECT_EQ(value, nullptr);
    }
    EXPECT_STREQ(line.data(), GetParam().lineAfterwards.c_str());
}

TEST_F(ServiceTest, NoLineHasNoField) {
    EXPECT_EQ(makeHwApi()->parse_field(nullptr, 'H'), nullptr);
}

INSTANTIATE_TEST_SUITE_P(Lines, ParseField, ValuesIn(kFieldCases),
                         [](const auto& tested) { return tested.param.name; });

}  // namespace
}  // namespace aidl::android::hardware::vibrator
