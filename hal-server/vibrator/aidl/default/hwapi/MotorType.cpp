// SPDX-License-Identifier: Apache-2.0
//
// What motor this is: read from the driver's motor_type node, or inferred from the nodes it has.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <fcntl.h>

#include <optional>
#include <string_view>

#include <android-base/logging.h>

#include "Constants.h"
#include "HwApi.h"
#include "hwapi/DriverWriter.h"

namespace aidl::android::hardware::vibrator {
namespace {

// clang-format off
constexpr NodeReader kIndexReader = {kHardwareLog, "getMotorIndex node: ", O_RDWR, "open failed. errno: ", " read failed. errno: ", 1};
constexpr NodeReader kEnhancedReader = {kHardwareLog, "supportsEnhancedQuorvanHapticPattern node: ", O_RDONLY, " open failed. errno: ", " read failed. errno: ", 1};
// clang-format on

// The motor type; empty optional when the node cannot be opened or has no string.
std::optional<std::string_view> readMotorType(const NodeReader& reader, const char* operation,
                                              char (&buffer)[32]) {
    const std::optional<std::string_view> name =
            readLine(reader, THE_DEVICE_MOTOR_TYPE, buffer, sizeof(buffer));
    if (name) {
        LOG(INFO) << "HW_API: " << operation << " string : " << *name;
        LOG(INFO) << "HW_API: " << operation << " string len : " << name->size();
    }
    return name;
}

}  // namespace

int HwApi::getMotorIndex() {
    LOG(INFO) << "HW_API: getMotorIndex return motor type >>";
    char buffer[32] = {};
    const std::optional<std::string_view> name =
            readMotorType(kIndexReader, "getMotorIndex", buffer);
    if (!name) return 0;
    const std::optional<int32_t> known = findMotorIndex(*name);
    if (!known) {
        LOG(INFO) << "HW_API: getMotorIndex MOTOR_TYPE is mandatory feature over P-OS.";
    }
    const int index = known.value_or(MOTOR_NONE);
    LOG(INFO) << "HW_API: getMotorIndex return motor type : " << index << " <<";
    return index;
}

int HwApi::getMotorIndexbyMethod() {
    LOG(INFO) << "HW_API: getMotorIndexbyMethod >> ";
    const bool prebaked = isPrebakedHapticPatternExist();
    const bool hapticEngine = isHapticEngineNodeExist();
    int index = MOTOR_NONE;
    if (prebaked) {
        index = hapticEngine ? MOTOR_LINEAR_INDEX : MOTOR_LINEAR_1030;
    } else if (hapticEngine) {
        index = supportsEnhancedQuorvanHapticPattern() ? MOTOR_LINEAR_1040 : MOTOR_LINEAR_0832RC;
    } else {
        index = isAmplitudeControlExist() ? MOTOR_LINEAR : MOTOR_COINDC;
    }
    LOG(INFO) << "HW_API: getMotorIndexbyMethod : " << index << " <<";
    return index;
}

bool HwApi::supportsEnhancedQuorvanHapticPattern() {
    LOG(INFO) << "HW_API: supportsEnhancedQuorvanHapticPattern";
    if (!isMotorTypeNodeExist()) {
        if (isHapticEngineNodeExist()) {
            LOG(INFO) << "HW_API: supportsEnhancedQuorvanHapticPattern Enhanced supports motor";
            return true;
        }
        LOG(INFO) << "HW_API: supportsEnhancedQuorvanHapticPattern not supports";
        return false;
    }
    char buffer[32] = {};
    const std::optional<std::string_view> name =
            readMotorType(kEnhancedReader, "supportsEnhancedQuorvanHapticPattern", buffer);
    if (!name) return false;
    if (*name == "LINEAR_1040") {
        LOG(INFO) << "HW_API: supportsEnhancedQuorvanHapticPattern LINEAR_1040";
        return true;
    }
    LOG(INFO) << "HW_API: supportsEnhancedQuorvanHapticPattern can not supports. Out of capability";
    return false;
}

}  // namespace aidl::android::hardware::vibrator
