// SPDX-License-Identifier: Apache-2.0
#include "command.h"

#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>

extern char** environ;

namespace qvx::test {
namespace {

// Appends what is readable; false at the end of the stream.
bool drain(int fd, std::string* text) {
    std::array<char, 4096> buffer;
    const ssize_t count = read(fd, buffer.data(), buffer.size());
    if (count <= 0) return false;
    text->append(buffer.data(), static_cast<size_t>(count));
    return true;
}

}  // namespace

CommandResult runCommand(const std::vector<std::string>& arguments) {
    std::array<int, 2> out{};
    std::array<int, 2> err{};
    if (pipe2(out.data(), O_CLOEXEC) != 0 || pipe2(err.data(), O_CLOEXEC) != 0) return {};

    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    posix_spawn_file_actions_adddup2(&actions, out[1], STDOUT_FILENO);
    posix_spawn_file_actions_adddup2(&actions, err[1], STDERR_FILENO);

    std::vector<std::string> words = arguments;
    std::vector<char*> argv;
    for (std::string& word : words) argv.push_back(word.data());
    argv.push_back(nullptr);

    pid_t pid = -1;
    const int failure = posix_spawnp(&pid, argv[0], &actions, nullptr, argv.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    close(out[1]);
    close(err[1]);

    CommandResult result;
    if (failure == 0) {
        std::array<pollfd, 2> streams{{{out[0], POLLIN, 0}, {err[0], POLLIN, 0}}};
        while (streams[0].fd >= 0 || streams[1].fd >= 0) {
            if (poll(streams.data(), streams.size(), -1) < 0) break;
            if (streams[0].revents != 0 && !drain(out[0], &result.out)) streams[0].fd = -1;
            if (streams[1].revents != 0 && !drain(err[0], &result.err)) streams[1].fd = -1;
        }
        int status = 0;
        waitpid(pid, &status, 0);
        result.status = WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
    } else {
        result.status = 127;
    }
    close(out[0]);
    close(err[0]);
    return result;
}

CommandResult runShell(const std::string& line) {
    return runCommand({"sh", "-c", line});
}

}  // namespace qvx::test
