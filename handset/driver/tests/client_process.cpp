// SPDX-License-Identifier: Apache-2.0
//
// A driver's clients.
#include "handset/driver/tests/client_process.h"

#include <fcntl.h>
#include <sched.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

#include <android-base/file.h>
#include <gtest/gtest.h>

#include "tests/support/process.h"

namespace handset {
namespace {

bool enterMountsOf(pid_t process) {
    if (process == 0) return true;
    const std::string path = "/proc/" + std::to_string(process) + "/ns/mnt";
    const int mounts = open(path.c_str(), O_RDONLY | O_CLOEXEC);
    return setns(mounts, CLONE_NEWNS) == 0;
}

}  // namespace

std::string runAs(uid_t user, const std::function<std::string()>& work, pid_t mountsOf) {
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0) return strerror(errno);
    const qvx::test::Process child(geteuid(), [&] {
        const bool entered = enterMountsOf(mountsOf) && qvx::test::becomeUser(user);
        const std::string result = entered ? work() : "cannot enter";
        EXPECT_TRUE(android::base::WriteStringToFd(result, ends[1]));
    });
    close(ends[1]);
    std::string result;
    android::base::ReadFdToString(ends[0], &result);
    close(ends[0]);
    return result;
}

std::string outcome(ssize_t returned) {
    return returned < 0 ? std::string(strerrorname_np(errno)) : std::to_string(returned);
}

std::string openNode(const std::string& path, int flags) {
    const int fd = open(path.c_str(), flags | O_CLOEXEC, 0644);
    if (fd < 0) return strerrorname_np(errno);
    close(fd);
    return "ok";
}

std::string writeNode(const std::string& path, const std::string& text, int flags) {
    const int fd = open(path.c_str(), flags, 0644);
    if (fd < 0) return std::string("open ") + strerrorname_np(errno);
    std::string result = outcome(write(fd, text.data(), text.size()));
    close(fd);
    return result;
}

std::string readNode(const std::string& path) {
    const int fd = open(path.c_str(), O_RDONLY);
    if (fd < 0) return std::string("open ") + strerrorname_np(errno);
    char text[65536];
    const ssize_t size = read(fd, text, sizeof text);
    std::string result =
            size < 0 ? strerrorname_np(errno) : std::string(text, static_cast<size_t>(size));
    close(fd);
    return result;
}

}  // namespace handset
