// SPDX-License-Identifier: Apache-2.0
//
// Stored patterns and the platform's effects at an explicit amplitude.
#define LOG_TAG "QvxVibrator-HAL-AIDL-EXT"

#include <android-base/logging.h>

#include "ServiceStatus.h"
#include "Vibrator_vendor.h"
#include "hwapi/DriverWriter.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

constexpr core::PatternWords kPatternWords = {core::kExtensionLog, core::kExtensionLog, true};

}  // namespace

ndk::ScopedAStatus Vibrator::performPrebakedHapticPattern(int32_t patternIndex, int32_t amplitude,
                                                          bool repeat) {
    LOG(INFO) << "V_4_0: performPrebakedHapticPattern " << patternIndex << " : " << amplitude
              << " : " << repeat;
    if (!isCallerAllowed()) return core::ok();
    if (!core::isDriverAmplitude(core::kExtensionLog, "performPrebakedHapticPattern", amplitude)) {
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    return core::okOrIllegalState(
            core::playPattern(*mHwApi, kPatternWords, patternIndex, amplitude, repeat));
}

ndk::ScopedAStatus Vibrator::perform(core::Effect effect, int32_t amplitude,
                                     const std::shared_ptr<core::IVibratorCallback>& callback,
                                     int32_t* _aidl_return) {
    LOG(INFO) << "V_4_0: perform for QVX";
    if (!isCallerAllowed()) {
        *_aidl_return = 0;
        return core::ok();
    }
    LOG(INFO) << "V_4_0: Vibrator perform Effect for QVX : " << static_cast<int32_t>(effect)
              << " amplitude : " << amplitude;
    if (core::motorPerformMethod == core::PERFORM_NONE) {
        return refuse(EX_UNSUPPORTED_OPERATION, "V_4_0: performEffect PERFORM_NONE");
    }
    if (callback != nullptr) {
        return refuse(EX_UNSUPPORTED_OPERATION, "V_4_0: Not support perform() callback");
    }
    if (!core::HwApi::isPlayed(effect)) {
        return refuse(EX_UNSUPPORTED_OPERATION, "V_4_0: Unsupport vibrator perform effect for QVX");
    }
    if (!core::isDriverAmplitude(core::kExtensionLog, "vibrator perform effect for QVX",
                                 amplitude)) {
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    int durationMs = 0;
    if (!mHwApi->preparePerform(effect, amplitude, durationMs)) {
        return core::exception(EX_ILLEGAL_STATE);
    }
    LOG(INFO) << "V_4_0: Vibrator perform timeMS return: " << durationMs;
    *_aidl_return = durationMs;
    return core::ok();
}

}  // namespace aidl::vendor::quorvan::hardware::vibrator
