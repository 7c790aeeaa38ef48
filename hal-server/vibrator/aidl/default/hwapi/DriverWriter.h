// SPDX-License-Identifier: Apache-2.0
//
// What is done to the driver in more than one place, written once: strings to and from nodes, the
// pattern queue, packets and stored patterns. Each function takes the LogSource and the words of
// whoever asks, so that every log line keeps the tag, severity, prefix and text of its layer. A file
// of such code defines LOG_TAG as log.tag and logs with LOG(log.severity) << log.prefix.
#pragma once

#include <sys/types.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <android-base/logging.h>

#include "HwApi.h"
#include "driver/PacketText.h"

namespace aidl::android::hardware::vibrator {

struct LogSource {
    const char* tag;
    ::android::base::LogSeverity severity;
    const char* prefix;
};

inline constexpr LogSource kHardwareLog = {"QvxVibrator-HAL-AIDL-CORE", ::android::base::INFO,
                                           "HW_API: "};
inline constexpr LogSource kStandardLog = {"QvxVibrator-HAL-AIDL-CORE", ::android::base::ERROR,
                                           "V_2_0: "};
inline constexpr LogSource kExtensionLog = {"QvxVibrator-HAL-AIDL-EXT", ::android::base::INFO,
                                            "V_4_0: "};

// A node's path from its 11th character on, which leaves out the "/sys/class" that all nodes begin
// with. Nothing of a shorter path, such as the empty one of a node that the device does not have.
constexpr std::string_view fromClass(std::string_view path) {
    constexpr std::string_view kClassRoot = "/sys/class";
    return path.substr(std::min(kClassRoot.size(), path.size()));
}

// Whether the driver takes `amplitude`; one that it does not take is logged as the operation's. 0 is
// not among them: the motor is switched off instead.
bool isDriverAmplitude(const LogSource& log, const char* operation, int32_t amplitude);

// `amplitude` (0.0 to 1.0, or not a number) times `full`, in single precision, truncated. Not a
// number becomes 0, where the language leaves the conversion open.
constexpr int32_t toDriverAmplitude(float amplitude, float full) {
    const float scaled = amplitude * full;
    return scaled >= 1.0F ? static_cast<int32_t>(scaled) : 0;
}

// The number that the entry `index` of the plain wavetable has in the platform's numbering: 0 and
// 100 keep theirs, 119 to 124 move up by 16, all others by 9. Wraps at the ends of 32 bits.
constexpr int32_t toKypIndex(int32_t index) {
    if (index == 0 || index == 100) return index;
    const uint32_t offset = index >= 119 && index <= 124 ? 16 : 9;
    return static_cast<int32_t>(static_cast<uint32_t>(index) + offset);
}

// `succeeded`, after a line of `operation` and `failure` when it is false.
bool checked(bool succeeded, const LogSource& log, const char* operation, const char* failure);

// Opens the node read-write and writes `bytes` in one call. Empty, and logged as the operation's
// failure, when the node cannot be opened; else the count that was taken, or -1.
std::optional<ssize_t> writeBytes(const LogSource& log, const char* operation,
                                  const std::string& node, std::string_view bytes);

// Who reads a node: its access and its words for a node that does not open or gives nothing. Access
// and spaces differ from reader to reader, and log readers know them so.
struct NodeReader {
    const LogSource& log;
    const char* subject;  // before the node's path
    int flags;
    const char* openFailed;  // between the path and errno
    const char* readFailed;
    ssize_t least;  // a read of fewer bytes has failed
};

// Reads at most `size` - 1 bytes into the zeroed `buffer`. The count; empty after the failure's line.
std::optional<ssize_t> readBytes(const NodeReader& reader, const std::string& node, char* buffer,
                                 size_t size);

// The same, without the last byte, which is the driver's newline: a string written without one
// loses its last character. Empty when it cannot be read; else a part of `buffer`, terminated.
std::optional<std::string_view> readLine(const NodeReader& reader, const std::string& node,
                                         char* buffer, size_t size);

// The widest access that the node grants: "read-write", "read-only" or "write-only"; the system's
// words for why when there is none.
std::string describeAccess(const std::string& node);

// A pattern ends by itself; the motor only has to be started, for milliseconds that do not count.
inline constexpr int kPatternTriggerMs = 1000;

// The words of one user of the queue.
struct QueueWords {
    const LogSource& log;
    const char* operation;  // begins the lines up to the writing of the queue string
    const char* player;     // begins those after it
    bool terse;             // no line for the count and for the end; the count must be exact
};

// Queues `bytes`, the terminating zero byte included where the driver wants one, and starts the
// motor. False, after one line, when the driver does not take it all.
bool playQueue(HwApi& hardware, const QueueWords& words, std::string_view bytes);

// The words of one packet request.
struct PacketWords {
    const LogSource& log;
    const char* operation;
    bool partIsOk;  // whether a driver that takes less than the string has said all there is to say
};

// Logs the request and says whether its number of packets and its amplitude can be played.
bool arePacketsPlayable(const PacketWords& words, size_t packets, int32_t amplitude);

// Appends plain packets, their intensities scaled by amplitude / 10000.
template <typename Packet>
void appendPackets(PacketText& text, const std::vector<Packet>& packets, int32_t amplitude) {
    for (const Packet& packet : packets) {
        text.append(packet.time);
        text.append(scaleIntensity(packet.intensity, amplitude));
        text.append(packet.frequency);
        text.append(packet.overdrive);
    }
}

// Writes the string to the node and, if the driver took it all, starts the motor; what the driver
// makes of the start does not count. Logs the outcome and returns whether it is ok.
bool sendPackets(HwApi& hardware, const PacketWords& words, const std::string& node,
                 std::string_view text);

// The words of one player.
struct PatternWords {
    const LogSource& log;
    const LogSource& forceFeedbackRepeatLog;
    bool terse;  // only what fails is logged
};

// Plays the pattern at `amplitude` (1 to 10000), once or, with `repeat`, over and over. Pattern 0
// played once only sets the amplitude and the index. False when the driver refuses.
bool playPattern(HwApi& hardware, const PatternWords& words, int32_t patternIndex,
                 int32_t amplitude, bool repeat);

}  // namespace aidl::android::hardware::vibrator
