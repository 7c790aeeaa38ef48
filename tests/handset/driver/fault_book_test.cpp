// SPDX-License-Identifier: Apache-2.0
// Which call a fault applies to.
#include "driver/fault_book.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <string>
#include <vector>

namespace handset {
namespace {

constexpr const char* kNode = "/sys/class/leds/vibrator/duration";

FaultSpec failingWrite(int error, uint64_t after, uint64_t times) {
    FaultSpec fault;
    fault.node = kNode;
    fault.op = FaultOp::kWrite;
    fault.action.error = error;
    fault.after = after;
    fault.times = times;
    return fault;
}

std::vector<int> errorsOfWrites(FaultBook& book, int calls) {
    std::vector<int> errors;
    for (int i = 0; i < calls; ++i) errors.push_back(book.next(kNode, FaultOp::kWrite).error);
    return errors;
}

using Errors = std::vector<int>;

TEST(FaultBook, WithoutFaultsNothingHappens) {
    FaultBook book;
    const FaultAction action = book.next(kNode, FaultOp::kWrite);
    EXPECT_EQ(action.error, 0);
    EXPECT_EQ(action.shortCount, std::nullopt);
    EXPECT_EQ(action.delay.count(), 0);
    EXPECT_FALSE(action.unplug);
}

TEST(FaultBook, TimesZeroMeansAlways) {
    FaultBook book;
    book.add(failingWrite(EIO, 0, 0));
    EXPECT_EQ(errorsOfWrites(book, 4), (Errors{EIO, EIO, EIO, EIO}));
}

TEST(FaultBook, TimesLimitsHowOften) {
    FaultBook book;
    book.add(failingWrite(EIO, 0, 2));
    EXPECT_EQ(errorsOfWrites(book, 4), (Errors{EIO, EIO, 0, 0}));
}

TEST(FaultBook, AfterLetsCallsPassFirst) {
    FaultBook book;
    book.add(failingWrite(EIO, 2, 1));
    EXPECT_EQ(errorsOfWrites(book, 5), (Errors{0, 0, EIO, 0, 0}));
}

TEST(FaultBook, OnlyTheNamedNodeAndCallCount) {
    FaultBook book;
    book.add(failingWrite(EIO, 1, 1));
    EXPECT_EQ(book.next(kNode, FaultOp::kRead).error, 0);
    EXPECT_EQ(book.next("/sys/class/leds/vibrator/state", FaultOp::kWrite).error, 0);
    EXPECT_EQ(errorsOfWrites(book, 3), (Errors{0, EIO, 0}));
}

TEST(FaultBook, OneFaultAfterTheOtherOnOneNode) {
    FaultBook book;
    book.add(failingWrite(EINTR, 0, 2));
    book.add(failingWrite(EIO, 0, 1));
    EXPECT_EQ(errorsOfWrites(book, 4), (Errors{EINTR, EINTR, EIO, 0}));
}

TEST(FaultBook, EveryFaultCountsEveryCallItMatches) {
    FaultBook book;
    book.add(failingWrite(EINTR, 0, 1));
    book.add(failingWrite(EIO, 1, 1));
    book.add(failingWrite(EACCES, 3, 1));
    EXPECT_EQ(errorsOfWrites(book, 5), (Errors{EINTR, EIO, 0, EACCES, 0}));
}

TEST(FaultBook, AFaultAddedLaterCountsFromThen) {
    FaultBook book;
    EXPECT_EQ(errorsOfWrites(book, 3), (Errors{0, 0, 0}));
    book.add(failingWrite(EIO, 1, 1));
    EXPECT_EQ(errorsOfWrites(book, 3), (Errors{0, EIO, 0}));
}

TEST(FaultBook, ShortAndDelayAreHandedOn) {
    FaultBook book;
    FaultSpec fault = failingWrite(0, 0, 1);
    fault.action.shortCount = 3;
    fault.action.delay = std::chrono::milliseconds(20);
    book.add(fault);
    const FaultAction action = book.next(kNode, FaultOp::kWrite);
    EXPECT_EQ(action.shortCount, 3U);
    EXPECT_EQ(action.delay.count(), 20);
    EXPECT_EQ(book.next(kNode, FaultOp::kWrite).shortCount, std::nullopt);
}

TEST(FaultBook, UnplugFailsTheCallAndEveryLaterOne) {
    FaultBook book;
    FaultSpec fault = failingWrite(0, 1, 1);
    fault.action.unplug = true;
    book.add(fault);
    EXPECT_EQ(errorsOfWrites(book, 3), (Errors{0, ENODEV, ENODEV}));
    EXPECT_EQ(book.next(kNode, FaultOp::kOpen).error, ENODEV);
    EXPECT_EQ(book.next(kNode, FaultOp::kRead).error, ENODEV);
    EXPECT_EQ(book.next("/sys/class/leds/vibrator/state", FaultOp::kWrite).error, 0);
    EXPECT_TRUE(book.isUnplugged(kNode));
}

TEST(FaultBook, AnUnplugWithAnErrorGivesThatErrorFirst) {
    FaultBook book;
    FaultSpec fault = failingWrite(EIO, 0, 1);
    fault.action.unplug = true;
    book.add(fault);
    EXPECT_EQ(errorsOfWrites(book, 3), (Errors{EIO, ENODEV, ENODEV}));
}

TEST(FaultBook, ClearForgetsFaultsAndPlugsInAgain) {
    FaultBook book;
    FaultSpec fault = failingWrite(0, 0, 1);
    fault.action.unplug = true;
    book.add(fault);
    book.add(failingWrite(EIO, 0, 0));
    EXPECT_EQ(errorsOfWrites(book, 1), Errors{ENODEV});
    book.clear();
    EXPECT_EQ(errorsOfWrites(book, 2), (Errors{0, 0}));
    EXPECT_FALSE(book.isUnplugged(kNode));
}

}  // namespace
}  // namespace handset
