// SPDX-License-Identifier: Apache-2.0
//
// The lines of a session: calls that another program asks for, one after the other, of one client
// that goes on living.
#pragma once

#include <string>

#include "vibctl/arguments.h"
#include "vibctl/command_line.h"

namespace vibctl {

// A line is a JSON list of the words that would stand behind the program's name, from std or ext on:
// ["std","on","500"]. Of the options, those of a call are accepted: --callback, --wait, --timeout.
// `line` becomes the command line, with the option --json.
Problem parseSessionLine(const std::string& text, CommandLine& line);

}  // namespace vibctl
