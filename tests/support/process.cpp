// SPDX-License-Identifier: Apache-2.0
//
// Forking the parties of a test.
#include "tests/support/process.h"

#include <fcntl.h>
#include <grp.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <thread>

#include <gtest/gtest.h>

namespace qvx::test {
namespace {

// Emulation under a sanitizer is slow.
constexpr int kStartTimeout = 30000;  // milliseconds

[[noreturn]] void become(const Program& program, int ready) {
    std::vector<std::string> words = program.words;
    if (ready >= 0) words.insert(words.end(), {"--ready-fd", std::to_string(ready)});
    std::vector<char*> arguments;
    for (std::string& word : words) arguments.push_back(word.data());
    arguments.push_back(nullptr);
    dup2(open(program.errors.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644),
         STDERR_FILENO);
    execv(arguments[0], arguments.data());
    _exit(127);
}

}  // namespace

bool becomeUser(uid_t uid) {
    // As a phone's init does: the binder driver lends a serving thread its caller's priority, and
    // notes on the kernel log when it may not.
    const rlimit anyNice = {40, 40};
    setrlimit(RLIMIT_NICE, &anyNice);
    return uid == geteuid() || (setgroups(0, nullptr) == 0 && setresgid(uid, uid, uid) == 0 &&
                                setresuid(uid, uid, uid) == 0);
}

void Process::start(uid_t uid, const std::function<void()>& body) {
    // What is still buffered would be printed by both.
    std::fflush(nullptr);
    mPid = fork();
    if (mPid != 0) return;
    int status = 1;
    if (becomeUser(uid)) {
        prctl(PR_SET_PDEATHSIG, SIGKILL);
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
    std::array<int, 2> ends{};
    if (pipe2(ends.data(), O_CLOEXEC) != 0) return;
    start(uid, [&] {
        close(ends[0]);
        body([&] {
            const char answer = testing::Test::HasFailure() ? 'n' : 'y';
            EXPECT_EQ(1, write(ends[1], &answer, 1));
            close(ends[1]);
        });
    });
    close(ends[1]);
    char answer = '-';
    mReady = read(ends[0], &answer, 1) == 1;
    EXPECT_TRUE(mReady) << "the process ended before it was ready";
    EXPECT_NE(answer, 'n') << "in the process of user " << uid;
    close(ends[0]);
}

Process::Process(uid_t uid, const Program& program) {
    std::array<int, 2> ends{};
    if (pipe2(ends.data(), O_CLOEXEC) != 0) return;
    start(uid, [&] { become(program, program.tellsReadiness ? dup(ends[1]) : -1); });
    close(ends[1]);
    pollfd polled{ends[0], POLLIN, 0};
    char answer = '-';
    mReady = program.tellsReadiness && poll(&polled, 1, kStartTimeout) > 0 &&
             read(ends[0], &answer, 1) == 1;
    close(ends[0]);
}

Process::~Process() {
    kill();
}

void Process::reap(int options) {
    if (mStatus || mPid <= 0) return;
    int status = 0;
    pid_t ended = 0;
    while ((ended = waitpid(mPid, &status, options)) < 0 && errno == EINTR) {
    }
    if (ended != mPid) return;
    mStatus = WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status);
}

void Process::signal(int number) const {
    if (mPid > 0 && !mStatus) ::kill(mPid, number);
}

int Process::wait() {
    reap(0);
    return mStatus.value_or(-1);
}

void Process::kill() {
    signal(SIGKILL);
    wait();
}

bool Process::hasEnded() {
    reap(WNOHANG);
    return mStatus.has_value();
}

void inProcess(uid_t uid, const std::function<void()>& body) {
    EXPECT_EQ(0, Process(uid, body).wait()) << "in the process of user " << uid;
}

bool eventually(const std::function<bool()>& condition) {
    const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(10);
    while (!condition()) {
        if (std::chrono::steady_clock::now() >= end) return false;
        std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
    return true;
}

}  // namespace qvx::test
