// SPDX-License-Identifier: Apache-2.0
//
// Stored patterns and the platform's effects at an explicit amplitude. The sequences resemble those
// of the hardware layer but are the extension's own, with its own lines and statuses.
#define LOG_TAG "QvxVibrator-HAL-AIDL-EXT"

#include <cerrno>
#include <optional>
#include <string_view>

#include <android-base/logging.h>

#include "Amplitude.h"
#include "PatternQueue.h"
#include "ServiceStatus.h"
#include "SystemCalls.h"
#include "Vibrator_vendor.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using core::HwApi;

bool choosePattern(HwApi& hardware, int32_t patternIndex, int32_t amplitude) {
    if (core::useForceFeedback) {
        return hardware.setForceFeedbackAmplitude(amplitude) &&
               hardware.setForceFeedbackIndex(patternIndex);
    }
    if (!hardware.writeNode(core::THE_DEVICE_INTENSITY, amplitude)) {
        LOG(INFO) << "V_4_0: performPrebakedHapticPattern intensity write fail";
        return false;
    }
    if (!hardware.writeNode(core::THE_DEVICE_HAPTIC_ENGINE_INDEX, patternIndex)) {
        LOG(INFO) << "V_4_0: performPrebakedHapticPattern pattern write fail";
        return false;
    }
    return true;
}

bool playOnce(HwApi& hardware, int32_t patternIndex, int32_t amplitude) {
    if (!choosePattern(hardware, patternIndex, amplitude)) return false;
    if (patternIndex == 0) return true;  // chosen, but there is nothing to start
    if (hardware.do_on(core::kPatternTriggerMs)) return true;
    LOG(INFO) << "V_4_0: performPrebakedHapticPattern on fail";
    return false;
}

bool repeatByQueue(HwApi& hardware, int32_t patternIndex, int32_t amplitude) {
    char buffer[core::kQueueEntrySize];
    const std::string_view text = core::formatQueueEntry(patternIndex, amplitude, buffer);
    LOG(INFO) << "V_4_0: performPrebakedHapticPattern : " << text << " , " << text.size();
    if (!hardware.writeNode(core::THE_DEVICE_HAPTIC_ENGINE_INDEX, core::kQueueIndex)) {
        LOG(INFO) << "V_4_0: performPrebakedHapticPattern write 0xFFFE fail";
        return false;
    }
    const size_t size = text.size() + 1;  // the driver wants the terminating zero byte
    const std::optional<ssize_t> written =
            core::kernel::writeOnce(core::THE_DEVICE_HAPTIC_PLAYBACK_QUEUE, text.data(), size);
    if (!written) {
        const int error = errno;
        LOG(INFO) << "V_4_0: performPrebakedHapticPattern is fail: " << error;
        return false;
    }
    if (*written != static_cast<ssize_t>(size)) {
        LOG(INFO) << "V_4_0: performPrebakedHapticPattern repeat error";
        return false;
    }
    if (hardware.do_on(core::kPatternTriggerMs)) return true;
    LOG(INFO) << "V_4_0: performPrebakedHapticPattern on Trigger fail";
    return false;
}

bool repeatOnForceFeedback(HwApi& hardware, int32_t patternIndex, int32_t amplitude) {
    if (patternIndex == 0) {
        LOG(INFO) << "V_4_0: performPrebakedHapticPattern Cannot use patternIndex 0 with repeat";
        return false;
    }
    if (!hardware.setForceFeedbackAmplitude(amplitude)) return false;
    if (hardware.setAndTriggerOwt(patternIndex, amplitude)) return true;
    LOG(INFO) << "V_4_0: performPrebakedHapticPattern setAndTriggerOwt fail";
    return false;
}

bool isPlayed(core::Effect effect) {
    switch (effect) {
        case core::Effect::CLICK:
        case core::Effect::DOUBLE_CLICK:
        case core::Effect::TICK:
        case core::Effect::HEAVY_CLICK:
            return true;
        default:
            return false;
    }
}

}  // namespace

ndk::ScopedAStatus Vibrator::performPrebakedHapticPattern(int32_t patternIndex, int32_t amplitude,
                                                          bool repeat) {
    LOG(INFO) << "V_4_0: performPrebakedHapticPattern " << patternIndex << " : " << amplitude
              << " : " << repeat;
    if (!isCallerAllowed()) return core::ok();
    if (!core::isDriverAmplitude(amplitude)) {
        LOG(INFO) << "V_4_0: performPrebakedHapticPattern amplitude is abnormal " << amplitude;
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    if (!repeat) return core::okOrIllegalState(playOnce(*mHwApi, patternIndex, amplitude));
    return core::okOrIllegalState(core::useForceFeedback
                                          ? repeatOnForceFeedback(*mHwApi, patternIndex, amplitude)
                                          : repeatByQueue(*mHwApi, patternIndex, amplitude));
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
        LOG(INFO) << "V_4_0: performEffect PERFORM_NONE";
        return core::exception(EX_UNSUPPORTED_OPERATION);
    }
    if (callback != nullptr) {
        LOG(INFO) << "V_4_0: Not support perform() callback";
        return core::exception(EX_UNSUPPORTED_OPERATION);
    }
    if (!isPlayed(effect)) {
        LOG(INFO) << "V_4_0: Unsupport vibrator perform effect for QVX";
        return core::exception(EX_UNSUPPORTED_OPERATION);
    }
    if (!core::isDriverAmplitude(amplitude)) {
        LOG(INFO) << "V_4_0: vibrator perform effect for QVX amplitude is abnormal " << amplitude;
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
