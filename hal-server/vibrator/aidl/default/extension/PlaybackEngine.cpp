// SPDX-License-Identifier: Apache-2.0
//
// Sequences of stored patterns, each at its own level, through the driver's pattern queue.
#define LOG_TAG "QvxVibrator-HAL-AIDL-EXT"

#include <cstddef>
#include <cstdint>
#include <string_view>
#include <vector>

#include <android-base/logging.h>

#include "ServiceStatus.h"
#include "Vibrator_vendor.h"
#include "hwapi/DriverWriter.h"
#include "hwapi/TextBuffer.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

constexpr size_t kPacketsMax = 200;

constexpr core::QueueWords kWords = {core::kExtensionLog, "performPlaybackEngine",
                                     "performPlaybackEngine", false};

// Three numbers of at most eleven characters for each packet, each with what follows it, then one
// more and a terminator.
using Sequence = core::TextBuffer<(kPacketsMax * 3 + 1) * 12 + 1>;

// Fills in the queue string, for example "5.100,7.80,3,2!": patterns with their levels and, where it
// is not 0, their option, then how often the whole is played.
void format(Sequence& text, const std::vector<ZelPlaybackPacket>& packets, bool repeat,
            int32_t repeatCnt) {
    for (const ZelPlaybackPacket& packet : packets) {
        text.append("%d.%d,", packet.patternIndex, packet.level);
        if (packet.option != 0) text.append("%d,", packet.option);
    }
    if (!repeat) {
        text.dropLast();  // the last comma
    } else if (repeatCnt == 0) {
        text.append("~");
    } else {
        text.append("%d!", repeatCnt);
    }
}

}  // namespace

ndk::ScopedAStatus Vibrator::performPlaybackEngine(const std::vector<ZelPlaybackPacket>& packets,
                                                   bool repeat, int32_t repeatCnt) {
    LOG(INFO) << "V_4_0: performPlaybackEngine";
    if (!isCallerAllowed()) return core::ok();
    LOG(INFO) << "V_4_0: performPlaybackEngine packet_cnt : " << packets.size();
    LOG(INFO) << "V_4_0: performPlaybackEngine repeat : " << repeat;
    LOG(INFO) << "V_4_0: performPlaybackEngine repeatCnt : " << repeatCnt;
    if (packets.empty() || packets.size() > kPacketsMax) {
        return refuse(EX_ILLEGAL_ARGUMENT,
                      "V_4_0: performPlaybackEngine packet size is something worng");
    }
    if (repeat && repeatCnt < 0) {
        return refuse(EX_ILLEGAL_ARGUMENT,
                      "V_4_0: performPlaybackEngine repeatCnt minus. It's worng.");
    }
    Sequence text;
    format(text, packets, repeat, repeatCnt);
    const std::string_view bytes = text.getTerminated();  // as the driver wants them
    LOG(INFO) << "V_4_0: Packet data size with repeat option : " << bytes.size();
    LOG(INFO) << "V_4_0: Packet data with repeat option : " << text.get();
    return core::okOrIllegalState(core::playQueue(*mHwApi, kWords, bytes));
}

}  // namespace aidl::vendor::quorvan::hardware::vibrator
