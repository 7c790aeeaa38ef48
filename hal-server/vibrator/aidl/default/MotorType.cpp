// SPDX-License-Identifier: Apache-2.0
//
// What motor this is: read from the driver's motor_type node, or inferred from the nodes it has.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <fcntl.h>

#include <cerrno>
#include <cstring>
#include <optional>
#include <string>

#include <android-base/logging.h>
#include <log/log.h>

#include "Constants.h"
#include "HwApi.h"
#include "SystemCalls.h"

namespace aidl::android::hardware::vibrator {
namespace {

constexpr int kLinear1040 = 7;

// How an operation opens the motor_type node, and its words for a node that does not open. The two
// differ, access and blank alike, and log readers know them so.
struct MotorTypeAccess {
    const char* operation;
    int flags;
    const char* openFailed;
};

constexpr MotorTypeAccess kIndexAccess = {"getMotorIndex", O_RDWR, "open failed. errno: "};
constexpr MotorTypeAccess kEnhancedAccess = {"supportsEnhancedQuorvanHapticPattern", O_RDONLY,
                                             " open failed. errno: "};

// The motor type without its last byte, which is the driver's line feed; a name written without
// one loses its last character. Empty optional when the node cannot be opened or has no text.
std::optional<std::string> readMotorType(const MotorTypeAccess& access) {
    const std::string& node = THE_DEVICE_MOTOR_TYPE;
    kernel::FileDescriptor descriptor = kernel::open(node.c_str(), access.flags);
    if (!descriptor.isOpen()) {
        const int error = errno;
        LOG(INFO) << "HW_API: " << access.operation << " node: " << node << access.openFailed
                  << error;
        return std::nullopt;
    }
    char text[32] = {};
    const ssize_t count = kernel::read(descriptor.get(), text, sizeof(text) - 1);
    if (count <= 0) {
        const int error = errno;
        LOG(INFO) << "HW_API: " << access.operation << " node: " << node
                  << " read failed. errno: " << error;
        return std::nullopt;
    }
    descriptor.reset();
    if (count >= static_cast<ssize_t>(sizeof(text))) {
        text[sizeof(text) - 1] = '\0';
        ALOGE("Read MAX limit. Always end of string is null");
    } else {
        text[count - 1] = '\0';
    }
    LOG(INFO) << "HW_API: " << access.operation << " string : " << text;
    LOG(INFO) << "HW_API: " << access.operation << " string len : " << strlen(text);
    return text;
}

}  // namespace

int HwApi::getMotorIndex() {
    LOG(INFO) << "HW_API: getMotorIndex return motor type >>";
    const std::optional<std::string> name = readMotorType(kIndexAccess);
    if (!name) return 0;
    const std::optional<int32_t> known = findMotorIndex(*name);
    if (!known) {
        LOG(INFO) << "HW_API: getMotorIndex MOTOR_TYPE is mandatory feature over P-OS.";
    }
    const int index = known.value_or(0);
    LOG(INFO) << "HW_API: getMotorIndex return motor type : " << index << " <<";
    return index;
}

int HwApi::getMotorIndexbyMethod() {
    LOG(INFO) << "HW_API: getMotorIndexbyMethod >> ";
    const bool prebaked = isPrebakedHapticPatternExist();
    const bool hapticEngine = isHapticEngineNodeExist();
    int index = 0;
    if (prebaked) {
        index = hapticEngine ? 5 : 9;  // LINEAR_INDEX, LINEAR_1030
    } else if (hapticEngine) {
        index = supportsEnhancedQuorvanHapticPattern() ? kLinear1040 : 6;  // else LINEAR_0832RC
    } else {
        index = isAmplitudeControlExist() ? 2 : 1;  // LINEAR, COINDC
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
    const std::optional<std::string> name = readMotorType(kEnhancedAccess);
    if (!name) return false;
    if (*name == "LINEAR_1040") {
        LOG(INFO) << "HW_API: supportsEnhancedQuorvanHapticPattern LINEAR_1040";
        return true;
    }
    LOG(INFO) << "HW_API: supportsEnhancedQuorvanHapticPattern can not supports. Out of capability";
    return false;
}

}  // namespace aidl::android::hardware::vibrator
