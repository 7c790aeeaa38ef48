// SPDX-License-Identifier: Apache-2.0
//
// Log capture through libbase's logger hook, which receives liblog's lines as well.
#include "tests/log_capture.h"

#include <algorithm>
#include <chrono>
#include <string_view>

#include <android-base/logging.h>
#include <gtest/gtest.h>

#include "tests/sequence.h"

namespace {

char letter(android::base::LogSeverity severity) {
    switch (severity) {
        case android::base::INFO:
            return 'I';
        case android::base::WARNING:
            return 'W';
        case android::base::ERROR:
            return 'E';
        default:
            return '?';
    }
}

}  // namespace

LogCapture::LogCapture() {
    android::base::SetLogger([this](android::base::LogId, android::base::LogSeverity severity,
                                    const char* tag, const char*, unsigned, const char* text) {
        // One severity for all of a layer's lines; the standard service's prefix is borrowed.
        const std::string_view line = text;
        if (line.starts_with("HW_API: ") || line.starts_with("V_4_0: ")) {
            EXPECT_EQ(severity, android::base::INFO) << line;
        }
        const std::lock_guard lock(mMutex);
        mLines.push_back(std::string(1, letter(severity)) + ' ' + text);
        sequence::note(mLines.back());
        mTags.insert(tag != nullptr ? tag : "");
        mLogged.notify_all();
    });
}

LogCapture::~LogCapture() {
    release();
}

void LogCapture::release() {
    android::base::SetLogger(android::base::StderrLogger);
}

std::vector<std::string> LogCapture::lines() const {
    const std::lock_guard lock(mMutex);
    return mLines;
}

std::string LogCapture::line(size_t number) const {
    const std::lock_guard lock(mMutex);
    return number < mLines.size() ? mLines[number]
                                  : "only " + std::to_string(mLines.size()) + " records";
}

std::set<std::string> LogCapture::tags() const {
    const std::lock_guard lock(mMutex);
    return mTags;
}

void LogCapture::clear() {
    const std::lock_guard lock(mMutex);
    mLines.clear();
    mTags.clear();
}

bool LogCapture::waitFor(const std::string& line) const {
    std::unique_lock lock(mMutex);
    return mLogged.wait_for(lock, std::chrono::seconds(10), [&] {
        return std::find(mLines.begin(), mLines.end(), line) != mLines.end();
    });
}
