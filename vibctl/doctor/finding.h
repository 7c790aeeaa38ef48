// SPDX-License-Identifier: Apache-2.0
//
// What a check came to: one line for people, or one JSON object.
#pragma once

#include <span>
#include <string>
#include <vector>

namespace vibctl {

enum class Answer {
    kGood,
    kBad,
    kSkipped,  ///< could not be asked, because an earlier answer was bad
};

struct Finding {
    Answer answer = Answer::kGood;
    std::string check;  ///< "binder", "nodes": which question was asked
    std::string text;   ///< what was found
    std::string next;   ///< what to do; empty unless the answer is bad
};

Finding good(std::string check, std::string text);
Finding bad(std::string check, std::string text, std::string next);
Finding skipped(std::string check, std::string text);

/// "ok       binder: ...", "bad      nodes: ...; next: ...", "skipped  user: ..."; no line feed.
std::string humanLine(const Finding& finding);

/// {"check":...,"ok":true,"text":...,"next":null} without a line feed; "ok" is null for a check
/// that was skipped.
std::string jsonLine(const Finding& finding);

/// True when no answer is bad. One that was skipped is the consequence of a bad one.
bool allIsWell(std::span<const Finding> findings);

}  // namespace vibctl
