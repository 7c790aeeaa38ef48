// SPDX-License-Identifier: Apache-2.0
//
// Start-up probing: which class wins, which paths it sets, and the whole log of each outcome.
#include <cerrno>
#include <string>
#include <vector>

#include "tests/service_test.h"

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
using ::testing::StartsWith;

class Probing : public ServiceTest {};

TEST_F(Probing, LegacyClassSetsItsPaths) {
    addLegacyClass();
    const HwApi hwApi;
    EXPECT_FALSE(useLedsClass);
    EXPECT_FALSE(useForceFeedback);
    EXPECT_EQ(THE_DEVICE_INTENSITY, "/sys/class/timed_output/vibrator/intensity");
    EXPECT_EQ(THE_DEVICE_FORCE_TOUCH_INTENSITY,
              "/sys/class/timed_output/vibrator/force_touch_intensity");
    EXPECT_EQ(THE_DEVICE_MULTI_FREQ, "/sys/class/timed_output/vibrator/multi_freq");
    EXPECT_EQ(THE_DEVICE_HAPTIC_ENGINE, "/sys/class/timed_output/vibrator/haptic_engine");
    EXPECT_EQ(THE_DEVICE_HAPTIC_ENGINE_INDEX, "/sys/class/timed_output/vibrator/cp_trigger_index");
    EXPECT_EQ(THE_DEVICE_HAPTIC_PLAYBACK_QUEUE,
              "/sys/class/timed_output/vibrator/cp_trigger_queue");
    EXPECT_EQ(THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES, "/sys/class/timed_output/vibrator/num_waves");
    EXPECT_EQ(THE_DEVICE_MOTOR_TYPE, "/sys/class/timed_output/vibrator/motor_type");
    EXPECT_EQ(THE_DEVICE_EVENT_CMD, "/sys/class/timed_output/vibrator/event_cmd");
    EXPECT_EQ(THE_DEVICE_PATTERN_LENGTH, "/sys/class/timed_output/vibrator/pattern_length");
    EXPECT_EQ(THE_DEVICE_EXT_CONTROL, "/sys/class/timed_output/vibrator/ext_control");
    EXPECT_EQ(THE_DEVICE_CAL_INTENSITIES, "/sys/class/timed_output/vibrator/intensities");
    EXPECT_EQ(THE_DEVICE_CAL_HAPTIC_INTENSITIES,
              "/sys/class/timed_output/vibrator/haptic_intensities");
    EXPECT_EQ(THE_DEVICE_ASP_ENABLE, "/sys/class/timed_output/vibrator/asp_enable");
    EXPECT_EQ(THE_DEVICE_GPIO1_FALL_INDEX, "/sys/class/timed_output/vibrator/gpio1_fall_index");
    EXPECT_EQ(THE_DEVICE_GPIO1_FALL_DIG_SCALE,
              "/sys/class/timed_output/vibrator/gpio1_fall_dig_scale");
    EXPECT_EQ(THE_DEVICE_GPIO1_RISE_INDEX, "/sys/class/timed_output/vibrator/gpio1_rise_index");
    EXPECT_EQ(THE_DEVICE_GPIO1_RISE_DIG_SCALE,
              "/sys/class/timed_output/vibrator/gpio1_rise_dig_scale");
    EXPECT_EQ(THE_DEVICE_VIB_STATE, "/sys/class/timed_output/vibrator/vibe_state");
    EXPECT_EQ(THE_DEVICE_FIFO_HAPTIC_ENGINE, "/sys/class/timed_output/vibrator/fifo");
    EXPECT_EQ(THE_DEVICE_HYBRID_HAPTIC_ENGINE,
              "/sys/class/timed_output/vibrator/hybrid_haptic_engine");
    EXPECT_EQ(THE_DEVICE_FF, "");
}

TEST_F(Probing, LedsClassSetsItsPaths) {
    addLedsClass();
    const HwApi hwApi;
    EXPECT_TRUE(useLedsClass);
    EXPECT_FALSE(useForceFeedback);
    EXPECT_EQ(THE_DEVICE_INTENSITY, "/sys/class/leds/vibrator/intensity");
    EXPECT_EQ(THE_DEVICE_FORCE_TOUCH_INTENSITY, "/sys/class/leds/vibrator/force_touch_intensity");
    EXPECT_EQ(THE_DEVICE_MULTI_FREQ, "/sys/class/leds/vibrator/multi_freq");
    EXPECT_EQ(THE_DEVICE_HAPTIC_ENGINE, "/sys/class/leds/vibrator/haptic_engine");
    EXPECT_EQ(THE_DEVICE_HAPTIC_ENGINE_INDEX, "/sys/class/leds/vibrator/cp_trigger_index");
    EXPECT_EQ(THE_DEVICE_HAPTIC_PLAYBACK_QUEUE, "/sys/class/leds/vibrator/cp_trigger_queue");
    EXPECT_EQ(THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES, "/sys/class/leds/vibrator/num_waves");
    EXPECT_EQ(THE_DEVICE_MOTOR_TYPE, "/sys/class/leds/vibrator/motor_type");
    EXPECT_EQ(THE_DEVICE_EVENT_CMD, "/sys/class/leds/vibrator/event_cmd");
    EXPECT_EQ(THE_DEVICE_PATTERN_LENGTH, "/sys/class/leds/vibrator/pattern_length");
    EXPECT_EQ(THE_DEVICE_EXT_CONTROL, "/sys/class/leds/vibrator/ext_control");
    EXPECT_EQ(THE_DEVICE_CAL_INTENSITIES, "/sys/class/leds/vibrator/intensities");
    EXPECT_EQ(THE_DEVICE_CAL_HAPTIC_INTENSITIES, "/sys/class/leds/vibrator/haptic_intensities");
    EXPECT_EQ(THE_DEVICE_ASP_ENABLE, "/sys/class/leds/vibrator/asp_enable");
    EXPECT_EQ(THE_DEVICE_GPIO1_FALL_INDEX, "/sys/class/leds/vibrator/gpio1_fall_index");
    EXPECT_EQ(THE_DEVICE_GPIO1_FALL_DIG_SCALE, "/sys/class/leds/vibrator/gpio1_fall_dig_scale");
    EXPECT_EQ(THE_DEVICE_GPIO1_RISE_INDEX, "/sys/class/leds/vibrator/gpio1_rise_index");
    EXPECT_EQ(THE_DEVICE_GPIO1_RISE_DIG_SCALE, "/sys/class/leds/vibrator/gpio1_rise_dig_scale");
    EXPECT_EQ(THE_DEVICE_VIB_STATE, "/sys/class/leds/vibrator/vibe_state");
    EXPECT_EQ(THE_DEVICE_FIFO_HAPTIC_ENGINE, "/sys/class/leds/vibrator/fifo");
    EXPECT_EQ(THE_DEVICE_HYBRID_HAPTIC_ENGINE, "/sys/class/leds/vibrator/hybrid_haptic_engine");
    EXPECT_EQ(THE_DEVICE_FF, "");
}

TEST_F(Probing, LedsClassStartsWithExactlyTheseCalls) {
    addLedsClass();
    kernel.addNode(kLeds + "haptic_engine");
    kernel.addNode(kLeds + "asp_enable");
    { const HwApi hwApi; }
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/timed_output/vibrator/enable O_RDWR = ENOENT",
                            "open /sys/class/leds/vibrator/activate O_RDWR",
                            "close /sys/class/leds/vibrator/activate",
                            "open /sys/class/leds/vibrator/duration O_RDWR",
                            "close /sys/class/leds/vibrator/duration",
                            "open /sys/class/leds/vibrator/state O_RDWR",
                            "close /sys/class/leds/vibrator/state",
                            "fopen /sys/class/leds/vibrator/asp_enable r+",
                            "fopen /sys/class/leds/vibrator/gpio1_fall_index r+ = ENOENT",
                            "fopen /sys/class/leds/vibrator/gpio1_fall_dig_scale r+ = ENOENT",
                            "fopen /sys/class/leds/vibrator/gpio1_rise_index r+ = ENOENT",
                            "fopen /sys/class/leds/vibrator/gpio1_rise_dig_scale r+ = ENOENT",
                            "fopen /sys/class/leds/vibrator/vibe_state r = ENOENT",
                            "open /sys/class/leds/vibrator/cp_trigger_index O_RDWR = ENOENT",
                            "open /sys/class/leds/vibrator/haptic_engine O_RDWR",
                            "close /sys/class/leds/vibrator/haptic_engine",
                            "close /sys/class/leds/vibrator/asp_enable"));
}

TEST_F(Probing, LegacyClassLogsExactlyTheseLines) {
    addLegacyClass();
    const HwApi hwApi;
    EXPECT_THAT(
            log.lines(),
            ElementsAre(
                    "I HW_API: isNodeExist node:/timed_output/vibrator/enable", "I HW_API: true",
                    "I HW_API: Vibrator using timed_output",
                    "I HW_API: isNodeExistForWrite "
                    "node:/sys/class/timed_output/vibrator/use_kyp_index - false",
                    "I HW_API: Vibrator THE_DEVICE_INTENSITY : /timed_output/vibrator/intensity",
                    "I HW_API: Vibrator THE_DEVICE_FORCE_TOUCH_INTENSITY : "
                    "/timed_output/vibrator/force_touch_intensity",
                    "I HW_API: Vibrator THE_DEVICE_MULTI_FREQ : /timed_output/vibrator/multi_freq",
                    "I HW_API: Vibrator THE_DEVICE_HAPTIC_ENGINE : "
                    "/timed_output/vibrator/haptic_engine",
                    "I HW_API: Vibrator THE_DEVICE_HAPTIC_ENGINE_INDEX : "
                    "/timed_output/vibrator/cp_trigger_index",
                    "I HW_API: Vibrator THE_DEVICE_HAPTIC_PLAYBACK_QUEUE : "
                    "/timed_output/vibrator/cp_trigger_queue",
                    "I HW_API: Vibrator THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES : "
                    "/timed_output/vibrator/num_waves",
                    "I HW_API: Vibrator THE_DEVICE_MOTOR_TYPE : /timed_output/vibrator/motor_type",
                    "I HW_API: Vibrator THE_DEVICE_EVENT_CMD : /timed_output/vibrator/event_cmd",
                    "I HW_API: Vibrator THE_DEVICE_PATTERN_LENGTH : "
                    "/timed_output/vibrator/pattern_length",
                    "I HW_API: Vibrator THE_DEVICE_EXT_CONTROL : "
                    "/timed_output/vibrator/ext_control",
                    "I HW_API: Vibrator THE_DEVICE_CAL_INTENSITIES : "
                    "/timed_output/vibrator/intensities",
                    "I HW_API: Vibrator THE_DEVICE_CAL_HAPTIC_INTENSITIES : "
                    "/timed_output/vibrator/haptic_intensities",
                    "I HW_API: Vibrator THE_DEVICE_ASP_ENABLE : /timed_output/vibrator/asp_enable",
                    "I HW_API: Vibrator THE_DEVICE_GPIO1_FALL_INDEX : "
                    "/timed_output/vibrator/gpio1_fall_index",
                    "I HW_API: Vibrator THE_DEVICE_GPIO1_FALL_DIG_SCALE : "
                    "/timed_output/vibrator/gpio1_fall_dig_scale",
                    "I HW_API: Vibrator THE_DEVICE_GPIO1_RISE_INDEX : "
                    "/timed_output/vibrator/gpio1_rise_index",
                    "I HW_API: Vibrator THE_DEVICE_GPIO1_RISE_DIG_SCALE : "
                    "/timed_output/vibrator/gpio1_rise_dig_scale",
                    "I HW_API: Vibrator THE_DEVICE_VIB_STATE : /timed_output/vibrator/vibe_state",
                    "I HW_API: Vibrator THE_DEVICE_FIFO_HAPTIC_ENGINE : "
                    "/timed_output/vibrator/fifo",
                    "I HW_API: Vibrator THE_DEVICE_HYBRID_HAPTIC_ENGINE : "
                    "/timed_output/vibrator/hybrid_haptic_engine",
                    "E Failed to open /timed_output/vibrator/asp_enable (2): No such file or "
                    "directory",
                    "E Failed to open /timed_output/vibrator/gpio1_fall_index (2): No such file "
                    "or directory",
                    "E Failed to open /timed_output/vibrator/gpio1_fall_dig_scale (2): No such "
                    "file or directory",
                    "E Failed to open /timed_output/vibrator/gpio1_rise_index (2): No such file "
                    "or directory",
                    "E Failed to open /timed_output/vibrator/gpio1_rise_dig_scale (2): No such "
                    "file or directory",
                    "E Failed to open /timed_output/vibrator/vibe_state (2): No such file or "
                    "directory",
                    "I HW_API: isNodeExist node:/timed_output/vibrator/cp_trigger_index",
                    "I HW_API: false",
                    "I HW_API: isNodeExist node:/timed_output/vibrator/haptic_engine",
                    "I HW_API: false",
                    "I HW_API: isNodeExist node:/timed_output/vibrator/intensity",
                    "I HW_API: false", "I HW_API: getMotorPerformMethod type : 0"));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-CORE"));
}

TEST_F(Probing, LegacyClassWinsAndTheLedNodesAreNeverProbed) {
    addLegacyClass();
    addLedsClass();
    const HwApi hwApi;
    EXPECT_FALSE(useLedsClass);
    EXPECT_EQ(THE_DEVICE_INTENSITY, "/sys/class/timed_output/vibrator/intensity");
    EXPECT_THAT(kernel.calls(), Each(Not(HasSubstr("/sys/class/leds/"))));
}

TEST_F(Probing, ReadOnlyLegacyNodeIsNoLegacyClass) {
    kernel.addNode(kLegacy + "enable", "0\n", Access::kReadOnly);
    addLedsClass();
    const HwApi hwApi;
    EXPECT_TRUE(useLedsClass);
}

TEST_F(Probing, LedNodesAreProbedInOrderUpToTheFirstMissingOne) {
    kernel.addNode(kLeds + "activate");
    kernel.addNode(kLeds + "state");
    const HwApi hwApi;
    EXPECT_THAT(kernel.calls(), Contains("open /sys/class/leds/vibrator/duration O_RDWR = ENOENT"));
    EXPECT_THAT(kernel.calls(), Each(Not(StartsWith("open /sys/class/leds/vibrator/state"))));
}

TEST_F(Probing, LedsWithoutStateNodeGoOnToForceFeedback) {
    kernel.addNode(kLeds + "activate");
    kernel.addNode(kLeds + "duration");
    const HwApi hwApi;
    EXPECT_FALSE(useLedsClass);
    EXPECT_EQ(THE_DEVICE_INTENSITY, "");
    EXPECT_THAT(log.lines(), Contains("I HW_API: Fail to find CS40L26 info"));
}

TEST_F(Probing, NoDeviceLeavesEverythingEmptyAndStarts) {
    const HwApi hwApi;
    EXPECT_FALSE(useLedsClass);
    EXPECT_FALSE(useForceFeedback);
    EXPECT_FALSE(useKypIndex);
    EXPECT_EQ(motorPerformMethod, 0);
    EXPECT_EQ(THE_DEVICE_FF, "");
    EXPECT_EQ(THE_DEVICE_EVENT_CMD, "");
    EXPECT_EQ(THE_DEVICE_HYBRID_HAPTIC_ENGINE, "");
    EXPECT_THAT(log.lines(), IsSupersetOf({"I HW_API: Fail to find CS40L26 info",
                                           "I HW_API: Vibrator THE_DEVICE_INTENSITY : ",
                                           "I HW_API: Vibrator THE_DEVICE_HYBRID_HAPTIC_ENGINE : ",
                                           "E Failed to open  (2): No such file or directory",
                                           "I HW_API: getMotorPerformMethod type : 0"}));
    EXPECT_THAT(log.lines(), Contains("E Failed to open  (2): No such file or directory").Times(6));
}

TEST_F(Probing, LegacyClassIsSwitchedToThePlatformsIndices) {
    addLegacyClass();
    kernel.addNode(kLegacy + "use_kyp_index", "", Access::kWriteOnly);
    const HwApi hwApi;
    EXPECT_TRUE(useKypIndex);
    EXPECT_THAT(kernel.writes(),
                ElementsAre("/sys/class/timed_output/vibrator/use_kyp_index \"1\\n\""));
    EXPECT_THAT(log.lines(), Contains("I HW_API: >> writeNodeByStringOnlyForWriting "
                                      "node:/timed_output/vibrator/use_kyp_index val:1"));
}

TEST_F(Probing, IndexSwitchCountsEvenWhereItsWriteFails) {
    addLegacyClass();
    kernel.addNode(kLegacy + "use_kyp_index", "", Access::kWriteOnly);
    kernel.addFault(
            {.path = kLegacy + "use_kyp_index", .operation = Operation::kWrite, .error = EIO});
    const HwApi hwApi;
    EXPECT_TRUE(useKypIndex);
}

TEST_F(Probing, MissingIndexSwitchLeavesTheDriversIndices) {
    addLegacyClass();
    const HwApi hwApi;
    EXPECT_FALSE(useKypIndex);
}

TEST_F(Probing, LedsClassHasNoIndexSwitch) {
    addLedsClass();
    kernel.addNode(kLeds + "use_kyp_index");
    const HwApi hwApi;
    EXPECT_FALSE(useKypIndex);
    EXPECT_THAT(kernel.calls(), Each(Not(HasSubstr("use_kyp_index"))));
}

TEST_F(Probing, InterruptedProbesAreRepeated) {
    addLedsClass();
    for (const char* leaf : {"activate", "duration", "state"}) {
        kernel.addFault(
                {.path = kLeds + leaf, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    }
    const HwApi hwApi;
    EXPECT_TRUE(useLedsClass);
}

TEST_F(Probing, PerformMethodIsKeptForTheProcess) {
    addLedsClass();
    kernel.addNode(kLeds + "intensity");
    const HwApi hwApi;
    EXPECT_EQ(motorPerformMethod, 3);
    kernel.addNode(kLeds + "cp_trigger_index");
    EXPECT_EQ(motorPerformMethod, 3);
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
