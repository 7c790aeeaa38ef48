// SPDX-License-Identifier: Apache-2.0
//
// The lines of a session: see session.h.
#include "vibctl/session.h"

#include <string>
#include <vector>

#include "vibctl/play/json_fields.h"

namespace vibctl {

Problem parseSessionLine(const std::string& text, CommandLine& line) {
    constexpr const char* kAccepted = R"(session: a list such as ["std","on","500"] is accepted)";
    line.json = true;
    Json::Value list;
    if (const Problem problem = parseJson(text, 1, list)) return kAccepted + ("; " + *problem);
    std::vector<std::string> words;
    if (!list.isArray()) return kAccepted;
    for (const Json::Value& word : list) {
        if (!word.isString()) return kAccepted;
        words.push_back(word.asString());
    }
    Problem problem = parseCommandLine(words, line);
    line.json = true;
    if (problem) return problem;
    if (line.command != "std" && line.command != "ext") {
        return "session: a call begins with std or ext, not " + inQuotes(line.command);
    }
    if (line.help || line.version || line.offOnInterrupt || line.method == "help") {
        return "session: of the options --callback, --wait and --timeout are accepted";
    }
    return std::nullopt;
}

}  // namespace vibctl
