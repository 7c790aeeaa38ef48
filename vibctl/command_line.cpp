// SPDX-License-Identifier: Apache-2.0
//
// The command line taken apart: see command_line.h.
#include "command_line.h"

#include <fmt/format.h>

namespace vibctl {

namespace {

/// A day: beyond it, a number is a slip and not a wish.
constexpr float kLongestWaitSeconds = 86400;

constexpr const char* kOptions = "--json, --wait SECONDS, --callback, --help, --version";

Problem parseWait(std::string_view word, CommandLine& line) {
    float seconds = 0;
    const Problem problem = Argument<float>::parse("--wait", word, seconds);
    // Written so that nan is refused as well.
    if (problem || !(seconds >= 0 && seconds <= kLongestWaitSeconds)) {
        return fmt::format("--wait {:?} is not a number of seconds from 0 to {}", word,
                           kLongestWaitSeconds);
    }
    line.wait = std::chrono::milliseconds(static_cast<int64_t>(seconds * 1000));
    return std::nullopt;
}

/// Takes the option at the front of `words`, with its value.
Problem parseOption(std::span<const std::string>& words, CommandLine& line) {
    const std::string& option = words.front();
    words = words.subspan(1);
    if (option == "--wait") {
        if (words.empty()) return "--wait needs a number of seconds";
        const std::string& value = words.front();
        words = words.subspan(1);
        return parseWait(value, line);
    }
    constexpr std::string_view kWaitIs = "--wait=";
    if (option.starts_with(kWaitIs)) {
        return parseWait(std::string_view(option).substr(kWaitIs.size()), line);
    }
    constexpr struct {
        std::string_view name;
        bool CommandLine::*flag;
    } kFlags[] = {
            {"--json", &CommandLine::json},
            {"--callback", &CommandLine::callback},
            {"--help", &CommandLine::help},
            {"--version", &CommandLine::version},
    };
    for (const auto& [name, flag] : kFlags) {
        if (option != name) continue;
        line.*flag = true;
        return std::nullopt;
    }
    return fmt::format("unknown option {:?}; there are {}", option, kOptions);
}

}  // namespace

Problem parseCommandLine(std::span<const std::string> words, CommandLine& line) {
    std::vector<std::string> plain;
    bool optionsEnded = false;
    while (!words.empty()) {
        if (!optionsEnded && words.front().starts_with("--") && words.front() != "--") {
            if (Problem problem = parseOption(words, line)) return problem;
            continue;
        }
        if (!optionsEnded && words.front() == "--") {
            optionsEnded = true;
        } else {
            plain.push_back(words.front());
        }
        words = words.subspan(1);
    }
    if (!plain.empty()) line.command = plain[0];
    if (line.command == "-h") line.command = "help";
    if (plain.size() > 1) line.method = plain[1];
    if (plain.size() > 2) line.arguments.assign(plain.begin() + 2, plain.end());
    return std::nullopt;
}

}  // namespace vibctl
