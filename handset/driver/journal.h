// SPDX-License-Identifier: Apache-2.0
//
// What the driver saw: one JSON object a line, in the order in which it happened. A line is in the
// file before the caller gets its answer. docs/formats.md has the keys.
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>

#include <android-base/result.h>
#include <android-base/thread_annotations.h>
#include <android-base/unique_fd.h>
#include <nlohmann/json.hpp>

#include "handset/driver/caller.h"
#include "handset/driver/fault.h"

namespace handset {

// The keys of a line from "op" on.
using JournalFields = nlohmann::ordered_json;

// A count, or for a negative value the name of that error: 4, "EIO".
nlohmann::ordered_json resultOf(int64_t countOrNegativeError);

// The fields of an open; `error` is its number, or 0.
JournalFields openLine(std::string_view node, int flags, int error);

// What a fault did to a call, and when that call arrived.
struct Strike {
    const FaultAction& action;
    std::chrono::steady_clock::time_point arrival;
};

// The journal's file. All operations may be called from any thread.
class Journal {
  public:
    // Creates or empties the file at `path`, mode 0644.
    static android::base::Result<std::unique_ptr<Journal>> create(const std::string& path);

    // Writes one line. A line that cannot be written is reported on standard error, once.
    void record(const Caller& caller, const JournalFields& fields);

    // The same for a call that a fault may have struck: if so, the line says how and how long the
    // call took.
    void record(const Caller& caller, JournalFields fields, const Strike& strike);

    // Empties the file; the next line is number 1 again.
    void reset();

  private:
    explicit Journal(android::base::unique_fd file) : mFile(std::move(file)) {}

    std::mutex mMutex;
    android::base::unique_fd mFile GUARDED_BY(mMutex);
    uint64_t mLines GUARDED_BY(mMutex) = 0;
    bool mComplained GUARDED_BY(mMutex) = false;
};

}  // namespace handset
