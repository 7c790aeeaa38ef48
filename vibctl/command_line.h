// SPDX-License-Identifier: Apache-2.0
//
// The command line taken apart: options, command, method, arguments.
#pragma once

#include <chrono>
#include <span>
#include <string>
#include <vector>

#include "vibctl/arguments.h"

namespace vibctl {

// Options begin with two dashes and may stand anywhere, before or after the method; a word `--`
// ends them. A single dash begins no option, so that negative numbers are plain arguments.
struct CommandLine {
    bool json = false;
    bool callback = false;
    bool offOnInterrupt = false;
    bool help = false;
    bool version = false;
    std::chrono::milliseconds timeout{5000};  // for the answer of each call
    std::chrono::milliseconds wait{5000};     // for the callback

    std::string amplitudes;  // of a pattern, as they were written; empty when not given
    int repeat = 1;
    bool explain = false;

    std::string command;                 // "std", "list", "help"; empty when missing
    std::string method;                  // the word after it; empty when missing
    std::vector<std::string> arguments;  // the words after that, options left out
};

// `words` are those after the program's name. The method and its arguments are not looked at. With
// a problem, `line` has what could be understood all the same.
Problem parseCommandLine(std::span<const std::string> words, CommandLine& line);

}  // namespace vibctl
