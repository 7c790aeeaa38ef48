// SPDX-License-Identifier: Apache-2.0
//
// The processes of a guest test: see processes.h.
#include "platform/servicemanager/tests/processes.h"

#include <fcntl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <thread>

#include <android-base/file.h>
#include <android/binder_process.h>
#include <gtest/gtest.h>

#include "handset/common/raw_binder.h"
#include "tests/support/fake_root.h"
#include "tests/support/kernel_log.h"

namespace processes {

namespace {

namespace fs = std::filesystem;

void becomeUser(uid_t uid) {
    // As init sets it on a phone: the driver changes the priority of threads that serve calls, and
    // complains in the kernel log where it may not.
    const rlimit anyPriority{40, 40};
    if (setrlimit(RLIMIT_NICE, &anyPriority) != 0) _exit(98);
    if (setresgid(uid, uid, uid) != 0 || setresuid(uid, uid, uid) != 0) _exit(99);
}

// Waits for the end of a child; its exit status, or -1 when a signal ended it.
int endOf(pid_t pid) {
    int status = 0;
    if (waitpid(pid, &status, 0) != pid) return -1;
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

pid_t forkQuietly() {
    // What is still buffered would be printed by both.
    std::fflush(nullptr);
    return fork();
}

std::string contentOf(const fs::path& file) {
    std::string content;
    android::base::ReadFileToString(file.string(), &content);
    return content;
}

}  // namespace

Manager::Manager(const fs::path& root, const std::string& rules)
    : mLog(root / "servicemanager.log"), mPid(-1) {
    const fs::path file = root / "services.rules";
    EXPECT_TRUE(android::base::WriteStringToFile(rules, file.string()));
    std::array<int, 2> ready{};
    if (pipe(ready.data()) != 0) return;
    mPid = forkQuietly();
    if (mPid == 0) {
        const int log = open(mLog.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
        dup2(log, STDERR_FILENO);
        close(ready[0]);
        execl(SERVICEMANAGER_PROGRAM, "servicemanager", "--root", root.c_str(), "--rules",
              file.c_str(), "--ready-fd", std::to_string(ready[1]).c_str(), nullptr);
        _exit(127);
    }
    close(ready[1]);
    char answer = '-';
    EXPECT_EQ(read(ready[0], &answer, 1), 1) << log();
    close(ready[0]);
}

Manager::~Manager() {
    // It may go while notices of deaths are on their way to it, which the kernel remarks on.
    const qvx::test::ExpectBinderComplaints expected;
    ::kill(mPid, SIGTERM);
    endOf(mPid);
    // The driver cleans up behind the process, and remarks on it while it does.
    eventually([this] { return !answers(); });
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
}

bool Manager::answers() const {
    return handset::RawBinder().pingServiceManager();
}

std::string Manager::log() const {
    return contentOf(mLog);
}

int runManager(uid_t uid, std::string& output) {
    const qvx::test::FakeRoot root;
    const std::string log = root.at("/log");
    const pid_t pid = forkQuietly();
    if (pid == 0) {
        const int descriptor = open(log.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0666);
        dup2(descriptor, STDERR_FILENO);
        becomeUser(uid);
        execl(SERVICEMANAGER_PROGRAM, "servicemanager", nullptr);
        _exit(127);
    }
    const int status = endOf(pid);
    output = contentOf(log);
    return status;
}

void as(uid_t uid, const std::function<void()>& body) {
    const pid_t pid = forkQuietly();
    if (pid == 0) {
        becomeUser(uid);
        body();
        std::fflush(nullptr);
        _exit(::testing::Test::HasFailure() ? 1 : 0);
    }
    EXPECT_EQ(endOf(pid), 0) << "in the client that ran as uid " << uid;
}

Server::Server(uid_t uid, const std::function<void()>& prepare) : mPid(-1) {
    std::array<int, 2> ready{};
    if (pipe2(ready.data(), O_CLOEXEC) != 0) return;
    mPid = forkQuietly();
    if (mPid == 0) {
        close(ready[0]);
        becomeUser(uid);
        prepare();
        std::fflush(nullptr);
        const char answer = ::testing::Test::HasFailure() ? 'n' : 'y';
        if (write(ready[1], &answer, 1) != 1) _exit(1);
        ABinderProcess_joinThreadPool();
        _exit(0);
    }
    close(ready[1]);
    char answer = '-';
    EXPECT_EQ(read(ready[0], &answer, 1), 1);
    EXPECT_EQ(answer, 'y') << "in the server that ran as uid " << uid;
    close(ready[0]);
}

Server::~Server() {
    kill();
}

void Server::kill() {
    if (mPid < 0) return;
    ::kill(mPid, SIGKILL);
    endOf(mPid);
    mPid = -1;
}

bool Server::hasEnded() {
    if (mPid >= 0 && waitpid(mPid, nullptr, WNOHANG) == mPid) mPid = -1;
    return mPid < 0;
}

bool eventually(const std::function<bool()>& question) {
    using std::chrono::steady_clock;
    const auto limit = steady_clock::now() + std::chrono::seconds(10);
    while (!question()) {
        if (steady_clock::now() > limit) return false;
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    return true;
}

}  // namespace processes
