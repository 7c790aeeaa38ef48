// SPDX-License-Identifier: Apache-2.0
//
// Prebaked patterns, once and repeating, on nodes and on force feedback.
#include <cerrno>
#include <string>
#include <vector>

#include "service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using imitated::Operation;
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

// The force-feedback operations that patterns call, one of which may fail.
class ImitatedForceFeedback : public HwApi {
  public:
    bool setForceFeedbackAmplitude(int gain) override {
        return answer("gain " + std::to_string(gain));
    }
    bool setForceFeedbackIndex(int index) override {
        return answer("index " + std::to_string(index));
    }
    bool setForceFeedbackDuration(int durationMs) override {
        return answer("duration " + std::to_string(durationMs));
    }
    bool triggerForceFeedbackVibration(bool on) override { return answer(on ? "start" : "stop"); }

    std::string refused;
    std::vector<std::string> requests;

  private:
    bool answer(const std::string& request) {
        requests.push_back(request);
        return request != refused;
    }
};

class PatternOnForceFeedback : public ServiceTest {
  protected:
    PatternOnForceFeedback() {
        useForceFeedback = true;
        kernel.clear();
        log.clear();
    }

    ImitatedForceFeedback hwApi;
};

TEST_F(PatternOnForceFeedback, OnceSetsGainAndIndexAndStarts) {
    EXPECT_TRUE(hwApi.performPrebakedHapticPattern(23, 6700, false));
    EXPECT_THAT(hwApi.requests, ElementsAre("gain 6700", "index 23", "duration 1000", "start"));
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern one shoot end");
}

TEST_F(PatternOnForceFeedback, OnceWithIndexZeroIsNotStarted) {
    EXPECT_TRUE(hwApi.performPrebakedHapticPattern(0, 6700, false));
    EXPECT_THAT(hwApi.requests, ElementsAre("gain 6700", "index 0"));
}

TEST_F(PatternOnForceFeedback, RefusedGainOrIndexEndsItWithoutALine) {
    hwApi.refused = "gain 6700";
    EXPECT_FALSE(hwApi.performPrebakedHapticPattern(23, 6700, false));
    EXPECT_THAT(hwApi.requests, ElementsAre("gain 6700"));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern one shoot starts");
    hwApi.refused = "index 23";
    EXPECT_FALSE(hwApi.performPrebakedHapticPattern(23, 6700, false));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern one shoot starts");
}

TEST_F(PatternOnForceFeedback, RepeatWithIndexZeroIsRefused) {
    EXPECT_FALSE(hwApi.performPrebakedHapticPattern(0, 6700, true));
    EXPECT_THAT(hwApi.requests, IsEmpty());
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: performPrebakedHapticPattern 0 : 6700 : 1",
                            "I HW_API: performPrebakedHapticPattern repeat starts",
                            "I V_2_0: performPrebakedHapticPattern Cannot use patternIndex 0 with "
                            "repeat"));
}

TEST_F(PatternOnForceFeedback, RepeatWithRefusedGainEndsItWithoutALine) {
    hwApi.refused = "gain 6700";
    EXPECT_FALSE(hwApi.performPrebakedHapticPattern(23, 6700, true));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern repeat starts");
}

TEST_F(PatternOnForceFeedback, RepeatThatCannotBeUploadedIsLogged) {
    EXPECT_FALSE(hwApi.performPrebakedHapticPattern(23, 6700, true));
    EXPECT_EQ(log.lines().back(), "I V_2_0: performPrebakedHapticPattern setAndTriggerOwt fail");
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
