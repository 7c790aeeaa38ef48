// SPDX-License-Identifier: Apache-2.0
// The journal: formatting a line and putting it into the file.
#include "driver/journal.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <iterator>

#include "driver/error_names.h"
#include "driver/json_text.h"

namespace handset {
namespace {

uint64_t monotonicMicroseconds() {
    timespec now{};
    clock_gettime(CLOCK_MONOTONIC, &now);
    return static_cast<uint64_t>(now.tv_sec) * 1000000U +
           static_cast<uint64_t>(now.tv_nsec) / 1000U;
}

bool writeWhole(int fd, const char* data, size_t size) {
    while (size > 0) {
        const ssize_t written = write(fd, data, size);
        if (written < 0 && errno == EINTR) continue;
        if (written <= 0) return false;
        data += written;
        size -= static_cast<size_t>(written);
    }
    return true;
}

}  // namespace

JournalLine::JournalLine(std::string_view op) {
    text("op", op);
}

void JournalLine::key(std::string_view key) {
    content_.push_back(',');
    appendJsonString(content_, key);
    content_.push_back(':');
}

JournalLine& JournalLine::text(std::string_view name, std::string_view text) {
    key(name);
    appendJsonString(content_, text);
    return *this;
}

JournalLine& JournalLine::bytes(std::string_view name, std::string_view hexName,
                                std::string_view bytes) {
    return isUtf8(bytes) ? text(name, bytes) : hex(hexName, bytes);
}

JournalLine& JournalLine::hex(std::string_view name, std::string_view bytes) {
    key(name);
    appendHexString(content_, bytes);
    return *this;
}

JournalLine& JournalLine::number(std::string_view name, int64_t value) {
    key(name);
    fmt::format_to(std::back_inserter(content_), "{}", value);
    return *this;
}

JournalLine& JournalLine::result(std::string_view name, int64_t countOrNegativeError) {
    if (countOrNegativeError >= 0) return number(name, countOrNegativeError);
    return text(name, errorName(static_cast<int>(-countOrNegativeError)));
}

Result<std::unique_ptr<Journal>> Journal::create(const std::string& path) {
    UniqueFd file(open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_APPEND | O_CLOEXEC, 0644));
    if (!file) return Error{fmt::format("journal {}: {}", path, strerror(errno))};
    return std::unique_ptr<Journal>(new Journal(std::move(file)));
}

void Journal::record(const Caller& caller, const JournalLine& line) {
    const std::lock_guard lock(mutex_);
    fmt::memory_buffer whole;
    fmt::format_to(std::back_inserter(whole), R"({{"n":{},"us":{},"pid":{},"uid":{}{}}})", ++lines_,
                   monotonicMicroseconds(), caller.pid, caller.uid, line.content());
    whole.push_back('\n');
    if (writeWhole(file_.get(), whole.data(), whole.size()) || complained_) return;
    complained_ = true;
    fmt::print(stderr, "handset-driver: journal: line {} lost: {}\n", lines_, strerror(errno));
}

void Journal::reset() {
    const std::lock_guard lock(mutex_);
    lines_ = 0;
    if (ftruncate(file_.get(), 0) != 0) {
        fmt::print(stderr, "handset-driver: journal: not emptied: {}\n", strerror(errno));
    }
}

}  // namespace handset
