// SPDX-License-Identifier: Apache-2.0
//
// Haptic engine playback: a sequence of packets goes to the driver as one string, for example
// "4 7 10000 2050 0\n" for one packet: how many numbers follow, then four for each packet.
#define LOG_TAG log.tag

#include <optional>

#include <android-base/logging.h>

#include "hwapi/DriverWriter.h"

namespace aidl::android::hardware::vibrator {
namespace {

constexpr PacketWords kWords = {kHardwareLog, "performHapticEngine", false};

}  // namespace

bool arePacketsPlayable(const PacketWords& words, size_t packets, int32_t amplitude) {
    const LogSource& log = words.log;
    const char* const operation = words.operation;
    LOG(log.severity) << log.prefix << operation << " amplitude : " << amplitude;
    LOG(log.severity) << log.prefix << operation << " packet_cnt : " << packets;
    LOG(log.severity) << log.prefix << operation << " total_size : " << packets * kPacketValues;
    if (packets > kPacketsMax) {
        LOG(log.severity) << log.prefix << operation << " packet size is exceed";
        return false;
    }
    return isDriverAmplitude(log, operation, amplitude);
}

bool sendPackets(HwApi& hardware, const PacketWords& words, const std::string& node,
                 std::string_view text) {
    const LogSource& log = words.log;
    LOG(log.severity) << log.prefix << words.operation << " : " << text;
    const std::optional<ssize_t> written = writeBytes(log, words.operation, node, text);
    if (!written) return false;
    const bool whole = *written == static_cast<ssize_t>(text.size());
    if (whole) hardware.do_on(1);
    const bool accepted = whole || words.partIsOk;
    LOG(log.severity) << log.prefix << words.operation << (accepted ? " OK" : " UNKNOWN_ERROR");
    return accepted;
}

bool HwApi::performHapticEngine(const std::vector<HapticEnginePacket>& packets, int amplitude) {
    const LogSource& log = kHardwareLog;
    LOG(log.severity) << log.prefix << kWords.operation;
    if (!arePacketsPlayable(kWords, packets.size(), amplitude)) return false;
    PacketText text(packets.size());
    appendPackets(text, packets, amplitude);
    return sendPackets(*this, kWords, THE_DEVICE_HAPTIC_ENGINE, text.finish());
}

}  // namespace aidl::android::hardware::vibrator
