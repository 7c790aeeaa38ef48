// SPDX-License-Identifier: Apache-2.0
//
// What a check came to: see finding.h.
#include "vibctl/doctor/finding.h"

#include <algorithm>
#include <utility>

#include <fmt/format.h>

#include "vibctl/outcome.h"

namespace vibctl {

namespace {

struct AnswerWords {
    const char* word;
    const char* colour;  // escape sequence of terminals
    const char* isOk;    // in JSON
};

constexpr AnswerWords kAnswers[] = {
        {"ok", "\033[32m", "true"},      // kGood
        {"note", "\033[33m", "true"},    // kNote
        {"bad", "\033[1;31m", "false"},  // kBad
        {"skip", "\033[2m", "null"},     // kSkipped
};

const AnswerWords& wordsOf(const Finding& finding) {
    return kAnswers[static_cast<size_t>(finding.answer)];
}

bool isBad(const Finding& finding) {
    return finding.answer == Answer::kBad;
}

}  // namespace

Finding good(std::string check, std::string text) {
    return {Answer::kGood, std::move(check), std::move(text), {}};
}

Finding note(std::string check, std::string text, std::string next) {
    return {Answer::kNote, std::move(check), std::move(text), std::move(next)};
}

Finding bad(std::string check, std::string text, std::string next) {
    return {Answer::kBad, std::move(check), std::move(text), std::move(next)};
}

Finding skipped(std::string check, std::string text) {
    return {Answer::kSkipped, std::move(check), std::move(text), {}};
}

std::string humanLine(const Finding& finding, bool coloured) {
    constexpr size_t kColumns = 100;
    const AnswerWords& words = wordsOf(finding);
    std::string line = fmt::format("{:<4} {}: {}", words.word, finding.check, finding.text);
    const std::string next = finding.next.empty() ? "" : "; next: " + finding.next;
    if (line.size() + next.size() > kColumns) {
        line.resize(kColumns - std::min(kColumns - 5, next.size() + 3));
        line += "...";
    }
    line = (line + next).substr(0, kColumns);
    if (coloured) line = words.colour + line.insert(4, "\033[0m");
    return line;
}

std::string jsonLine(const Finding& finding) {
    return fmt::format(R"({{"check":{},"ok":{},"text":{},"next":{}}})", jsonOf(finding.check),
                       wordsOf(finding).isOk, jsonOf(finding.text),
                       finding.next.empty() ? "null" : jsonOf(finding.next));
}

std::string closingLine(std::span<const Finding> findings) {
    const auto first = std::find_if(findings.begin(), findings.end(), isBad);
    if (first == findings.end()) return "all is well";
    const auto count = std::count_if(findings.begin(), findings.end(), isBad);
    if (count == 1) return fmt::format("one problem: {}", first->check);
    return fmt::format("{} problems; first: {}", count, first->check);
}

bool allIsWell(std::span<const Finding> findings) {
    return std::none_of(findings.begin(), findings.end(), isBad);
}

}  // namespace vibctl
