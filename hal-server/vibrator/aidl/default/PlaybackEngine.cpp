// SPDX-License-Identifier: Apache-2.0
//
// Sequences of stored patterns, each at its own level, through the driver's pattern queue.
#define LOG_TAG "QvxVibrator-HAL-AIDL-EXT"

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <optional>
#include <string_view>
#include <vector>

#include <android-base/logging.h>

#include "PatternQueue.h"
#include "ServiceStatus.h"
#include "SystemCalls.h"
#include "Vibrator_vendor.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

constexpr size_t kPacketsMax = 200;

// The queue text, for example "5.100,7.80,3,2!": patterns with their levels and, where it is not 0,
// their option, then how often the whole is played. A terminating zero byte follows it.
class SequenceText {
  public:
    SequenceText(const std::vector<ZelPlaybackPacket>& packets, bool repeat, int32_t repeatCnt) {
        for (const ZelPlaybackPacket& packet : packets) {
            append("%d.%d,", packet.patternIndex, packet.level);
            if (packet.option != 0) append("%d,", packet.option);
        }
        if (!repeat) {
            mText[--mLength] = '\0';  // the last comma
        } else if (repeatCnt == 0) {
            append("~");
        } else {
            append("%d!", repeatCnt);
        }
    }

    std::string_view get() const { return {mText, mLength}; }

  private:
    static constexpr size_t kNumberSize = 12;  // eleven characters and what follows them

    __attribute__((format(printf, 2, 3))) void append(const char* format, ...) {
        va_list arguments;
        va_start(arguments, format);
        const int length = vsnprintf(mText + mLength, sizeof(mText) - mLength, format, arguments);
        va_end(arguments);
        mLength += static_cast<size_t>(length);
    }

    char mText[kPacketsMax * 3 * kNumberSize + kNumberSize + 1];
    size_t mLength = 0;
};

}  // namespace

ndk::ScopedAStatus Vibrator::performPlaybackEngine(const std::vector<ZelPlaybackPacket>& packets,
                                                   bool repeat, int32_t repeatCnt) {
    LOG(INFO) << "V_4_0: performPlaybackEngine";
    if (!isCallerAllowed()) return core::ok();
    LOG(INFO) << "V_4_0: performPlaybackEngine packet_cnt : " << packets.size();
    LOG(INFO) << "V_4_0: performPlaybackEngine repeat : " << repeat;
    LOG(INFO) << "V_4_0: performPlaybackEngine repeatCnt : " << repeatCnt;
    if (packets.empty() || packets.size() > kPacketsMax) {
        LOG(INFO) << "V_4_0: performPlaybackEngine packet size is something worng";
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    if (repeat && repeatCnt < 0) {
        LOG(INFO) << "V_4_0: performPlaybackEngine repeatCnt minus. It's worng.";
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    const SequenceText sequence(packets, repeat, repeatCnt);
    const std::string_view text = sequence.get();
    const size_t size = text.size() + 1;  // the driver wants the terminating zero byte
    LOG(INFO) << "V_4_0: Packet data size with repeat option : " << size;
    LOG(INFO) << "V_4_0: Packet data with repeat option : " << text;

    if (!mHwApi->writeNode(core::THE_DEVICE_HAPTIC_ENGINE_INDEX, core::kQueueIndex)) {
        LOG(INFO) << "V_4_0: performPlaybackEngine write 0xFFFE fail";
        return core::exception(EX_ILLEGAL_STATE);
    }
    const std::optional<ssize_t> written =
            core::kernel::writeOnce(core::THE_DEVICE_HAPTIC_PLAYBACK_QUEUE, text.data(), size);
    if (!written) {
        const int error = errno;
        LOG(INFO) << "V_4_0: performPlaybackEngine is fail: " << error;
        return core::exception(EX_ILLEGAL_STATE);
    }
    LOG(INFO) << "V_4_0: ret : " << *written;
    if (*written < static_cast<ssize_t>(size)) {
        LOG(INFO) << "V_4_0: performPlaybackEngine repeat error";
        return core::exception(EX_ILLEGAL_STATE);
    }
    if (!mHwApi->do_on(core::kPatternTriggerMs)) {
        LOG(INFO) << "V_4_0: performPlaybackEngine on Trigger fail";
        return core::exception(EX_ILLEGAL_STATE);
    }
    LOG(INFO) << "V_4_0: performPlaybackEngine end";
    return core::ok();
}

}  // namespace aidl::vendor::quorvan::hardware::vibrator
