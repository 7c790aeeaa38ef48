// SPDX-License-Identifier: Apache-2.0
//
// Prebaked patterns: vibrations that the driver or the motor's wavetable holds, played by index,
// once or over and over.
#define LOG_TAG log.tag

#include <android-base/logging.h>

#include "hwapi/DriverWriter.h"
#include "hwapi/TextBuffer.h"

namespace aidl::android::hardware::vibrator {
namespace {

constexpr char kOperation[] = "performPrebakedHapticPattern";

// Repeating on force feedback came from the standard service, and its prefix with it.
constexpr LogSource kHardwareRepeatLog = {kHardwareLog.tag, kHardwareLog.severity,
                                          kStandardLog.prefix};

constexpr PatternWords kHardwareWords = {kHardwareLog, kHardwareRepeatLog, false};

bool choosePattern(HwApi& hardware, const LogSource& log, int32_t patternIndex, int32_t amplitude) {
    if (useForceFeedback) {
        return hardware.sendAmplitude(amplitude) && hardware.setForceFeedbackIndex(patternIndex);
    }
    return checked(hardware.sendAmplitude(amplitude), log, kOperation, " intensity write fail") &&
           checked(hardware.writeNode(THE_DEVICE_HAPTIC_ENGINE_INDEX, patternIndex), log,
                   kOperation, " pattern write fail");
}

bool playOnce(HwApi& hardware, const PatternWords& words, int32_t patternIndex, int32_t amplitude) {
    const LogSource& log = words.log;
    if (!words.terse) LOG(log.severity) << log.prefix << kOperation << " one shoot starts";
    if (!choosePattern(hardware, log, patternIndex, amplitude)) return false;
    if (patternIndex == 0) return true;  // chosen, but there is nothing to start
    if (!checked(hardware.do_on(kPatternTriggerMs), log, kOperation, " on fail")) return false;
    if (!words.terse) LOG(log.severity) << log.prefix << kOperation << " one shoot end";
    return true;
}

bool repeatOnForceFeedback(HwApi& hardware, const PatternWords& words, int32_t patternIndex,
                           int32_t amplitude) {
    const LogSource& log = words.forceFeedbackRepeatLog;
    if (!checked(patternIndex != 0, log, kOperation, " Cannot use patternIndex 0 with repeat") ||
        !hardware.setForceFeedbackAmplitude(amplitude) ||
        !checked(hardware.setAndTriggerOwt(patternIndex, amplitude), log, kOperation,
                 " setAndTriggerOwt fail")) {
        return false;
    }
    if (!words.terse) LOG(log.severity) << log.prefix << kOperation << " end";
    return true;
}

// The queue string repeats one pattern for ever, for example "5.100, 10, 0~" for pattern 5 at
// amplitude 10000.
bool repeatByQueue(HwApi& hardware, const PatternWords& words, int32_t patternIndex,
                   int32_t amplitude) {
    const LogSource& log = words.log;
    TextBuffer<32> text;
    text.append("%d.%d, 10, 0~", patternIndex, static_cast<uint16_t>(amplitude) / 100);
    LOG(log.severity) << log.prefix << kOperation << " : " << text.get() << " , "
                      << text.get().size();
    return playQueue(hardware, {log, kOperation, kOperation, words.terse}, text.getTerminated());
}

}  // namespace

bool playPattern(HwApi& hardware, const PatternWords& words, int32_t patternIndex,
                 int32_t amplitude, bool repeat) {
    const LogSource& log = words.log;
    if (!repeat) return playOnce(hardware, words, patternIndex, amplitude);
    if (!words.terse) LOG(log.severity) << log.prefix << kOperation << " repeat starts";
    return useForceFeedback ? repeatOnForceFeedback(hardware, words, patternIndex, amplitude)
                            : repeatByQueue(hardware, words, patternIndex, amplitude);
}

bool HwApi::performPrebakedHapticPattern(int patternIndex, int amplitude, bool repeat) {
    const LogSource& log = kHardwareLog;
    LOG(log.severity) << log.prefix << kOperation << " " << patternIndex << " : " << amplitude
                      << " : " << repeat;
    return isDriverAmplitude(log, kOperation, amplitude) &&
           playPattern(*this, kHardwareWords, patternIndex, amplitude, repeat);
}

}  // namespace aidl::android::hardware::vibrator
