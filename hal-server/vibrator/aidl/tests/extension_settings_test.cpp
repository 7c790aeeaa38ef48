// SPDX-License-Identifier: Apache-2.0
//
// The extension's settings: amplitudes, frequency type and posture. None of them starts the motor.
#include <cerrno>
#include <string>
#include <vector>

#include "tests/extension_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using fake::Access;
using fake::Fault;
using fake::Operation;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

struct NumberSetting {
    const char* name;
    ndk::ScopedAStatus (*set)(Vibrator& extension, int32_t number);
    const char* leaf;
    std::vector<int32_t> accepted;
    std::vector<int32_t> refused;
    const char* entry;    // before the number
    const char* refusal;  // before the number
};

const NumberSetting kNumberSettings[] = {
        {"setAmplitude",
         [](Vibrator& extension, int32_t number) { return extension.setAmplitude(number); },
         "intensity",
         {1, 2, 5000, 9999, 10000},
         {0, -1, 10001, 65537, kIntMin, kIntMin + 1, kIntMax},
         "I V_4_0: setAmplitude ",
         "I V_4_0: setAmplitude amplitude is abnormal "},
        {"setForceTouchAmplitude",
         [](Vibrator& extension, int32_t number) {
             return extension.setForceTouchAmplitude(number);
         },
         "force_touch_intensity",
         {1, 2, 5000, 9999, 10000},
         {0, -1, 10001, 65537, kIntMin, kIntMin + 1, kIntMax},
         "I V_4_0: setForceTouchAmplitude ",
         "I V_4_0: setForceTouchAmplitude amplitude is abnormal "},
        {"setFrequencyType",
         [](Vibrator& extension, int32_t number) {
             return extension.setFrequencyType(static_cast<ZelFrequencyType>(number));
         },
         "multi_freq",
         {0, 1, 2, 3, 4},
         {5, 6, -1, kIntMin, kIntMax},
         "I V_4_0: setFrequencyType",  // no space before the number
         "I V_4_0: setFrequencyType is abnormal "},
};

class SettingOfANumber : public ExtensionTest, public testing::WithParamInterface<NumberSetting> {
  protected:
    SettingOfANumber() {
        addLedsClass();
        kernel.addNode(node, "unset");
    }

    const std::string node = kLeds + GetParam().leaf;
};

TEST_P(SettingOfANumber, IsWrittenInDecimalWithALineFeed) {
    const NumberSetting& setting = GetParam();
    const auto extension = makeExtension();
    for (const int32_t number : setting.accepted) {
        kernel.clear();
        log.clear();
        const std::string text = std::to_string(number);
        EXPECT_TRUE(setting.set(*extension, number).isOk()) << number;
        EXPECT_THAT(kernel.calls(),
                    ElementsAre("open " + node + " O_RDWR",
                                "write " + node + " \"" + text + "\\n\"", "close " + node));
        EXPECT_THAT(
                log.lines(),
                ElementsAre(setting.entry + text,
                            std::string("I HW_API: >> writeNode node:/leds/vibrator/") +
                                    setting.leaf + " val:" + text,
                            "I HW_API: << writeNode node OK : " + std::to_string(text.size() + 1)));
    }
}

TEST_P(SettingOfANumber, OutOfRangeIsAnIllegalArgumentAndNothingIsWritten) {
    const NumberSetting& setting = GetParam();
    const auto extension = makeExtension();
    for (const int32_t number : setting.refused) {
        log.clear();
        EXPECT_EQ(exceptionOf(setting.set(*extension, number)), EX_ILLEGAL_ARGUMENT) << number;
        EXPECT_THAT(log.lines(), ElementsAre(setting.entry + std::to_string(number),
                                             setting.refusal + std::to_string(number)));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_P(SettingOfANumber, FailingDriverIsAnIllegalStateWithoutALineOfItsOwn) {
    const NumberSetting& setting = GetParam();
    const int32_t number = setting.accepted[2];
    const std::string text = std::to_string(number);
    const std::string size = std::to_string(text.size() + 1);
    const struct {
        Fault fault;
        std::string line;
    } failures[] = {
            {{.path = node, .operation = Operation::kOpen, .error = EACCES},
             "I HW_API: node: " + node + "errno: 13"},
            {{.path = node, .operation = Operation::kWrite, .error = EIO},
             "I HW_API: << writeNode node UNKNOWN_ERROR : " + size + " , -1"},
            {{.path = node, .operation = Operation::kWrite, .limit = 1},
             "I HW_API: << writeNode node UNKNOWN_ERROR : " + size + " , 1"},
    };
    const auto extension = makeExtension();
    for (const auto& [fault, line] : failures) {
        log.clear();
        kernel.addFault(fault);
        EXPECT_EQ(exceptionOf(setting.set(*extension, number)), EX_ILLEGAL_STATE) << line;
        EXPECT_THAT(log.lines(),
                    ElementsAre(setting.entry + text,
                                std::string("I HW_API: >> writeNode node:/leds/vibrator/") +
                                        setting.leaf + " val:" + text,
                                line));
    }
}

TEST_P(SettingOfANumber, WithoutTheNodeIsAnIllegalState) {
    kernel.removeNode(node);
    const auto extension = makeExtension();
    EXPECT_EQ(exceptionOf(GetParam().set(*extension, 1)), EX_ILLEGAL_STATE);
    EXPECT_EQ(log.lines().back(), "I HW_API: node: " + node + "errno: 2");
}

TEST_P(SettingOfANumber, InterruptedCallsAreRepeated) {
    const auto extension = makeExtension();
    kernel.addFault({.path = node, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    kernel.addFault({.path = node, .operation = Operation::kWrite, .error = EINTR, .times = 2});
    EXPECT_TRUE(GetParam().set(*extension, 4).isOk());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open " + node + " O_RDWR = EINTR", "open " + node + " O_RDWR = EINTR",
                            "open " + node + " O_RDWR", "write " + node + " \"4\\n\" = EINTR",
                            "write " + node + " \"4\\n\" = EINTR", "write " + node + " \"4\\n\"",
                            "close " + node));
}

INSTANTIATE_TEST_SUITE_P(Extension, SettingOfANumber, testing::ValuesIn(kNumberSettings),
                         rowName<NumberSetting>);

class SettingOnForceFeedback : public ExtensionTest {
  protected:
    SettingOnForceFeedback() { addForceFeedback(); }
};

TEST_F(SettingOnForceFeedback, AmplitudeIsTheGainAndNoNodeIsWritten) {
    const auto extension = makeExtension();
    EXPECT_TRUE(extension->setAmplitude(1).isOk());
    EXPECT_TRUE(extension->setAmplitude(10000).isOk());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /dev/input/event7 O_RDWR", "event type=21 code=96 value=1",
                            "event type=21 code=96 value=10000"));
    EXPECT_EQ(log.line(0), "I V_4_0: setAmplitude 1");
    EXPECT_EQ(log.line(1), "I HW_API: [setForceFeedbackAmplitude]amplitude: 1");
}

TEST_F(SettingOnForceFeedback, AmplitudeOutOfRangeSendsNothing) {
    const auto extension = makeExtension();
    for (const int32_t amplitude : {0, -1, 10001, kIntMin, kIntMax}) {
        EXPECT_EQ(exceptionOf(extension->setAmplitude(amplitude)), EX_ILLEGAL_ARGUMENT);
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(SettingOnForceFeedback, FailingMotorIsAnIllegalState) {
    const auto extension = makeExtension();
    kernel.addFault({.path = kMotorDevice, .operation = Operation::kOpen, .error = EACCES});
    EXPECT_EQ(exceptionOf(extension->setAmplitude(5000)), EX_ILLEGAL_STATE);
    kernel.addFault({.path = kMotorDevice, .operation = Operation::kWrite, .error = ENODEV});
    EXPECT_EQ(exceptionOf(extension->setAmplitude(5000)), EX_ILLEGAL_STATE);
    EXPECT_TRUE(extension->setAmplitude(5000).isOk());
}

TEST_F(SettingOnForceFeedback, OtherNumbersHaveNoNodeAndAreAnIllegalState) {
    const auto extension = makeExtension();
    EXPECT_EQ(exceptionOf(extension->setForceTouchAmplitude(5000)), EX_ILLEGAL_STATE);
    EXPECT_EQ(exceptionOf(extension->setFrequencyType(ZelFrequencyType::FREQUENCY_0)),
              EX_ILLEGAL_STATE);
    EXPECT_THAT(kernel.calls(), ElementsAre("open  O_RDWR = ENOENT", "open  O_RDWR = ENOENT"));
}

TEST_F(SettingOnForceFeedback, PostureGoesToTheControlClass) {
    kernel.addNode(kInputFf + "event_cmd");
    const auto extension = makeExtension();
    EXPECT_TRUE(extension->setFolderStatus(ZelFolderStatus::OPEN).isOk());
    EXPECT_THAT(kernel.writes(),
                ElementsAre("/sys/class/qvx_vib_inputff/control/event_cmd \"FOLDER_OPEN\\n\""));
}

struct Posture {
    const char* name;
    ndk::ScopedAStatus (*set)(Vibrator& extension, int32_t number);
    int32_t number;
    const char* operation;
    std::string text;  // without the newline
    const char* size;  // with it
};

ndk::ScopedAStatus setFoldable(Vibrator& extension, int32_t number) {
    return extension.setFolderStatus(static_cast<ZelFolderStatus>(number));
}

ndk::ScopedAStatus setTentMode(Vibrator& extension, int32_t number) {
    return extension.setFolderTentModeStatus(static_cast<ZelFolderTentModeStatus>(number));
}

const Posture kPostures[] = {
        {"FolderOpen", setFoldable, 0, "setFolderStatus", "FOLDER_OPEN", "12"},
        {"FolderClosed", setFoldable, 1, "setFolderStatus", "FOLDER_CLOSE", "13"},
        {"TentModeOpen", setTentMode, 0, "setFolderTentModeStatus", "FOLDER_TENT_OPEN", "17"},
        {"TentModeClosed", setTentMode, 1, "setFolderTentModeStatus", "FOLDER_TENT_CLOSE", "18"},
};

class SettingOfAPosture : public ExtensionTest, public testing::WithParamInterface<Posture> {
  protected:
    SettingOfAPosture() {
        addLedsClass();
        kernel.addNode(node, "unset");
    }

    ndk::ScopedAStatus set(Vibrator& extension, int32_t number) {
        return GetParam().set(extension, number);
    }

    const std::string node = kLeds + "event_cmd";
    const std::string line = std::string("I V_4_0: ") + GetParam().operation;
    const std::string entry = line + std::to_string(GetParam().number);
    const std::string textLine = "I V_4_0: " + GetParam().text;
    // The string's newline divides its line in two.
    const std::string sizeLine = std::string("I  length : ") + GetParam().size;
    const std::string written = "write " + node + " \"" + GetParam().text + "\\n\"";
};

TEST_P(SettingOfAPosture, SendsTheTextInOneCall) {
    const auto extension = makeExtension();
    EXPECT_TRUE(set(*extension, GetParam().number).isOk());
    EXPECT_THAT(kernel.calls(), ElementsAre("open " + node + " O_RDWR", written, "close " + node));
    EXPECT_EQ(kernel.text(node).size(), std::stoul(GetParam().size));
    EXPECT_THAT(log.lines(),
                ElementsAre(entry, textLine, sizeLine,
                            std::string("I V_4_0: ret : ") + GetParam().size, line + " end"));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-EXT"));
}

TEST_P(SettingOfAPosture, OtherNumbersAreAnIllegalArgumentAndNothingIsWritten) {
    const auto extension = makeExtension();
    for (const int32_t number : {2, 3, -1, kIntMin, kIntMax}) {
        log.clear();
        EXPECT_EQ(exceptionOf(set(*extension, number)), EX_ILLEGAL_ARGUMENT) << number;
        EXPECT_THAT(log.lines(), ElementsAre(line + std::to_string(number), line + " BAD_VALUE"));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_P(SettingOfAPosture, NodeThatDoesNotOpenIsLoggedWithItsError) {
    kernel.removeNode(node);
    const auto extension = makeExtension();
    EXPECT_EQ(exceptionOf(set(*extension, GetParam().number)), EX_ILLEGAL_STATE);
    EXPECT_THAT(log.lines(), ElementsAre(entry, textLine, sizeLine, line + " is fail: 2"));
    log.clear();
    kernel.addNode(node, "unset", Access::kReadOnly);
    EXPECT_EQ(exceptionOf(set(*extension, GetParam().number)), EX_ILLEGAL_STATE);
    EXPECT_THAT(log.lines(), ElementsAre(entry, textLine, sizeLine, line + " is fail: 13"));
}

TEST_P(SettingOfAPosture, FailingWriteIsLoggedAsMinusOneAndTheNodeClosed) {
    const auto extension = makeExtension();
    kernel.addFault({.path = node, .operation = Operation::kWrite, .error = EIO});
    EXPECT_EQ(exceptionOf(set(*extension, GetParam().number)), EX_ILLEGAL_STATE);
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open " + node + " O_RDWR", written + " = EIO", "close " + node));
    EXPECT_THAT(log.lines(),
                ElementsAre(entry, textLine, sizeLine, "I V_4_0: ret : -1", line + " error"));
}

TEST_P(SettingOfAPosture, ShortWriteIsAnErrorAndNotCompleted) {
    const auto extension = makeExtension();
    kernel.addFault({.path = node, .operation = Operation::kWrite, .limit = 5});
    EXPECT_EQ(exceptionOf(set(*extension, GetParam().number)), EX_ILLEGAL_STATE);
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open " + node + " O_RDWR", written + " = 5", "close " + node));
    EXPECT_THAT(log.lines(),
                ElementsAre(entry, textLine, sizeLine, "I V_4_0: ret : 5", line + " error"));
}

TEST_P(SettingOfAPosture, AnyOtherCountIsAnError) {
    const auto extension = makeExtension();
    for (const ssize_t count : {0, 19}) {
        kernel.addFault({.path = node, .operation = Operation::kWrite, .result = count});
        EXPECT_EQ(exceptionOf(set(*extension, GetParam().number)), EX_ILLEGAL_STATE);
        EXPECT_EQ(log.lines().back(), line + " error");
    }
}

TEST_P(SettingOfAPosture, InterruptedCallsAreRepeated) {
    const auto extension = makeExtension();
    kernel.addFault({.path = node, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    kernel.addFault({.path = node, .operation = Operation::kWrite, .error = EINTR, .times = 2});
    EXPECT_TRUE(set(*extension, GetParam().number).isOk());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open " + node + " O_RDWR = EINTR", "open " + node + " O_RDWR = EINTR",
                            "open " + node + " O_RDWR", written + " = EINTR", written + " = EINTR",
                            written, "close " + node));
}

TEST_P(SettingOfAPosture, WithoutADeviceIsAnIllegalState) {
    removeLedsClass();
    const auto extension = makeExtension();
    EXPECT_EQ(exceptionOf(set(*extension, GetParam().number)), EX_ILLEGAL_STATE);
    EXPECT_THAT(kernel.calls(), ElementsAre("open  O_RDWR = ENOENT"));
}

INSTANTIATE_TEST_SUITE_P(Extension, SettingOfAPosture, testing::ValuesIn(kPostures),
                         rowName<Posture>);

}  // namespace
}  // namespace aidl::vendor::quorvan::hardware::vibrator
