// SPDX-License-Identifier: Apache-2.0
//
// Start-up probing: which of the three drivers this phone has, and where its nodes are. The legacy
// class is tried first, then the LED class, then force feedback; the first that answers is kept for
// the life of the process.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <cerrno>
#include <cstdlib>
#include <memory>
#include <string>

#include <android-base/logging.h>

#include "Constants.h"
#include "HwApi.h"
#include "hwapi/DriverWriter.h"

namespace aidl::android::hardware::vibrator {

std::string THE_DEVICE_FF;
std::string THE_DEVICE_INTENSITY;
std::string THE_DEVICE_FORCE_TOUCH_INTENSITY;
std::string THE_DEVICE_MULTI_FREQ;
std::string THE_DEVICE_HAPTIC_ENGINE;
std::string THE_DEVICE_HAPTIC_ENGINE_INDEX;
std::string THE_DEVICE_HAPTIC_PLAYBACK_QUEUE;
std::string THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES;
std::string THE_DEVICE_MOTOR_TYPE;
std::string THE_DEVICE_EVENT_CMD;
std::string THE_DEVICE_PATTERN_LENGTH;
std::string THE_DEVICE_EXT_CONTROL;
std::string THE_DEVICE_CAL_INTENSITIES;
std::string THE_DEVICE_CAL_HAPTIC_INTENSITIES;
std::string THE_DEVICE_FIFO_HAPTIC_ENGINE;
std::string THE_DEVICE_HYBRID_HAPTIC_ENGINE;
std::string THE_DEVICE_ASP_ENABLE;
std::string THE_DEVICE_GPIO1_FALL_INDEX;
std::string THE_DEVICE_GPIO1_FALL_DIG_SCALE;
std::string THE_DEVICE_GPIO1_RISE_INDEX;
std::string THE_DEVICE_GPIO1_RISE_DIG_SCALE;
std::string THE_DEVICE_VIB_STATE;
namespace {

// The nodes that the legacy and the LED class both have, under the same leaf names, in the order
// in which they are set and logged.
struct SysfsNode {
    std::string& path;
    const char* leaf;
    const char* logText;
};

// clang-format off
const SysfsNode kSysfsNodes[] = {
    {THE_DEVICE_INTENSITY,               "intensity",             "Vibrator THE_DEVICE_INTENSITY : "},
    {THE_DEVICE_FORCE_TOUCH_INTENSITY,   "force_touch_intensity", "Vibrator THE_DEVICE_FORCE_TOUCH_INTENSITY : "},
    {THE_DEVICE_MULTI_FREQ,              "multi_freq",            "Vibrator THE_DEVICE_MULTI_FREQ : "},
    {THE_DEVICE_HAPTIC_ENGINE,           "haptic_engine",         "Vibrator THE_DEVICE_HAPTIC_ENGINE : "},
    {THE_DEVICE_HAPTIC_ENGINE_INDEX,     "cp_trigger_index",      "Vibrator THE_DEVICE_HAPTIC_ENGINE_INDEX : "},
    {THE_DEVICE_HAPTIC_PLAYBACK_QUEUE,   "cp_trigger_queue",      "Vibrator THE_DEVICE_HAPTIC_PLAYBACK_QUEUE : "},
    {THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES, "num_waves",             "Vibrator THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES : "},
    {THE_DEVICE_MOTOR_TYPE,              "motor_type",            "Vibrator THE_DEVICE_MOTOR_TYPE : "},
    {THE_DEVICE_EVENT_CMD,               "event_cmd",             "Vibrator THE_DEVICE_EVENT_CMD : "},
    {THE_DEVICE_PATTERN_LENGTH,          "pattern_length",        "Vibrator THE_DEVICE_PATTERN_LENGTH : "},
    {THE_DEVICE_EXT_CONTROL,             "ext_control",           "Vibrator THE_DEVICE_EXT_CONTROL : "},
    {THE_DEVICE_CAL_INTENSITIES,         "intensities",           "Vibrator THE_DEVICE_CAL_INTENSITIES : "},
    {THE_DEVICE_CAL_HAPTIC_INTENSITIES,  "haptic_intensities",    "Vibrator THE_DEVICE_CAL_HAPTIC_INTENSITIES : "},
    {THE_DEVICE_ASP_ENABLE,              "asp_enable",            "Vibrator THE_DEVICE_ASP_ENABLE : "},
    {THE_DEVICE_GPIO1_FALL_INDEX,        "gpio1_fall_index",      "Vibrator THE_DEVICE_GPIO1_FALL_INDEX : "},
    {THE_DEVICE_GPIO1_FALL_DIG_SCALE,    "gpio1_fall_dig_scale",  "Vibrator THE_DEVICE_GPIO1_FALL_DIG_SCALE : "},
    {THE_DEVICE_GPIO1_RISE_INDEX,        "gpio1_rise_index",      "Vibrator THE_DEVICE_GPIO1_RISE_INDEX : "},
    {THE_DEVICE_GPIO1_RISE_DIG_SCALE,    "gpio1_rise_dig_scale",  "Vibrator THE_DEVICE_GPIO1_RISE_DIG_SCALE : "},
    {THE_DEVICE_VIB_STATE,               "vibe_state",            "Vibrator THE_DEVICE_VIB_STATE : "},
    {THE_DEVICE_FIFO_HAPTIC_ENGINE,      "fifo",                  "Vibrator THE_DEVICE_FIFO_HAPTIC_ENGINE : "},
    {THE_DEVICE_HYBRID_HAPTIC_ENGINE,    "hybrid_haptic_engine",  "Vibrator THE_DEVICE_HYBRID_HAPTIC_ENGINE : "},
};
// clang-format on

void setSysfsPaths(const std::string& deviceDirectory) {
    for (const SysfsNode& node : kSysfsNodes) {
        node.path = deviceDirectory + node.leaf;
    }
}

void logSysfsPaths() {
    for (const SysfsNode& node : kSysfsNodes) {
        LOG(INFO) << "HW_API: " << node.logText << fromClass(node.path);
    }
}

}  // namespace

// Probing asks through the virtual interface, which during construction is this class's own.
// NOLINTBEGIN(clang-analyzer-optin.cplusplus.VirtualCall)

HwApi::HwApi() {
    if (isVibratorNodeExist()) {
        selectTimedOutput();
    } else {
        mTimedOutputError = errno;
        if (isVibratorActiveNodeExist() && isVibratorDurationNodeExist() &&
            isVibratorStateNodeExist()) {
            selectLeds();
        } else {
            mLedsError = errno;
            selectForceFeedback();
        }
    }
    if (!useForceFeedback) logSysfsPaths();
    openStreams();
    motorPerformMethod = getMotorPerformMethod();
}

HwApi::~HwApi() = default;

void HwApi::selectTimedOutput() {
    LOG(INFO) << "HW_API: Vibrator using timed_output";
    useLedsClass = false;
    switchToKypIndex(TIMED_OUTPUT_USE_KYP_INDEX);
    setSysfsPaths("/sys/class/timed_output/vibrator/");
}

void HwApi::selectLeds() {
    LOG(INFO) << "HW_API: Vibrator using LED trigger";
    useLedsClass = true;
    setSysfsPaths("/sys/class/leds/vibrator/");
}

void HwApi::selectForceFeedback() {
    struct Free {
        void operator()(char* text) const { free(text); }
    };
    const std::unique_ptr<char, Free> handlers(get_input_field_value('H'));
    if (handlers == nullptr) {
        LOG(INFO) << "HW_API: Fail to find CS40L26 info";
        return;
    }
    LOG(INFO) << "HW_API: Vibrator using ForceFeedback";
    useForceFeedback = true;
    switchToKypIndex(INPUTFF_USE_KYP_INDEX);
    THE_DEVICE_FF = "/dev/input/" + rtrim(handlers.get());
    THE_DEVICE_EVENT_CMD = "/sys/class/qvx_vib_inputff/control/event_cmd";
    LOG(INFO) << "HW_API: THE_DEVICE_FF: " << THE_DEVICE_FF;
    LOG(INFO) << "HW_API: THE_DEVICE_FF_EVENT_CMD: " << THE_DEVICE_EVENT_CMD;
    initForceFeedbackEffect();
    restoreCalibration();
}

void HwApi::switchToKypIndex(const char* node) {
    if (!isNodeExistForWrite(node)) return;
    // A driver that has the switch numbers its patterns that way even where it refuses the write.
    writeNodeByStringOnlyForWriting(node, "1");
    useKypIndex = true;
}

void HwApi::restoreCalibration() {
    if (!isNodeExistForRead(CALIBRATION_FILE)) return;
    const std::string calibration = readNodeAsString(CALIBRATION_FILE);
    LOG(INFO) << "HW_API: vibrator_calibration: " << calibration;
    if (calibration.empty()) {
        LOG(INFO) << "HW_API: Fail - read vibrator_calibration";
    } else if (!writeNodeByStringOnlyForWriting(INPUTFF_F0_STORED, calibration)) {
        LOG(INFO) << "HW_API: Fail - write vibrator_calibration to f0_stored";
    }
}

// NOLINTEND(clang-analyzer-optin.cplusplus.VirtualCall)

void HwApi::openStreams() {
    HwApiopen(THE_DEVICE_ASP_ENABLE, &mAspEnable);
    HwApiopen(THE_DEVICE_GPIO1_FALL_INDEX, &mGpioFallIndex);
    HwApiopen(THE_DEVICE_GPIO1_FALL_DIG_SCALE, &mGpioFallScale);
    HwApiopen(THE_DEVICE_GPIO1_RISE_INDEX, &mGpioRiseIndex);
    HwApiopen(THE_DEVICE_GPIO1_RISE_DIG_SCALE, &mGpioRiseScale);
    HwApiopen(THE_DEVICE_VIB_STATE, &mVibState);
}

}  // namespace aidl::android::hardware::vibrator
