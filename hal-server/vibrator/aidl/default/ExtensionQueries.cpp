// SPDX-License-Identifier: Apache-2.0
//
// What the driver supports, as the extension answers it.
#define LOG_TAG "QvxVibrator-HAL-AIDL-EXT"

#include <fcntl.h>

#include <cerrno>
#include <string>
#include <string_view>

#include <android-base/logging.h>
#include <log/log.h>

#include "Constants.h"
#include "ServiceStatus.h"
#include "SystemCalls.h"
#include "Vibrator_vendor.h"

namespace aidl::vendor::quorvan::hardware::vibrator {

using core::HwApi;

struct FeatureQuery {
    const char* name;
    core::qvx_features feature;
    bool (*fallback)(HwApi& hardware);
};

struct LetterQuery {
    const char* name;
    const char* letters;
};

namespace {

constexpr int kLinearWatch = 11;  // motor index

// On force feedback the answer is yes whatever nodes there are.
bool alwaysOrNode(HwApi& hardware, const char* query, const std::string& node) {
    if (!core::useForceFeedback) return hardware.isNodeExist(node);
    LOG(INFO) << "V_4_0: [" << query << "]return true";
    return true;
}

// clang-format off
constexpr FeatureQuery kAmplitudeControl = {
    "supportsAmplitudeControl", core::INTENSITY,
    [](HwApi& hardware) { return alwaysOrNode(hardware, "supportsAmplitudeControl", core::THE_DEVICE_INTENSITY); }};
constexpr FeatureQuery kForceTouchAmplitudeControl = {
    "supportsForceTouchAmplitudeControl", core::FORCE_TOUCH_INTENSITY,
    [](HwApi& hardware) { return hardware.isNodeExist(core::THE_DEVICE_FORCE_TOUCH_INTENSITY); }};
constexpr FeatureQuery kFrequencyControl = {
    "supportsFrequencyControl", core::MULTI_FREQUENCY,
    [](HwApi& hardware) { return hardware.isNodeExist(core::THE_DEVICE_MULTI_FREQ); }};
constexpr FeatureQuery kHapticEngine = {
    "supportsHapticEngine", core::HAPTIC_ENGINE,
    [](HwApi& hardware) { return alwaysOrNode(hardware, "supportsHapticEngine", core::THE_DEVICE_HAPTIC_ENGINE); }};
constexpr FeatureQuery kPrebakedHapticPattern = {
    "supportsPrebakedHapticPattern", core::INDEX_HAPTIC_PATTERN,
    [](HwApi& hardware) { return alwaysOrNode(hardware, "supportsPrebakedHapticPattern", core::THE_DEVICE_HAPTIC_ENGINE_INDEX); }};
constexpr FeatureQuery kEnhancedHapticPattern = {
    "supportsEnhancedQuorvanHapticPattern", core::ENHANCED_HAPTIC_ENGINE,
    [](HwApi& hardware) { return hardware.supportsEnhancedQuorvanHapticPattern(); }};
constexpr FeatureQuery kFifoHapticEngine = {
    "supportsFifoHapticEngine", core::FIFO_HAPTIC_ENGINE,
    [](HwApi& hardware) { return hardware.isNodeExist(core::THE_DEVICE_FIFO_HAPTIC_ENGINE); }};
constexpr FeatureQuery kHybridHapticEngine = {
    "supportsHybridHapticEngine", core::HYBRID_HAPTIC_ENGINE,
    [](HwApi& hardware) { return hardware.isNodeExist(core::THE_DEVICE_HYBRID_HAPTIC_ENGINE); }};
constexpr FeatureQuery kEnhancedHybridHapticPattern = {
    "supportsEnhancedHybridHapticPattern", core::ENHANCED_HYBRID_HAPTIC_ENGINE,
    [](HwApi& hardware) { return hardware.getMotorIndex() == kLinearWatch; }};
// clang-format on

// The letters are matched one by one: drivers report words of their own ("FOLDER", "ON", "TENT").
constexpr LetterQuery kFolderStatus = {"supportsFolderStatusSetting", "DFLO"};
constexpr LetterQuery kFolderTentMode = {"supportsFolderTentModeStatusSetting", "ENT"};

bool hasLetter(const LetterQuery& query) {
    const std::string& node = core::THE_DEVICE_EVENT_CMD;
    core::kernel::FileDescriptor descriptor = core::kernel::open(node.c_str(), O_RDWR);
    if (!descriptor.isOpen()) {
        const int error = errno;
        LOG(INFO) << "V_4_0: " << query.name << " node: " << node
                  << " open failed. errno: " << error;
        return false;
    }
    char buffer[512] = {};
    const ssize_t count = core::kernel::read(descriptor.get(), buffer, sizeof(buffer) - 1);
    if (count <= 0) {
        const int error = errno;
        LOG(INFO) << "V_4_0: " << query.name << " node: " << node
                  << " read failed. errno: " << error;
        return false;
    }
    descriptor.reset();
    if (count >= static_cast<ssize_t>(sizeof(buffer))) {
        ALOGE("Read MAX limit. Always end of string is null");
        buffer[sizeof(buffer) - 1] = '\0';
    } else {
        buffer[count - 1] = '\0';  // the driver's line feed; a text without one loses a character
    }

    const std::string_view text = buffer;
    LOG(INFO) << "V_4_0: " << query.name << " string : " << text << " len : " << text.size();
    const bool supported = text.find_first_of(query.letters) != std::string_view::npos;
    LOG(INFO) << "V_4_0: " << query.name << (supported ? " TRUE" : " FALSE");
    return supported;
}

// Whether one of the words between single blanks is exactly `word`.
bool holdsWord(std::string_view text, std::string_view word) {
    for (;;) {
        const size_t blank = text.find(' ');
        if (text.substr(0, blank) == word) return true;
        if (blank == std::string_view::npos) return false;
        text.remove_prefix(blank + 1);
    }
}

}  // namespace

ndk::ScopedAStatus Vibrator::answer(const FeatureQuery& query, bool* result) const {
    LOG(INFO) << "V_4_0: " << query.name;
    *result = false;
    if (isCallerAllowed()) {
        const int listed = mHwApi->hasFeature(query.feature);
        *result = listed >= 0 ? listed == 1 : query.fallback(*mHwApi);
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
    LOG(INFO) << "V_4_0: [hasFeature]featureName: " << featureName
              << " ,length: " << featureName.size();
    *_aidl_return = false;
    if (!isCallerAllowed("[hasFeature]Fail - ")) return core::exception(EX_SECURITY);
    if (featureName.empty()) {
        LOG(INFO) << "V_4_0: [hasFeature]Fail - featureName Param is Empty";
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    if (!mHwApi->isNodeExistForRead(core::VIB_INFO_FUNCTIONS)) {
        LOG(INFO) << "V_4_0: [hasFeature]Not Supported Function";
        return core::exception(EX_UNSUPPORTED_OPERATION);
    }
    const std::string features = mHwApi->readNodeAsString(core::VIB_INFO_FUNCTIONS);
    LOG(INFO) << "V_4_0: [hasFeature]allFeatures: " << features;
    if (features.empty()) return core::ok();
    *_aidl_return = holdsWord(features, featureName);
    LOG(INFO) << "V_4_0: [hasFeature]result: " << *_aidl_return;
    return core::ok();
}

}  // namespace aidl::vendor::quorvan::hardware::vibrator
