// SPDX-License-Identifier: Apache-2.0
//
// Calls of either interface as the tests make them.
#pragma once

#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "vibctl/find_method.h"

namespace vibctl {

inline auto answerOk() {
    return [](auto&&...) { return ndk::ScopedAStatus::ok(); };
}

// Makes the call that the words ask for, the method first; fails the test where they are wrong.
template <typename Interface>
Outcome makeCall(const char* command, const std::vector<std::string>& words, Interface& service,
                 const Callback& callback) {
    CommandLine line;
    line.command = command;
    line.method = words.at(0);
    line.arguments.assign(words.begin() + 1, words.end());
    const Method* method = nullptr;
    Call prepared;
    Problem problem = findMethod(line, method);
    if (!problem) problem = prepareCall(line, *method, prepared);
    if (problem) {
        ADD_FAILURE() << *problem;
        return {};
    }
    return prepared(service, callback);
}

}  // namespace vibctl
