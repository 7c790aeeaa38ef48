// SPDX-License-Identifier: Apache-2.0
//
// Prebaked patterns: vibrations that the driver or the motor's wavetable holds, played by index,
// once or over and over.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <cerrno>
#include <cstdio>
#include <optional>
#include <string_view>

#include <android-base/logging.h>

#include "Amplitude.h"
#include "HwApi.h"
#include "PatternQueue.h"
#include "SystemCalls.h"

namespace aidl::android::hardware::vibrator {
namespace {

bool choosePattern(HwApi& hardware, int patternIndex, int amplitude) {
    if (useForceFeedback) {
        return hardware.setForceFeedbackAmplitude(amplitude) &&
               hardware.setForceFeedbackIndex(patternIndex);
    }
    if (!hardware.writeNode(THE_DEVICE_INTENSITY, amplitude)) {
        LOG(INFO) << "HW_API: performPrebakedHapticPattern intensity write fail";
        return false;
    }
    if (!hardware.writeNode(THE_DEVICE_HAPTIC_ENGINE_INDEX, patternIndex)) {
        LOG(INFO) << "HW_API: performPrebakedHapticPattern pattern write fail";
        return false;
    }
    return true;
}

bool playOnce(HwApi& hardware, int patternIndex, int amplitude) {
    LOG(INFO) << "HW_API: performPrebakedHapticPattern one shoot starts";
    if (!choosePattern(hardware, patternIndex, amplitude)) return false;
    if (patternIndex == 0) return true;  // chosen, but there is nothing to start
    if (!hardware.do_on(kPatternTriggerMs)) {
        LOG(INFO) << "HW_API: performPrebakedHapticPattern on fail";
        return false;
    }
    LOG(INFO) << "HW_API: performPrebakedHapticPattern one shoot end";
    return true;
}

bool repeatOnForceFeedback(HwApi& hardware, int patternIndex, int amplitude) {
    if (patternIndex == 0) {
        LOG(INFO) << "V_2_0: performPrebakedHapticPattern Cannot use patternIndex 0 with repeat";
        return false;
    }
    if (!hardware.setForceFeedbackAmplitude(amplitude)) return false;
    if (!hardware.setAndTriggerOwt(patternIndex, 0)) {
        LOG(INFO) << "V_2_0: performPrebakedHapticPattern setAndTriggerOwt fail";
        return false;
    }
    LOG(INFO) << "V_2_0: performPrebakedHapticPattern end";
    return true;
}

bool repeatByQueue(HwApi& hardware, int patternIndex, int amplitude) {
    char buffer[kQueueEntrySize];
    const std::string_view text = formatQueueEntry(patternIndex, amplitude, buffer);
    LOG(INFO) << "HW_API: performPrebakedHapticPattern : " << text << " , " << text.size();
    if (!hardware.writeNode(THE_DEVICE_HAPTIC_ENGINE_INDEX, kQueueIndex)) {
        LOG(INFO) << "HW_API: performPrebakedHapticPattern write 0xFFFE fail";
        return false;
    }
    const size_t size = text.size() + 1;  // the driver wants the terminating zero byte
    const std::optional<ssize_t> written =
            kernel::writeOnce(THE_DEVICE_HAPTIC_PLAYBACK_QUEUE, text.data(), size);
    if (!written) {
        const int error = errno;
        LOG(INFO) << "HW_API: performPrebakedHapticPattern is fail: " << error;
        return false;
    }
    LOG(INFO) << "HW_API: ret : " << *written;
    if (*written < static_cast<ssize_t>(size)) {
        LOG(INFO) << "HW_API: performPrebakedHapticPattern repeat error";
        return false;
    }
    if (!hardware.do_on(kPatternTriggerMs)) {
        LOG(INFO) << "HW_API: performPrebakedHapticPattern on Trigger fail";
        return false;
    }
    LOG(INFO) << "HW_API: performPrebakedHapticPattern end";
    return true;
}

}  // namespace

std::string_view formatQueueEntry(int32_t patternIndex, int32_t amplitude,
                                  char (&buffer)[kQueueEntrySize]) {
    const int length = snprintf(buffer, sizeof(buffer), "%d.%d, 10, 0~", patternIndex,
                                static_cast<uint16_t>(amplitude) / 100);
    return {buffer, static_cast<size_t>(length)};
}

bool HwApi::performPrebakedHapticPattern(int patternIndex, int amplitude, bool repeat) {
    LOG(INFO) << "HW_API: performPrebakedHapticPattern " << patternIndex << " : " << amplitude
              << " : " << repeat;
    if (!isDriverAmplitude(amplitude)) {
        LOG(INFO) << "HW_API: performPrebakedHapticPattern amplitude is abnormal " << amplitude;
        return false;
    }
    if (!repeat) return playOnce(*this, patternIndex, amplitude);
    LOG(INFO) << "HW_API: performPrebakedHapticPattern repeat starts";
    return useForceFeedback ? repeatOnForceFeedback(*this, patternIndex, amplitude)
                            : repeatByQueue(*this, patternIndex, amplitude);
}

}  // namespace aidl::android::hardware::vibrator
