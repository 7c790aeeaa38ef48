// SPDX-License-Identifier: Apache-2.0
//
// Haptic engine playback: a sequence of packets goes to the driver as one text, for example
// "4 7 10000 2050 0\n" for one packet: how many numbers follow, then four for each packet.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <cerrno>
#include <optional>
#include <string_view>
#include <vector>

#include <android-base/logging.h>

#include "Amplitude.h"
#include "HwApi.h"
#include "PacketText.h"
#include "SystemCalls.h"

namespace aidl::android::hardware::vibrator {

bool HwApi::performHapticEngine(const std::vector<HapticEnginePacket>& packets, int amplitude) {
    LOG(INFO) << "HW_API: performHapticEngine";
    LOG(INFO) << "HW_API: performHapticEngine amplitude : " << amplitude;
    LOG(INFO) << "HW_API: performHapticEngine packet_cnt : " << packets.size();
    LOG(INFO) << "HW_API: performHapticEngine total_size : " << packets.size() * kPacketValues;
    if (packets.size() > kPacketsMax) {
        LOG(INFO) << "HW_API: performHapticEngine packet size is exceed";
        return false;
    }
    if (!isDriverAmplitude(amplitude)) {
        LOG(INFO) << "HW_API: performHapticEngine amplitude is abnormal " << amplitude;
        return false;
    }
    PacketText builder(packets.size());
    for (const HapticEnginePacket& packet : packets) {
        builder.append(packet.time);
        builder.append(scaleIntensity(packet.intensity, amplitude));
        builder.append(packet.frequency);
        builder.append(packet.overdrive);
    }
    const std::string_view text = builder.finish();
    LOG(INFO) << "HW_API: performHapticEngine : " << text;

    const std::optional<ssize_t> written =
            kernel::writeOnce(THE_DEVICE_HAPTIC_ENGINE, text.data(), text.size());
    if (!written) {
        const int error = errno;
        LOG(INFO) << "HW_API: performHapticEngine is fail: " << error;
        return false;
    }
    if (*written != static_cast<ssize_t>(text.size())) {
        LOG(INFO) << "HW_API: performHapticEngine UNKNOWN_ERROR";
        return false;
    }
    do_on(1);
    LOG(INFO) << "HW_API: performHapticEngine OK";
    return true;
}

}  // namespace aidl::android::hardware::vibrator
