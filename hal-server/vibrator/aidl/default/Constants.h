// SPDX-License-Identifier: Apache-2.0
//
// The driver's fixed names, shared by the hardware layer and both services: node paths that do not
// depend on the device class, the posture commands, the motor types and the driver's feature words.
// All of it is there before main() runs.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace aidl::android::hardware::vibrator {

// Legacy class: one node that takes the duration in milliseconds, 0 to stop.
inline constexpr char TIMED_OUTPUT_ENABLE[] = "/sys/class/timed_output/vibrator/enable";

// LED class: start/stop, duration in milliseconds, and the state that arms a timed vibration.
inline constexpr char LEDS_ACTIVATE[] = "/sys/class/leds/vibrator/activate";
inline constexpr char LEDS_DURATION[] = "/sys/class/leds/vibrator/duration";
inline constexpr char LEDS_STATE[] = "/sys/class/leds/vibrator/state";

// Power management of DC motors. The driver has it; the service leaves it alone.
inline constexpr char DC_PMIC[] = "/sys/class/qvx/vib/dc_pmic";

// Information class, the same on every device class: intensity tables and the feature words.
inline constexpr char VIB_INFO_INTENSITIES[] =
        "/sys/class/vib_info_class/vib_support_info/intensities";
inline constexpr char VIB_INFO_HAPTIC_INTENSITIES[] =
        "/sys/class/vib_info_class/vib_support_info/haptic_intensities";
inline constexpr char VIB_INFO_FUNCTIONS[] = "/sys/class/vib_info_class/vib_support_info/functions";

// Resonance measured in the factory, and the force-feedback driver's node that takes it.
inline constexpr char CALIBRATION_FILE[] = "/efs/FactoryApp/vibrator_calibration";
inline constexpr char INPUTFF_F0_STORED[] = "/sys/class/qvx_vib_inputff/control/f0_stored";

// Switches that make the driver number its patterns the platform's way.
inline constexpr char TIMED_OUTPUT_USE_KYP_INDEX[] =
        "/sys/class/timed_output/vibrator/use_kyp_index";
inline constexpr char INPUTFF_USE_KYP_INDEX[] = "/sys/class/qvx_vib_inputff/control/use_kyp_index";

// Posture commands of a foldable device, newline included, written as they stand to
// THE_DEVICE_EVENT_CMD.
inline constexpr char FOLDER_OPEN[] = "FOLDER_OPEN\n";
inline constexpr char FOLDER_CLOSE[] = "FOLDER_CLOSE\n";
inline constexpr char FOLDER_TENT_OPEN[] = "FOLDER_TENT_OPEN\n";
inline constexpr char FOLDER_TENT_CLOSE[] = "FOLDER_TENT_CLOSE\n";

// Motor indices, which the driver's tables count by, and the names that its motor_type node reports.
// MOTOR_NONE also stands for an unknown motor.
// clang-format off
enum MotorIndex : int32_t {
    MOTOR_NONE = 0,          MOTOR_COINDC = 1,         MOTOR_LINEAR = 2,        MOTOR_COINDC_PMIC = 3,
    MOTOR_COINDC_INDEX = 4,  MOTOR_LINEAR_INDEX = 5,   MOTOR_LINEAR_0832RC = 6, MOTOR_LINEAR_1040 = 7,
    MOTOR_LINEAR_RCVMOT = 8, MOTOR_LINEAR_1030 = 9,    MOTOR_LINEAR_INDEX_RC = 10,
    MOTOR_LINEAR_WATCH = 11, MOTOR_LINEAR_ACTIVE = 12,
};
inline const std::map<std::string, int32_t, std::less<>> MOTOR_TYPE_NAMES = {
    {"NONE", MOTOR_NONE},                 {"COINDC", MOTOR_COINDC},
    {"LINEAR", MOTOR_LINEAR},             {"COINDC_PMIC", MOTOR_COINDC_PMIC},
    {"COINDC_INDEX", MOTOR_COINDC_INDEX}, {"LINEAR_INDEX", MOTOR_LINEAR_INDEX},
    {"LINEAR_0832RC", MOTOR_LINEAR_0832RC}, {"LINEAR_1040", MOTOR_LINEAR_1040},
    {"LINEAR_RCVMOT", MOTOR_LINEAR_RCVMOT}, {"LINEAR_1030", MOTOR_LINEAR_1030},
    {"LINEAR_INDEX_RC", MOTOR_LINEAR_INDEX_RC}, {"LINEAR_WATCH", MOTOR_LINEAR_WATCH},
    {"LINEAR_ACTIVE", MOTOR_LINEAR_ACTIVE},
};
// clang-format on

// The motor index of exactly this name, upper case included; empty when there is no such motor.
inline std::optional<int32_t> findMotorIndex(std::string_view name) {
    const auto found = MOTOR_TYPE_NAMES.find(name);
    if (found == MOTOR_TYPE_NAMES.end()) return std::nullopt;
    return found->second;
}

// The words that the driver lists in VIB_INFO_FUNCTIONS, each at the value of its qvx_features.
inline constexpr std::array<std::string_view, 13> FEATURE_NAMES = {{
        "INTENSITY",                      // 0
        "FORCE_TOUCH_INTENSITY",          // 1
        "MULTI_FREQUENCY",                // 2
        "HAPTIC_ENGINE",                  // 3
        "INDEX_HAPTIC_PATTERN",           // 4
        "KYPINDEX_HAPTIC_PATTERN",        // 5
        "ENHANCED_HAPTIC_ENGINE",         // 6
        "FIFO_HAPTIC_ENGINE",             // 7
        "HYBRID_HAPTIC_ENGINE",           // 8
        "ENHANCED_HYBRID_HAPTIC_ENGINE",  // 9
        "CAPABILITY_EXTERNAL_CONTROL",    // 10
        "COMMON_INPUTFF_INTERFACE",       // 11
        "PRIMITIVE_EFFECT_COMPOSE",       // 12
}};

}  // namespace aidl::android::hardware::vibrator
