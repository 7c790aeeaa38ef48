// SPDX-License-Identifier: Apache-2.0
// A handset-driver that runs for one test.
#include "running_driver.h"

#include <fcntl.h>
#include <grp.h>
#include <poll.h>
#include <sched.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstring>
#include <regex>
#include <sstream>

#include "phone/control_client.h"

namespace handset {
namespace {

constexpr int kStartPatience = 30000;  // milliseconds; emulation under a sanitizer is slow

int waitFor(pid_t pid) {
    int status = 0;
    while (waitpid(pid, &status, 0) < 0 && errno == EINTR) {
    }
    return WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status);
}

std::string readAll(int fd) {
    std::string text;
    char part[4096];
    for (ssize_t size; (size = read(fd, part, sizeof part)) > 0;) {
        text.append(part, static_cast<size_t>(size));
    }
    return text;
}

}  // namespace

RunningDriver::RunningDriver(const std::string& profile) {
    std::ofstream(folder_.file("profile.json")) << profile;
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0) return;
    pid_ = fork();
    if (pid_ == 0) {
        const int errors = open(folder_.file("errors").c_str(), O_WRONLY | O_CREAT, 0644);
        dup2(errors, STDERR_FILENO);
        const int ready = dup(ends[1]);
        execl(QVX_DRIVER, "handset-driver", "--profile", folder_.file("profile.json").c_str(),
              "--journal", folder_.file("journal").c_str(), "--control",
              folder_.file("control").c_str(), "--ready-fd", std::to_string(ready).c_str(),
              nullptr);
        _exit(127);
    }
    close(ends[1]);
    pollfd polled{ends[0], POLLIN, 0};
    ready_ = poll(&polled, 1, kStartPatience) > 0 && readAll(ends[0]) == "ready\n";
    close(ends[0]);
}

RunningDriver::~RunningDriver() {
    if (pid_ > 0) end(SIGTERM);
}

int RunningDriver::end(int signal) {
    kill(pid_, signal);
    const int status = waitFor(pid_);
    pid_ = -1;
    return status;
}

std::string RunningDriver::ask(const std::string& request) const {
    const Result<std::string> answer = askDriver(folder_.file("control"), request);
    return answer ? "ok " + *answer : "error " + answer.error().text;
}

std::vector<std::string> RunningDriver::journal() const {
    std::istringstream text(std::regex_replace(
            rawJournal(), std::regex("\"n\":[0-9]+,\"us\":[0-9]+,\"pid\":[0-9]+,"), ""));
    std::vector<std::string> lines;
    for (std::string line; std::getline(text, line);) lines.push_back(line);
    return lines;
}

std::string RunningDriver::inside(uid_t user, const std::function<std::string()>& work) const {
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0) return strerror(errno);
    const pid_t child = fork();
    if (child == 0) {
        const std::string path = "/proc/" + std::to_string(pid_) + "/ns/mnt";
        const int mounts = open(path.c_str(), O_RDONLY | O_CLOEXEC);
        std::string result = "cannot enter";
        if (setns(mounts, CLONE_NEWNS) == 0 && setgroups(0, nullptr) == 0 &&
            setresgid(user, user, user) == 0 && setresuid(user, user, user) == 0) {
            result = work();
        }
        _exit(write(ends[1], result.data(), result.size()) < 0 ? 1 : 0);
    }
    close(ends[1]);
    std::string result = readAll(ends[0]);
    close(ends[0]);
    waitFor(child);
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
