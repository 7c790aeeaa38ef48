// SPDX-License-Identifier: Apache-2.0
//
// Requests that drive the haptic engine itself: plain packets, hybrid packets and FIFO patterns.
#define LOG_TAG "QvxVibrator-HAL-AIDL-EXT"

#include <cerrno>
#include <optional>
#include <string_view>
#include <vector>

#include <android-base/logging.h>

#include "Amplitude.h"
#include "PacketText.h"
#include "ServiceStatus.h"
#include "SystemCalls.h"
#include "Vibrator_vendor.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

constexpr uint32_t kFifoTypes = 26;

// What both packet requests log and check before they build their text.
bool isPlayable(const char* operation, size_t packets, int32_t amplitude) {
    LOG(INFO) << "V_4_0: " << operation << " amplitude : " << amplitude;
    LOG(INFO) << "V_4_0: " << operation << " packet_cnt : " << packets;
    LOG(INFO) << "V_4_0: " << operation << " total_size : " << packets * core::kPacketValues;
    if (packets > core::kPacketsMax) {
        LOG(INFO) << "V_4_0: " << operation << " packet size is exceed";
        return false;
    }
    if (!core::isDriverAmplitude(amplitude)) {
        LOG(INFO) << "V_4_0: " << operation << " amplitude is abnormal " << amplitude;
        return false;
    }
    return true;
}

}  // namespace

ndk::ScopedAStatus Vibrator::performHapticEngine(const std::vector<ZelHapticEnginePacket>& packets,
                                                 int32_t amplitude) {
    LOG(INFO) << "V_4_0: performHapticEngine";
    if (!isCallerAllowed()) return core::ok();
    if (!isPlayable("performHapticEngine", packets.size(), amplitude)) {
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    core::PacketText builder(packets.size());
    for (const ZelHapticEnginePacket& packet : packets) {
        builder.append(packet.time);
        builder.append(core::scaleIntensity(packet.intensity, amplitude));
        builder.append(packet.frequency);
        builder.append(packet.overdrive);
    }
    const std::string_view text = builder.finish();
    LOG(INFO) << "V_4_0: performHapticEngine : " << text;

    // Clients of older phones send packets unasked, so they are not told that nothing plays.
    if (core::useForceFeedback) {
        LOG(INFO) << "V_4_0: performHapticEngine Fail - unsupported when forcefeedback";
        return core::ok();
    }
    const std::optional<ssize_t> written =
            core::kernel::writeOnce(core::THE_DEVICE_HAPTIC_ENGINE, text.data(), text.size());
    if (!written) {
        const int error = errno;
        LOG(INFO) << "V_4_0: performHapticEngine is fail: " << error;
        return core::exception(EX_ILLEGAL_STATE);
    }
    if (*written != static_cast<ssize_t>(text.size())) {
        LOG(INFO) << "V_4_0: performHapticEngine UNKNOWN_ERROR";
        return core::exception(EX_ILLEGAL_STATE);
    }
    mHwApi->do_on(1);
    LOG(INFO) << "V_4_0: performHapticEngine OK";
    return core::ok();
}

ndk::ScopedAStatus Vibrator::performHybridHapticEngine(
        const std::vector<ZelHybridHapticEnginePacket>& packets, int32_t amplitude) {
    LOG(INFO) << "V_4_0: performHybridHapticEngine";
    if (!isCallerAllowed()) return core::ok();
    if (!isPlayable("performHybridHapticEngine", packets.size(), amplitude)) {
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    core::PacketText builder(packets.size());
    for (size_t i = 0; i < packets.size(); ++i) {
        const ZelHybridHapticEnginePacket& packet = packets[i];
        builder.append(packet.time);
        builder.append(core::scaleIntensity(packet.intensity, amplitude));
        switch (const auto type = static_cast<int32_t>(packet.type)) {
            case 0:
                builder.append(packet.value);
                break;
            case 1:
                builder.appendMarked(packet.value);
                break;
            default:  // the packet goes out without its value
                LOG(INFO) << "V_4_0: ZelHybridHapticEnginePacketType idx : " << i
                          << " is abnormal : " << type;
                break;
        }
        builder.append(packet.frequency);
    }
    const std::string_view text = builder.finish();
    LOG(INFO) << "V_4_0: performHybridHapticEngine : " << text;

    const std::optional<ssize_t> written = core::kernel::writeOnce(
            core::THE_DEVICE_HYBRID_HAPTIC_ENGINE, text.data(), text.size());
    if (!written) {
        const int error = errno;
        LOG(INFO) << "V_4_0: performHybridHapticEngine is fail: " << error;
        return core::exception(EX_ILLEGAL_STATE);
    }
    // A driver that takes less, or nothing, has said all there is to say to its own log.
    if (*written == static_cast<ssize_t>(text.size())) mHwApi->do_on(1);
    LOG(INFO) << "V_4_0: performHybridHapticEngine OK";
    return core::ok();
}

ndk::ScopedAStatus Vibrator::performFifoHapticEngine(ZelFifoType type) {
    const auto number = static_cast<int32_t>(type);
    LOG(INFO) << "V_4_0: performFifoHapticEngine";
    if (!isCallerAllowed()) return core::ok();
    if (static_cast<uint32_t>(number) >= kFifoTypes) {
        LOG(INFO) << "V_4_0: performFifoHapticEngine is abnormal " << number;
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    // The driver starts a FIFO pattern on the write itself.
    if (!mHwApi->writeNode(core::THE_DEVICE_FIFO_HAPTIC_ENGINE, number)) {
        return core::exception(EX_ILLEGAL_STATE);
    }
    LOG(INFO) << "V_4_0: performFIFOHapticEngine OK";
    return core::ok();
}

}  // namespace aidl::vendor::quorvan::hardware::vibrator
