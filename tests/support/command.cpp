// SPDX-License-Identifier: Apache-2.0
#include "tests/support/command.h"

#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>

#include <android-base/unique_fd.h>

extern char** environ;

namespace qvx::test {
namespace {

using android::base::unique_fd;

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
    unique_fd out;
    unique_fd outEnd;
    unique_fd err;
    unique_fd errEnd;
    if (!android::base::Pipe(&out, &outEnd) || !android::base::Pipe(&err, &errEnd)) return {};

    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    posix_spawn_file_actions_adddup2(&actions, outEnd.get(), STDOUT_FILENO);
    posix_spawn_file_actions_adddup2(&actions, errEnd.get(), STDERR_FILENO);

    std::vector<std::string> words = arguments;
    std::vector<char*> argv;
    for (std::string& word : words) argv.push_back(word.data());
    argv.push_back(nullptr);

    pid_t pid = -1;
    const int failure = posix_spawnp(&pid, argv[0], &actions, nullptr, argv.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    outEnd.reset();
    errEnd.reset();

    CommandResult result;
    if (failure == 0) {
        std::array<pollfd, 2> streams{{{out.get(), POLLIN, 0}, {err.get(), POLLIN, 0}}};
        while (streams[0].fd >= 0 || streams[1].fd >= 0) {
            if (poll(streams.data(), streams.size(), -1) < 0) break;
            if (streams[0].revents != 0 && !drain(out.get(), &result.out)) streams[0].fd = -1;
            if (streams[1].revents != 0 && !drain(err.get(), &result.err)) streams[1].fd = -1;
        }
        int status = 0;
        waitpid(pid, &status, 0);
        result.status = WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
    } else {
        result.status = 127;
    }
    return result;
}

CommandResult runShell(const std::string& line) {
    return runCommand({"sh", "-c", line});
}

}  // namespace qvx::test
