// SPDX-License-Identifier: Apache-2.0
//
// Requests that drive the haptic engine itself: plain packets, hybrid packets and FIFO patterns.
#define LOG_TAG "QvxVibrator-HAL-AIDL-EXT"

#include <cstdint>
#include <vector>

#include <android-base/logging.h>

#include "ServiceStatus.h"
#include "Vibrator_vendor.h"
#include "hwapi/DriverWriter.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

constexpr uint32_t kFifoTypes = 26;

constexpr core::PacketWords kPlainWords = {core::kExtensionLog, "performHapticEngine", false};
constexpr core::PacketWords kHybridWords = {core::kExtensionLog, "performHybridHapticEngine", true};

}  // namespace

ndk::ScopedAStatus Vibrator::performHapticEngine(const std::vector<ZelHapticEnginePacket>& packets,
                                                 int32_t amplitude) {
    LOG(INFO) << "V_4_0: performHapticEngine";
    if (!isCallerAllowed()) return core::ok();
    if (!core::arePacketsPlayable(kPlainWords, packets.size(), amplitude)) {
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    core::PacketText text(packets.size());
    core::appendPackets(text, packets, amplitude);
    // Clients of older phones send packets unasked, so they are not told that nothing plays.
    if (core::useForceFeedback) {
        LOG(INFO) << "V_4_0: performHapticEngine : " << text.finish();
        LOG(INFO) << "V_4_0: performHapticEngine Fail - unsupported when forcefeedback";
        return core::ok();
    }
    return core::okOrIllegalState(
            core::sendPackets(*mHwApi, kPlainWords, core::THE_DEVICE_HAPTIC_ENGINE, text.finish()));
}

ndk::ScopedAStatus Vibrator::performHybridHapticEngine(
        const std::vector<ZelHybridHapticEnginePacket>& packets, int32_t amplitude) {
    LOG(INFO) << "V_4_0: performHybridHapticEngine";
    if (!isCallerAllowed()) return core::ok();
    if (!core::arePacketsPlayable(kHybridWords, packets.size(), amplitude)) {
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    core::PacketText text(packets.size());
    for (size_t i = 0; i < packets.size(); ++i) {
        const ZelHybridHapticEnginePacket& packet = packets[i];
        text.append(packet.time);
        text.append(core::scaleIntensity(packet.intensity, amplitude));
        switch (const auto type = static_cast<int32_t>(packet.type)) {
            case 0:
                text.append(packet.value);
                break;
            case 1:
                text.appendMarked(packet.value);
                break;
            default:  // the packet goes out without its value
                LOG(INFO) << "V_4_0: ZelHybridHapticEnginePacketType idx : " << i
                          << " is abnormal : " << type;
                break;
        }
        text.append(packet.frequency);
    }
    return core::okOrIllegalState(core::sendPackets(
            *mHwApi, kHybridWords, core::THE_DEVICE_HYBRID_HAPTIC_ENGINE, text.finish()));
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
