// SPDX-License-Identifier: Apache-2.0
//
// A handset-driver that runs for one test.
#include "handset/driver/tests/running_driver.h"

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <csignal>
#include <regex>
#include <sstream>

#include "handset/phone/control_client.h"

namespace handset {
namespace {

using android::base::Result;

constexpr int kStartTimeout = 30000;  // milliseconds; emulation under a sanitizer is slow

}  // namespace

RunningDriver::RunningDriver(const std::string& profile) {
    std::ofstream(fileIn(mDirectory, "profile.json")) << profile;
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0) return;
    mPid = fork();
    if (mPid == 0) {
        const int errors = open(fileIn(mDirectory, "errors").c_str(), O_WRONLY | O_CREAT, 0644);
        dup2(errors, STDERR_FILENO);
        const int ready = dup(ends[1]);
        execl(QVX_DRIVER, "handset-driver", "--profile", fileIn(mDirectory, "profile.json").c_str(),
              "--journal", fileIn(mDirectory, "journal").c_str(), "--control",
              fileIn(mDirectory, "control").c_str(), "--ready-fd", std::to_string(ready).c_str(),
              nullptr);
        _exit(127);
    }
    close(ends[1]);
    pollfd polled{ends[0], POLLIN, 0};
    mReady = poll(&polled, 1, kStartTimeout) > 0 && readAll(ends[0]) == "ready\n";
    close(ends[0]);
}

RunningDriver::~RunningDriver() {
    if (mPid > 0) end(SIGTERM);
}

int RunningDriver::end(int signal) {
    kill(mPid, signal);
    const int status = waitForEnd(mPid);
    mPid = -1;
    return status;
}

std::string RunningDriver::ask(const std::string& request) const {
    const Result<std::string> answer = askDriver(fileIn(mDirectory, "control"), request);
    return answer ? "ok " + *answer : "error " + answer.error().message();
}

std::string RunningDriver::rawJournal() const {
    ask("settle");
    return contentOf(fileIn(mDirectory, "journal"));
}

std::vector<std::string> RunningDriver::journal() const {
    std::istringstream text(std::regex_replace(
            rawJournal(), std::regex("\"n\":[0-9]+,\"us\":[0-9]+,\"pid\":[0-9]+,|,\"took\":[0-9]+"),
            ""));
    std::vector<std::string> lines;
    for (std::string line; std::getline(text, line);) lines.push_back(line);
    return lines;
}

}  // namespace handset
