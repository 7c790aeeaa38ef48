// SPDX-License-Identifier: Apache-2.0
//
// The command line taken apart: see command_line.h.
#include "vibctl/command_line.h"

#include <algorithm>
#include <iterator>

#include <android-base/strings.h>
#include <fmt/format.h>

namespace vibctl {

namespace {

struct Option {
    const char* name;
    const char* value;     // what follows it, as the usage shows it; null when nothing does
    const char* commands;  // those it goes with, separated by spaces; null when it goes with all
    Problem (*take)(const Option& option, const std::string& word, CommandLine& line);
};

template <bool CommandLine::*kFlag>
Problem takeFlag(const Option&, const std::string&, CommandLine& line) {
    line.*kFlag = true;
    return std::nullopt;
}

template <std::chrono::milliseconds CommandLine::*kTime>
Problem takeSeconds(const Option& option, const std::string& word, CommandLine& line) {
    // A day: beyond it, a number is a slip and not a wish.
    constexpr float kMost = 86400;
    float seconds = 0;
    const Problem problem = Argument<float>::parse(option.name, word, seconds);
    // Written so that nan is refused as well.
    if (problem || !(seconds >= 0 && seconds <= kMost)) {
        return fmt::format("{} {} is not a number of seconds from 0 to {}", option.name,
                           inQuotes(word), static_cast<int>(kMost));
    }
    line.*kTime = std::chrono::milliseconds(static_cast<int64_t>(seconds * 1000));
    return std::nullopt;
}

Problem takeAmplitudes(const Option&, const std::string& word, CommandLine& line) {
    line.amplitudes = word;
    return std::nullopt;
}

Problem takeRepeat(const Option& option, const std::string& word, CommandLine& line) {
    int64_t count = 0;
    Problem problem = parseInteger(option.name, word, 1, 1000, count);
    line.repeat = static_cast<int>(count);
    return problem;
}

constexpr Option kOptions[] = {
        {"--json", nullptr, nullptr, takeFlag<&CommandLine::json>},
        {"--timeout", "SECONDS", nullptr, takeSeconds<&CommandLine::timeout>},
        {"--wait", "SECONDS", "std ext", takeSeconds<&CommandLine::wait>},
        {"--callback", nullptr, "std ext", takeFlag<&CommandLine::callback>},
        {"--off-on-interrupt", nullptr, "std ext", takeFlag<&CommandLine::offOnInterrupt>},
        {"--amplitudes", "A,...", "play", takeAmplitudes},
        {"--repeat", "COUNT", "play", takeRepeat},
        {"--explain", nullptr, "play", takeFlag<&CommandLine::explain>},
        {"--help", nullptr, nullptr, takeFlag<&CommandLine::help>},
        {"--version", nullptr, nullptr, takeFlag<&CommandLine::version>},
};

std::string withValue(const Option& option) {
    return fmt::format("{}{}{}", option.name, option.value == nullptr ? "" : " ",
                       option.value == nullptr ? "" : option.value);
}

Problem unknownOption(const std::string& word) {
    std::vector<std::string> all;
    for (const Option& option : kOptions) all.push_back(withValue(option));
    return fmt::format("unknown option {}; there are {}", inQuotes(word), fmt::join(all, ", "));
}

// Takes the option at the front of `words`, with its value, and notes it in `given`.
Problem takeOption(std::span<const std::string>& words, CommandLine& line,
                   std::vector<const Option*>& given) {
    const std::string& word = words.front();
    words = words.subspan(1);
    const size_t equals = word.find('=');
    const auto* const option =
            std::find_if(std::begin(kOptions), std::end(kOptions), [&](const Option& one) {
                return word.substr(0, one.value == nullptr ? word.npos : equals) == one.name;
            });
    if (option == std::end(kOptions)) return unknownOption(word);
    given.push_back(option);
    if (option->value == nullptr) return option->take(*option, word, line);
    if (equals != std::string::npos) return option->take(*option, word.substr(equals + 1), line);
    if (words.empty()) return fmt::format("{} needs its {}", option->name, option->value);
    const std::string& value = words.front();
    words = words.subspan(1);
    return option->take(*option, value, line);
}

// An option that the command does nothing with was meant for another one.
Problem checkOptions(const CommandLine& line, const std::vector<const Option*>& given) {
    for (const Option* option : given) {
        if (option->commands == nullptr || line.help || line.version || line.command.empty()) {
            continue;
        }
        const std::vector<std::string> commands = android::base::Split(option->commands, " ");
        if (std::find(commands.begin(), commands.end(), line.command) != commands.end()) continue;
        return fmt::format("{} takes no {}, unlike {}", line.command, option->name,
                           fmt::join(commands, ", "));
    }
    return std::nullopt;
}

}  // namespace

Problem parseCommandLine(std::span<const std::string> words, CommandLine& line) {
    std::vector<std::string> plain;
    std::vector<const Option*> given;
    Problem first;
    bool optionsEnded = false;
    while (!words.empty()) {
        const std::string& word = words.front();
        if (!optionsEnded && word.size() > 2 && word.starts_with("--")) {
            const Problem problem = takeOption(words, line, given);
            if (!first) first = problem;
            continue;
        }
        if (!optionsEnded && word == "--") {
            optionsEnded = true;
        } else {
            plain.push_back(word);
        }
        words = words.subspan(1);
    }
    if (!plain.empty()) line.command = plain[0];
    if (line.command == "-h") line.command = "help";
    if (plain.size() > 1) line.method = plain[1];
    if (plain.size() > 2) line.arguments.assign(plain.begin() + 2, plain.end());
    return first ? first : checkOptions(line, given);
}

}  // namespace vibctl
