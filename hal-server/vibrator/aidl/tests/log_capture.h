// SPDX-License-Identifier: Apache-2.0
//
// Catches what the code under test logs, through the stream logger and the formatted one alike.
#pragma once

#include <condition_variable>
#include <cstddef>
#include <mutex>
#include <set>
#include <string>
#include <vector>

// While it exists nothing reaches standard error. One at a time.
class LogCapture {
  public:
    LogCapture();
    ~LogCapture();
    LogCapture(const LogCapture&) = delete;
    LogCapture& operator=(const LogCapture&) = delete;

    // Every record so far, in order, as its severity's letter, a space and its string: "I HW_API:
    // do_off". A newline within a string begins a further record, which is how the logger passes
    // it on.
    std::vector<std::string> lines() const;

    // The record of that number, from 0; words that say so where there are fewer.
    std::string line(size_t number) const;

    // The tags that were used.
    std::set<std::string> tags() const;

    void clear();

    // Lets further records through to standard error, for what a death test looks for.
    static void release();

    // Waits, in real time, for this record; false after ten seconds.
    bool waitFor(const std::string& line) const;

  private:
    mutable std::mutex mMutex;
    mutable std::condition_variable mLogged;
    std::vector<std::string> mLines;
    std::set<std::string> mTags;
};
