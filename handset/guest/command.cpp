// SPDX-License-Identifier: Apache-2.0
//
// Starting a child process on pipes or on a pseudo-terminal.
#include "handset/guest/command.h"

#include <fcntl.h>
#include <signal.h>
#include <stdlib.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cerrno>

namespace handset {
namespace {

using android::base::unique_fd;

// The child's side: what becomes its descriptors 0, 1 and 2.
struct ChildEnds {
    unique_fd input;
    unique_fd output;
    unique_fd errors;
};

// The step a child failed at, as it goes through the pipe to its parent.
struct ChildFailure {
    enum Step { Setup, Directory, Program } step;
    int error;
};

bool makePipe(unique_fd& readEnd, unique_fd& writeEnd) {
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0) return false;
    readEnd.reset(ends[0]);
    writeEnd.reset(ends[1]);
    return true;
}

bool openPipes(Command& command, ChildEnds& child) {
    return makePipe(child.input, command.input) && makePipe(command.output, child.output) &&
           makePipe(command.errors, child.errors);
}

bool openTerminal(TerminalSize size, Command& command, ChildEnds& child) {
    command.output.reset(posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC));
    const int master = command.output.get();
    char name[64];
    if (master < 0 || grantpt(master) != 0 || unlockpt(master) != 0 ||
        ptsname_r(master, name, sizeof(name)) != 0) {
        return false;
    }
    resizeTerminal(master, size);
    command.input.reset(fcntl(master, F_DUPFD_CLOEXEC, 0));
    child.input.reset(open(name, O_RDWR | O_NOCTTY | O_CLOEXEC));
    child.output.reset(fcntl(child.input.get(), F_DUPFD_CLOEXEC, 0));
    child.errors.reset(fcntl(child.input.get(), F_DUPFD_CLOEXEC, 0));
    return command.input.ok() && child.errors.ok();
}

std::vector<char*> pointersTo(const std::vector<std::string>& words) {
    std::vector<char*> pointers;
    pointers.reserve(words.size() + 1);
    for (const std::string& word : words) pointers.push_back(const_cast<char*>(word.c_str()));
    pointers.push_back(nullptr);
    return pointers;
}

// Becomes the command. Returns only on failure.
ChildFailure becomeCommand(const CommandDescription& description, const ChildEnds& ends) {
    sigset_t none;
    sigemptyset(&none);
    sigprocmask(SIG_SETMASK, &none, nullptr);
    signal(SIGPIPE, SIG_DFL);
    setsid();
    if (description.terminal && ioctl(ends.input.get(), TIOCSCTTY, 0) != 0) {
        return {ChildFailure::Setup, errno};
    }
    if (dup2(ends.input.get(), STDIN_FILENO) < 0 || dup2(ends.output.get(), STDOUT_FILENO) < 0 ||
        dup2(ends.errors.get(), STDERR_FILENO) < 0) {
        return {ChildFailure::Setup, errno};
    }
    if (chdir(description.directory.c_str()) != 0) return {ChildFailure::Directory, errno};
    const std::vector<char*> arguments = pointersTo(description.arguments);
    std::vector<char*> environment = pointersTo(description.environment);
    environ = environment.data();
    execvp(arguments[0], arguments.data());
    return {ChildFailure::Program, errno};
}

std::string describe(ChildFailure::Step step, const CommandDescription& description) {
    switch (step) {
        case ChildFailure::Directory:
            return "cannot enter " + description.directory;
        case ChildFailure::Program:
            return "cannot run " + description.arguments[0];
        case ChildFailure::Setup:
            break;
    }
    return "cannot set up the command";
}

}  // namespace

std::optional<StartFailure> startCommand(const CommandDescription& description, Command& command) {
    if (description.arguments.empty()) return StartFailure{EINVAL, "no command given"};
    Command started;
    ChildEnds child;
    unique_fd failureRead;
    unique_fd failureWrite;
    const bool open = description.terminal ? openTerminal(*description.terminal, started, child)
                                           : openPipes(started, child);
    if (!open || !makePipe(failureRead, failureWrite)) {
        return StartFailure{errno, describe(ChildFailure::Setup, description)};
    }

    started.pid = fork();
    if (started.pid < 0) return StartFailure{errno, "cannot fork"};
    if (started.pid == 0) {
        const ChildFailure failure = becomeCommand(description, child);
        const ssize_t ignored = write(failureWrite.get(), &failure, sizeof(failure));
        _exit(ignored < 0 ? 126 : 127);
    }

    // The pipe closes when the program starts; the child of a failed start is reaped with the rest.
    failureWrite.reset();
    ChildFailure failure{};
    if (read(failureRead.get(), &failure, sizeof(failure)) == sizeof(failure)) {
        return StartFailure{failure.error, describe(failure.step, description)};
    }
    for (const unique_fd* end : {&started.input, &started.output, &started.errors}) {
        if (end->ok()) fcntl(end->get(), F_SETFL, O_NONBLOCK);
    }
    command = std::move(started);
    return std::nullopt;
}

void resizeTerminal(int fd, TerminalSize size) {
    const winsize window{
            .ws_row = size.rows, .ws_col = size.columns, .ws_xpixel = 0, .ws_ypixel = 0};
    ioctl(fd, TIOCSWINSZ, &window);
}

}  // namespace handset
