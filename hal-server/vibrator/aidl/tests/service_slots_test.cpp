// SPDX-License-Identifier: Apache-2.0
//
// The order of both services' virtual operations: the destructor's two entries, the binder base's
// four, then the interface in the order in which it is declared.
#include <gtest/gtest.h>

#include "Vibrator.h"
#include "Vibrator_vendor.h"
#include "tests/virtual_slot.h"

namespace {

TEST(VibratorSlots, FollowTheInterface) {
    using aidl::android::hardware::vibrator::Vibrator;
    EXPECT_EQ(virtualSlot(&Vibrator::asBinder), 2);
    EXPECT_EQ(virtualSlot(&Vibrator::getCapabilities), 6);
    EXPECT_EQ(virtualSlot(&Vibrator::off), 7);
    EXPECT_EQ(virtualSlot(&Vibrator::on), 8);
    EXPECT_EQ(virtualSlot(&Vibrator::perform), 9);
    EXPECT_EQ(virtualSlot(&Vibrator::getSupportedEffects), 10);
    EXPECT_EQ(virtualSlot(&Vibrator::setAmplitude), 11);
    EXPECT_EQ(virtualSlot(&Vibrator::setExternalControl), 12);
    EXPECT_EQ(virtualSlot(&Vibrator::getCompositionDelayMax), 13);
    EXPECT_EQ(virtualSlot(&Vibrator::getCompositionSizeMax), 14);
    EXPECT_EQ(virtualSlot(&Vibrator::getSupportedPrimitives), 15);
    EXPECT_EQ(virtualSlot(&Vibrator::getPrimitiveDuration), 16);
    EXPECT_EQ(virtualSlot(&Vibrator::compose), 17);
    EXPECT_EQ(virtualSlot(&Vibrator::getSupportedAlwaysOnEffects), 18);
    EXPECT_EQ(virtualSlot(&Vibrator::alwaysOnEnable), 19);
    EXPECT_EQ(virtualSlot(&Vibrator::alwaysOnDisable), 20);
    EXPECT_EQ(virtualSlot(&Vibrator::getResonantFrequency), 21);
    EXPECT_EQ(virtualSlot(&Vibrator::getQFactor), 22);
    EXPECT_EQ(virtualSlot(&Vibrator::getFrequencyResolution), 23);
    EXPECT_EQ(virtualSlot(&Vibrator::getFrequencyMinimum), 24);
    EXPECT_EQ(virtualSlot(&Vibrator::getBandwidthAmplitudeMap), 25);
    EXPECT_EQ(virtualSlot(&Vibrator::getPwlePrimitiveDurationMax), 26);
    EXPECT_EQ(virtualSlot(&Vibrator::getPwleCompositionSizeMax), 27);
    EXPECT_EQ(virtualSlot(&Vibrator::getSupportedBraking), 28);
    EXPECT_EQ(virtualSlot(&Vibrator::composePwle), 29);
    EXPECT_EQ(virtualSlot(&Vibrator::getInterfaceVersion), 30);
    EXPECT_EQ(virtualSlot(&Vibrator::getInterfaceHash), 31);
}

TEST(ExtensionVibratorSlots, FollowTheInterface) {
    using aidl::vendor::quorvan::hardware::vibrator::Vibrator;
    EXPECT_EQ(virtualSlot(&Vibrator::asBinder), 2);
    EXPECT_EQ(virtualSlot(&Vibrator::supportsAmplitudeControl), 6);
    EXPECT_EQ(virtualSlot(&Vibrator::supportsForceTouchAmplitudeControl), 7);
    EXPECT_EQ(virtualSlot(&Vibrator::supportsFrequencyControl), 8);
    EXPECT_EQ(virtualSlot(&Vibrator::supportsHapticEngine), 9);
    EXPECT_EQ(virtualSlot(&Vibrator::supportsPrebakedHapticPattern), 10);
    EXPECT_EQ(virtualSlot(&Vibrator::supportsFolderStatusSetting), 11);
    EXPECT_EQ(virtualSlot(&Vibrator::supportsEnhancedQuorvanHapticPattern), 12);
    EXPECT_EQ(virtualSlot(&Vibrator::setAmplitude), 13);
    EXPECT_EQ(virtualSlot(&Vibrator::setForceTouchAmplitude), 14);
    EXPECT_EQ(virtualSlot(&Vibrator::setFrequencyType), 15);
    EXPECT_EQ(virtualSlot(&Vibrator::setFolderStatus), 16);
    EXPECT_EQ(virtualSlot(&Vibrator::getNumberOfPrebakedHapticPattern), 17);
    EXPECT_EQ(virtualSlot(&Vibrator::performHapticEngine), 18);
    EXPECT_EQ(virtualSlot(&Vibrator::performPrebakedHapticPattern), 19);
    EXPECT_EQ(virtualSlot(&Vibrator::getAmplitudeList), 20);
    EXPECT_EQ(virtualSlot(&Vibrator::perform), 21);
    EXPECT_EQ(virtualSlot(&Vibrator::performPlaybackEngine), 22);
    EXPECT_EQ(virtualSlot(&Vibrator::supportsFifoHapticEngine), 23);
    EXPECT_EQ(virtualSlot(&Vibrator::supportsHybridHapticEngine), 24);
    EXPECT_EQ(virtualSlot(&Vibrator::supportsEnhancedHybridHapticPattern), 25);
    EXPECT_EQ(virtualSlot(&Vibrator::performFifoHapticEngine), 26);
    EXPECT_EQ(virtualSlot(&Vibrator::performHybridHapticEngine), 27);
    EXPECT_EQ(virtualSlot(&Vibrator::supportsFolderTentModeStatusSetting), 28);
    EXPECT_EQ(virtualSlot(&Vibrator::setFolderTentModeStatus), 29);
    EXPECT_EQ(virtualSlot(&Vibrator::supportsHasFeature), 30);
    EXPECT_EQ(virtualSlot(&Vibrator::hasFeature), 31);
    EXPECT_EQ(virtualSlot(&Vibrator::getInterfaceVersion), 32);
    EXPECT_EQ(virtualSlot(&Vibrator::getInterfaceHash), 33);
}

}  // namespace
