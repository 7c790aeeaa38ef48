// SPDX-License-Identifier: Apache-2.0
//
// One command as a child process, with its pipes or its terminal.
#pragma once

#include <sys/types.h>

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include <android-base/unique_fd.h>

namespace handset {

struct TerminalSize {
    std::uint16_t rows;
    std::uint16_t columns;
};

// What to run.
struct CommandDescription {
    std::vector<std::string> arguments;
    std::vector<std::string> environment;
    std::string directory = "/";
    std::optional<TerminalSize> terminal;
};

// Why a command was not started.
struct StartFailure {
    int error;         // an errno value
    std::string what;  // the step and its object, as "cannot run ls"
};

// A running command. Its descriptors are non-blocking. With a terminal, `input` and `output` are
// two descriptors of the terminal's master side and `errors` is not open.
struct Command {
    pid_t pid = -1;
    android::base::unique_fd input;
    android::base::unique_fd output;
    android::base::unique_fd errors;
};

// Runs `description` in a session of its own. Fills `command`; on failure leaves it as it was and
// says why.
std::optional<StartFailure> startCommand(const CommandDescription& description, Command& command);

// Tells the terminal behind `fd` its size, which signals the programs that use it.
void resizeTerminal(int fd, TerminalSize size);

}  // namespace handset
