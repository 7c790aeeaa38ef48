// SPDX-License-Identifier: Apache-2.0
//
// Composite waveforms for the force-feedback device: compiled from a string, uploaded and started.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <cstdint>
#include <cstdio>
#include <string>

#include <android-base/logging.h>

#include "HwApi.h"
#include "driver/ForceFeedbackEffect.h"
#include "hwapi/CompositeWaveform.h"
#include "hwapi/DriverWriter.h"

namespace aidl::android::hardware::vibrator {
bool HwApi::playComposite(const char* operation, char* text) {
    LOG(INFO) << "HW_API: " << operation << "str: " << text;
    alignas(int16_t) uint8_t bytes[WT_TYPE10_COMP_BUFFER_SIZE] = {};
    const int count = wt_type10_comp_str_to_bin(text, bytes);
    LOG(INFO) << "HW_API: " << operation << "num_bytes: " << count;
    if (count < 0) return false;

    forceFeedbackEffect.record.replay.length = 0;
    ff_effect record = forceFeedbackEffect.record;
    record.u.periodic.custom_len = static_cast<uint32_t>(count) / sizeof(int16_t);
    record.u.periodic.custom_data = reinterpret_cast<int16_t*>(bytes);  // the driver copies it
    return upload(record) && triggerForceFeedbackVibration(true);
}

bool HwApi::setAndTriggerOwt(int index, int /*unused*/) {
    if (useKypIndex) {
        LOG(INFO) << "HW_API: [setAndTriggerOwt]kyp index transform";
        index = toKypIndex(index);
    }
    char text[32];
    snprintf(text, sizeof(text), "%d.%d, 10, ~", index, 100);
    return playComposite("[setAndTriggerOwt]", text);
}

bool HwApi::setAndTriggerOwt_primitve(std::string text) {
    return playComposite("[setAndTriggerOwt_primitve]", text.data());
}

}  // namespace aidl::android::hardware::vibrator
