// SPDX-License-Identifier: Apache-2.0
//
// The force-feedback input device: finding it, and playing the process's one effect on it. Every
// upload frees the effect before, so the driver holds at most one of this process.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <fcntl.h>
#include <linux/input.h>

#include <cerrno>
#include <cstring>

#include <android-base/logging.h>
#include <android-base/unique_fd.h>

#include "HwApi.h"
#include "driver/ForceFeedbackEffect.h"
#include "driver/LineReader.h"
#include "driver/SystemCalls.h"

namespace aidl::android::hardware::vibrator {
namespace {

constexpr const char* kInputDeviceList = "/proc/bus/input/devices";
constexpr const char* kDeviceName = "N: Name=\"qvx_vibrator_inputff\"";

// The record before anything is uploaded.
ForceFeedbackEffect emptyEffect() {
    ForceFeedbackEffect effect = {};
    effect.record.type = FF_PERIODIC;
    effect.record.id = -1;
    effect.record.u.periodic.waveform = FF_CUSTOM;
    effect.record.u.periodic.custom_len = ForceFeedbackEffect::kIndexPairLength;
    effect.event.type = EV_FF;
    return effect;
}

// The string that precedes a field's value; null for a field that is not read.
const char* fieldPrefix(char key) {
    switch (key) {
        case 'H':
            return "Handlers=";
        case 'S':
            return "Sysfs=";
        default:
            return nullptr;
    }
}

// Opens the device unless it is open. `operation` begins the log lines.
bool openInputDevice(const char* operation) {
    if (inputFD >= 0) return true;
    LOG(INFO) << "HW_API: " << operation << "Input Node File Open: " << THE_DEVICE_FF;
    inputFD = kernel::open(THE_DEVICE_FF.c_str(), O_RDWR).release();  // open as long as the process
    if (inputFD >= 0) return true;
    const int error = errno;
    LOG(INFO) << "HW_API: " << operation << "open fail: " << THE_DEVICE_FF << " ,errno: " << error;
    return false;
}

}  // namespace

ForceFeedbackEffect forceFeedbackEffect = emptyEffect();

char* HwApi::parse_field(char* line, char key) {
    const char* const prefix = fieldPrefix(key);
    if (prefix == nullptr || line == nullptr) return nullptr;
    const char* const found = strstr(line, prefix);
    if (found == nullptr) return nullptr;
    const char* const value = found + strlen(prefix);
    line[strlen(line) - 1] = '\0';  // its newline; a line without one loses a character
    return strdup(value);
}

char* HwApi::get_input_field_value(char key) {
    LineReader reader(kInputDeviceList);
    if (!reader.isOpen()) {
        LOG(INFO) << "HW_API: [get_input_field_value]fopen error !! ";
        return nullptr;
    }
    LOG(INFO) << "HW_API: [get_input_field_value]fopen done ";
    char line[LineReader::kLineSize];
    bool inBlock = false;
    while (reader.next(line)) {
        if (strstr(line, kDeviceName) != nullptr) inBlock = true;
        if (inBlock && line[0] == key) return parse_field(line, key);
        if (line[0] == '\n') inBlock = false;
    }
    reader.close();
    LOG(INFO) << "HW_API: [get_input_field_value]fopen close()!! ";
    return nullptr;
}

void HwApi::initForceFeedbackEffect() {
    LOG(INFO) << "HW_API: [initForceFeedbackEffect]";
    forceFeedbackEffect = emptyEffect();
    forceFeedbackEffect.record.u.periodic.custom_data = forceFeedbackEffect.indexPair;
}

bool HwApi::uploadForceFeedbackeffect() {
    return upload(forceFeedbackEffect.record);
}

bool HwApi::upload(ff_effect& record) {
    if (!openInputDevice("[uploadForceFeedbackeffect]")) return false;
    int16_t& uploaded = forceFeedbackEffect.record.id;
    if (uploaded != -1) {
        if (kernel::ioctl(inputFD, EVIOCRMFF, uploaded) < 0) {
            const int error = errno;
            LOG(INFO) << "HW_API: [uploadForceFeedbackeffect]Clear Memory - ioctl fail: "
                      << THE_DEVICE_FF << " ,errno: " << error;
            return false;
        }
        uploaded = -1;
    }
    record.id = -1;
    if (kernel::ioctl(inputFD, EVIOCSFF, &record) < 0) {
        const int error = errno;
        LOG(INFO) << "HW_API: [uploadForceFeedbackeffect]ioctl fail: " << THE_DEVICE_FF
                  << " ,errno: " << error;
        return false;
    }
    uploaded = record.id;
    LOG(INFO) << "HW_API: [uploadForceFeedbackeffect]ioctl success ,uploaded effect with ID: "
              << uploaded;
    return true;
}

bool HwApi::setForceFeedbackIndex(int index) {
    forceFeedbackEffect.indexPair[1] = static_cast<int16_t>(index);
    if (index != 0) forceFeedbackEffect.record.replay.length = 0;
    return uploadForceFeedbackeffect();
}

bool HwApi::setForceFeedbackDuration(int durationMs) {
    if (forceFeedbackEffect.indexPair[1] != 0) return true;  // it plays for its own length
    forceFeedbackEffect.record.replay.length = static_cast<uint16_t>(durationMs);
    return uploadForceFeedbackeffect();
}

bool HwApi::setForceFeedbackAmplitude(int gain) {
    LOG(INFO) << "HW_API: [setForceFeedbackAmplitude]amplitude: " << gain;
    forceFeedbackEffect.event.code = FF_GAIN;
    forceFeedbackEffect.event.value = gain;
    return writeInputEvent();
}

bool HwApi::triggerForceFeedbackVibration(bool on) {
    LOG(INFO) << "HW_API: [triggerForceFeedbackVibration]on: " << on;
    forceFeedbackEffect.event.code = static_cast<uint16_t>(forceFeedbackEffect.record.id);
    forceFeedbackEffect.event.value = on ? 1 : 0;
    return writeInputEvent();
}

bool HwApi::writeInputEvent() {
    if (!openInputDevice("[writeInputEvent]")) return false;
    const input_event& event = forceFeedbackEffect.event;
    // The input core takes whole events or none, so a count is not looked at.
    if (kernel::write(inputFD, &event, sizeof(event)) < 0) {
        const int error = errno;
        LOG(INFO) << "HW_API: [writeInputEvent]write fail: " << THE_DEVICE_FF
                  << " ,errno: " << error;
        return false;
    }
    return true;
}

void HwApi::closeInputDevice() {
    ::android::base::unique_fd(inputFD).reset();
}

}  // namespace aidl::android::hardware::vibrator
