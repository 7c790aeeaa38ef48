// SPDX-License-Identifier: Apache-2.0
//
// Who plays: see callers.h.
#include "vibctl/play/callers.h"

#include <grp.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <set>
#include <utility>

#include <android-base/file.h>
#include <fmt/format.h>

namespace vibctl {

namespace {

using android::base::unique_fd;

// The users who call, but for this one.
std::set<uid_t> othersIn(const Plan& plan) {
    std::set<uid_t> others;
    for (const TimedCall& call : plan.calls) {
        if (call.uid && *call.uid != getuid()) others.insert(*call.uid);
    }
    return others;
}

void become(uid_t user) {
    if (setgroups(0, nullptr) != 0 || setgid(user) != 0 || setuid(user) != 0) {
        fmt::print(stderr, "vibctl: cannot become user {}: {}\n", user, std::strerror(errno));
        _exit(static_cast<int>(Exit::kNoService));
    }
    // Ends with the one who waits for it, turning the motor off.
    prctl(PR_SET_PDEATHSIG, SIGTERM);
}

}  // namespace

Problem Callers::check(const Plan& plan) {
    const std::set<uid_t> others = othersIn(plan);
    if (others.empty() || getuid() == 0) return std::nullopt;
    return fmt::format("uid: user {} cannot call as user {}; play it as root, or leave uid out",
                       getuid(), *others.begin());
}

Callers::Callers(const Plan& plan) : mUser(getuid()), mOwn(getuid()) {
    const std::set<uid_t> others = othersIn(plan);
    if (others.empty()) return;
    unique_fd arrive;
    unique_fd departure;
    if (!android::base::Pipe(&mReady, &arrive) ||
        !android::base::Socketpair(SOCK_SEQPACKET, &departure, &mStart))
        return;
    std::fflush(stdout);
    for (const uid_t user : others) {
        const pid_t pid = fork();
        if (pid == 0) {
            become(user);
            mOwn = user;
            mOthers.clear();
            mReady = std::move(arrive);
            mStart = std::move(departure);
            return;
        }
        if (pid > 0) {
            mOthers.push_back(pid);
        } else {
            fmt::print(stderr, "vibctl: no process for user {}: {}\n", user, std::strerror(errno));
        }
    }
}

void Callers::keepOwn(Plan& plan) const {
    std::erase_if(plan.calls,
                  [this](const TimedCall& call) { return call.uid.value_or(mUser) != mOwn; });
}

Clock::time_point Callers::start() {
    Clock::time_point start = Clock::now();
    if (mOwn != mUser) {
        mReady.reset();
        android::base::ReadFully(mStart, &start, sizeof start);
    } else if (!mOthers.empty()) {
        char byte = 0;
        android::base::ReadFully(mReady, &byte, 1);
        start = Clock::now();
        for (size_t i = 0; i < mOthers.size(); ++i) {
            send(mStart.get(), &start, sizeof start, MSG_NOSIGNAL);
        }
    }
    return start;
}

Exit Callers::join(Exit own) {
    // Nobody waits any more for one who has not come to play.
    mReady.reset();
    mStart.reset();
    for (const pid_t pid : mOthers) {
        int status = 0;
        while (waitpid(pid, &status, 0) < 0 && errno == EINTR) continue;
        const Exit came =
                WIFEXITED(status) ? static_cast<Exit>(WEXITSTATUS(status)) : Exit::kNoService;
        if (own == Exit::kOk) own = came;
    }
    return own;
}

}  // namespace vibctl
