// SPDX-License-Identifier: Apache-2.0
//
// From a command line to a method with its arguments, or to the one line that says what is wrong;
// and the help texts.
#pragma once

#include <string>

#include "command_line.h"
#include "method.h"
#include "methods.h"

namespace vibctl {

/// "std" or "ext".
template <typename Interface>
const char* ifaceOf();
template <>
inline const char* ifaceOf<IVibrator>() {
    return "std";
}
template <>
inline const char* ifaceOf<IZelVibrator>() {
    return "ext";
}

template <typename Interface>
std::span<const Method<Interface>> methodsOf();
template <>
inline std::span<const Method<IVibrator>> methodsOf<IVibrator>() {
    return standardMethods();
}
template <>
inline std::span<const Method<IZelVibrator>> methodsOf<IZelVibrator>() {
    return extensionMethods();
}

/// Finds the method that `line` names, or says which there are.
template <typename Interface>
Problem findMethod(const CommandLine& line, const Method<Interface>*& method);

/// Parses the arguments and checks that the options go with the method.
template <typename Interface>
Problem prepareCall(const CommandLine& line, const Method<Interface>& method,
                    typename Method<Interface>::Call& call);

/// "vibctl std perform EFFECT STRENGTH [--callback]"
template <typename Interface>
std::string usageOf(const Method<Interface>& method);

/// The usage of a method and, a line each, what its parameters accept.
template <typename Interface>
std::string helpOf(const Method<Interface>& method);

/// Every method of the interface, a line each.
template <typename Interface>
std::string helpOfInterface();

/// What the program is and does.
std::string programHelp();

/// The text after "vibctl: " for a first word that is no command.
std::string unknownCommand(const std::string& word);

}  // namespace vibctl
