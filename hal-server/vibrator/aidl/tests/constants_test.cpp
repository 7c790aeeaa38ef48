// SPDX-License-Identifier: Apache-2.0
//
// The driver's fixed names, written out a second time.
#include "Constants.h"

#include <cstdlib>
#include <string>

#include <gtest/gtest.h>

#include "HwApi.h"
#include "hwapi/DriverWriter.h"
#include "tests/node_paths.h"

namespace aidl::android::hardware::vibrator {
namespace {

TEST(Constants, NodePathsAreTheDrivers) {
    EXPECT_STREQ(TIMED_OUTPUT_ENABLE, "/sys/class/timed_output/vibrator/enable");
    EXPECT_STREQ(LEDS_ACTIVATE, "/sys/class/leds/vibrator/activate");
    EXPECT_STREQ(LEDS_DURATION, "/sys/class/leds/vibrator/duration");
    EXPECT_STREQ(LEDS_STATE, "/sys/class/leds/vibrator/state");
    EXPECT_STREQ(DC_PMIC, "/sys/class/qvx/vib/dc_pmic");
    EXPECT_STREQ(VIB_INFO_INTENSITIES, "/sys/class/vib_info_class/vib_support_info/intensities");
    EXPECT_STREQ(VIB_INFO_HAPTIC_INTENSITIES,
                 "/sys/class/vib_info_class/vib_support_info/haptic_intensities");
    EXPECT_STREQ(VIB_INFO_FUNCTIONS, "/sys/class/vib_info_class/vib_support_info/functions");
    EXPECT_STREQ(CALIBRATION_FILE, "/efs/FactoryApp/vibrator_calibration");
    EXPECT_STREQ(INPUTFF_F0_STORED, "/sys/class/qvx_vib_inputff/control/f0_stored");
    EXPECT_STREQ(TIMED_OUTPUT_USE_KYP_INDEX, "/sys/class/timed_output/vibrator/use_kyp_index");
    EXPECT_STREQ(INPUTFF_USE_KYP_INDEX, "/sys/class/qvx_vib_inputff/control/use_kyp_index");
}

TEST(Constants, FoldableCommandsEndInANewlineAndNothingElse) {
    EXPECT_EQ(std::string(FOLDER_OPEN), "FOLDER_OPEN\n");
    EXPECT_EQ(std::string(FOLDER_CLOSE), "FOLDER_CLOSE\n");
    EXPECT_EQ(std::string(FOLDER_TENT_OPEN), "FOLDER_TENT_OPEN\n");
    EXPECT_EQ(std::string(FOLDER_TENT_CLOSE), "FOLDER_TENT_CLOSE\n");
    EXPECT_EQ(sizeof(FOLDER_OPEN) - 1, 12U);
    EXPECT_EQ(sizeof(FOLDER_CLOSE) - 1, 13U);
    EXPECT_EQ(sizeof(FOLDER_TENT_OPEN) - 1, 17U);
    EXPECT_EQ(sizeof(FOLDER_TENT_CLOSE) - 1, 18U);
}

TEST(Constants, ThirteenMotorTypesHaveTheirIndices) {
    EXPECT_EQ(MOTOR_TYPE_NAMES.size(), 13U);
    EXPECT_EQ(findMotorIndex("NONE"), 0);
    EXPECT_EQ(findMotorIndex("COINDC"), 1);
    EXPECT_EQ(findMotorIndex("LINEAR"), 2);
    EXPECT_EQ(findMotorIndex("COINDC_PMIC"), 3);
    EXPECT_EQ(findMotorIndex("COINDC_INDEX"), 4);
    EXPECT_EQ(findMotorIndex("LINEAR_INDEX"), 5);
    EXPECT_EQ(findMotorIndex("LINEAR_0832RC"), 6);
    EXPECT_EQ(findMotorIndex("LINEAR_1040"), 7);
    EXPECT_EQ(findMotorIndex("LINEAR_RCVMOT"), 8);
    EXPECT_EQ(findMotorIndex("LINEAR_1030"), 9);
    EXPECT_EQ(findMotorIndex("LINEAR_INDEX_RC"), 10);
    EXPECT_EQ(findMotorIndex("LINEAR_WATCH"), 11);
    EXPECT_EQ(findMotorIndex("LINEAR_ACTIVE"), 12);
}

TEST(Constants, MotorTypeIsFoundByItsExactNameOnly) {
    EXPECT_EQ(findMotorIndex("linear_1040"), std::nullopt);
    EXPECT_EQ(findMotorIndex("LINEAR_104"), std::nullopt);
    EXPECT_EQ(findMotorIndex("LINEAR_1040 "), std::nullopt);
    EXPECT_EQ(findMotorIndex(""), std::nullopt);
}

TEST(Constants, ThirteenFeaturesStandAtTheirValues) {
    const auto word = [](qvx_features feature) {
        return FEATURE_NAMES.at(static_cast<size_t>(feature));
    };
    EXPECT_EQ(FEATURE_NAMES.size(), 13U);
    EXPECT_EQ(FEATURE_NAMES[0], "INTENSITY");
    EXPECT_EQ(FEATURE_NAMES[1], "FORCE_TOUCH_INTENSITY");
    EXPECT_EQ(FEATURE_NAMES[2], "MULTI_FREQUENCY");
    EXPECT_EQ(FEATURE_NAMES[3], "HAPTIC_ENGINE");
    EXPECT_EQ(FEATURE_NAMES[4], "INDEX_HAPTIC_PATTERN");
    EXPECT_EQ(FEATURE_NAMES[5], "KYPINDEX_HAPTIC_PATTERN");
    EXPECT_EQ(FEATURE_NAMES[6], "ENHANCED_HAPTIC_ENGINE");
    EXPECT_EQ(FEATURE_NAMES[7], "FIFO_HAPTIC_ENGINE");
    EXPECT_EQ(FEATURE_NAMES[8], "HYBRID_HAPTIC_ENGINE");
    EXPECT_EQ(FEATURE_NAMES[9], "ENHANCED_HYBRID_HAPTIC_ENGINE");
    EXPECT_EQ(FEATURE_NAMES[10], "CAPABILITY_EXTERNAL_CONTROL");
    EXPECT_EQ(FEATURE_NAMES[11], "COMMON_INPUTFF_INTERFACE");
    EXPECT_EQ(FEATURE_NAMES[12], "PRIMITIVE_EFFECT_COMPOSE");
    EXPECT_EQ(word(qvx_features::INTENSITY), "INTENSITY");
    EXPECT_EQ(word(qvx_features::FORCE_TOUCH_INTENSITY), "FORCE_TOUCH_INTENSITY");
    EXPECT_EQ(word(qvx_features::MULTI_FREQUENCY), "MULTI_FREQUENCY");
    EXPECT_EQ(word(qvx_features::HAPTIC_ENGINE), "HAPTIC_ENGINE");
    EXPECT_EQ(word(qvx_features::INDEX_HAPTIC_PATTERN), "INDEX_HAPTIC_PATTERN");
    EXPECT_EQ(word(qvx_features::KYPINDEX_HAPTIC_PATTERN), "KYPINDEX_HAPTIC_PATTERN");
    EXPECT_EQ(word(qvx_features::ENHANCED_HAPTIC_ENGINE), "ENHANCED_HAPTIC_ENGINE");
    EXPECT_EQ(word(qvx_features::FIFO_HAPTIC_ENGINE), "FIFO_HAPTIC_ENGINE");
    EXPECT_EQ(word(qvx_features::HYBRID_HAPTIC_ENGINE), "HYBRID_HAPTIC_ENGINE");
    EXPECT_EQ(word(qvx_features::ENHANCED_HYBRID_HAPTIC_ENGINE), "ENHANCED_HYBRID_HAPTIC_ENGINE");
    EXPECT_EQ(word(qvx_features::CAPABILITY_EXTERNAL_CONTROL), "CAPABILITY_EXTERNAL_CONTROL");
    EXPECT_EQ(word(qvx_features::COMMON_INPUTFF_INTERFACE), "COMMON_INPUTFF_INTERFACE");
    EXPECT_EQ(word(qvx_features::PRIMITIVE_EFFECT_COMPOSE), "PRIMITIVE_EFFECT_COMPOSE");
}

TEST(Constants, PerformMethodsHaveTheirNumbers) {
    EXPECT_EQ(PERFORM_NONE, 0);
    EXPECT_EQ(PERFORM_PREBAKED_INDEX, 1);
    EXPECT_EQ(PERFORM_HAPTIC_ENGINE, 2);
    EXPECT_EQ(PERFORM_AMPLITUDE, 3);
}

bool processWideValuesAreEmpty() {
    bool empty = !useLedsClass && !useForceFeedback && !useKypIndex && motorPerformMethod == 0 &&
                 inputFD == -1;
    for (const std::string* path : kNodePaths) empty = empty && path->empty();
    return empty;
}

TEST(ProcessWideValuesDeathTest, StartEmpty) {
    // In a process of its own, which no other test has been in before.
    GTEST_FLAG_SET(death_test_style, "fast");
    EXPECT_EXIT(exit(processWideValuesAreEmpty() ? 0 : 1), ::testing::ExitedWithCode(0), "");
}

TEST(LogText, PathIsWrittenFromItsEleventhCharacter) {
    EXPECT_EQ(fromClass("/sys/class/leds/vibrator/state"), "/leds/vibrator/state");
    EXPECT_EQ(fromClass("/efs/FactoryApp/x"), "ryApp/x");
}

TEST(LogText, ShorterPathIsWrittenAsNothing) {
    EXPECT_EQ(fromClass("/sys/class"), "");
    EXPECT_EQ(fromClass("/dev"), "");
    EXPECT_EQ(fromClass(""), "");
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
