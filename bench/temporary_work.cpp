// SPDX-License-Identifier: Apache-2.0
//
// The work is a child; this process only waits, forwards the end and tidies up.
#include "bench/temporary_work.h"

#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <system_error>

namespace bench {
namespace {

constexpr int kEndings[] = {SIGHUP, SIGINT, SIGTERM};

std::atomic<pid_t> group = 0;

void endGroup(int signal) {
    if (group > 0) kill(-group, signal);
}

}  // namespace

int runInTemporaryDirectory(const std::function<int(const std::string& directory)>& work) {
    std::string directory = std::filesystem::temp_directory_path() / "figures.XXXXXX";
    if (mkdtemp(directory.data()) == nullptr) {
        perror("no temporary directory");
        return 1;
    }
    // Held back until there is a group to end.
    sigset_t endings;
    sigset_t before;
    sigemptyset(&endings);
    for (const int ending : kEndings) sigaddset(&endings, ending);
    sigprocmask(SIG_BLOCK, &endings, &before);
    const pid_t child = fork();
    if (child == 0) {
        setpgid(0, 0);
        sigprocmask(SIG_SETMASK, &before, nullptr);
        exit(work(directory));  // flushes what was printed
    }
    int status = 1 << 8;
    if (child > 0) {
        setpgid(child, child);
        group = child;
        for (const int ending : kEndings) signal(ending, endGroup);
        sigprocmask(SIG_SETMASK, &before, nullptr);
        while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
        }
    }
    std::error_code ignored;
    std::filesystem::remove_all(directory, ignored);
    return WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status);
}

}  // namespace bench
