// SPDX-License-Identifier: Apache-2.0
// What a running driver answers.
#include "driver/control_requests.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cerrno>
#include <functional>
#include <memory>

#include "driver/profile_reader.h"
#include "temporary_folder.h"

namespace handset {
namespace {

constexpr const char* kProfile = R"({"nodes": {
    "/sys/class/leds/vibrator/duration": {"mode": "rw", "text": "0\n"},
    "/sys/class/leds/vibrator/blob": {"mode": "ro", "hex": "ff00"}}})";
constexpr const char* kDuration = "/sys/class/leds/vibrator/duration";

class Requests : public testing::Test {
  protected:
    std::string answer(std::string_view request) { return requests_.answer(request); }

    TemporaryFolder folder_;
    Profile profile_ = *parseProfile(kProfile);
    NodeTree tree_{"/sys/class", profile_.nodes};
    FaultBook faults_;
    std::unique_ptr<Journal> journal_ = std::move(*Journal::create(folder_.file("journal")));
    std::function<void()> late_ = [] {};
    ControlRequests requests_{profile_, tree_, faults_, *journal_, [this] { late_(); }};
};

TEST_F(Requests, FaultTakesEffectAtOnce) {
    EXPECT_EQ(answer(R"(fault {"node":"/sys/class/leds/vibrator/duration","op":"write",)"
                     R"("errno":"EIO","times":1})"),
              "ok");
    EXPECT_EQ(faults_.next(kDuration, FaultOp::kWrite).error, EIO);
    EXPECT_EQ(faults_.next(kDuration, FaultOp::kWrite).error, 0);
}

TEST_F(Requests, AWrongFaultIsRefusedWithItsReason) {
    EXPECT_EQ(answer("fault {"), "error line 1, column 2: no valid JSON at the end of the text");
    EXPECT_EQ(answer(R"(fault {"node":"/sys/class/leds/vibrator/nothing","op":"write"})"),
              "error fault.node: the profile has no node \"/sys/class/leds/vibrator/nothing\"");
}

TEST_F(Requests, ClearForgetsFaults) {
    answer(R"(fault {"node":"/sys/class/leds/vibrator/duration","op":"write","errno":"EIO"})");
    EXPECT_EQ(answer("clear"), "ok");
    EXPECT_EQ(faults_.next(kDuration, FaultOp::kWrite).error, 0);
}

TEST_F(Requests, GetShowsANodesText) {
    EXPECT_EQ(answer("get /sys/class/leds/vibrator/duration"), R"(ok "0\n")");
    EXPECT_EQ(answer("get /sys/class/leds/vibrator/blob"), R"(ok hex "ff00")");
    EXPECT_EQ(answer("get /sys/class/nothing"),
              "error the profile has no node \"/sys/class/nothing\"");
}

TEST_F(Requests, SetChangesANodesText) {
    EXPECT_EQ(answer(R"(set /sys/class/leds/vibrator/duration "77\n")"), "ok");
    EXPECT_EQ(tree_.nodeAt(kDuration)->text(), "77\n");
    EXPECT_EQ(answer("set /sys/class/leds/vibrator/duration"),
              "error set: a text expected after the path");
    EXPECT_EQ(answer("set /sys/class/leds/vibrator/duration 77"),
              "error set: a JSON string expected after the path");
    EXPECT_EQ(tree_.nodeAt(kDuration)->text(), "77\n");
}

TEST_F(Requests, ResetEmptiesTheJournal) {
    journal_->record({1, 0}, JournalLine("close"));
    EXPECT_EQ(answer("reset"), "ok");
    EXPECT_EQ(contentOf(folder_.file("journal")), "");
}

TEST_F(Requests, TheJournalIsUpToDateFirst) {
    journal_->record({1, 0}, JournalLine("open"));
    late_ = [this] { journal_->record({1, 0}, JournalLine("close")); };
    EXPECT_EQ(answer("settle"), "ok");
    EXPECT_THAT(contentOf(folder_.file("journal")), testing::HasSubstr("\"op\":\"close\""));
    EXPECT_EQ(answer("reset"), "ok");
    EXPECT_EQ(contentOf(folder_.file("journal")), "");
}

TEST_F(Requests, StopIsRemembered) {
    EXPECT_FALSE(requests_.isStopWanted());
    EXPECT_EQ(answer("stop"), "ok");
    EXPECT_TRUE(requests_.isStopWanted());
}

TEST_F(Requests, AnythingElseIsRefused) {
    EXPECT_EQ(answer("halt"),
              "error unknown request \"halt\"; accepted: fault, clear, reset, get, set, settle, "
              "stop");
    EXPECT_EQ(answer(""),
              "error unknown request \"\"; accepted: fault, clear, reset, get, set, settle, stop");
    EXPECT_FALSE(requests_.isStopWanted());
}

}  // namespace
}  // namespace handset
