// SPDX-License-Identifier: Apache-2.0
//
// The command line taken apart: options, interface, method, arguments.
#pragma once

#include <chrono>
#include <span>
#include <string>
#include <vector>

#include "arguments.h"

namespace vibctl {

/// Options begin with two dashes and may stand anywhere, before or after the method; a word `--`
/// ends them. A single dash begins no option, so that negative numbers are plain arguments.
struct CommandLine {
    bool json = false;
    bool callback = false;
    bool help = false;
    bool version = false;
    std::chrono::milliseconds wait{5000};

    std::string command;                 ///< "std", "ext", "list", "help"; empty when missing
    std::string method;                  ///< of std and ext; empty when missing
    std::vector<std::string> arguments;  ///< the words after the method, options left out
};

/// `words` are those after the program's name. The method and its arguments are not looked at.
Problem parseCommandLine(std::span<const std::string> words, CommandLine& line);

}  // namespace vibctl
