// SPDX-License-Identifier: Apache-2.0
//
// Runs a program and keeps what it printed.
#pragma once

#include <string>
#include <vector>

namespace qvx::test {

struct CommandResult {
    int status = -1;  // exit status; 128 + n when signal n ended it; 127 when it was not found
    std::string out;
    std::string err;
};

// Runs `arguments` (the first is the program, looked up in PATH) with no standard input and waits
// for its end.
CommandResult runCommand(const std::vector<std::string>& arguments);

// The same for a line in the shell's language.
CommandResult runShell(const std::string& line);

}  // namespace qvx::test
