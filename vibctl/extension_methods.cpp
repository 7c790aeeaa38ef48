// SPDX-License-Identifier: Apache-2.0
//
// The methods of the vendor extension interface, and how its packets are written.
#include "vibctl/methods.h"

namespace vibctl {

using aidl::vendor::quorvan::hardware::vibrator::ZelHapticEnginePacket;
using aidl::vendor::quorvan::hardware::vibrator::ZelHybridHapticEnginePacket;
using aidl::vendor::quorvan::hardware::vibrator::ZelHybridHapticEnginePacketType;
using aidl::vendor::quorvan::hardware::vibrator::ZelPlaybackPacket;

template <>
struct Argument<ZelHapticEnginePacket> {
    static Problem parse(const std::string& name, const std::string& word,
                         ZelHapticEnginePacket& value) {
        return parsePacket(name, word, value.time, value.intensity, value.frequency,
                           value.overdrive);
    }

    static std::string accepted() { return "any count of these, every field an integer"; }
};

template <>
struct Argument<ZelHybridHapticEnginePacket> {
    static Problem parse(const std::string& name, const std::string& word,
                         ZelHybridHapticEnginePacket& value) {
        return parsePacket(name, word, value.time, value.intensity, value.type, value.value,
                           value.frequency);
    }

    static std::string accepted() {
        return "any count of these; TYPE is " +
               Argument<ZelHybridHapticEnginePacketType>::accepted();
    }
};

template <>
struct Argument<ZelPlaybackPacket> {
    static Problem parse(const std::string& name, const std::string& word,
                         ZelPlaybackPacket& value) {
        return parsePacket(name, word, value.patternIndex, value.level, value.option);
    }

    static std::string accepted() { return "any count of these, every field an integer"; }
};

namespace {

// clang-format off
constexpr Method kExtensionMethods[] = {
        row<&IZelVibrator::supportsAmplitudeControl>("supportsAmplitudeControl"),
        row<&IZelVibrator::supportsForceTouchAmplitudeControl>("supportsForceTouchAmplitudeControl"),
        row<&IZelVibrator::supportsFrequencyControl>("supportsFrequencyControl"),
        row<&IZelVibrator::supportsHapticEngine>("supportsHapticEngine"),
        row<&IZelVibrator::supportsPrebakedHapticPattern>("supportsPrebakedHapticPattern"),
        row<&IZelVibrator::supportsFolderStatusSetting>("supportsFolderStatusSetting"),
        row<&IZelVibrator::supportsEnhancedQuorvanHapticPattern>("supportsEnhancedQuorvanHapticPattern"),
        row<&IZelVibrator::setAmplitude>("setAmplitude", "AMPLITUDE"),
        row<&IZelVibrator::setForceTouchAmplitude>("setForceTouchAmplitude", "AMPLITUDE"),
        row<&IZelVibrator::setFrequencyType>("setFrequencyType", "FREQUENCY_TYPE"),
        row<&IZelVibrator::setFolderStatus>("setFolderStatus", "FOLDER_STATUS"),
        row<&IZelVibrator::getNumberOfPrebakedHapticPattern>("getNumberOfPrebakedHapticPattern"),
        row<&IZelVibrator::performHapticEngine>("performHapticEngine", "AMPLITUDE TIME,INTENSITY,FREQUENCY,OVERDRIVE..."),
        row<&IZelVibrator::performPrebakedHapticPattern>("performPrebakedHapticPattern", "PATTERN_INDEX AMPLITUDE REPEAT"),
        row<&IZelVibrator::getAmplitudeList>("getAmplitudeList", "AMPLITUDE_TYPE"),
        row<&IZelVibrator::perform>("perform", "EFFECT AMPLITUDE", kMilliseconds),
        row<&IZelVibrator::performPlaybackEngine>("performPlaybackEngine", "REPEAT REPEAT_COUNT PATTERN_INDEX,LEVEL,OPTION..."),
        row<&IZelVibrator::supportsFifoHapticEngine>("supportsFifoHapticEngine"),
        row<&IZelVibrator::supportsHybridHapticEngine>("supportsHybridHapticEngine"),
        row<&IZelVibrator::supportsEnhancedHybridHapticPattern>("supportsEnhancedHybridHapticPattern"),
        row<&IZelVibrator::performFifoHapticEngine>("performFifoHapticEngine", "FIFO_TYPE"),
        row<&IZelVibrator::performHybridHapticEngine>("performHybridHapticEngine", "AMPLITUDE TIME,INTENSITY,TYPE,VALUE,FREQUENCY..."),
        row<&IZelVibrator::supportsFolderTentModeStatusSetting>("supportsFolderTentModeStatusSetting"),
        row<&IZelVibrator::setFolderTentModeStatus>("setFolderTentModeStatus", "TENT_MODE_STATUS"),
        row<&IZelVibrator::supportsHasFeature>("supportsHasFeature"),
        row<&IZelVibrator::hasFeature>("hasFeature", "FEATURE_NAME"),
        row<&IZelVibrator::getInterfaceVersion>("getInterfaceVersion"),
        row<&IZelVibrator::getInterfaceHash>("getInterfaceHash"),
};
// clang-format on

}  // namespace

std::span<const Method> extensionMethods() {
    return kExtensionMethods;
}

}  // namespace vibctl
