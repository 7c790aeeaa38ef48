// SPDX-License-Identifier: Apache-2.0
//
// What a check came to: see finding.h.
#include "doctor/finding.h"

#include <algorithm>
#include <utility>

#include <fmt/format.h>
#include <nlohmann/json.hpp>

namespace vibctl {

namespace {

const char* wordOf(Answer answer) {
    switch (answer) {
        case Answer::kGood:
            return "ok";
        case Answer::kBad:
            return "bad";
        case Answer::kSkipped:
            break;
    }
    return "skipped";
}

}  // namespace

Finding good(std::string check, std::string text) {
    return {Answer::kGood, std::move(check), std::move(text), {}};
}

Finding bad(std::string check, std::string text, std::string next) {
    return {Answer::kBad, std::move(check), std::move(text), std::move(next)};
}

Finding skipped(std::string check, std::string text) {
    return {Answer::kSkipped, std::move(check), std::move(text), {}};
}

std::string humanLine(const Finding& finding) {
    return fmt::format("{:<8} {}: {}{}{}", wordOf(finding.answer), finding.check, finding.text,
                       finding.next.empty() ? "" : "; next: ", finding.next);
}

std::string jsonLine(const Finding& finding) {
    nlohmann::ordered_json line;
    line["check"] = finding.check;
    line["ok"] = nullptr;
    if (finding.answer != Answer::kSkipped) line["ok"] = finding.answer == Answer::kGood;
    line["text"] = finding.text;
    line["next"] = nullptr;
    if (!finding.next.empty()) line["next"] = finding.next;
    return line.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace);
}

bool allIsWell(std::span<const Finding> findings) {
    return std::none_of(findings.begin(), findings.end(),
                        [](const Finding& finding) { return finding.answer == Answer::kBad; });
}

}  // namespace vibctl
