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
    kNote,     // it works, at a cost
    kBad,      // keeps the phone, or a part of what the driver offers, from working
    kSkipped,  // could not be asked, because an earlier answer was bad
};

struct Finding {
    Answer answer = Answer::kGood;
    std::string check;  // "binder", "nodes": which question was asked
    std::string text;   // what was found
    std::string next;   // what to do; empty when the answer is good or skipped
};

Finding good(std::string check, std::string text);
Finding note(std::string check, std::string text, std::string next);
Finding bad(std::string check, std::string text, std::string next);
Finding skipped(std::string check, std::string text);

// "ok   binder: ...", "bad  nodes: ...; next: ..."; 100 columns at most and no newline. A text that
// is too long loses its end. With `coloured` the first word has the terminal's colour for it.
std::string humanLine(const Finding& finding, bool coloured);

// {"check":...,"ok":true,"text":...,"next":null} without a newline; "ok" is null for a check that
// was skipped, and true for a note.
std::string jsonLine(const Finding& finding);

// "all is well", or how many problems there are and which to look at first; without a newline.
std::string closingLine(std::span<const Finding> findings);

// True when no answer is bad. One that was skipped is the consequence of a bad one.
bool allIsWell(std::span<const Finding> findings);

}  // namespace vibctl
