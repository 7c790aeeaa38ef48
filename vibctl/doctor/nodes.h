// SPDX-License-Identifier: Apache-2.0
//
// The vibrator driver's nodes from outside the service. The names are written down here once more,
// from the nodes' side, so that a slip in the service shows as a difference.
#pragma once

#include <fcntl.h>

#include <string>

namespace vibctl {

inline constexpr const char* kLegacyDirectory = "/sys/class/timed_output/vibrator/";
inline constexpr const char* kLedsDirectory = "/sys/class/leds/vibrator/";
inline constexpr const char* kInfoDirectory = "/sys/class/vib_info_class/vib_support_info/";
inline constexpr const char* kForceFeedbackDirectory = "/sys/class/qvx_vib_inputff/control/";
inline constexpr const char* kInputDeviceList = "/proc/bus/input/devices";
inline constexpr const char* kMotorName = "qvx_vibrator_inputff";

struct Node {
    const char* name;
    int flags;  // of open(2), as the service opens it
};

// Those that decide about the class.
inline constexpr Node kLegacyClass[] = {{"enable", O_RDWR}};
inline constexpr Node kLedsClass[] = {
        {"activate", O_RDWR}, {"duration", O_RDWR}, {"state", O_RDWR}};

// Which of these a driver has is its own choice; each that it has, the service must be able to
// open. motor_type is only read, but the service opens it for writing as well.
inline constexpr Node kFeatureNodes[] = {
        {"intensity", O_RDWR},
        {"force_touch_intensity", O_RDWR},
        {"multi_freq", O_RDWR},
        {"haptic_engine", O_RDWR},
        {"cp_trigger_index", O_RDWR},
        {"cp_trigger_queue", O_RDWR},
        {"num_waves", O_RDONLY},
        {"motor_type", O_RDWR},
        {"event_cmd", O_RDWR},
        {"intensities", O_RDONLY},
        {"haptic_intensities", O_RDONLY},
        {"asp_enable", O_RDWR},
        {"gpio1_fall_index", O_RDWR},
        {"gpio1_fall_dig_scale", O_RDWR},
        {"gpio1_rise_index", O_RDWR},
        {"gpio1_rise_dig_scale", O_RDWR},
        {"vibe_state", O_RDONLY},
        {"fifo", O_RDWR},
        {"hybrid_haptic_engine", O_RDWR},
};

inline constexpr Node kForceFeedbackNodes[] = {
        {"/sys/class/qvx_vib_inputff/control/use_kyp_index", O_WRONLY},
        {"/sys/class/qvx_vib_inputff/control/event_cmd", O_RDWR},
        {"/sys/class/qvx_vib_inputff/control/f0_stored", O_WRONLY},
        {"/efs/FactoryApp/vibrator_calibration", O_RDONLY},
};

inline constexpr Node kInfoNodes[] = {
        {"functions", O_RDONLY},
        {"intensities", O_RDONLY},
        {"haptic_intensities", O_RDONLY},
};

// "vibrator/intensity": the two last pieces tell a node from all others.
inline std::string shortName(const std::string& path) {
    const size_t last = path.rfind('/');
    return path.substr(path.rfind('/', last - 1) + 1);
}

}  // namespace vibctl
