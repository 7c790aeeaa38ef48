// SPDX-License-Identifier: Apache-2.0
//
// The order and types of the hardware layer's virtual operations.
#include <cstdint>
#include <fstream>
#include <string>
#include <type_traits>
#include <vector>

#include <gtest/gtest.h>

#include "HwApi.h"
#include "tests/virtual_slot.h"

namespace aidl::android::hardware::vibrator {
namespace {

// Picks the operation by its exact type, which the test thereby asserts as well.
template <typename Signature>
int slot(Signature HwApi::*operation) {
    return virtualSlot(operation);
}

TEST(HwApiSlots, DestructorComesFirst) {
    EXPECT_TRUE(std::has_virtual_destructor_v<HwApi>);
}

TEST(HwApiSlots, EveryOperationStandsInItsSlotWithItsType) {
    using std::string;
    using Numbers = std::vector<int>;
    using Packets = std::vector<HapticEnginePacket>;
    EXPECT_EQ(slot<bool()>(&HwApi::hasAspEnable), 2);
    EXPECT_EQ(slot<bool(bool*)>(&HwApi::getAspEnable), 3);
    EXPECT_EQ(slot<bool(bool)>(&HwApi::setAspEnable), 4);
    EXPECT_EQ(slot<bool(uint32_t)>(&HwApi::setGpioFallIndex), 5);
    EXPECT_EQ(slot<bool(uint32_t)>(&HwApi::setGpioFallScale), 6);
    EXPECT_EQ(slot<bool(uint32_t)>(&HwApi::setGpioRiseIndex), 7);
    EXPECT_EQ(slot<bool(uint32_t)>(&HwApi::setGpioRiseScale), 8);
    EXPECT_EQ(slot<void(int)>(&HwApi::debug), 9);
    EXPECT_EQ(slot<bool(string, int)>(&HwApi::writeNode), 10);
    EXPECT_EQ(slot<bool(string, string)>(&HwApi::writeNodeByStringOnlyForWriting), 11);
    EXPECT_EQ(slot<int(string)>(&HwApi::readNode), 12);
    EXPECT_EQ(slot<string(string)>(&HwApi::readNodeAsString), 13);
    EXPECT_EQ(slot<bool(string)>(&HwApi::isNodeExist), 14);
    EXPECT_EQ(slot<bool(string)>(&HwApi::isNodeExistForRead), 15);
    EXPECT_EQ(slot<bool(string)>(&HwApi::isNodeExistForWrite), 16);
    EXPECT_EQ(slot<bool()>(&HwApi::isVibratorNodeExist), 17);
    EXPECT_EQ(slot<bool()>(&HwApi::isVibratorActiveNodeExist), 18);
    EXPECT_EQ(slot<bool()>(&HwApi::isVibratorDurationNodeExist), 19);
    EXPECT_EQ(slot<bool()>(&HwApi::isVibratorStateNodeExist), 20);
    EXPECT_EQ(slot<bool()>(&HwApi::isHapticEngineNodeExist), 21);
    EXPECT_EQ(slot<bool()>(&HwApi::isMotorTypeNodeExist), 22);
    EXPECT_EQ(slot<bool()>(&HwApi::isNumWavesNodeExist), 23);
    EXPECT_EQ(slot<bool()>(&HwApi::isDynamicIntensityNodeExist), 24);
    EXPECT_EQ(slot<bool()>(&HwApi::isPrebakedHapticPatternExist), 25);
    EXPECT_EQ(slot<bool()>(&HwApi::isAmplitudeControlExist), 26);
    EXPECT_EQ(slot<bool()>(&HwApi::isVibrating), 27);
    EXPECT_EQ(slot<bool(int)>(&HwApi::checkClientUID), 28);
    EXPECT_EQ(slot<int()>(&HwApi::getMotorIndex), 29);
    EXPECT_EQ(slot<int()>(&HwApi::getMotorIndexbyMethod), 30);
    EXPECT_EQ(slot<bool(int)>(&HwApi::do_on), 31);
    EXPECT_EQ(slot<bool()>(&HwApi::do_off), 32);
    EXPECT_EQ(slot<bool()>(&HwApi::supportsEnhancedQuorvanHapticPattern), 33);
    EXPECT_EQ(slot<int()>(&HwApi::getMotorPerformMethod), 34);
    EXPECT_EQ(slot<int(EffectStrength)>(&HwApi::setPerformAmplitude), 35);
    EXPECT_EQ(slot<void()>(&HwApi::performEffect_DOUBLE_CLICK), 36);
    EXPECT_EQ((slot<bool(Effect, int, int&)>(&HwApi::preparePerform)), 37);
    EXPECT_EQ((slot<bool(int, int, bool)>(&HwApi::performPrebakedHapticPattern)), 38);
    EXPECT_EQ((slot<bool(const Packets&, int)>(&HwApi::performHapticEngine)), 39);
    EXPECT_EQ(slot<bool(int)>(&HwApi::setAmplitude), 40);
    EXPECT_EQ(slot<bool(string)>(&HwApi::setAndTriggerOwt_primitve), 41);
    EXPECT_EQ((slot<bool(bool, Numbers&)>(&HwApi::getDynamicIntensityList)), 42);
    EXPECT_EQ((slot<char*(char*, char)>(&HwApi::parse_field)), 43);
    EXPECT_EQ(slot<int(qvx_features)>(&HwApi::hasFeature), 44);
    EXPECT_EQ(slot<char*(char)>(&HwApi::get_input_field_value), 45);
    EXPECT_EQ(slot<string(const string&)>(&HwApi::rtrim), 46);
    EXPECT_EQ(slot<void()>(&HwApi::initForceFeedbackEffect), 47);
    EXPECT_EQ(slot<bool()>(&HwApi::uploadForceFeedbackeffect), 48);
    EXPECT_EQ(slot<bool(int)>(&HwApi::setForceFeedbackIndex), 49);
    EXPECT_EQ(slot<bool(int)>(&HwApi::setForceFeedbackDuration), 50);
    EXPECT_EQ(slot<bool(int)>(&HwApi::setForceFeedbackAmplitude), 51);
    EXPECT_EQ(slot<bool(bool)>(&HwApi::triggerForceFeedbackVibration), 52);
    EXPECT_EQ(slot<bool()>(&HwApi::writeInputEvent), 53);
}

TEST(HwApiSlots, OperationsBesideTheTableAreNotVirtual) {
    EXPECT_EQ((slot<bool(int, int)>(&HwApi::setAndTriggerOwt)), -1);
    EXPECT_EQ((slot<void(const std::string&, std::fstream*)>(&HwApi::HwApiopen)), -1);
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
