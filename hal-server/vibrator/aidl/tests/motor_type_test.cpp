// SPDX-License-Identifier: Apache-2.0
//
// What motor this is, by the motor_type node: its index, and whether it takes enhanced patterns.
#include <cerrno>
#include <string>

#include "tests/force_feedback_phone.h"
#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;

const std::string kMotorType = kLeds + "motor_type";

class MotorTypeTest : public ServiceTest {
  protected:
    MotorTypeTest() { addLedsClass(); }
};

using MotorIndex = MotorTypeTest;

TEST_F(MotorIndex, NameWithLineFeedGivesItsIndex) {
    kernel.addNode(kMotorType, "LINEAR_1040\n");
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndex(), 7);
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/leds/vibrator/motor_type O_RDWR",
                            "read /sys/class/leds/vibrator/motor_type 31 \"LINEAR_1040\\n\"",
                            "close /sys/class/leds/vibrator/motor_type"));
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: getMotorIndex return motor type >>",
                                         "I HW_API: getMotorIndex string : LINEAR_1040",
                                         "I HW_API: getMotorIndex string len : 11",
                                         "I HW_API: getMotorIndex return motor type : 7 <<"));
}

TEST_F(MotorIndex, NameWithoutLineFeedLosesItsLastCharacter) {
    kernel.addNode(kMotorType, "LINEAR_1040");
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndex(), 0);
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: getMotorIndex return motor type >>",
                            "I HW_API: getMotorIndex string : LINEAR_104",
                            "I HW_API: getMotorIndex string len : 10",
                            "I HW_API: getMotorIndex MOTOR_TYPE is mandatory feature over P-OS.",
                            "I HW_API: getMotorIndex return motor type : 0 <<"));
}

TEST_F(MotorIndex, EveryNameGivesItsIndex) {
    static constexpr struct {
        const char* text;
        int index;
    } kMotors[] = {
            {"NONE\n", 0},           {"COINDC\n", 1},           {"LINEAR\n", 2},
            {"COINDC_PMIC\n", 3},    {"COINDC_INDEX\n", 4},     {"LINEAR_INDEX\n", 5},
            {"LINEAR_0832RC\n", 6},  {"LINEAR_1040\n", 7},      {"LINEAR_RCVMOT\n", 8},
            {"LINEAR_1030\n", 9},    {"LINEAR_INDEX_RC\n", 10}, {"LINEAR_WATCH\n", 11},
            {"LINEAR_ACTIVE\n", 12},
    };
    const auto hwApi = makeHwApi();
    for (const auto& motor : kMotors) {
        kernel.addNode(kMotorType, motor.text);
        EXPECT_EQ(hwApi->getMotorIndex(), motor.index) << motor.text;
    }
}

TEST_F(MotorIndex, LowerCaseAndPaddedNamesAreUnknown) {
    const auto hwApi = makeHwApi();
    for (const char* text : {"linear_1040\n", " LINEAR_1040\n", "LINEAR_1040\r\n", "\n"}) {
        kernel.addNode(kMotorType, text);
        log.clear();
        EXPECT_EQ(hwApi->getMotorIndex(), 0);
        EXPECT_THAT(log.lines(), Contains("I HW_API: getMotorIndex MOTOR_TYPE is mandatory feature "
                                          "over P-OS."));
    }
}

TEST_F(MotorIndex, NameOfThirtyCharactersIsWhole) {
    kernel.addNode(kMotorType, "ABCDEFGHIJKLMNOPQRSTUVWXYZ0123\n");
    EXPECT_EQ(makeHwApi()->getMotorIndex(), 0);
    EXPECT_THAT(log.lines(),
                Contains("I HW_API: getMotorIndex string : ABCDEFGHIJKLMNOPQRSTUVWXYZ0123"));
    EXPECT_THAT(log.lines(), Contains("I HW_API: getMotorIndex string len : 30"));
}

TEST_F(MotorIndex, NameOf31CharactersLosesItsLastOne) {
    kernel.addNode(kMotorType, "ABCDEFGHIJKLMNOPQRSTUVWXYZ01234\n");
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndex(), 0);
    EXPECT_THAT(kernel.calls(), Contains("read /sys/class/leds/vibrator/motor_type 31 "
                                         "\"ABCDEFGHIJKLMNOPQRSTUVWXYZ01234\""));
    EXPECT_THAT(log.lines(),
                Contains("I HW_API: getMotorIndex string : ABCDEFGHIJKLMNOPQRSTUVWXYZ0123"));
}

TEST_F(MotorIndex, LongNameIsCutToThirtyCharacters) {
    kernel.addNode(kMotorType, "ABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789\n");
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndex(), 0);
    EXPECT_THAT(log.lines(),
                Contains("I HW_API: getMotorIndex string : ABCDEFGHIJKLMNOPQRSTUVWXYZ0123"));
    EXPECT_THAT(log.lines(), Contains("I HW_API: getMotorIndex string len : 30"));
}

TEST_F(MotorIndex, NameEndsAtAZeroByte) {
    kernel.addNode(kMotorType, std::string("LINEAR\0XX\n", 10));
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndex(), 2);
    EXPECT_THAT(log.lines(), Contains("I HW_API: getMotorIndex string len : 6"));
}

TEST_F(MotorIndex, MissingNodeGivesZeroAndTheWordsRunTogether) {
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndex(), 0);
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: getMotorIndex return motor type >>",
                            "I HW_API: getMotorIndex node: /sys/class/leds/vibrator/motor_type"
                            "open failed. errno: 2"));
}

TEST_F(MotorIndex, ReadOnlyNodeDoesNotOpen) {
    kernel.addNode(kMotorType, "LINEAR_1040\n", Access::kReadOnly);
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndex(), 0);
    EXPECT_EQ(log.lines().back(),
              "I HW_API: getMotorIndex node: /sys/class/leds/vibrator/motor_type"
              "open failed. errno: 13");
}

TEST_F(MotorIndex, FailedReadGivesZeroAndClosesTheNode) {
    kernel.addNode(kMotorType, "LINEAR_1040\n");
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kMotorType, .operation = Operation::kRead, .error = EIO});
    EXPECT_EQ(hwApi->getMotorIndex(), 0);
    EXPECT_EQ(log.lines().back(),
              "I HW_API: getMotorIndex node: /sys/class/leds/vibrator/motor_type "
              "read failed. errno: 5");
    EXPECT_EQ(kernel.calls().back(), "close /sys/class/leds/vibrator/motor_type");
}

TEST_F(MotorIndex, EmptyNodeCountsAsAFailedReadAndANewlineDoesNot) {
    kernel.addNode(kMotorType, "");
    const auto hwApi = makeHwApi();
    errno = 0;
    EXPECT_EQ(hwApi->getMotorIndex(), 0);
    EXPECT_EQ(log.lines().back(),
              "I HW_API: getMotorIndex node: /sys/class/leds/vibrator/motor_type "
              "read failed. errno: 0");
    kernel.addNode(kMotorType, "\n");
    EXPECT_EQ(hwApi->getMotorIndex(), 0);
    EXPECT_THAT(log.lines(), Contains("I HW_API: getMotorIndex string len : 0"));
}

TEST_F(MotorIndex, InterruptedOpenAndReadAreRepeated) {
    kernel.addNode(kMotorType, "LINEAR_1040\n");
    const auto hwApi = makeHwApi();
    kernel.addFault(
            {.path = kMotorType, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    kernel.addFault(
            {.path = kMotorType, .operation = Operation::kRead, .error = EINTR, .times = 2});
    EXPECT_EQ(hwApi->getMotorIndex(), 7);
}

TEST_F(MotorIndex, MoreBytesThanAskedForAreTerminatedAndLoggedAsAnError) {
    kernel.addNode(kMotorType, "LINEAR\n");
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kMotorType, .operation = Operation::kRead, .result = 32});
    EXPECT_EQ(hwApi->getMotorIndex(), 0);
    EXPECT_THAT(log.lines(), Contains("E Read MAX limit. Always end of string is null"));
}

TEST_F(ServiceTest, MotorIndexOfTheLegacyClassIsReadFromItsOwnNode) {
    addLegacyClass();
    kernel.addNode(kLegacy + "motor_type", "LINEAR_WATCH\n");
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndex(), 11);
    EXPECT_EQ(kernel.calls().front(), "open /sys/class/timed_output/vibrator/motor_type O_RDWR");
}

TEST_F(ServiceTest, MotorIndexWithoutADeviceIsZero) {
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndex(), 0);
    EXPECT_EQ(log.lines().back(), "I HW_API: getMotorIndex node: open failed. errno: 2");
}

using EnhancedPattern = MotorTypeTest;

TEST_F(EnhancedPattern, Linear1040CanAndIsReadReadOnly) {
    kernel.addNode(kMotorType, "LINEAR_1040\n", Access::kReadOnly);
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->supportsEnhancedQuorvanHapticPattern());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/leds/vibrator/motor_type O_RDONLY",
                            "close /sys/class/leds/vibrator/motor_type",
                            "open /sys/class/leds/vibrator/motor_type O_RDONLY",
                            "read /sys/class/leds/vibrator/motor_type 31 \"LINEAR_1040\\n\"",
                            "close /sys/class/leds/vibrator/motor_type"));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: supportsEnhancedQuorvanHapticPattern",
                            "I HW_API: supportsEnhancedQuorvanHapticPattern string : LINEAR_1040",
                            "I HW_API: supportsEnhancedQuorvanHapticPattern string len : 11",
                            "I HW_API: supportsEnhancedQuorvanHapticPattern LINEAR_1040"));
}

TEST_F(EnhancedPattern, EveryOtherMotorCannot) {
    const auto hwApi = makeHwApi();
    for (const char* text : {"LINEAR_1040", "LINEAR_1030\n", "linear_1040\n", "LINEAR_10400\n"}) {
        kernel.addNode(kMotorType, text);
        EXPECT_FALSE(hwApi->supportsEnhancedQuorvanHapticPattern());
        EXPECT_EQ(log.lines().back(),
                  "I HW_API: supportsEnhancedQuorvanHapticPattern can not supports. Out of "
                  "capability");
    }
}

TEST_F(EnhancedPattern, WithoutMotorTypeTheHapticEngineDecides) {
    const auto hwApi = makeHwApi();
    EXPECT_FALSE(hwApi->supportsEnhancedQuorvanHapticPattern());
    EXPECT_EQ(log.lines().back(), "I HW_API: supportsEnhancedQuorvanHapticPattern not supports");
    kernel.addNode(kLeds + "haptic_engine");
    EXPECT_TRUE(hwApi->supportsEnhancedQuorvanHapticPattern());
    EXPECT_EQ(log.lines().back(),
              "I HW_API: supportsEnhancedQuorvanHapticPattern Enhanced supports motor");
}

TEST_F(EnhancedPattern, NodeThatVanishesFailsWithABlankBeforeOpen) {
    kernel.addNode(kMotorType, "LINEAR_1040\n");
    const auto hwApi = makeHwApi();
    kernel.addFault(
            {.path = kMotorType, .operation = Operation::kOpen, .error = ENODEV, .after = 1});
    EXPECT_FALSE(hwApi->supportsEnhancedQuorvanHapticPattern());
    EXPECT_EQ(log.lines().back(),
              "I HW_API: supportsEnhancedQuorvanHapticPattern node: "
              "/sys/class/leds/vibrator/motor_type open failed. errno: 19");
}

TEST_F(EnhancedPattern, FailedReadIsNo) {
    kernel.addNode(kMotorType, "LINEAR_1040\n");
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kMotorType, .operation = Operation::kRead, .error = EIO});
    EXPECT_FALSE(hwApi->supportsEnhancedQuorvanHapticPattern());
    EXPECT_EQ(log.lines().back(),
              "I HW_API: supportsEnhancedQuorvanHapticPattern node: "
              "/sys/class/leds/vibrator/motor_type read failed. errno: 5");
}

TEST_F(EnhancedPattern, EmptyNodeCountsAsAFailedReadAndANewlineDoesNot) {
    kernel.addNode(kMotorType, "");
    const auto hwApi = makeHwApi();
    errno = 0;
    EXPECT_FALSE(hwApi->supportsEnhancedQuorvanHapticPattern());
    EXPECT_EQ(log.lines().back(),
              "I HW_API: supportsEnhancedQuorvanHapticPattern node: "
              "/sys/class/leds/vibrator/motor_type read failed. errno: 0");
    kernel.addNode(kMotorType, "\n");
    EXPECT_FALSE(hwApi->supportsEnhancedQuorvanHapticPattern());
    EXPECT_EQ(log.line(3), "I HW_API: supportsEnhancedQuorvanHapticPattern string : ");
}

TEST_F(EnhancedPattern, MoreBytesThanAskedForAreLoggedAsAnError) {
    kernel.addNode(kMotorType, "LINEAR_1040\n");
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kMotorType, .operation = Operation::kRead, .result = 32});
    EXPECT_FALSE(hwApi->supportsEnhancedQuorvanHapticPattern());
    EXPECT_THAT(log.lines(), Contains("E Read MAX limit. Always end of string is null"));
}

TEST_F(EnhancedPattern, NodeThatCannotBeReadIsNoMotorType) {
    kernel.addNode(kMotorType, "LINEAR_1030\n", Access::kWriteOnly);
    kernel.addNode(kLeds + "haptic_engine");
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->supportsEnhancedQuorvanHapticPattern());
    EXPECT_THAT(
            log.lines(),
            ElementsAre("I HW_API: supportsEnhancedQuorvanHapticPattern",
                        "I HW_API: isNodeExistForRead "
                        "node:/sys/class/leds/vibrator/motor_type - false",
                        "I HW_API: isNodeExist node:/leds/vibrator/haptic_engine", "I HW_API: true",
                        "I HW_API: supportsEnhancedQuorvanHapticPattern Enhanced supports "
                        "motor"));
}

TEST_F(EnhancedPattern, InterruptedReadIsRepeated) {
    kernel.addNode(kMotorType, "LINEAR_1040\n");
    const auto hwApi = makeHwApi();
    kernel.addFault(
            {.path = kMotorType, .operation = Operation::kRead, .error = EINTR, .times = 2});
    EXPECT_TRUE(hwApi->supportsEnhancedQuorvanHapticPattern());
}

TEST_F(ForceFeedbackPhone, MotorTypeIsUnknownAndThereIsNoEnhancedPattern) {
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndex(), 0);
    EXPECT_FALSE(hwApi->supportsEnhancedQuorvanHapticPattern());
    EXPECT_EQ(log.lines().back(), "I HW_API: supportsEnhancedQuorvanHapticPattern not supports");
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
