// SPDX-License-Identifier: Apache-2.0
//
// A run read from its files, and put into words: journal, service log and calls on one clock.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "handset/phone/phone_state.h"

namespace handset {

// One line of the listing.
struct ListingLine {
    int64_t us = 0;    // since boot
    std::string text;  // "write    leds/vibrator/duration <- \"500\\n\""
};

// What one line of journal.jsonl, service.log or calls.jsonl says; none where it is no such line. A
// call is two: what was asked, and what was answered.
std::vector<ListingLine> fromJournal(std::string_view line);
std::vector<ListingLine> fromLog(std::string_view line);
std::vector<ListingLine> fromCalls(std::string_view line);

// A file that grows, or is emptied and grows anew.
class GrowingFile {
  public:
    explicit GrowingFile(std::string path) : mPath(std::move(path)) {}

    // The whole lines that are new since the last time.
    std::vector<std::string> newLines();

  private:
    std::string mPath;
    int64_t mOffset = 0;
};

// The lines of all three that are new, in order of time.
class Listing {
  public:
    explicit Listing(const PhoneState& state)
        : mJournal(state.journal()), mLog(state.serviceLog()), mCalls(state.calls()) {}

    // "    8.122998 write    leds/vibrator/duration <- \"500\\n\"" and so on.
    std::vector<std::string> newLines();

  private:
    GrowingFile mJournal;
    GrowingFile mLog;
    GrowingFile mCalls;
};

}  // namespace handset
