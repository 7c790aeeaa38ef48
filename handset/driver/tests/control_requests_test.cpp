// SPDX-License-Identifier: Apache-2.0
//
// What a running driver answers.
#include "handset/driver/control_requests.h"

#include <cerrno>
#include <functional>
#include <memory>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/driver/profile_reader.h"
#include "handset/driver/tests/test_files.h"

namespace handset {
namespace {

constexpr const char* kProfile = R"({"nodes": {
    "/sys/class/leds/vibrator/duration": {"mode": "rw", "text": "0\n"},
    "/sys/class/leds/vibrator/blob": {"mode": "ro", "hex": "ff00"}}})";
constexpr const char* kDuration = "/sys/class/leds/vibrator/duration";

class Requests : public testing::Test {
  protected:
    std::string answer(std::string_view request) { return mRequests.answer(request); }

    TemporaryDir mDirectory;
    Profile mProfile = *parseProfile(kProfile);
    NodeTree mTree{"/sys/class", mProfile.nodes};
    FaultInjector mFaults;
    std::unique_ptr<Journal> mJournal = std::move(*Journal::create(fileIn(mDirectory, "journal")));
    std::function<void()> mLate = [] {};
    ControlRequests mRequests{mProfile, &mTree, mFaults, *mJournal, [this] { mLate(); }};
};

TEST_F(Requests, FaultTakesEffectAtOnce) {
    EXPECT_EQ(answer(R"(fault {"node":"/sys/class/leds/vibrator/duration","op":"write",)"
                     R"("errno":"EIO","times":1})"),
              "ok");
    EXPECT_EQ(mFaults.next(kDuration, FaultOp::kWrite).error, EIO);
    EXPECT_EQ(mFaults.next(kDuration, FaultOp::kWrite).error, 0);
}

TEST_F(Requests, AWrongFaultIsRefusedWithItsReason) {
    EXPECT_EQ(answer("fault {"), "error line 1, column 2: no valid JSON at the end of the text");
    EXPECT_EQ(answer(R"(fault {"node":"/sys/class/leds/vibrator/nothing","op":"write"})"),
              "error fault.node: the profile has no node \"/sys/class/leds/vibrator/nothing\"");
}

TEST_F(Requests, ClearForgetsFaults) {
    answer(R"(fault {"node":"/sys/class/leds/vibrator/duration","op":"write","errno":"EIO"})");
    EXPECT_EQ(answer("clear"), "ok");
    EXPECT_EQ(mFaults.next(kDuration, FaultOp::kWrite).error, 0);
}

TEST_F(Requests, FaultsAreListedWithWhatBecameOfThem) {
    answer(R"(fault {"node":"/sys/class/leds/vibrator/duration","op":"write","errno":"EIO",)"
           R"("every":2})");
    mFaults.next(kDuration, FaultOp::kWrite);
    mFaults.next(kDuration, FaultOp::kWrite);
    mFaults.next(kDuration, FaultOp::kWrite);
    EXPECT_EQ(answer("faults"),
              R"(ok [{"node":"/sys/class/leds/vibrator/duration","op":"write","errno":"EIO",)"
              R"("every":2,"seen":3,"struck":1}])");
}

TEST_F(Requests, UnplugTakesANodeAwayAndPlugBringsItBack) {
    EXPECT_EQ(answer("unplug /sys/class/leds/vibrator/duration"), "ok");
    EXPECT_TRUE(mFaults.isUnplugged(kDuration));
    EXPECT_EQ(answer("plug /sys/class/leds/vibrator/duration"), "ok");
    EXPECT_FALSE(mFaults.isUnplugged(kDuration));
}

TEST_F(Requests, UnplugMayComeLater) {
    EXPECT_EQ(answer("unplug /sys/class/leds/vibrator/duration 60000"), "ok");
    EXPECT_FALSE(mFaults.isUnplugged(kDuration));
    const int left = mRequests.runDue();
    EXPECT_GT(left, 30000);
    EXPECT_LE(left, 60000);
    EXPECT_FALSE(mFaults.isUnplugged(kDuration));
}

TEST_F(Requests, OnlyWhatIsThereCanBeUnplugged) {
    EXPECT_EQ(answer("unplug motor"), "error the profile has no motor");
    EXPECT_EQ(answer("unplug /sys/class/nothing"),
              "error the profile has no node \"/sys/class/nothing\"");
    EXPECT_EQ(answer("plug /sys/class/leds/vibrator/duration soon"),
              "error plug: milliseconds from 0 to 3600000 expected, not \"soon\"");
}

TEST_F(Requests, GetShowsANodesText) {
    EXPECT_EQ(answer("get /sys/class/leds/vibrator/duration"), R"(ok "0\n")");
    EXPECT_EQ(answer("get /sys/class/leds/vibrator/blob"), R"(ok hex "ff00")");
    EXPECT_EQ(answer("get /sys/class/nothing"),
              "error the profile has no node \"/sys/class/nothing\"");
}

TEST_F(Requests, SetChangesANodesText) {
    EXPECT_EQ(answer(R"(set /sys/class/leds/vibrator/duration "77\n")"), "ok");
    EXPECT_EQ(mTree.nodeAt(kDuration)->text(), "77\n");
    EXPECT_EQ(answer("set /sys/class/leds/vibrator/duration"),
              "error set: a JSON string expected after the path");
    EXPECT_EQ(answer("set /sys/class/leds/vibrator/duration 77"),
              "error set: a JSON string expected after the path");
    EXPECT_EQ(mTree.nodeAt(kDuration)->text(), "77\n");
}

TEST_F(Requests, ResetEmptiesTheJournal) {
    mJournal->record({1, 0}, {{"op", "close"}});
    EXPECT_EQ(answer("reset"), "ok");
    EXPECT_EQ(contentOf(fileIn(mDirectory, "journal")), "");
}

TEST_F(Requests, TheJournalIsUpToDateFirst) {
    mJournal->record({1, 0}, {{"op", "open"}});
    mLate = [this] { mJournal->record({1, 0}, {{"op", "close"}}); };
    EXPECT_EQ(answer("settle"), "ok");
    EXPECT_THAT(contentOf(fileIn(mDirectory, "journal")), testing::HasSubstr("\"op\":\"close\""));
    EXPECT_EQ(answer("reset"), "ok");
    EXPECT_EQ(contentOf(fileIn(mDirectory, "journal")), "");
}

TEST_F(Requests, StopIsRemembered) {
    EXPECT_FALSE(mRequests.isStopWanted());
    EXPECT_EQ(answer("stop"), "ok");
    EXPECT_TRUE(mRequests.isStopWanted());
}

TEST_F(Requests, AnythingElseIsRefused) {
    EXPECT_EQ(
            answer("halt"),
            "error unknown request \"halt\"; accepted: fault, faults, clear, unplug, plug, reset, "
            "get, set, settle, stop");
    EXPECT_EQ(answer(""),
              "error unknown request \"\"; accepted: fault, faults, clear, unplug, plug, reset, "
              "get, set, settle, stop");
    EXPECT_FALSE(mRequests.isStopWanted());
}

}  // namespace
}  // namespace handset
