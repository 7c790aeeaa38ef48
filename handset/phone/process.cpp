// SPDX-License-Identifier: Apache-2.0
//
// Starting a process and waiting for its end.
#include "handset/phone/process.h"

#include <fcntl.h>
#include <grp.h>
#include <poll.h>
#include <sched.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>

#include <fmt/format.h>

#include "handset/driver/permission.h"

namespace handset {
namespace {

using android::base::ErrnoError;
using android::base::Error;
using android::base::Result;
using android::base::unique_fd;

constexpr std::array<gid_t, 3> kSystemGroups = {1000 /* system */, 1004 /* input */,
                                                1007 /* log */};

int openHandle(pid_t pid) {
    return static_cast<int>(syscall(SYS_pidfd_open, pid, 0));
}

bool waitReadable(int fd, int milliseconds) {
    pollfd polled{fd, POLLIN, 0};
    return poll(&polled, 1, milliseconds) > 0;
}

// Undoes what the parent changed for itself: blocked signals and ignored ones.
void resetSignals() {
    sigset_t none;
    sigemptyset(&none);
    sigprocmask(SIG_SETMASK, &none, nullptr);
    signal(SIGPIPE, SIG_DFL);
}

// Ends with the parent. Set after the change of user, which would clear it.
void endWith(pid_t parent) {
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (getppid() != parent) _exit(1);
}

// What a child does up to its new program; returns only when that cannot be run.
std::string execute(const Launch& launch, pid_t parent) {
    resetSignals();
    if (launch.output >= 0) dup2(launch.output, STDOUT_FILENO);
    if (launch.errors >= 0) dup2(launch.errors, STDERR_FILENO);
    if (launch.kept >= 0) fcntl(launch.kept, F_SETFD, 0);
    if (auto done = becomeWhatLaunchAsks(launch); !done) return done.error().message();
    endWith(parent);
    std::vector<char*> arguments;
    arguments.reserve(launch.command.size() + 1);
    for (const std::string& word : launch.command) {
        arguments.push_back(const_cast<char*>(word.c_str()));
    }
    arguments.push_back(nullptr);
    execv(arguments[0], arguments.data());
    return fmt::format("{}: {}", launch.command[0], strerror(errno));
}

}  // namespace

Result<void> becomeWhatLaunchAsks(const Launch& launch) {
    if (launch.mounts >= 0 && setns(launch.mounts, CLONE_NEWNS) != 0) {
        return ErrnoError() << "the phone's mount namespace";
    }
    if (!launch.user || *launch.user == 0) return {};
    const bool system = *launch.user == kSystemUser;
    // As the phone's init does for everybody: binder hands a caller's priority on to the one who
    // serves it, and complains where it may not.
    constexpr rlimit kAnyNice{40, 40};
    setrlimit(RLIMIT_NICE, &kAnyNice);
    prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0);
    // From root to another user the kernel drops every capability by itself.
    if (setgroups(system ? kSystemGroups.size() : 0, kSystemGroups.data()) != 0 ||
        setresgid(*launch.user, *launch.user, *launch.user) != 0 ||
        setresuid(*launch.user, *launch.user, *launch.user) != 0) {
        return ErrnoError() << fmt::format("user {}", *launch.user);
    }
    return {};
}

Result<Child> Child::start(const Launch& launch) {
    std::array<int, 2> ends{};
    if (pipe2(ends.data(), O_CLOEXEC) != 0) return ErrnoError() << "pipe";
    unique_fd readEnd(ends[0]);
    unique_fd writeEnd(ends[1]);
    const pid_t parent = getpid();
    const pid_t pid = ::fork();
    if (pid < 0) return ErrnoError() << "fork";
    if (pid == 0) {
        const std::string error = execute(launch, parent);
        if (write(writeEnd.get(), error.data(), error.size()) < 0) _exit(126);
        _exit(127);
    }
    writeEnd.reset();
    std::array<char, 512> text;
    const ssize_t size = read(readEnd.get(), text.data(), text.size());
    if (size > 0) {
        waitpid(pid, nullptr, 0);
        return Error() << std::string(text.data(), static_cast<size_t>(size));
    }
    return Child(pid, unique_fd(openHandle(pid)));
}

Result<Child> Child::fork(const std::function<int()>& work) {
    const pid_t parent = getpid();
    const pid_t pid = ::fork();
    if (pid < 0) return ErrnoError() << "fork";
    if (pid == 0) {
        resetSignals();
        endWith(parent);
        _exit(work());
    }
    return Child(pid, unique_fd(openHandle(pid)));
}

std::optional<int> Child::poll() {
    if (mStatus) return mStatus;
    int status = 0;
    if (waitpid(mPid, &status, WNOHANG) != mPid) return std::nullopt;
    mStatus = WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status);
    return mStatus;
}

void Child::await(int timeout) const {
    waitReadable(mHandle.get(), timeout);
}

void Child::end(int timeout) {
    if (poll()) return;
    kill(mPid, SIGTERM);
    if (!waitReadable(mHandle.get(), timeout)) kill(mPid, SIGKILL);
    waitReadable(mHandle.get(), -1);
    poll();
}

}  // namespace handset
