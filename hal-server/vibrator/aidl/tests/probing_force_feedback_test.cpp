// SPDX-License-Identifier: Apache-2.0
//
// Start-up on a phone with a force-feedback motor: paths, flags, the index switch, the factory
// calibration, and the whole log of it.
#include <cerrno>
#include <string>
#include <vector>

#include "tests/force_feedback_phone.h"
#include "tests/node_paths.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::Contains;
using ::testing::Each;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsSupersetOf;
using ::testing::Not;

const std::string kCalibration = "/efs/FactoryApp/vibrator_calibration";

class ProbingForceFeedback : public ForceFeedbackPhone {
  protected:
    void addControlClass() {
        kernel.addNode(kControl + "use_kyp_index", "0\n");
        kernel.addNode(kControl + "f0_stored", "unset");
        kernel.addNode(kControl + "event_cmd", "NONE\n");
    }
};

TEST_F(ProbingForceFeedback, SetsItsTwoPathsAndLeavesTheOthersEmpty) {
    addControlClass();
    const HwApi hwApi;
    EXPECT_EQ(THE_DEVICE_FF, "/dev/input/event7");
    EXPECT_EQ(THE_DEVICE_EVENT_CMD, "/sys/class/qvx_vib_inputff/control/event_cmd");
    for (const std::string* path : kNodePaths) {
        if (path == &THE_DEVICE_FF || path == &THE_DEVICE_EVENT_CMD) continue;
        EXPECT_EQ(*path, "");
    }
    EXPECT_TRUE(useForceFeedback);
    EXPECT_FALSE(useLedsClass);
    EXPECT_TRUE(useKypIndex);
    EXPECT_EQ(motorPerformMethod, 1);
    EXPECT_EQ(inputFD, -1);
}

TEST_F(ProbingForceFeedback, LogsExactlyTheseLines) {
    addControlClass();
    kernel.addNode(kCalibration, " 137 \n", Access::kReadOnly);
    const HwApi hwApi;
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: isNodeExist node:/timed_output/vibrator/enable",
                            "I HW_API: false", "I HW_API: isNodeExist node:/leds/vibrator/activate",
                            "I HW_API: false", "I HW_API: [get_input_field_value]fopen done ",
                            "I HW_API: Vibrator using ForceFeedback",
                            "I HW_API: >> writeNodeByStringOnlyForWriting "
                            "node:/qvx_vib_inputff/control/use_kyp_index val:1",
                            "I HW_API: << writeNode node OK : 2",
                            "I HW_API: THE_DEVICE_FF: /dev/input/event7",
                            "I HW_API: THE_DEVICE_FF_EVENT_CMD: "
                            "/sys/class/qvx_vib_inputff/control/event_cmd",
                            "I HW_API: [initForceFeedbackEffect]",
                            "I HW_API: >> readNodeAsString node:ryApp/vibrator_calibration",
                            "I HW_API: << readNodeAsString success - length: 3",
                            "I HW_API: vibrator_calibration: 137",
                            "I HW_API: >> writeNodeByStringOnlyForWriting "
                            "node:/qvx_vib_inputff/control/f0_stored val:137",
                            "I HW_API: << writeNode node OK : 4",
                            "E Failed to open  (2): No such file or directory",
                            "E Failed to open  (2): No such file or directory",
                            "E Failed to open  (2): No such file or directory",
                            "E Failed to open  (2): No such file or directory",
                            "E Failed to open  (2): No such file or directory",
                            "E Failed to open  (2): No such file or directory",
                            "I HW_API: isNodeExist node:", "I HW_API: false",
                            "I HW_API: getMotorPerformMethod type : 1"));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-CORE"));
}

TEST_F(ProbingForceFeedback, StartsWithExactlyTheseCalls) {
    addControlClass();
    kernel.addNode(kInputDeviceList, "N: Name=\"qvx_vibrator_inputff\"\nH: Handlers=event7 \n",
                   Access::kReadOnly);
    kernel.addNode(kCalibration, "137\n", Access::kReadOnly);
    const HwApi hwApi;
    EXPECT_THAT(
            kernel.calls(),
            ElementsAre("open /sys/class/timed_output/vibrator/enable O_RDWR = ENOENT",
                        "open /sys/class/leds/vibrator/activate O_RDWR = ENOENT",
                        "open /proc/bus/input/devices O_RDONLY",
                        "read /proc/bus/input/devices 1024 "
                        "\"N: Name=\\\"qvx_vibrator_inputff\\\"\\nH: Handlers=event7 \\n\"",
                        "close /proc/bus/input/devices",
                        "open /sys/class/qvx_vib_inputff/control/use_kyp_index O_WRONLY",
                        "close /sys/class/qvx_vib_inputff/control/use_kyp_index",
                        "open /sys/class/qvx_vib_inputff/control/use_kyp_index O_WRONLY",
                        "write /sys/class/qvx_vib_inputff/control/use_kyp_index \"1\\n\"",
                        "close /sys/class/qvx_vib_inputff/control/use_kyp_index",
                        "open /efs/FactoryApp/vibrator_calibration O_RDONLY",
                        "close /efs/FactoryApp/vibrator_calibration",
                        "open /efs/FactoryApp/vibrator_calibration O_RDONLY",
                        "read /efs/FactoryApp/vibrator_calibration 511 \"137\\n\"",
                        "close /efs/FactoryApp/vibrator_calibration",
                        "open /sys/class/qvx_vib_inputff/control/f0_stored O_WRONLY",
                        "write /sys/class/qvx_vib_inputff/control/f0_stored \"137\\n\"",
                        "close /sys/class/qvx_vib_inputff/control/f0_stored", "fopen  r+ = ENOENT",
                        "fopen  r+ = ENOENT", "fopen  r+ = ENOENT", "fopen  r+ = ENOENT",
                        "fopen  r+ = ENOENT", "fopen  r = ENOENT", "open  O_RDWR = ENOENT"));
}

TEST_F(ProbingForceFeedback, TrailingWhiteSpaceIsNotPartOfTheDevicesName) {
    kernel.addNode(kInputDeviceList,
                   "N: Name=\"qvx_vibrator_inputff\"\nH: Handlers=event12 \t \r\n");
    const HwApi hwApi;
    EXPECT_EQ(THE_DEVICE_FF, "/dev/input/event12");
}

TEST_F(ProbingForceFeedback, SysfsMotorsAreAskedFirst) {
    addControlClass();
    addLedsClass();
    const HwApi hwApi;
    EXPECT_FALSE(useForceFeedback);
    EXPECT_EQ(THE_DEVICE_FF, "");
    EXPECT_THAT(kernel.calls(), Each(Not(HasSubstr("/proc/bus/input/devices"))));
}

TEST_F(ProbingForceFeedback, ListWithoutTheMotorIsNoDevice) {
    addControlClass();
    kernel.addNode(kInputDeviceList, "N: Name=\"keyboard\"\nH: Handlers=event0 \n\n");
    const HwApi hwApi;
    EXPECT_FALSE(useForceFeedback);
    EXPECT_FALSE(useKypIndex);
    EXPECT_EQ(THE_DEVICE_FF, "");
    EXPECT_EQ(THE_DEVICE_EVENT_CMD, "");
    EXPECT_THAT(log.lines(), IsSupersetOf({"I HW_API: [get_input_field_value]fopen close()!! ",
                                           "I HW_API: Fail to find CS40L26 info",
                                           "I HW_API: Vibrator THE_DEVICE_INTENSITY : "}));
    EXPECT_THAT(kernel.writes(), ElementsAre());
}

TEST_F(ProbingForceFeedback, MissingIndexSwitchLeavesTheDriversIndices) {
    const HwApi hwApi;
    EXPECT_TRUE(useForceFeedback);
    EXPECT_FALSE(useKypIndex);
    EXPECT_THAT(log.lines(),
                Contains("I HW_API: isNodeExistForWrite "
                         "node:/sys/class/qvx_vib_inputff/control/use_kyp_index - false"));
}

TEST_F(ProbingForceFeedback, IndexSwitchMayBeWriteOnly) {
    kernel.addNode(kControl + "use_kyp_index", "", Access::kWriteOnly);
    const HwApi hwApi;
    EXPECT_TRUE(useKypIndex);
    EXPECT_THAT(kernel.writes(),
                ElementsAre("/sys/class/qvx_vib_inputff/control/use_kyp_index \"1\\n\""));
}

TEST_F(ProbingForceFeedback, IndexSwitchCountsEvenWhereItsWriteFails) {
    addControlClass();
    kernel.addFault(
            {.path = kControl + "use_kyp_index", .operation = Operation::kWrite, .error = EIO});
    const HwApi hwApi;
    EXPECT_TRUE(useKypIndex);
    EXPECT_THAT(log.lines(), Contains("I HW_API: << writeNode node UNKNOWN_ERROR : 2 , -1"));
}

TEST_F(ProbingForceFeedback, ReadOnlyIndexSwitchIsNone) {
    kernel.addNode(kControl + "use_kyp_index", "0\n", Access::kReadOnly);
    const HwApi hwApi;
    EXPECT_FALSE(useKypIndex);
}

using Calibration = ProbingForceFeedback;

TEST_F(Calibration, MissingFileSaysOneLineAndWritesNothing) {
    addControlClass();
    const HwApi hwApi;
    EXPECT_EQ(kernel.text(kControl + "f0_stored"), "unset");
    EXPECT_THAT(log.lines(), Contains("I HW_API: isNodeExistForRead "
                                      "node:/efs/FactoryApp/vibrator_calibration - false"));
    EXPECT_THAT(log.lines(), Each(Not(HasSubstr("vibrator_calibration: "))));
    EXPECT_THAT(log.lines(), Each(Not(HasSubstr("Fail - "))));
}

TEST_F(Calibration, FileOfWhiteSpaceIsAFailureAndWritesNothing) {
    addControlClass();
    for (const char* text : {" \n\t\n", ""}) {
        kernel.addNode(kCalibration, text, Access::kReadOnly);
        log.clear();
        const HwApi hwApi;
        EXPECT_EQ(kernel.text(kControl + "f0_stored"), "unset");
        EXPECT_THAT(log.lines(), IsSupersetOf({"I HW_API: vibrator_calibration: ",
                                               "I HW_API: Fail - read vibrator_calibration"}));
    }
}

TEST_F(Calibration, FileThatCannotBeReadIsAFailure) {
    addControlClass();
    kernel.addNode(kCalibration, "137\n", Access::kReadOnly);
    kernel.addFault({.path = kCalibration, .operation = Operation::kRead, .error = EIO});
    const HwApi hwApi;
    EXPECT_EQ(kernel.text(kControl + "f0_stored"), "unset");
    EXPECT_THAT(log.lines(),
                IsSupersetOf({"I HW_API: readNodeAsString node: "
                              "/efs/FactoryApp/vibrator_calibrationread failed. errno: 5",
                              "I HW_API: vibrator_calibration: ",
                              "I HW_API: Fail - read vibrator_calibration"}));
}

TEST_F(Calibration, DriverThatDoesNotTakeItIsLoggedAndTheStartGoesOn) {
    addControlClass();
    kernel.addNode(kCalibration, "137\n", Access::kReadOnly);
    kernel.addFault({.path = kControl + "f0_stored", .operation = Operation::kWrite, .error = EIO});
    const HwApi hwApi;
    EXPECT_THAT(log.lines(), Contains("I HW_API: Fail - write vibrator_calibration to f0_stored"));
    EXPECT_EQ(log.lines().back(), "I HW_API: getMotorPerformMethod type : 1");
}

TEST_F(Calibration, MissingTargetIsLogged) {
    kernel.addNode(kCalibration, "137\n", Access::kReadOnly);
    const HwApi hwApi;
    EXPECT_THAT(
            log.lines(),
            IsSupersetOf({"I HW_API: node: /sys/class/qvx_vib_inputff/control/f0_storederrno: 2",
                          "I HW_API: Fail - write vibrator_calibration to f0_stored"}));
}

TEST_F(Calibration, InnerWhiteSpaceStays) {
    addControlClass();
    kernel.addNode(kCalibration, "\t137 a\n\n", Access::kReadOnly);
    const HwApi hwApi;
    EXPECT_EQ(kernel.text(kControl + "f0_stored"), "137 a\n");
}

TEST_F(Calibration, TextOfEighteenCharactersFitsAndALongerOneIsRefusedWhole) {
    addControlClass();
    kernel.addNode(kCalibration, "123456789012345678\n", Access::kReadOnly);
    { const HwApi hwApi; }
    EXPECT_EQ(kernel.text(kControl + "f0_stored"), "123456789012345678\n");
    kernel.addNode(kCalibration, "1234567890123456789\n", Access::kReadOnly);
    log.clear();
    { const HwApi hwApi; }
    EXPECT_EQ(kernel.text(kControl + "f0_stored"), "123456789012345678\n");
    EXPECT_THAT(log.lines(), Contains("I HW_API: Fail - write vibrator_calibration to f0_stored"));
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
