// SPDX-License-Identifier: Apache-2.0
//
// Node input and output: each access opens the node, transfers once and closes it, as the driver's
// sysfs attributes expect.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <fcntl.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <optional>
#include <string>
#include <string_view>

#include <android-base/logging.h>
#include <android-base/unique_fd.h>

#include "Constants.h"
#include "HwApi.h"
#include "driver/SystemCalls.h"
#include "hwapi/DriverWriter.h"

namespace aidl::android::hardware::vibrator {
namespace {

constexpr char kWhiteSpace[] = " \t\n\v\f\r";

// A short word with its newline and terminator.
constexpr size_t kNodeTextSize = 20;

// clang-format off
constexpr NodeReader kNumberReader = {kHardwareLog, "node: ", O_RDONLY, " open failed. errno: ", "read failed. errno: ", 0};
constexpr NodeReader kStringReader = {kHardwareLog, "readNodeAsString node: ", O_RDONLY, " open failed. errno: ", "read failed. errno: ", 0};
// clang-format on

bool writeText(const std::string& node, int flags, const char* text, size_t length) {
    const std::optional<ssize_t> written = kernel::writeOnce(node.c_str(), flags, text, length);
    if (!written) {
        const int error = errno;
        LOG(INFO) << "HW_API: node: " << node << "errno: " << error;
        return false;
    }
    if (*written != static_cast<ssize_t>(length)) {
        LOG(INFO) << "HW_API: << writeNode node UNKNOWN_ERROR : " << length << " , " << *written;
        return false;
    }
    LOG(INFO) << "HW_API: << writeNode node OK : " << length;
    return true;
}

bool canOpen(const std::string& node, int flags) {
    return kernel::open(node.c_str(), flags).ok();
}

}  // namespace

// Strings are passed by value, as the order and types of the operations are fixed.
// NOLINTBEGIN(performance-unnecessary-value-param)

bool HwApi::writeNode(std::string node, int value) {
    LOG(INFO) << "HW_API: >> writeNode node:" << fromClass(node) << " val:" << value;
    const std::string text = std::to_string(value) + "\n";
    return writeText(node, O_RDWR, text.data(), text.size());
}

bool HwApi::writeNodeByStringOnlyForWriting(std::string node, std::string value) {
    LOG(INFO) << "HW_API: >> writeNodeByStringOnlyForWriting node:" << fromClass(node)
              << " val:" << value;
    char text[kNodeTextSize];
    const auto length = static_cast<size_t>(snprintf(text, sizeof(text), "%s\n", value.c_str()));
    // A command that was cut would be another command, so one that does not fit is not sent at all.
    if (length >= sizeof(text)) {
        LOG(INFO) << "HW_API: << writeNode node UNKNOWN_ERROR : " << length << " , " << 0;
        return false;
    }
    return writeText(node, O_WRONLY, text, length);
}

int HwApi::readNode(std::string node) {
    LOG(INFO) << "HW_API: >> readNode node:" << fromClass(node);
    char text[8] = {};
    if (!readBytes(kNumberReader, node, text, sizeof(text))) return -1;
    const auto value = static_cast<int>(strtol(text, nullptr, 10));
    LOG(INFO) << "HW_API: << readNode done";
    return value;
}

std::string HwApi::readNodeAsString(std::string node) {
    LOG(INFO) << "HW_API: >> readNodeAsString node:" << fromClass(node);
    char buffer[512] = {};
    if (!readBytes(kStringReader, node, buffer, sizeof(buffer))) return "";
    std::string_view text(buffer);
    text.remove_suffix(text.size() - (text.find_last_not_of(kWhiteSpace) + 1));
    text.remove_prefix(std::min(text.find_first_not_of(kWhiteSpace), text.size()));
    LOG(INFO) << "HW_API: << readNodeAsString success - length: " << text.size();
    return std::string(text);
}

bool HwApi::isNodeExist(std::string node) {
    LOG(INFO) << "HW_API: isNodeExist node:" << fromClass(node);
    const ::android::base::unique_fd descriptor = kernel::open(node.c_str(), O_RDWR);
    LOG(INFO) << "HW_API: " << (descriptor.ok() ? "true" : "false");
    return descriptor.ok();
}

bool HwApi::isNodeExistForRead(std::string node) {
    if (canOpen(node, O_RDONLY)) return true;
    LOG(INFO) << "HW_API: isNodeExistForRead node:" << node << " - false";
    return false;
}

bool HwApi::isNodeExistForWrite(std::string node) {
    if (canOpen(node, O_WRONLY)) return true;
    LOG(INFO) << "HW_API: isNodeExistForWrite node:" << node << " - false";
    return false;
}

// NOLINTEND(performance-unnecessary-value-param)

bool HwApi::isVibratorNodeExist() {
    return isNodeExist(TIMED_OUTPUT_ENABLE);
}

bool HwApi::isVibratorActiveNodeExist() {
    return isNodeExist(LEDS_ACTIVATE);
}

bool HwApi::isVibratorDurationNodeExist() {
    return isNodeExist(LEDS_DURATION);
}

bool HwApi::isVibratorStateNodeExist() {
    return isNodeExist(LEDS_STATE);
}

bool HwApi::isHapticEngineNodeExist() {
    return isNodeExist(THE_DEVICE_HAPTIC_ENGINE);
}

bool HwApi::isMotorTypeNodeExist() {
    return isNodeExistForRead(THE_DEVICE_MOTOR_TYPE);
}

bool HwApi::isNumWavesNodeExist() {
    return isNodeExistForRead(THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES);
}

bool HwApi::isPrebakedHapticPatternExist() {
    return isNodeExist(THE_DEVICE_HAPTIC_ENGINE_INDEX);
}

std::string HwApi::rtrim(const std::string& text) {
    return text.substr(0, text.find_last_not_of(kWhiteSpace) + 1);
}

}  // namespace aidl::android::hardware::vibrator
