// SPDX-License-Identifier: Apache-2.0
#define LOG_TAG log.tag

#include "hwapi/DriverWriter.h"

#include <fcntl.h>

#include <cerrno>
#include <cstring>

#include <android-base/unique_fd.h>
#include <log/log.h>

#include "driver/SystemCalls.h"

namespace aidl::android::hardware::vibrator {

bool isDriverAmplitude(const LogSource& log, const char* operation, int32_t amplitude) {
    if (amplitude >= 1 && amplitude <= 10000) return true;
    LOG(log.severity) << log.prefix << operation << " amplitude is abnormal " << amplitude;
    return false;
}

bool checked(bool succeeded, const LogSource& log, const char* operation, const char* failure) {
    if (!succeeded) LOG(log.severity) << log.prefix << operation << failure;
    return succeeded;
}

std::optional<ssize_t> writeBytes(const LogSource& log, const char* operation,
                                  const std::string& node, std::string_view bytes) {
    const std::optional<ssize_t> written =
            kernel::writeOnce(node.c_str(), O_RDWR, bytes.data(), bytes.size());
    if (!written) {
        const int error = errno;
        LOG(log.severity) << log.prefix << operation << " is fail: " << error;
    }
    return written;
}

std::optional<ssize_t> readBytes(const NodeReader& reader, const std::string& node, char* buffer,
                                 size_t size) {
    const LogSource& log = reader.log;
    const ::android::base::unique_fd descriptor = kernel::open(node.c_str(), reader.flags);
    if (!descriptor.ok()) {
        const int error = errno;
        LOG(log.severity) << log.prefix << reader.subject << node << reader.openFailed << error;
        return std::nullopt;
    }
    const ssize_t count = kernel::read(descriptor.get(), buffer, size - 1);
    if (count >= reader.least) return count;
    const int error = errno;
    LOG(log.severity) << log.prefix << reader.subject << node << reader.readFailed << error;
    return std::nullopt;
}

std::optional<std::string_view> readLine(const NodeReader& reader, const std::string& node,
                                         char* buffer, size_t size) {
    const LogSource& log = reader.log;
    const std::optional<ssize_t> count = readBytes(reader, node, buffer, size);
    if (!count) return std::nullopt;
    if (*count >= static_cast<ssize_t>(size)) {
        ALOGE("Read MAX limit. Always end of string is null");
        buffer[size - 1] = '\0';
    } else {
        buffer[*count - 1] = '\0';
    }
    return buffer;
}

std::string describeAccess(const std::string& node) {
    if (kernel::open(node.c_str(), O_RDWR).ok()) return "read-write";
    const int error = errno;
    if (kernel::open(node.c_str(), O_RDONLY).ok()) return "read-only";
    if (kernel::open(node.c_str(), O_WRONLY).ok()) return "write-only";
    return strerror(error);
}

bool playQueue(HwApi& hardware, const QueueWords& words, std::string_view bytes) {
    constexpr int kQueueIndex = 0xFFFE;  // makes the driver play its queue
    const LogSource& log = words.log;
    if (!checked(hardware.writeNode(THE_DEVICE_HAPTIC_ENGINE_INDEX, kQueueIndex), log,
                 words.operation, " write 0xFFFE fail")) {
        return false;
    }
    const std::optional<ssize_t> written =
            writeBytes(log, words.operation, THE_DEVICE_HAPTIC_PLAYBACK_QUEUE, bytes);
    if (!written) return false;
    if (!words.terse) LOG(log.severity) << log.prefix << "ret : " << *written;
    const auto size = static_cast<ssize_t>(bytes.size());
    const bool whole = words.terse ? *written == size : *written >= size;
    if (!checked(whole, log, words.player, " repeat error")) return false;
    if (!checked(hardware.do_on(kPatternTriggerMs), log, words.player, " on Trigger fail")) {
        return false;
    }
    if (!words.terse) LOG(log.severity) << log.prefix << words.player << " end";
    return true;
}

}  // namespace aidl::android::hardware::vibrator
