// SPDX-License-Identifier: Apache-2.0
//
// Forking the parties of a test.
#include "platform/libbinder_ndk/tests/guest/process.h"

#include <signal.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <filesystem>
#include <thread>

#include <gtest/gtest.h>

namespace binder_test {

void Process::start(uid_t uid, const std::function<void()>& body) {
    std::fflush(nullptr);
    mPid = fork();
    if (mPid != 0) return;

    prctl(PR_SET_PDEATHSIG, SIGKILL);
    // As a phone's init does: the driver lends a serving thread its caller's priority, and notes on
    // the kernel log when it may not.
    const rlimit anyNice = {40, 40};
    setrlimit(RLIMIT_NICE, &anyNice);
    int status = 1;
    if (uid == 0 || (setgid(uid) == 0 && setuid(uid) == 0)) {
        body();
        status = testing::Test::HasFailure() ? 1 : 0;
    }
    std::fflush(nullptr);
    _exit(status);
}

Process::Process(uid_t uid, const std::function<void()>& body) {
    start(uid, body);
}

Process::Process(uid_t uid, const std::function<void(const Ready&)>& body) {
    int ends[2];
    if (pipe(ends) != 0) return;
    start(uid, [&] {
        close(ends[0]);
        body([&] {
            const char ready = 1;
            EXPECT_EQ(1, write(ends[1], &ready, 1));
            close(ends[1]);
        });
    });
    close(ends[1]);
    char ready = 0;
    EXPECT_EQ(1, read(ends[0], &ready, 1)) << "the process ended before it was ready";
    close(ends[0]);
}

Process::~Process() {
    if (mPid <= 0) return;
    kill();
    wait();
}

void Process::kill() {
    if (mPid > 0) ::kill(mPid, SIGKILL);
}

int Process::wait() {
    int status = 0;
    if (mPid <= 0 || waitpid(mPid, &status, 0) != mPid) return -1;
    mPid = -1;
    return WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
}

void inProcess(uid_t uid, const std::function<void()>& body) {
    EXPECT_EQ(0, Process(uid, body).wait()) << "in the process of user " << uid;
}

int countDescriptors() {
    int count = 0;
    for ([[maybe_unused]] const auto& entry : std::filesystem::directory_iterator("/proc/self/fd"))
        ++count;
    return count;
}

bool eventually(const std::function<bool()>& condition) {
    const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(10);
    while (!condition()) {
        if (std::chrono::steady_clock::now() >= end) return false;
        std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
    return true;
}

}  // namespace binder_test
