// SPDX-License-Identifier: Apache-2.0
//
// The service's standard error.
#include "handset/phone/service_log.h"

#include <fcntl.h>
#include <sys/socket.h>
#include <time.h>

#include <array>
#include <cstring>
#include <utility>

#include <android-base/file.h>
#include <fmt/format.h>

namespace handset {
namespace {

using android::base::ErrnoError;
using android::base::Result;
using android::base::unique_fd;

constexpr size_t kLongestWrite = 1 << 16;

int64_t microsecondsOf(const timespec& time) {
    return int64_t{time.tv_sec} * 1000000 + time.tv_nsec / 1000;
}

int64_t now(clockid_t clock) {
    timespec time{};
    clock_gettime(clock, &time);
    return microsecondsOf(time);
}

// When the kernel took a message, in microseconds since boot. It says so in wall-clock time.
int64_t timeOf(msghdr& message) {
    const cmsghdr* header = CMSG_FIRSTHDR(&message);
    if (header == nullptr || header->cmsg_type != SCM_TIMESTAMPNS) return now(CLOCK_MONOTONIC);
    timespec taken{};
    memcpy(&taken, CMSG_DATA(header), sizeof taken);
    return now(CLOCK_MONOTONIC) - (now(CLOCK_REALTIME) - microsecondsOf(taken));
}

}  // namespace

Result<ServiceLog> ServiceLog::create(const std::string& path) {
    ServiceLog log;
    // Appending, so that "phone reset" may empty the file under its writer.
    log.mFile.reset(open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_APPEND | O_CLOEXEC, 0644));
    if (!log.mFile.ok()) return ErrnoError() << path;
    std::array<int, 2> ends{};
    if (socketpair(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0, ends.data()) != 0) {
        return ErrnoError() << "the service's log";
    }
    log.mReader.reset(ends[0]);
    log.mWriter.reset(ends[1]);
    constexpr int kOn = 1;
    setsockopt(log.reader(), SOL_SOCKET, SO_TIMESTAMPNS, &kOn, sizeof kOn);
    return log;
}

void ServiceLog::drain() {
    mPart.resize(kLongestWrite);
    while (true) {
        alignas(cmsghdr) std::array<char, CMSG_SPACE(sizeof(timespec))> control;
        iovec where{mPart.data(), mPart.size()};
        msghdr message{};
        message.msg_iov = &where;
        message.msg_iovlen = 1;
        message.msg_control = control.data();
        message.msg_controllen = control.size();
        const ssize_t size = recvmsg(mReader.get(), &message, MSG_DONTWAIT);
        if (size < 0) return;
        take({mPart.data(), static_cast<size_t>(size)}, timeOf(message));
    }
}

void ServiceLog::flush() {
    if (!mLine.empty()) take("\n", mLineTime);
}

void ServiceLog::take(std::string_view part, int64_t microseconds) {
    std::string whole;
    while (!part.empty()) {
        if (mLine.empty()) mLineTime = microseconds;
        const size_t end = part.find('\n');
        mLine += part.substr(0, end);
        if (end == std::string_view::npos) break;
        whole += fmt::format("{} {}\n", mLineTime, mLine);
        mLine.clear();
        part.remove_prefix(end + 1);
    }
    android::base::WriteFully(mFile, whole.data(), whole.size());
}

}  // namespace handset
