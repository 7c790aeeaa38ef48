// SPDX-License-Identifier: Apache-2.0
//
// Which call a fault applies to.
#include "handset/driver/fault_injector.h"

#include <cerrno>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace handset {
namespace {

constexpr const char* kNode = "/sys/class/leds/vibrator/duration";

Fault failingWrite(int error, uint64_t after, uint64_t times) {
    Fault fault;
    fault.node = kNode;
    fault.op = FaultOp::kWrite;
    fault.action.error = error;
    fault.after = after;
    fault.times = times;
    return fault;
}

std::vector<int> errorsOfWrites(FaultInjector& injector, int calls) {
    std::vector<int> errors;
    for (int i = 0; i < calls; ++i) errors.push_back(injector.next(kNode, FaultOp::kWrite).error);
    return errors;
}

using Errors = std::vector<int>;

TEST(FaultInjector, WithoutFaultsNothingHappens) {
    FaultInjector injector;
    const FaultAction action = injector.next(kNode, FaultOp::kWrite);
    EXPECT_EQ(action.error, 0);
    EXPECT_EQ(action.shortCount, std::nullopt);
    EXPECT_EQ(action.delay.count(), 0);
    EXPECT_FALSE(action.unplug);
}

TEST(FaultInjector, TimesZeroMeansAlways) {
    FaultInjector injector;
    injector.add(failingWrite(EIO, 0, 0));
    EXPECT_EQ(errorsOfWrites(injector, 4), (Errors{EIO, EIO, EIO, EIO}));
}

TEST(FaultInjector, TimesLimitsHowOften) {
    FaultInjector injector;
    injector.add(failingWrite(EIO, 0, 2));
    EXPECT_EQ(errorsOfWrites(injector, 4), (Errors{EIO, EIO, 0, 0}));
}

TEST(FaultInjector, AfterLetsCallsPassFirst) {
    FaultInjector injector;
    injector.add(failingWrite(EIO, 2, 1));
    EXPECT_EQ(errorsOfWrites(injector, 5), (Errors{0, 0, EIO, 0, 0}));
}

TEST(FaultInjector, OnlyTheNamedNodeAndCallCount) {
    FaultInjector injector;
    injector.add(failingWrite(EIO, 1, 1));
    EXPECT_EQ(injector.next(kNode, FaultOp::kRead).error, 0);
    EXPECT_EQ(injector.next("/sys/class/leds/vibrator/state", FaultOp::kWrite).error, 0);
    EXPECT_EQ(errorsOfWrites(injector, 3), (Errors{0, EIO, 0}));
}

TEST(FaultInjector, OneFaultAfterTheOtherOnOneNode) {
    FaultInjector injector;
    injector.add(failingWrite(EINTR, 0, 2));
    injector.add(failingWrite(EIO, 0, 1));
    EXPECT_EQ(errorsOfWrites(injector, 4), (Errors{EINTR, EINTR, EIO, 0}));
}

TEST(FaultInjector, EveryFaultCountsEveryCallItMatches) {
    FaultInjector injector;
    injector.add(failingWrite(EINTR, 0, 1));
    injector.add(failingWrite(EIO, 1, 1));
    injector.add(failingWrite(EACCES, 3, 1));
    EXPECT_EQ(errorsOfWrites(injector, 5), (Errors{EINTR, EIO, 0, EACCES, 0}));
}

TEST(FaultInjector, AFaultAddedLaterCountsFromThen) {
    FaultInjector injector;
    EXPECT_EQ(errorsOfWrites(injector, 3), (Errors{0, 0, 0}));
    injector.add(failingWrite(EIO, 1, 1));
    EXPECT_EQ(errorsOfWrites(injector, 3), (Errors{0, EIO, 0}));
}

TEST(FaultInjector, ShortAndDelayAreHandedOn) {
    FaultInjector injector;
    Fault fault = failingWrite(0, 0, 1);
    fault.action.shortCount = 3;
    fault.action.delay = std::chrono::milliseconds(20);
    injector.add(fault);
    const FaultAction action = injector.next(kNode, FaultOp::kWrite);
    EXPECT_EQ(action.shortCount, 3U);
    EXPECT_EQ(action.delay.count(), 20);
    EXPECT_EQ(injector.next(kNode, FaultOp::kWrite).shortCount, std::nullopt);
}

TEST(FaultInjector, UnplugFailsTheCallAndEveryLaterOne) {
    FaultInjector injector;
    Fault fault = failingWrite(0, 1, 1);
    fault.action.unplug = true;
    injector.add(fault);
    EXPECT_EQ(errorsOfWrites(injector, 3), (Errors{0, ENODEV, ENODEV}));
    EXPECT_EQ(injector.next(kNode, FaultOp::kOpen).error, ENODEV);
    EXPECT_EQ(injector.next(kNode, FaultOp::kRead).error, ENODEV);
    EXPECT_EQ(injector.next("/sys/class/leds/vibrator/state", FaultOp::kWrite).error, 0);
    EXPECT_TRUE(injector.isUnplugged(kNode));
}

TEST(FaultInjector, AnUnplugWithAnErrorGivesThatErrorFirst) {
    FaultInjector injector;
    Fault fault = failingWrite(EIO, 0, 1);
    fault.action.unplug = true;
    injector.add(fault);
    EXPECT_EQ(errorsOfWrites(injector, 3), (Errors{EIO, ENODEV, ENODEV}));
}

TEST(FaultInjector, ClearForgetsFaultsAndPlugsInAgain) {
    FaultInjector injector;
    Fault fault = failingWrite(0, 0, 1);
    fault.action.unplug = true;
    injector.add(fault);
    injector.add(failingWrite(EIO, 0, 0));
    EXPECT_EQ(errorsOfWrites(injector, 1), Errors{ENODEV});
    injector.clear();
    EXPECT_EQ(errorsOfWrites(injector, 2), (Errors{0, 0}));
    EXPECT_FALSE(injector.isUnplugged(kNode));
}

TEST(FaultInjector, EveryThirdCallIsStruck) {
    FaultInjector injector;
    Fault fault = failingWrite(EIO, 0, 2);
    fault.every = 3;
    injector.add(fault);
    EXPECT_EQ(errorsOfWrites(injector, 10), (Errors{0, 0, EIO, 0, 0, EIO, 0, 0, 0, 0}));
}

TEST(FaultInjector, EveryCountsFromWhatWasLetThrough) {
    FaultInjector injector;
    Fault fault = failingWrite(EIO, 1, 0);
    fault.every = 2;
    injector.add(fault);
    EXPECT_EQ(errorsOfWrites(injector, 5), (Errors{0, 0, EIO, 0, EIO}));
}

TEST(FaultInjector, TheListTellsHowOftenEachHasStruck) {
    FaultInjector injector;
    injector.add(failingWrite(EINTR, 1, 1));
    injector.add(failingWrite(EIO, 0, 0));
    errorsOfWrites(injector, 4);
    const std::vector<FaultInjector::Record> list = injector.list();
    ASSERT_EQ(list.size(), 2U);
    EXPECT_EQ(list[0].seen, 4U);
    EXPECT_EQ(list[0].struck, 1U);
    EXPECT_EQ(list[1].fault.action.error, EIO);
    EXPECT_EQ(list[1].struck, 3U);
}

TEST(FaultInjector, OtherContentsWaitForAReadThatShowsAnew) {
    FaultInjector injector;
    Fault fault;
    fault.node = kNode;
    fault.op = FaultOp::kRead;
    fault.action.text = "garbled";
    fault.times = 1;
    injector.add(fault);
    EXPECT_EQ(injector.next(kNode, FaultOp::kRead, true).text, std::nullopt);
    EXPECT_EQ(injector.next(kNode, FaultOp::kRead).text, "garbled");
    EXPECT_EQ(injector.next(kNode, FaultOp::kRead).text, std::nullopt);
}

TEST(FaultInjector, WhatIsPluggedInAgainServesNewFilesOnly) {
    FaultInjector injector;
    const uint64_t before = injector.unplugsOf(kNode);
    injector.unplug(kNode);
    EXPECT_EQ(injector.next(kNode, FaultOp::kOpen).error, ENODEV);
    injector.plug(kNode);
    EXPECT_FALSE(injector.isUnplugged(kNode));
    EXPECT_EQ(injector.nextOf(kNode, FaultOp::kWrite, before).error, ENODEV);
    EXPECT_EQ(injector.nextOf(kNode, FaultOp::kWrite, injector.unplugsOf(kNode)).error, 0);
}

TEST(FaultInjector, WhoeverListensHearsOfEachChangeOnce) {
    FaultInjector injector;
    std::vector<std::string> heard;
    injector.setOnPlug([&](std::string_view node, bool plugged) {
        heard.push_back(std::string(node) + (plugged ? " plugged" : " unplugged"));
    });
    Fault fault = failingWrite(0, 0, 1);
    fault.action.unplug = true;
    injector.add(fault);
    errorsOfWrites(injector, 2);
    injector.unplug(kNode);
    injector.plug(kNode);
    injector.plug(kNode);
    const std::string node = kNode;
    EXPECT_EQ(heard, (std::vector<std::string>{node + " unplugged", node + " plugged"}));
}

}  // namespace
}  // namespace handset
