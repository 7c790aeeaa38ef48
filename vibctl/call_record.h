// SPDX-License-Identifier: Apache-2.0
//
// The record of calls: a line for each that was made, for whoever looks at a run afterwards.
#pragma once

#include <string>

#include "vibctl/command_line.h"
#include "vibctl/outcome.h"

namespace vibctl {

// Appends the call to the file that the variable VIBCTL_CALLS names, as docs/formats.md describes
// under "calls.jsonl"; nothing where the variable is not set or nothing was called. A record that
// cannot be written changes nothing about the call.
void recordCall(const CommandLine& line, const std::string& method, const Outcome& outcome);

// The line, without its newline, as of a client with this process and user.
std::string recordLine(const CommandLine& line, const std::string& method, const Outcome& outcome,
                       int pid, unsigned uid);

}  // namespace vibctl
