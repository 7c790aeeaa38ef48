// SPDX-License-Identifier: Apache-2.0
//
// What the driver offers: the features it lists, how effects can be played, and its intensity
// lists. Nothing here writes.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <cstdlib>
#include <cstring>
#include <limits>
#include <string>
#include <string_view>
#include <vector>

#include <android-base/logging.h>

#include "Constants.h"
#include "HwApi.h"
#include "driver/LineReader.h"

namespace aidl::android::hardware::vibrator {
namespace {

// Appends the numbers between the commas of `text`, in order. A piece may have spaces before its
// number and anything after it; one without a number, or beyond 32 bits, is left out.
void appendNumbers(const std::string& text, std::vector<int>& list) {
    for (const char* piece = text.c_str();; ++piece) {
        char* end = nullptr;
        const long value = strtol(piece, &end, 10);
        if (end != piece && value >= std::numeric_limits<int>::min() &&
            value <= std::numeric_limits<int>::max()) {
            list.push_back(static_cast<int>(value));
        }
        piece = strchr(piece, ',');
        if (piece == nullptr) return;
    }
}

}  // namespace

int HwApi::hasFeature(qvx_features feature) {
    const auto position = static_cast<size_t>(feature);
    if (position >= FEATURE_NAMES.size()) return 0;
    const std::string_view keyword = FEATURE_NAMES[position];
    LineReader reader(VIB_INFO_FUNCTIONS);
    if (!reader.isOpen()) {
        LOG(INFO) << "HW_API: [hasFeature]fopen error!!";
        return -1;
    }
    char line[LineReader::kLineSize];
    while (reader.next(line)) {
        LOG(INFO) << "HW_API: [hasFeature] debug functions=" << line;
        // A word within a longer word counts: a driver with FIFO_HAPTIC_ENGINE has a haptic engine.
        if (std::string_view(line).find(keyword) != std::string_view::npos) return 1;
    }
    return 0;
}

int HwApi::getMotorPerformMethod() {
    int method = PERFORM_NONE;
    if (isNodeExist(THE_DEVICE_HAPTIC_ENGINE_INDEX) || useForceFeedback) {
        method = PERFORM_PREBAKED_INDEX;
    } else if (isNodeExist(THE_DEVICE_HAPTIC_ENGINE)) {
        method = PERFORM_HAPTIC_ENGINE;
    } else if (isNodeExist(THE_DEVICE_INTENSITY)) {
        method = PERFORM_AMPLITUDE;
    }
    LOG(INFO) << "HW_API: getMotorPerformMethod type : " << method;
    return method;
}

bool HwApi::isDynamicIntensityNodeExist() {
    if (isNodeExistForRead(VIB_INFO_INTENSITIES) &&
        isNodeExistForRead(VIB_INFO_HAPTIC_INTENSITIES)) {
        LOG(INFO) << "HW_API: [isDynamicIntensityNodeExist]new dynamic intensity node exist";
        return true;
    }
    if (isNodeExistForRead(THE_DEVICE_CAL_INTENSITIES) &&
        isNodeExistForRead(THE_DEVICE_CAL_HAPTIC_INTENSITIES)) {
        LOG(INFO) << "HW_API: [isDynamicIntensityNodeExist]old dynamic intensity node exist";
        return true;
    }
    LOG(INFO) << "HW_API: [isDynamicIntensityNodeExist]dynamic intensity node Not exist";
    return false;
}

bool HwApi::isAmplitudeControlExist() {
    if (useForceFeedback) {
        LOG(INFO) << "HW_API: [isAmplitudeControlExist]return true";
        return true;
    }
    return isNodeExist(THE_DEVICE_INTENSITY);
}

bool HwApi::getDynamicIntensityList(bool isDefaultType, std::vector<int>& list) {
    LOG(INFO) << "V_2_0: [getDynamicIntensityList]isDefaultType: " << isDefaultType;
    const char* const shared = isDefaultType ? VIB_INFO_INTENSITIES : VIB_INFO_HAPTIC_INTENSITIES;
    const std::string& own =
            isDefaultType ? THE_DEVICE_CAL_INTENSITIES : THE_DEVICE_CAL_HAPTIC_INTENSITIES;
    const std::string node = isNodeExistForRead(shared) ? shared
                             : isNodeExistForRead(own)  ? own
                                                        : std::string();
    const std::string text = readNodeAsString(node);
    LOG(INFO) << "V_2_0: [getDynamicIntensityList]raw value: " << text;
    if (text.empty()) {
        LOG(INFO) << "V_2_0: [getDynamicIntensityList]Fail - empty value";
        return false;
    }
    appendNumbers(text, list);
    if (list.empty()) {
        LOG(INFO) << "V_2_0: [getDynamicIntensityList]Fail - empty list";
        return false;
    }
    LOG(INFO) << "V_2_0: [getDynamicIntensityList]list size: " << list.size();
    return true;
}

}  // namespace aidl::android::hardware::vibrator
