// SPDX-License-Identifier: Apache-2.0
//
// From the words of a command line to a method with its arguments, or to the one line that says
// what is wrong.
#pragma once

#include <string>

#include "vibctl/command_line.h"
#include "vibctl/methods.h"

namespace vibctl {

// Finds the method that `line` names, or says which there are. `line.command` is "std" or "ext".
Problem findMethod(const CommandLine& line, const Method*& method);

// Parses the arguments and checks that the options go with the method.
Problem prepareCall(const CommandLine& line, const Method& method, Call& call);

// "vibctl std perform EFFECT STRENGTH [--callback]"
std::string usageOf(const std::string& iface, const Method& method);

}  // namespace vibctl
