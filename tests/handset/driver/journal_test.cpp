// SPDX-License-Identifier: Apache-2.0
// The journal's lines, to the byte.
#include "driver/journal.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <regex>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "temporary_folder.h"

namespace handset {
namespace {

using std::string_view_literals::operator""sv;

/// The journal with its times, the one thing a test cannot know, replaced by T.
std::string withoutTimes(const std::string& text) {
    return std::regex_replace(text, std::regex("\"us\":[0-9]+,"), "\"us\":T,");
}

class JournalFile : public testing::Test {
  protected:
    JournalFile() : path_(folder_.file("journal.jsonl")) {
        Result<std::unique_ptr<Journal>> created = Journal::create(path_);
        if (created) journal_ = std::move(*created);
    }

    std::string written() const { return withoutTimes(contentOf(path_)); }

    TemporaryFolder folder_;
    std::string path_;
    std::unique_ptr<Journal> journal_;
};

TEST_F(JournalFile, AWriteShowsNodeDataAndResult) {
    journal_->record({412, 1000}, JournalLine("write")
                                          .text("node", "/sys/class/leds/vibrator/duration")
                                          .bytes("data", "hex", "500\n")
                                          .result("result", 4));
    EXPECT_EQ(written(), R"({"n":1,"us":T,"pid":412,"uid":1000,"op":"write",)"
                         R"("node":"/sys/class/leds/vibrator/duration","data":"500\n","result":4})"
                         "\n");
}

TEST_F(JournalFile, BytesThatAreNoTextShowAsHex) {
    journal_->record({1, 0}, JournalLine("write").bytes("data", "hex", "ab\xff\0"sv));
    EXPECT_EQ(written(), R"({"n":1,"us":T,"pid":1,"uid":0,"op":"write","hex":"6162ff00"})"
                         "\n");
}

TEST_F(JournalFile, AnErrorShowsItsName) {
    journal_->record({1, 0}, JournalLine("open").result("error", -13));
    journal_->record({1, 0}, JournalLine("open").result("error", 0));
    EXPECT_EQ(written(), R"({"n":1,"us":T,"pid":1,"uid":0,"op":"open","error":"EACCES"})"
                         "\n"
                         R"({"n":2,"us":T,"pid":1,"uid":0,"op":"open","error":0})"
                         "\n");
}

TEST_F(JournalFile, NumbersMayBeNegative) {
    journal_->record({1, 0}, JournalLine("event").number("code", 65535).number("value", -5));
    EXPECT_EQ(written(), R"({"n":1,"us":T,"pid":1,"uid":0,"op":"event","code":65535,"value":-5})"
                         "\n");
}

TEST_F(JournalFile, ResetEmptiesItAndCountsFromOneAgain) {
    journal_->record({1, 0}, JournalLine("close"));
    journal_->record({1, 0}, JournalLine("close"));
    journal_->reset();
    EXPECT_EQ(written(), "");
    journal_->record({2, 0}, JournalLine("open"));
    EXPECT_EQ(written(), R"({"n":1,"us":T,"pid":2,"uid":0,"op":"open"})"
                         "\n");
}

TEST_F(JournalFile, TimesNeverGoBack) {
    for (int i = 0; i < 100; ++i) journal_->record({1, 0}, JournalLine("read"));
    const std::string text = contentOf(path_);
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
                journal_->record({7, 0}, JournalLine("write").bytes("data", "hex", "0123456789"));
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
    EXPECT_EQ(journal.error().text, "journal /proc/none/journal: No such file or directory");
}

}  // namespace
}  // namespace handset
