// SPDX-License-Identifier: Apache-2.0
//
// What the services tell on request, for bring-up: what was chosen at start-up, and what the driver
// offers now. It opens the nodes that requests open and writes to none of them.
#include <linux/input.h>

#include <cstring>
#include <set>
#include <string>
#include <string_view>

#include <android-base/file.h>

#include "Constants.h"
#include "HwApi.h"
#include "driver/ForceFeedbackEffect.h"
#include "driver/LineReader.h"
#include "hwapi/DriverWriter.h"

namespace aidl::android::hardware::vibrator {
namespace {

// The nodes that requests use: those of every device class, then those of the chosen one.
// clang-format off
constexpr const char* kFixedNodes[] = {
    TIMED_OUTPUT_ENABLE, LEDS_ACTIVATE, LEDS_DURATION, LEDS_STATE,
    VIB_INFO_FUNCTIONS, VIB_INFO_INTENSITIES, VIB_INFO_HAPTIC_INTENSITIES,
};
const std::string* const kChosenNodes[] = {
    &THE_DEVICE_FF, &THE_DEVICE_INTENSITY, &THE_DEVICE_FORCE_TOUCH_INTENSITY, &THE_DEVICE_MULTI_FREQ,
    &THE_DEVICE_HAPTIC_ENGINE, &THE_DEVICE_HAPTIC_ENGINE_INDEX, &THE_DEVICE_HAPTIC_PLAYBACK_QUEUE,
    &THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES, &THE_DEVICE_MOTOR_TYPE, &THE_DEVICE_EVENT_CMD,
    &THE_DEVICE_CAL_INTENSITIES, &THE_DEVICE_CAL_HAPTIC_INTENSITIES,
    &THE_DEVICE_FIFO_HAPTIC_ENGINE, &THE_DEVICE_HYBRID_HAPTIC_ENGINE,
};
// clang-format on

constexpr const char* kPerformMethods[] = {"none", "prebaked index", "haptic engine", "amplitude"};

std::string nodeLine(const std::string& node) {
    return "  " + node + ": " + describeAccess(node) + "\n";
}

// The first line of the file, without its newline.
std::string firstLine(const std::string& path) {
    LineReader reader(path.c_str());
    char line[LineReader::kLineSize];
    if (!reader.next(line)) return "unknown";
    return {line, strcspn(line, "\n")};
}

// The features that the driver lists, as hasFeature() finds them.
std::set<std::string_view> listedFeatures() {
    std::set<std::string_view> listed;
    LineReader reader(VIB_INFO_FUNCTIONS);
    char line[LineReader::kLineSize];
    while (reader.next(line)) {
        for (const std::string_view name : FEATURE_NAMES) {
            if (std::string_view(line).find(name) != std::string_view::npos) listed.insert(name);
        }
    }
    return listed;
}

std::string capabilityLines() {
    const std::set<std::string_view> features = listedFeatures();
    const auto has = [&](qvx_features feature) {
        return features.count(FEATURE_NAMES[feature]) != 0;
    };
    std::string text = "capabilities:";
    if (useForceFeedback || describeAccess(THE_DEVICE_INTENSITY) == "read-write")
        text += " amplitude-control";
    if (has(PRIMITIVE_EFFECT_COMPOSE)) text += " compose-effects";
    if (has(CAPABILITY_EXTERNAL_CONTROL)) text += " external-control external-amplitude-control";
    text += "\nfeatures:";
    for (const std::string_view name : features) text.append(" ").append(name);
    return text + "\n";
}

std::string effectLine() {
    const ff_effect& record = forceFeedbackEffect.record;
    if (record.id == -1) return "uploaded effect: none\n";
    return "uploaded effect: id " + std::to_string(record.id) + ", index " +
           std::to_string(forceFeedbackEffect.indexPair[1]) + ", " +
           std::to_string(record.replay.length) + " ms\n";
}

}  // namespace

std::string HwApi::describeChoice() const {
    const auto refusal = [](int error) { return "no, " + std::string(strerror(error)); };
    const bool hasTimedOutput = mTimedOutputError == 0;
    const bool hasLeds = !hasTimedOutput && mLedsError == 0;
    std::string text = "device classes, as found at start-up:\n  timed_output: ";
    text += hasTimedOutput ? "chosen" : refusal(mTimedOutputError);
    text += "\n  leds: ";
    text += hasTimedOutput ? "not looked for" : hasLeds ? "chosen" : refusal(mLedsError);
    text += "\n  force feedback: ";
    text += hasTimedOutput || hasLeds ? "not looked for"
            : useForceFeedback        ? "chosen"
                                      : "no, the input-device list names no such motor";
    return text + "\n";
}

bool HwApi::dump(int uid, int fd) {
    constexpr int kShell = 2000;
    if (uid != kShell && !checkClientUID(uid)) return false;
    std::string text = describeChoice();
    text += "perform method: " + std::string(kPerformMethods[motorPerformMethod]) + "\n";
    text += "motor type: " + firstLine(THE_DEVICE_MOTOR_TYPE) + "\n";
    text += "platform's pattern numbers: " + std::string(useKypIndex ? "yes" : "no") + "\n";
    text += capabilityLines();
    if (useForceFeedback) text += effectLine();
    text += "nodes:\n";
    for (const char* const node : kFixedNodes) text += nodeLine(node);
    for (const std::string* const node : kChosenNodes) {
        if (!node->empty()) text += nodeLine(*node);
    }
    return ::android::base::WriteStringToFd(text, fd);
}

}  // namespace aidl::android::hardware::vibrator
