// SPDX-License-Identifier: Apache-2.0
//
// Commands as the agent starts them: environment, directory, descriptors, terminal, failures.
#include <linux/close_range.h>
#include <poll.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <string>

#include <gtest/gtest.h>

#include "handset/guest/command.h"

namespace handset {
namespace {

using android::base::unique_fd;

// Everything up to the end of `fd`, which is non-blocking.
std::string readAll(const unique_fd& fd) {
    std::string text;
    std::array<char, 4096> chunk{};
    pollfd wait{.fd = fd.get(), .events = POLLIN, .revents = 0};
    while (poll(&wait, 1, 10000) == 1) {
        const ssize_t count = read(fd.get(), chunk.data(), chunk.size());
        if (count <= 0) break;
        text.append(chunk.data(), static_cast<std::size_t>(count));
    }
    return text;
}

int statusOf(const Command& command) {
    int status = -1;
    EXPECT_EQ(waitpid(command.pid, &status, 0), command.pid);
    return status;
}

CommandDescription shell(const std::string& script) {
    return {.arguments = {"/bin/sh", "-c", script},
            .environment = {},
            .directory = "/",
            .terminal = std::nullopt};
}

Command started(const CommandDescription& description) {
    Command command;
    const std::optional<StartFailure> failure = startCommand(description, command);
    EXPECT_FALSE(failure) << failure->what;
    return command;
}

TEST(AgentCommand, ExitStatusIsTheProgramsOwn) {
    EXPECT_EQ(WEXITSTATUS(statusOf(started(shell("exit 42")))), 42);
}

TEST(AgentCommand, SignalThatEndedItIsSeen) {
    EXPECT_EQ(WTERMSIG(statusOf(started(shell("kill -SEGV $$")))), SIGSEGV);
}

TEST(AgentCommand, OutputAndErrorsAreSeparate) {
    const Command command = started(shell("echo out; echo err >&2"));
    EXPECT_EQ(readAll(command.output), "out\n");
    EXPECT_EQ(readAll(command.errors), "err\n");
    statusOf(command);
}

TEST(AgentCommand, InputReachesItAndEnds) {
    Command command = started(shell("cat"));
    ASSERT_EQ(write(command.input.get(), "a\0b", 3), 3);
    command.input.reset();
    EXPECT_EQ(readAll(command.output), std::string("a\0b", 3));
    statusOf(command);
}

TEST(AgentCommand, EnvironmentIsOnlyWhatIsGiven) {
    CommandDescription description = shell("echo \"$OUT:$HOME:$1\"");
    description.environment = {"OUT=/run/x", "PATH=/bin"};
    const Command command = started(description);
    EXPECT_EQ(readAll(command.output), "/run/x::\n");
    statusOf(command);
}

TEST(AgentCommand, ProgramIsSearchedInTheGivenPath) {
    const CommandDescription description = {.arguments = {"sh", "-c", "echo found"},
                                            .environment = {"PATH=/nowhere:/bin"},
                                            .directory = "/",
                                            .terminal = std::nullopt};
    const Command command = started(description);
    EXPECT_EQ(readAll(command.output), "found\n");
    statusOf(command);
}

TEST(AgentCommand, RunsInTheGivenDirectory) {
    CommandDescription description = shell("pwd");
    description.directory = "/usr";
    const Command command = started(description);
    EXPECT_EQ(readAll(command.output), "/usr\n");
    statusOf(command);
}

TEST(AgentCommand, InheritsNoDescriptorButThree) {
    // What the test itself was started with is none of the agent's business.
    ASSERT_EQ(close_range(3, ~0U, CLOSE_RANGE_CLOEXEC), 0);
    CommandDescription description = shell("exec ls /proc/self/fd");
    description.environment = {"PATH=/bin:/usr/bin"};
    const Command command = started(description);
    EXPECT_EQ(readAll(command.output), "0\n1\n2\n3\n");  // the last is the listed directory
    statusOf(command);
}

TEST(AgentCommand, BrokenPipeEndsItAsUsual) {
    signal(SIGPIPE, SIG_IGN);
    Command command = started(shell("read line; echo late; echo later"));
    command.output.reset();
    command.input.reset();
    EXPECT_EQ(WTERMSIG(statusOf(command)), SIGPIPE);
    signal(SIGPIPE, SIG_DFL);
}

TEST(AgentCommand, TerminalHasTheGivenSize) {
    CommandDescription description = shell("test -t 0 && test -t 1 && test -t 2 && stty size");
    description.environment = {"PATH=/bin:/usr/bin"};
    description.terminal = TerminalSize{.rows = 24, .columns = 336};
    const Command command = started(description);
    EXPECT_EQ(readAll(command.output), "24 336\r\n");
    EXPECT_FALSE(command.errors.ok());
    statusOf(command);
}

TEST(AgentCommand, MissingProgramIsNamed) {
    CommandDescription description = shell("");
    description.arguments = {"/nowhere/at/all"};
    Command command;
    const std::optional<StartFailure> failure = startCommand(description, command);
    ASSERT_TRUE(failure);
    EXPECT_EQ(failure->error, ENOENT);
    EXPECT_EQ(failure->what, "cannot run /nowhere/at/all");
    EXPECT_EQ(command.pid, -1);
}

TEST(AgentCommand, ProgramThatMayNotRunIsNamed) {
    CommandDescription description = shell("");
    description.arguments = {"/etc/passwd"};
    Command command;
    const std::optional<StartFailure> failure = startCommand(description, command);
    ASSERT_TRUE(failure);
    EXPECT_EQ(failure->error, EACCES);
    EXPECT_EQ(failure->what, "cannot run /etc/passwd");
}

TEST(AgentCommand, MissingDirectoryIsNamed) {
    CommandDescription description = shell("true");
    description.directory = "/nowhere";
    Command command;
    const std::optional<StartFailure> failure = startCommand(description, command);
    ASSERT_TRUE(failure);
    EXPECT_EQ(failure->error, ENOENT);
    EXPECT_EQ(failure->what, "cannot enter /nowhere");
}

TEST(AgentCommand, NoWordsIsAFailure) {
    Command command;
    const std::optional<StartFailure> failure = startCommand(CommandDescription{}, command);
    ASSERT_TRUE(failure);
    EXPECT_EQ(failure->error, EINVAL);
    EXPECT_EQ(failure->what, "no command given");
}

}  // namespace
}  // namespace handset
