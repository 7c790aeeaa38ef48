// SPDX-License-Identifier: Apache-2.0
//
// Composite waveforms for the force-feedback device: compiled from text, uploaded and started. The
// process's effect record is borrowed for one upload and one start, and put back on every path.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <cstdint>
#include <cstdio>
#include <string>

#include <android-base/logging.h>

#include "CompositeWaveform.h"
#include "ForceFeedbackEffect.h"
#include "HwApi.h"
#include "KypIndex.h"

namespace aidl::android::hardware::vibrator {
namespace {

// Compiles `text`, cutting it up, and plays it. `operation` begins the log lines.
bool playComposite(HwApi& hardware, const char* operation, char* text) {
    LOG(INFO) << "HW_API: " << operation << "str: " << text;
    alignas(int16_t) uint8_t bytes[WT_TYPE10_COMP_BUFFER_SIZE] = {};
    const int count = wt_type10_comp_str_to_bin(text, bytes);
    LOG(INFO) << "HW_API: " << operation << "num_bytes: " << count;
    if (count < 0) return false;

    ff_effect& record = forceFeedbackEffect.record;
    record.replay.length = 0;
    record.u.periodic.custom_len = static_cast<uint32_t>(count) / sizeof(int16_t);
    record.u.periodic.custom_data = reinterpret_cast<int16_t*>(bytes);  // the driver copies it
    const bool played =
            hardware.uploadForceFeedbackeffect() && hardware.triggerForceFeedbackVibration(true);
    record.u.periodic.custom_len = ForceFeedbackEffect::kIndexPairLength;
    record.u.periodic.custom_data = forceFeedbackEffect.indexPair;
    return played;
}

}  // namespace

bool HwApi::setAndTriggerOwt(int index, int /*unused*/) {
    if (useKypIndex) {
        LOG(INFO) << "HW_API: [setAndTriggerOwt]kyp index transform";
        index = toKypIndex(index);
    }
    char text[32];
    snprintf(text, sizeof(text), "%d.%d, 10, ~", index, 100);
    return playComposite(*this, "[setAndTriggerOwt]", text);
}

bool HwApi::setAndTriggerOwt_primitve(std::string text) {
    return playComposite(*this, "[setAndTriggerOwt_primitve]", text.data());
}

}  // namespace aidl::android::hardware::vibrator
