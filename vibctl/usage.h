// SPDX-License-Identifier: Apache-2.0
//
// The help texts.
#pragma once

#include <string>

#include "vibctl/methods.h"

namespace vibctl {

// The usage of a method of the interface "std" or "ext" and, a line each, what its parameters
// accept.
std::string helpOf(const std::string& iface, const Method& method);

// Every method of the interface, a line each.
std::string helpOfInterface(const std::string& iface);

// What the program is and does.
std::string programHelp();

// What is said about a first word that is no command.
std::string unknownCommand(const std::string& word);

}  // namespace vibctl
