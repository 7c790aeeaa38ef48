// SPDX-License-Identifier: Apache-2.0
//
// The record of calls: see call_record.h.
#include "vibctl/call_record.h"

#include <fcntl.h>
#include <unistd.h>

#include <cstdlib>
#include <vector>

#include <android-base/file.h>
#include <android-base/unique_fd.h>
#include <fmt/format.h>

namespace vibctl {

std::string recordLine(const CommandLine& line, const std::string& method, const Outcome& outcome,
                       int pid, unsigned uid) {
    std::vector<std::string> call{line.command, line.method};
    call.insert(call.end(), line.arguments.begin(), line.arguments.end());
    if (line.callback) call.emplace_back("--callback");
    return fmt::format(R"({{"us":{},"pid":{},"uid":{},"call":{},"answer":{}}})",
                       outcome.sentMicroseconds, pid, uid, jsonOf(call),
                       jsonLine(line.command, method, outcome));
}

void recordCall(const CommandLine& line, const std::string& method, const Outcome& outcome) {
    const char* const path = std::getenv("VIBCTL_CALLS");
    if (path == nullptr || outcome.sentMicroseconds == 0) return;
    const android::base::unique_fd file(
            open(path, O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0666));
    if (file < 0) return;
    // One write: several clients may append at a time.
    (void)android::base::WriteStringToFd(
            recordLine(line, method, outcome, getpid(), getuid()) + "\n", file);
}

}  // namespace vibctl
