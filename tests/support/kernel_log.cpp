// SPDX-License-Identifier: Apache-2.0
#include "tests/support/kernel_log.h"

#include <fcntl.h>
#include <sys/klog.h>
#include <unistd.h>

#include <string_view>

#include <android-base/strings.h>
#include <android-base/unique_fd.h>

namespace qvx::test {
namespace {

constexpr std::string_view kBegin = "qvx-test: complaints expected from here\n";
constexpr std::string_view kEnd = "qvx-test: complaints expected up to here\n";
constexpr int kReadAll = 3;      // SYSLOG_ACTION_READ_ALL of syslog(2)
constexpr int kSizeBuffer = 10;  // SYSLOG_ACTION_SIZE_BUFFER

void writeMarker(std::string_view text) {
    // One write makes one record.
    const android::base::unique_fd fd(open("/dev/kmsg", O_WRONLY | O_CLOEXEC));
    [[maybe_unused]] const ssize_t written = write(fd, text.data(), text.size());
}

std::string readKernelLog() {
    const int size = klogctl(kSizeBuffer, nullptr, 0);
    std::string text(size > 0 ? static_cast<size_t>(size) : 0, '\0');
    const int count = klogctl(kReadAll, text.data(), size);
    text.resize(count > 0 ? static_cast<size_t>(count) : 0);
    return text;
}

}  // namespace

ExpectBinderComplaints::ExpectBinderComplaints() {
    writeMarker(kBegin);
}
ExpectBinderComplaints::~ExpectBinderComplaints() {
    writeMarker(kEnd);
}

std::vector<std::string> binderComplaints() {
    std::vector<std::string> complaints;
    bool expected = false;
    bool isFirst = true;
    for (const std::string& line : android::base::Split(readKernelLog(), "\n")) {
        const bool begins = line.find("complaints expected from here") != std::string::npos;
        const bool ends = line.find("complaints expected up to here") != std::string::npos;
        // The log has room for so much: of the first pair of markers the one in front may be gone.
        if (ends && isFirst) complaints.clear();
        if (begins || ends) {
            expected = begins;
            isFirst = false;
        }
        if (!expected && line.find("binder") != std::string::npos) complaints.push_back(line);
    }
    return complaints;
}

}  // namespace qvx::test
