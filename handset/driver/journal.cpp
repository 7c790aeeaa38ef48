// SPDX-License-Identifier: Apache-2.0
//
// The journal: completing a line and putting it into the file.
#include "handset/driver/journal.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <utility>

#include <android-base/file.h>
#include <fmt/format.h>

#include "handset/driver/error_names.h"
#include "handset/driver/open_flags.h"

namespace handset {

using android::base::ErrnoError;
using android::base::Result;
using android::base::unique_fd;
using std::chrono::microseconds;
using std::chrono::steady_clock;  // CLOCK_MONOTONIC

nlohmann::ordered_json resultOf(int64_t countOrNegativeError) {
    if (countOrNegativeError >= 0) return countOrNegativeError;
    return errorName(static_cast<int>(-countOrNegativeError));
}

JournalFields openLine(std::string_view node, int flags, int error) {
    return {{"op", "open"},
            {"node", node},
            {"flags", openFlagsText(flags)},
            {"error", resultOf(-error)}};
}

Result<std::unique_ptr<Journal>> Journal::create(const std::string& path) {
    unique_fd file(open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_APPEND | O_CLOEXEC, 0644));
    if (!file.ok()) return ErrnoError() << "journal " << path;
    return std::unique_ptr<Journal>(new Journal(std::move(file)));
}

void Journal::record(const Caller& caller, const JournalFields& fields) {
    const std::lock_guard lock(mMutex);
    const auto now =
            std::chrono::duration_cast<microseconds>(steady_clock::now().time_since_epoch());
    const std::string line =
            fmt::format("{{\"n\":{},\"us\":{},\"pid\":{},\"uid\":{},{}\n", ++mLines, now.count(),
                        caller.pid, caller.uid, fields.dump().substr(1));
    if (android::base::WriteFully(mFile, line.data(), line.size()) || mComplained) return;
    mComplained = true;
    fmt::print(stderr, "handset-driver: journal: line {} lost: {}\n", mLines, strerror(errno));
}

void Journal::record(const Caller& caller, JournalFields fields, const Strike& strike) {
    if (strike.action.strikes()) {
        fields["fault"] = toJson(strike.action);
        const auto took = steady_clock::now() - strike.arrival;
        fields["took"] = std::chrono::duration_cast<microseconds>(took).count();
    }
    record(caller, fields);
}

void Journal::reset() {
    const std::lock_guard lock(mMutex);
    mLines = 0;
    if (ftruncate(mFile.get(), 0) != 0) {
        fmt::print(stderr, "handset-driver: journal: not emptied: {}\n", strerror(errno));
    }
}

}  // namespace handset
