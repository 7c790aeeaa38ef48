// SPDX-License-Identifier: Apache-2.0
//
// What the driver supports, as the extension answers it.
#define LOG_TAG "QvxVibrator-HAL-AIDL-EXT"

#include <fcntl.h>

#include <algorithm>
#include <optional>
#include <string>
#include <string_view>

#include <android-base/logging.h>

#include "Constants.h"
#include "ServiceStatus.h"
#include "Vibrator_vendor.h"
#include "hwapi/DriverWriter.h"

namespace aidl::vendor::quorvan::hardware::vibrator {

using core::HwApi;

struct FeatureQuery {
    const char* name;
    core::qvx_features feature;
    bool (*withoutList)(HwApi& hardware, const char* name);
};

struct LetterQuery {
    const char* name;
    const char* letters;
    core::NodeReader reader;
};

namespace {

// The answers where the driver has no list.

template <const std::string& Node>
bool hasNode(HwApi& hardware, const char* /*name*/) {
    return hardware.isNodeExist(Node);
}

// On force feedback yes, whatever nodes there are.
template <const std::string& Node>
bool hasNodeOrForceFeedback(HwApi& hardware, const char* name) {
    if (!core::useForceFeedback) return hardware.isNodeExist(Node);
    LOG(INFO) << "V_4_0: [" << name << "]return true";
    return true;
}

bool hasEnhancedPattern(HwApi& hardware, const char* /*name*/) {
    return hardware.supportsEnhancedQuorvanHapticPattern();
}

bool hasEnhancedHybridPattern(HwApi& hardware, const char* /*name*/) {
    return hardware.getMotorIndex() == core::MOTOR_LINEAR_WATCH;
}

// clang-format off
constexpr FeatureQuery kAmplitudeControl = {"supportsAmplitudeControl", core::INTENSITY, hasNodeOrForceFeedback<core::THE_DEVICE_INTENSITY>};
constexpr FeatureQuery kForceTouchAmplitudeControl = {"supportsForceTouchAmplitudeControl", core::FORCE_TOUCH_INTENSITY, hasNode<core::THE_DEVICE_FORCE_TOUCH_INTENSITY>};
constexpr FeatureQuery kFrequencyControl = {"supportsFrequencyControl", core::MULTI_FREQUENCY, hasNode<core::THE_DEVICE_MULTI_FREQ>};
constexpr FeatureQuery kHapticEngine = {"supportsHapticEngine", core::HAPTIC_ENGINE, hasNodeOrForceFeedback<core::THE_DEVICE_HAPTIC_ENGINE>};
constexpr FeatureQuery kPrebakedHapticPattern = {"supportsPrebakedHapticPattern", core::INDEX_HAPTIC_PATTERN, hasNodeOrForceFeedback<core::THE_DEVICE_HAPTIC_ENGINE_INDEX>};
constexpr FeatureQuery kFifoHapticEngine = {"supportsFifoHapticEngine", core::FIFO_HAPTIC_ENGINE, hasNode<core::THE_DEVICE_FIFO_HAPTIC_ENGINE>};
constexpr FeatureQuery kHybridHapticEngine = {"supportsHybridHapticEngine", core::HYBRID_HAPTIC_ENGINE, hasNode<core::THE_DEVICE_HYBRID_HAPTIC_ENGINE>};
constexpr FeatureQuery kEnhancedHapticPattern = {"supportsEnhancedQuorvanHapticPattern", core::ENHANCED_HAPTIC_ENGINE, hasEnhancedPattern};
constexpr FeatureQuery kEnhancedHybridHapticPattern = {"supportsEnhancedHybridHapticPattern", core::ENHANCED_HYBRID_HAPTIC_ENGINE, hasEnhancedHybridPattern};
// clang-format on

// The letters are matched one by one: drivers report words of their own ("FOLDER", "ON", "TENT").
// clang-format off
constexpr LetterQuery kFolderStatus = {"supportsFolderStatusSetting", "DFLO",
    {core::kExtensionLog, "supportsFolderStatusSetting node: ", O_RDWR, " open failed. errno: ", " read failed. errno: ", 1}};
constexpr LetterQuery kFolderTentMode = {"supportsFolderTentModeStatusSetting", "ENT",
    {core::kExtensionLog, "supportsFolderTentModeStatusSetting node: ", O_RDWR, " open failed. errno: ", " read failed. errno: ", 1}};
// clang-format on

bool hasLetter(const LetterQuery& query) {
    char buffer[512] = {};
    const std::optional<std::string_view> text =
            core::readLine(query.reader, core::THE_DEVICE_EVENT_CMD, buffer, sizeof(buffer));
    if (!text) return false;
    LOG(INFO) << "V_4_0: " << query.name << " string : " << *text << " len : " << text->size();
    const bool supported = text->find_first_of(query.letters) != std::string_view::npos;
    LOG(INFO) << "V_4_0: " << query.name << (supported ? " TRUE" : " FALSE");
    return supported;
}

// Whether one of the words between single spaces is exactly `word`.
bool holdsWord(std::string_view text, std::string_view word) {
    for (;;) {
        const size_t space = text.find(' ');
        if (text.substr(0, space) == word) return true;
        if (space == std::string_view::npos) return false;
        text.remove_prefix(space + 1);
    }
}

// The logger begins a record at each newline; a client must not fill the log with one request.
std::string onOneLine(std::string text) {
    std::replace(text.begin(), text.end(), '\n', ' ');
    return text;
}

}  // namespace

ndk::ScopedAStatus Vibrator::answer(const FeatureQuery& query, bool* result) const {
    LOG(INFO) << "V_4_0: " << query.name;
    *result = false;
    if (isCallerAllowed()) {
        const int listed = mHwApi->hasFeature(query.feature);
        *result = listed >= 0 ? listed == 1 : query.withoutList(*mHwApi, query.name);
    }
    return core::ok();
}

ndk::ScopedAStatus Vibrator::answer(const LetterQuery& query, bool* result) const {
    LOG(INFO) << "V_4_0: " << query.name;
    *result = isCallerAllowed() && hasLetter(query);
    return core::ok();
}

ndk::ScopedAStatus Vibrator::supportsAmplitudeControl(bool* _aidl_return) {
    return answer(kAmplitudeControl, _aidl_return);
}

ndk::ScopedAStatus Vibrator::supportsForceTouchAmplitudeControl(bool* _aidl_return) {
    return answer(kForceTouchAmplitudeControl, _aidl_return);
}

ndk::ScopedAStatus Vibrator::supportsFrequencyControl(bool* _aidl_return) {
    return answer(kFrequencyControl, _aidl_return);
}

ndk::ScopedAStatus Vibrator::supportsHapticEngine(bool* _aidl_return) {
    return answer(kHapticEngine, _aidl_return);
}

ndk::ScopedAStatus Vibrator::supportsPrebakedHapticPattern(bool* _aidl_return) {
    return answer(kPrebakedHapticPattern, _aidl_return);
}

ndk::ScopedAStatus Vibrator::supportsFolderStatusSetting(bool* _aidl_return) {
    return answer(kFolderStatus, _aidl_return);
}

ndk::ScopedAStatus Vibrator::supportsEnhancedQuorvanHapticPattern(bool* _aidl_return) {
    return answer(kEnhancedHapticPattern, _aidl_return);
}

ndk::ScopedAStatus Vibrator::supportsFifoHapticEngine(bool* _aidl_return) {
    return answer(kFifoHapticEngine, _aidl_return);
}

ndk::ScopedAStatus Vibrator::supportsHybridHapticEngine(bool* _aidl_return) {
    return answer(kHybridHapticEngine, _aidl_return);
}

ndk::ScopedAStatus Vibrator::supportsEnhancedHybridHapticPattern(bool* _aidl_return) {
    return answer(kEnhancedHybridHapticPattern, _aidl_return);
}

ndk::ScopedAStatus Vibrator::supportsFolderTentModeStatusSetting(bool* _aidl_return) {
    return answer(kFolderTentMode, _aidl_return);
}

ndk::ScopedAStatus Vibrator::supportsHasFeature(bool* _aidl_return) {
    *_aidl_return = false;
    if (!isCallerAllowed("[supportsHasFeature]Fail - ")) return core::exception(EX_SECURITY);
    *_aidl_return = mHwApi->isNodeExistForRead(core::VIB_INFO_FUNCTIONS);
    LOG(INFO) << "V_4_0: [supportsHasFeature]result: " << *_aidl_return;
    return core::ok();
}

ndk::ScopedAStatus Vibrator::hasFeature(const std::string& featureName, bool* _aidl_return) {
    LOG(INFO) << "V_4_0: [hasFeature]featureName: " << onOneLine(featureName)
              << " ,length: " << featureName.size();
    *_aidl_return = false;
    if (!isCallerAllowed("[hasFeature]Fail - ")) return core::exception(EX_SECURITY);
    if (featureName.empty()) {
        return refuse(EX_ILLEGAL_ARGUMENT, "V_4_0: [hasFeature]Fail - featureName Param is Empty");
    }
    if (!mHwApi->isNodeExistForRead(core::VIB_INFO_FUNCTIONS)) {
        return refuse(EX_UNSUPPORTED_OPERATION, "V_4_0: [hasFeature]Not Supported Function");
    }
    const std::string features = mHwApi->readNodeAsString(core::VIB_INFO_FUNCTIONS);
    LOG(INFO) << "V_4_0: [hasFeature]allFeatures: " << features;
    if (features.empty()) return core::ok();
    *_aidl_return = holdsWord(features, featureName);
    LOG(INFO) << "V_4_0: [hasFeature]result: " << *_aidl_return;
    return core::ok();
}

}  // namespace aidl::vendor::quorvan::hardware::vibrator
