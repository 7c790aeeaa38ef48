// SPDX-License-Identifier: Apache-2.0
//
// Prebaked patterns, once and repeating, on the nodes of both classes.
#include <cerrno>
#include <string>

#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class PrebakedPattern : public ServiceTest {
  protected:
    PrebakedPattern() {
        addLegacyClass();
        for (const char* leaf : {"intensity", "cp_trigger_index", "cp_trigger_queue"}) {
            kernel.addNode(kLegacy + leaf);
        }
    }
};

TEST_F(PrebakedPattern, AmplitudeOutOfRangeIsRefusedAndNothingWritten) {
    const auto hwApi = makeHwApi();
    for (const bool repeat : {false, true}) {
        EXPECT_FALSE(hwApi->performPrebakedHapticPattern(5, 0, repeat));
        EXPECT_FALSE(hwApi->performPrebakedHapticPattern(5, 10001, repeat));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: performPrebakedHapticPattern 5 : 0 : 0",
                            "I HW_API: performPrebakedHapticPattern amplitude is abnormal 0",
                            "I HW_API: performPrebakedHapticPattern 5 : 10001 : 0",
                            "I HW_API: performPrebakedHapticPattern amplitude is abnormal 10001",
                            "I HW_API: performPrebakedHapticPattern 5 : 0 : 1",
                            "I HW_API: performPrebakedHapticPattern amplitude is abnormal 0",
                            "I HW_API: performPrebakedHapticPattern 5 : 10001 : 1",
                            "I HW_API: performPrebakedHapticPattern amplitude is abnormal 10001"));
}

TEST_F(PrebakedPattern, LargestAndSmallestAmplitudesAreRefused) {
    const auto hwApi = makeHwApi();
    for (const int amplitude : {-1, 2147483647, -2147483647 - 1}) {
        EXPECT_FALSE(hwApi->performPrebakedHapticPattern(5, amplitude, false));
        EXPECT_FALSE(hwApi->performPrebakedHapticPattern(5, amplitude, true));
        EXPECT_EQ(log.lines().back(),
                  "I HW_API: performPrebakedHapticPattern amplitude is abnormal " +
                          std::to_string(amplitude));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(PrebakedPattern, AmplitudesAtTheEndsOfTheRangeArePlayed) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(5, 1, false));
    EXPECT_EQ(kernel.text(kLegacy + "intensity"), "1\n");
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(5, 10000, false));
    EXPECT_EQ(kernel.text(kLegacy + "intensity"), "10000\n");
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(5, 1, true));
    EXPECT_EQ(kernel.text(kLegacy + "cp_trigger_queue"), std::string("5.0, 10, 0~\0", 12));
}

// The same on the LED class.
class PatternOnLeds : public ServiceTest {
  protected:
    PatternOnLeds() {
        addLedsClass();
        for (const char* leaf : {"intensity", "cp_trigger_index", "cp_trigger_queue"}) {
            kernel.addNode(kLeds + leaf);
        }
    }
};

TEST_F(PatternOnLeds, OnceWritesIntensityIndexAndStarts) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(23, 6700, false));
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/intensity \"6700\\n\"",
                                             "/sys/class/leds/vibrator/cp_trigger_index \"23\\n\"",
                                             "/sys/class/leds/vibrator/state \"1\\n\"",
                                             "/sys/class/leds/vibrator/duration \"1000\\n\"",
                                             "/sys/class/leds/vibrator/activate \"1\\n\""));
}

TEST_F(PatternOnLeds, OnceWithIndexZeroIsChosenButNotStarted) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(0, 10000, false));
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/intensity \"10000\\n\"",
                                             "/sys/class/leds/vibrator/cp_trigger_index \"0\\n\""));
}

TEST_F(PatternOnLeds, RepeatedQueuesTheTextWithItsZeroByteAndLeavesTheIntensity) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(12, 6700, true));
    EXPECT_THAT(kernel.writes(),
                ElementsAre("/sys/class/leds/vibrator/cp_trigger_index \"65534\\n\"",
                            "/sys/class/leds/vibrator/cp_trigger_queue \"12.67, 10, 0~\\0\"",
                            "/sys/class/leds/vibrator/state \"1\\n\"",
                            "/sys/class/leds/vibrator/duration \"1000\\n\"",
                            "/sys/class/leds/vibrator/activate \"1\\n\""));
}

TEST_F(PatternOnLeds, FailedStartOfEitherFails) {
    const auto hwApi = makeHwApi();
    kernel.addFault(
            {.path = kLeds + "duration", .operation = Operation::kWrite, .error = EIO, .times = 2});
    EXPECT_FALSE(hwApi->performPrebakedHapticPattern(12, 6700, false));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern on fail");
    EXPECT_FALSE(hwApi->performPrebakedHapticPattern(12, 6700, true));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern on Trigger fail");
}

using PatternOnce = PrebakedPattern;

TEST_F(PatternOnce, WritesIntensityIndexAndStarts) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(23, 6700, false));
    EXPECT_THAT(kernel.writes(),
                ElementsAre("/sys/class/timed_output/vibrator/intensity \"6700\\n\"",
                            "/sys/class/timed_output/vibrator/cp_trigger_index \"23\\n\"",
                            "/sys/class/timed_output/vibrator/enable \"1000\\n\""));
    EXPECT_THAT(
            log.lines(),
            ElementsAre("I HW_API: performPrebakedHapticPattern 23 : 6700 : 0",
                        "I HW_API: performPrebakedHapticPattern one shoot starts",
                        "I HW_API: >> writeNode node:/timed_output/vibrator/intensity val:6700",
                        "I HW_API: << writeNode node OK : 5",
                        "I HW_API: >> writeNode node:/timed_output/vibrator/cp_trigger_index "
                        "val:23",
                        "I HW_API: << writeNode node OK : 3", "I HW_API: do_on for timeoutMs: 1000",
                        "I HW_API: >> writeNode node:/timed_output/vibrator/enable val:1000",
                        "I HW_API: << writeNode node OK : 5",
                        "I HW_API: performPrebakedHapticPattern one shoot end"));
}

TEST_F(PatternOnce, IndexZeroIsChosenButNotStarted) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(0, 10000, false));
    EXPECT_THAT(kernel.writes(),
                ElementsAre("/sys/class/timed_output/vibrator/intensity \"10000\\n\"",
                            "/sys/class/timed_output/vibrator/cp_trigger_index \"0\\n\""));
}

TEST_F(PatternOnce, AnyIndexIsLeftToTheDriver) {
    const auto hwApi = makeHwApi();
    for (const int index : {-1, 65534, 2147483647, -2147483647 - 1}) {
        EXPECT_TRUE(hwApi->performPrebakedHapticPattern(index, 10000, false));
        EXPECT_EQ(kernel.text(kLegacy + "cp_trigger_index"), std::to_string(index) + "\n");
    }
}

TEST_F(PatternOnce, NegativeIndexIsStartedToo) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(-3, 5000, false));
    EXPECT_THAT(kernel.writes(),
                ElementsAre("/sys/class/timed_output/vibrator/intensity \"5000\\n\"",
                            "/sys/class/timed_output/vibrator/cp_trigger_index \"-3\\n\"",
                            "/sys/class/timed_output/vibrator/enable \"1000\\n\""));
}

TEST_F(PatternOnce, MissingIntensityEndsIt) {
    kernel.removeNode(kLegacy + "intensity");
    const auto hwApi = makeHwApi();
    EXPECT_FALSE(hwApi->performPrebakedHapticPattern(23, 6700, false));
    EXPECT_THAT(kernel.writes(), IsEmpty());
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern intensity write fail");
}

TEST_F(PatternOnce, FailedIntensityEndsIt) {
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kLegacy + "intensity", .operation = Operation::kWrite, .error = EIO});
    EXPECT_FALSE(hwApi->performPrebakedHapticPattern(23, 6700, false));
    EXPECT_THAT(kernel.writes(), IsEmpty());
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern intensity write fail");
}

TEST_F(PatternOnce, FailedIndexLeavesTheIntensity) {
    const auto hwApi = makeHwApi();
    kernel.addFault(
            {.path = kLegacy + "cp_trigger_index", .operation = Operation::kWrite, .error = EIO});
    EXPECT_FALSE(hwApi->performPrebakedHapticPattern(23, 6700, false));
    EXPECT_THAT(kernel.writes(),
                ElementsAre("/sys/class/timed_output/vibrator/intensity \"6700\\n\""));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern pattern write fail");
}

TEST_F(PatternOnce, FailedStartFails) {
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kLegacy + "enable", .operation = Operation::kWrite, .error = EIO});
    EXPECT_FALSE(hwApi->performPrebakedHapticPattern(23, 6700, false));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern on fail");
}

using PatternRepeated = PrebakedPattern;

TEST_F(PatternRepeated, QueuesTheTextWithItsZeroByteAndStarts) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(12, 6700, true));
    EXPECT_THAT(
            kernel.calls(),
            ElementsAre(
                    "open /sys/class/timed_output/vibrator/cp_trigger_index O_RDWR",
                    "write /sys/class/timed_output/vibrator/cp_trigger_index \"65534\\n\"",
                    "close /sys/class/timed_output/vibrator/cp_trigger_index",
                    "open /sys/class/timed_output/vibrator/cp_trigger_queue O_RDWR",
                    "write /sys/class/timed_output/vibrator/cp_trigger_queue \"12.67, 10, 0~\\0\"",
                    "close /sys/class/timed_output/vibrator/cp_trigger_queue",
                    "open /sys/class/timed_output/vibrator/enable O_RDWR",
                    "write /sys/class/timed_output/vibrator/enable \"1000\\n\"",
                    "close /sys/class/timed_output/vibrator/enable"));
    EXPECT_EQ(kernel.text(kLegacy + "cp_trigger_queue").size(), 14U);
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: performPrebakedHapticPattern 12 : 6700 : 1",
                            "I HW_API: performPrebakedHapticPattern repeat starts",
                            "I HW_API: performPrebakedHapticPattern : 12.67, 10, 0~ , 13",
                            "I HW_API: >> writeNode node:/timed_output/vibrator/cp_trigger_index "
                            "val:65534",
                            "I HW_API: << writeNode node OK : 6", "I HW_API: ret : 14",
                            "I HW_API: do_on for timeoutMs: 1000",
                            "I HW_API: >> writeNode node:/timed_output/vibrator/enable val:1000",
                            "I HW_API: << writeNode node OK : 5",
                            "I HW_API: performPrebakedHapticPattern end"));
}

TEST_F(PatternRepeated, AmplitudeIsDividedByAHundred) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(5, 10000, true));
    EXPECT_EQ(kernel.text(kLegacy + "cp_trigger_queue"), std::string("5.100, 10, 0~\0", 14));
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(0, 199, true));
    EXPECT_EQ(kernel.text(kLegacy + "cp_trigger_queue"), std::string("0.1, 10, 0~\0", 12));
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(-2147483647 - 1, 99, true));
    EXPECT_EQ(kernel.text(kLegacy + "cp_trigger_queue"),
              std::string("-2147483648.0, 10, 0~\0", 22));
}

TEST_F(PatternRepeated, FailedSwitchToTheQueueEndsIt) {
    const auto hwApi = makeHwApi();
    kernel.addFault(
            {.path = kLegacy + "cp_trigger_index", .operation = Operation::kWrite, .error = EIO});
    EXPECT_FALSE(hwApi->performPrebakedHapticPattern(12, 6700, true));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern write 0xFFFE fail");
    EXPECT_THAT(kernel.writes(), IsEmpty());
}

TEST_F(PatternRepeated, MissingQueueFails) {
    kernel.removeNode(kLegacy + "cp_trigger_queue");
    const auto hwApi = makeHwApi();
    EXPECT_FALSE(hwApi->performPrebakedHapticPattern(12, 6700, true));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern is fail: 2");
}

TEST_F(PatternRepeated, QueueMustOpenForReadingAndWriting) {
    kernel.addNode(kLegacy + "cp_trigger_queue", "\n", Access::kWriteOnly);
    const auto hwApi = makeHwApi();
    EXPECT_FALSE(hwApi->performPrebakedHapticPattern(12, 6700, true));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern is fail: 13");
    EXPECT_THAT(kernel.writes(),
                ElementsAre("/sys/class/timed_output/vibrator/cp_trigger_index \"65534\\n\""));
}

TEST_F(PatternRepeated, IndexZeroIsQueued) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(0, 6700, true));
    EXPECT_THAT(kernel.writes(),
                Contains("/sys/class/timed_output/vibrator/cp_trigger_queue \"0.67, 10, 0~\\0\""));
    EXPECT_EQ(kernel.text(kLegacy + "enable"), "1000\n");
}

TEST_F(PatternRepeated, ShortAndFailedQueueWritesStartNothing) {
    const auto hwApi = makeHwApi();
    kernel.addFault(
            {.path = kLegacy + "cp_trigger_queue", .operation = Operation::kWrite, .limit = 13});
    EXPECT_FALSE(hwApi->performPrebakedHapticPattern(12, 6700, true));
    EXPECT_EQ(log.lines().at(5), "I HW_API: ret : 13");
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern repeat error");
    log.clear();
    kernel.addFault(
            {.path = kLegacy + "cp_trigger_queue", .operation = Operation::kWrite, .error = EIO});
    EXPECT_FALSE(hwApi->performPrebakedHapticPattern(12, 6700, true));
    EXPECT_EQ(log.lines().at(5), "I HW_API: ret : -1");
    EXPECT_EQ(kernel.text(kLegacy + "enable"), "0\n");
}

TEST_F(PatternRepeated, InterruptedQueueCallsAreRepeated) {
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kLegacy + "cp_trigger_queue",
                     .operation = Operation::kOpen,
                     .error = EINTR,
                     .times = 2});
    kernel.addFault({.path = kLegacy + "cp_trigger_queue",
                     .operation = Operation::kWrite,
                     .error = EINTR,
                     .times = 2});
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(12, 6700, true));
}

TEST_F(PatternRepeated, FailedStartFails) {
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kLegacy + "enable", .operation = Operation::kWrite, .error = EIO});
    EXPECT_FALSE(hwApi->performPrebakedHapticPattern(12, 6700, true));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern on Trigger fail");
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
