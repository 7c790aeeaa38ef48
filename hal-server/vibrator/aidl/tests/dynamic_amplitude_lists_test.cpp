// SPDX-License-Identifier: Apache-2.0
//
// The extension's amplitude lists from the driver.
#include <cerrno>
#include <memory>
#include <string>
#include <vector>

#include "tests/amplitude_list_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::StartsWith;

class DynamicAmplitudeList : public AmplitudeList {
  protected:
    void addInformationLists(const std::string& intensities, const std::string& hapticIntensities) {
        kernel.addNode(kInfo + "intensities", intensities, Access::kReadOnly);
        kernel.addNode(kInfo + "haptic_intensities", hapticIntensities, Access::kReadOnly);
    }

    void addDeviceLists(const std::string& intensities, const std::string& hapticIntensities) {
        kernel.addNode(kLeds + "intensities", intensities, Access::kReadOnly);
        kernel.addNode(kLeds + "haptic_intensities", hapticIntensities, Access::kReadOnly);
    }
};

TEST_F(DynamicAmplitudeList, ComesFromTheDriverAndTheMotorIsNotAsked) {
    addInformationLists("0,1800, 3600,10000\n", "0,2200\n");
    const auto extension = makeExtension(motor);
    EXPECT_EQ(get(*extension, ZelAmplitudeType::DEFAULT), EX_NONE);
    EXPECT_THAT(list, ElementsAre(0, 1800, 3600, 10000));
    EXPECT_THAT(
            log.lines(),
            ElementsAre("I V_4_0: getAmplitudeList", "I V_4_0: getAmplitudeList amplitude type: 0",
                        "I HW_API: [isDynamicIntensityNodeExist]new dynamic intensity node exist",
                        "I V_4_0: Support Dynamic Intensity",
                        "I V_2_0: [getDynamicIntensityList]isDefaultType: 1",
                        "I HW_API: >> readNodeAsString "
                        "node:/vib_info_class/vib_support_info/intensities",
                        "I HW_API: << readNodeAsString success - length: 18",
                        "I V_2_0: [getDynamicIntensityList]raw value: 0,1800, 3600,10000",
                        "I V_2_0: [getDynamicIntensityList]list size: 4"));
    EXPECT_EQ(get(*extension, ZelAmplitudeType::HAPTIC), EX_NONE);
    EXPECT_THAT(list, ElementsAre(0, 2200));
    EXPECT_EQ(log.lines().back(), "I V_2_0: [getDynamicIntensityList]list size: 2");
    EXPECT_EQ(motor->asked, 0);
    EXPECT_EQ(motor->askedByMethod, 0);
}

TEST_F(DynamicAmplitudeList, ComesFromTheDeviceClassWhereTheInformationClassHasNone) {
    addDeviceLists("0,1\n", "0,2\n");
    const auto extension = makeExtension();
    EXPECT_EQ(get(*extension, ZelAmplitudeType::DEFAULT), EX_NONE);
    EXPECT_THAT(list, ElementsAre(0, 1));
    EXPECT_EQ(get(*extension, ZelAmplitudeType::HAPTIC), EX_NONE);
    EXPECT_THAT(list, ElementsAre(0, 2));
    EXPECT_THAT(log.lines(), Not(Contains("I HW_API: getMotorIndex return motor type >>")));
}

TEST_F(DynamicAmplitudeList, OfTheInformationClassGoesFirst) {
    addDeviceLists("0,1\n", "0,2\n");
    addInformationLists("0,3\n", "0,4\n");
    const auto extension = makeExtension();
    EXPECT_EQ(get(*extension, ZelAmplitudeType::DEFAULT), EX_NONE);
    EXPECT_THAT(list, ElementsAre(0, 3));
    EXPECT_EQ(get(*extension, ZelAmplitudeType::HAPTIC), EX_NONE);
    EXPECT_THAT(list, ElementsAre(0, 4));
}

TEST_F(DynamicAmplitudeList, OneNodeOfTheTwoIsNone) {
    kernel.addNode(kInfo + "intensities", "0,1\n", Access::kReadOnly);
    kernel.addNode(kLeds + "haptic_intensities", "0,2\n", Access::kReadOnly);
    motor->named = 3;
    const auto extension = makeExtension(motor);
    EXPECT_EQ(get(*extension, ZelAmplitudeType::DEFAULT), EX_NONE);
    EXPECT_THAT(list, ElementsAre(0, 1000, 5000, 9000));
}

TEST_F(DynamicAmplitudeList, WithoutNumbersIsAnIllegalStateAndTheFixedListsAreNotAsked) {
    motor->named = 3;
    const auto extension = makeExtension(motor);
    for (const char* text : {"", "\n", ",,", "none\n"}) {
        addInformationLists(text, "0,4\n");
        EXPECT_EQ(get(*extension, ZelAmplitudeType::DEFAULT), EX_ILLEGAL_STATE) << text;
        EXPECT_THAT(list, IsEmpty());
        EXPECT_EQ(log.lines().back(), "I V_4_0: Fail - Dynamic Intensity List Read Fail");
    }
    EXPECT_EQ(get(*extension, ZelAmplitudeType::HAPTIC), EX_NONE);
    EXPECT_EQ(motor->asked, 0);
}

TEST_F(DynamicAmplitudeList, ThatCannotBeReadIsAnIllegalState) {
    addInformationLists("0,1\n", "0,2\n");
    const auto extension = makeExtension();
    kernel.addFault(
            {.path = kInfo + "haptic_intensities", .operation = Operation::kRead, .error = EIO});
    EXPECT_EQ(get(*extension, ZelAmplitudeType::HAPTIC), EX_ILLEGAL_STATE);
    EXPECT_THAT(list, IsEmpty());
}

// A driver's list that fails after it was read in part.
class HalfReadList : public core::HwApi {
  public:
    bool isDynamicIntensityNodeExist() override { return true; }
    bool getDynamicIntensityList(bool /*isDefaultType*/, std::vector<int>& list) override {
        list = {0, 1000};
        return false;
    }
};

TEST_F(DynamicAmplitudeList, ThatFailsHalfWayLeavesTheVectorEmpty) {
    const auto extension = makeExtension(std::make_shared<HalfReadList>());
    EXPECT_EQ(get(*extension), EX_ILLEGAL_STATE);
    EXPECT_THAT(list, IsEmpty());
    EXPECT_THAT(log.lines(), ElementsAre("I V_4_0: getAmplitudeList",
                                         "I V_4_0: getAmplitudeList amplitude type: 0",
                                         "I V_4_0: Support Dynamic Intensity",
                                         "I V_4_0: Fail - Dynamic Intensity List Read Fail"));
}

TEST_F(DynamicAmplitudeList, IsThereOnForceFeedbackToo) {
    removeLedsClass();
    addForceFeedback();
    addInformationLists("0,3\n", "0,4\n");
    EXPECT_EQ(get(*makeExtension()), EX_NONE);
    EXPECT_THAT(list, ElementsAre(0, 3));
}

}  // namespace
}  // namespace aidl::vendor::quorvan::hardware::vibrator
