// SPDX-License-Identifier: Apache-2.0
//
// From words to a method with its arguments: see find_method.h.
#include "vibctl/find_method.h"

#include <string_view>
#include <vector>

#include <fmt/format.h>

#include "vibctl/near_words.h"

namespace vibctl {

Problem findMethod(const CommandLine& line, const Method*& method) {
    std::vector<std::string_view> all;
    for (const Method& one : methodsOf(line.command)) {
        if (line.method == one.name) {
            method = &one;
            return std::nullopt;
        }
        all.emplace_back(one.name);
    }
    const std::vector<std::string> near = wordsNear(line.method, all);
    return fmt::format(
            "{}: {}; {}", line.command,
            line.method.empty() ? "no method given" : "unknown method " + inQuotes(line.method),
            near.empty() ? fmt::format("there are {}", fmt::join(all, ", "))
                         : fmt::format("did you mean {}", fmt::join(near, ", ")));
}

Problem prepareCall(const CommandLine& line, const Method& method, Call& call) {
    Problem problem;
    if (line.callback && !method.takesCallback) {
        std::vector<std::string> others;
        for (const Method& one : methodsOf(line.command)) {
            if (one.takesCallback) others.emplace_back(one.name);
        }
        problem = fmt::format("takes no --callback, unlike {}", fmt::join(others, ", "));
    } else {
        problem = method.parse(method, line.arguments, call);
    }
    if (!problem) return std::nullopt;
    return fmt::format("{} {}: {}; usage: {}", line.command, method.name, *problem,
                       usageOf(line.command, method));
}

std::string usageOf(const std::string& iface, const Method& method) {
    return fmt::format("vibctl {} {}{}{}{}", iface, method.name,
                       *method.parameters == '\0' ? "" : " ", method.parameters,
                       method.takesCallback ? " [--callback]" : "");
}

}  // namespace vibctl
