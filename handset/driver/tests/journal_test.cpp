// SPDX-License-Identifier: Apache-2.0
//
// The journal's lines, to the byte.
#include "handset/driver/journal.h"

#include <algorithm>
#include <regex>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/driver/tests/test_files.h"

namespace handset {
namespace {

using android::base::Result;

// The journal with its times, the one thing a test cannot know, replaced by T.
std::string withoutTimes(const std::string& text) {
    return std::regex_replace(text, std::regex("\"us\":[0-9]+,"), "\"us\":T,");
}

class JournalFile : public testing::Test {
  protected:
    JournalFile() : mPath(fileIn(mDirectory, "journal.jsonl")) {
        Result<std::unique_ptr<Journal>> created = Journal::create(mPath);
        if (created) mJournal = std::move(*created);
    }

    std::string written() const { return withoutTimes(contentOf(mPath)); }

    TemporaryDir mDirectory;
    std::string mPath;
    std::unique_ptr<Journal> mJournal;
};

TEST_F(JournalFile, AWriteShowsNodeDataAndResult) {
    mJournal->record({412, 1000}, {{"op", "write"},
                                   {"node", "/sys/class/leds/vibrator/duration"},
                                   {"data", "500\n"},
                                   {"result", resultOf(4)}});
    EXPECT_EQ(written(), R"({"n":1,"us":T,"pid":412,"uid":1000,"op":"write",)"
                         R"("node":"/sys/class/leds/vibrator/duration","data":"500\n","result":4})"
                         "\n");
}

TEST_F(JournalFile, AnErrorShowsItsName) {
    mJournal->record({1, 0}, {{"op", "open"}, {"error", resultOf(-13)}});
    mJournal->record({1, 0}, {{"op", "open"}, {"error", resultOf(0)}});
    EXPECT_EQ(written(), R"({"n":1,"us":T,"pid":1,"uid":0,"op":"open","error":"EACCES"})"
                         "\n"
                         R"({"n":2,"us":T,"pid":1,"uid":0,"op":"open","error":0})"
                         "\n");
}

TEST_F(JournalFile, ACallThatAFaultStruckShowsItAndHowLongItTook) {
    FaultAction action;
    action.error = 5;
    action.delay = std::chrono::milliseconds(20);
    const auto arrival = std::chrono::steady_clock::now() - std::chrono::milliseconds(20);
    mJournal->record({1, 0}, {{"op", "open"}, {"error", "EIO"}}, {action, arrival});
    EXPECT_THAT(written(),
                testing::HasSubstr(R"("error":"EIO","fault":{"errno":"EIO","delay":20},"took":2)"));
}

TEST_F(JournalFile, ACallThatNoFaultStruckShowsNeither) {
    mJournal->record({1, 0}, {{"op", "open"}}, {FaultAction(), std::chrono::steady_clock::now()});
    EXPECT_EQ(written(), R"({"n":1,"us":T,"pid":1,"uid":0,"op":"open"})"
                         "\n");
}

TEST_F(JournalFile, NumbersMayBeNegative) {
    mJournal->record({1, 0}, {{"op", "event"}, {"code", 65535}, {"value", -5}});
    EXPECT_EQ(written(), R"({"n":1,"us":T,"pid":1,"uid":0,"op":"event","code":65535,"value":-5})"
                         "\n");
}

TEST_F(JournalFile, ResetEmptiesItAndCountsFromOneAgain) {
    mJournal->record({1, 0}, {{"op", "close"}});
    mJournal->record({1, 0}, {{"op", "close"}});
    mJournal->reset();
    EXPECT_EQ(written(), "");
    mJournal->record({2, 0}, {{"op", "open"}});
    EXPECT_EQ(written(), R"({"n":1,"us":T,"pid":2,"uid":0,"op":"open"})"
                         "\n");
}

TEST_F(JournalFile, TimesNeverGoBack) {
    for (int i = 0; i < 100; ++i) mJournal->record({1, 0}, {{"op", "read"}});
    const std::string text = contentOf(mPath);
    const std::regex time("\"us\":([0-9]+)");
    std::vector<unsigned long long> times;
    for (std::sregex_iterator at(text.begin(), text.end(), time), end; at != end; ++at) {
        times.push_back(std::stoull((*at)[1]));
    }
    ASSERT_EQ(times.size(), 100U);
    EXPECT_TRUE(std::is_sorted(times.begin(), times.end()));
}

TEST_F(JournalFile, ThreadsDoNotCutEachOthersLines) {
    std::vector<std::thread> threads;
    for (int thread = 0; thread < 4; ++thread) {
        threads.emplace_back([this] {
            for (int i = 0; i < 250; ++i) {
                mJournal->record({7, 0}, {{"op", "write"}, {"data", "0123456789"}});
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    std::string expected;
    for (int n = 1; n <= 1000; ++n) {
        expected += "{\"n\":" + std::to_string(n) +
                    R"(,"us":T,"pid":7,"uid":0,"op":"write","data":"0123456789"})"
                    "\n";
    }
    EXPECT_EQ(written(), expected);
}

TEST(Journal, AnUnusablePathIsRefusedWithItsReason) {
    const Result<std::unique_ptr<Journal>> journal = Journal::create("/proc/none/journal");
    ASSERT_FALSE(journal);
    EXPECT_EQ(journal.error().message(), "journal /proc/none/journal: No such file or directory");
}

}  // namespace
}  // namespace handset
