// SPDX-License-Identifier: Apache-2.0
//
// Starting services on request: see service_starter.h.
#include "platform/servicemanager/service_starter.h"

#include <grp.h>
#include <poll.h>
#include <pwd.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>

namespace servicemanager {

namespace {

using android::base::ErrnoError;
using android::base::Result;
using android::base::unique_fd;

bool hasEnded(const unique_fd& process) {
    pollfd polled{process.get(), POLLIN, 0};
    return !process.ok() || poll(&polled, 1, 0) != 0;
}

// Takes on the user with its groups; a process of that user stays as it is.
bool become(uid_t user) {
    if (geteuid() == user && user != 0) return true;
    const passwd* const entry = getpwuid(user);
    const gid_t group = entry != nullptr ? entry->pw_gid : user;
    const int groups = entry != nullptr ? initgroups(entry->pw_name, group) : setgroups(0, nullptr);
    return groups == 0 && setresgid(group, group, group) == 0 && setresuid(user, user, user) == 0;
}

[[noreturn]] void run(const StartCommand& command, pid_t starter) {
    std::vector<char*> words;
    words.reserve(command.words.size() + 1);
    for (const std::string& word : command.words) words.push_back(const_cast<char*>(word.c_str()));
    words.push_back(nullptr);
    signal(SIGCHLD, SIG_DFL);
    // Behind the change of user, which takes the wish back. A starter that has ended by now is seen
    // by its child's having another parent.
    if (become(command.user) && prctl(PR_SET_PDEATHSIG, SIGTERM) == 0 && getppid() == starter) {
        execv(words[0], words.data());
    }
    std::fprintf(stderr, "servicemanager: cannot run %s as user %u: %s\n", words[0], command.user,
                 std::strerror(errno));
    _exit(127);
}

}  // namespace

Result<bool> ServiceStarter::start(const std::string& name, const StartCommand& command) {
    const Clock::time_point now = Clock::now();
    const auto last = mStarted.find(name);
    if (last != mStarted.end() &&
        (now - last->second.at < mPeriod || !hasEnded(last->second.process))) {
        return false;
    }
    const pid_t self = getpid();
    const pid_t child = fork();
    if (child < 0) return ErrnoError() << "fork";
    if (child == 0) run(command, self);
    mStarted[name] = {unique_fd(static_cast<int>(syscall(SYS_pidfd_open, child, 0))), now};
    return true;
}

}  // namespace servicemanager
