// SPDX-License-Identifier: Apache-2.0
// The journal: what the driver saw, one JSON object a line, in the order it happened.
//
//   {"n":7,"us":81234567,"pid":412,"uid":1000,"op":"write",
//    "node":"/sys/class/leds/vibrator/duration","data":"500\n","result":4}       (on one line)
//
// n counts from 1; us is CLOCK_MONOTONIC in microseconds; pid is the process, not the thread.
// A line is in the file before the caller gets its answer.
#pragma once

#include <fmt/format.h>
#include <sys/types.h>

#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>

#include "common/unique_fd.h"
#include "driver/caller.h"
#include "driver/result.h"

namespace handset {

/// The part of a journal line from "op" on, built up key by key.
class JournalLine {
  public:
    explicit JournalLine(std::string_view op);

    /// `"key":"text"`; `text` must be UTF-8.
    JournalLine& text(std::string_view key, std::string_view text);

    /// `"key":"text"` where `bytes` is UTF-8, otherwise `"hexKey":"0a1b"`.
    JournalLine& bytes(std::string_view key, std::string_view hexKey, std::string_view bytes);

    /// `"key":"0a1b"`.
    JournalLine& hex(std::string_view key, std::string_view bytes);

    /// `"key":-5`.
    JournalLine& number(std::string_view key, int64_t value);

    /// `"key":4`, or for a negative value the name of that error, `"key":"EIO"`.
    JournalLine& result(std::string_view key, int64_t countOrNegativeError);

    std::string_view content() const { return {content_.data(), content_.size()}; }

  private:
    void key(std::string_view key);

    fmt::memory_buffer content_;
};

/// The journal's file. All operations may be called from any thread.
class Journal {
  public:
    /// Creates or empties the file at `path`, mode 0644.
    static Result<std::unique_ptr<Journal>> create(const std::string& path);

    /// Writes one line. A line that cannot be written is reported on standard error, once.
    void record(const Caller& caller, const JournalLine& line);

    /// Empties the file; the next line is number 1 again.
    void reset();

  private:
    explicit Journal(UniqueFd file) : file_(std::move(file)) {}

    std::mutex mutex_;
    UniqueFd file_;
    uint64_t lines_ = 0;
    bool complained_ = false;
};

}  // namespace handset
