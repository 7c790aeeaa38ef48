// SPDX-License-Identifier: Apache-2.0
//
// The extension's stored patterns, once and repeating, on nodes.
#include <cerrno>
#include <string>
#include <vector>

#include "tests/extension_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using fake::Fault;
using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

class PatternPhone : public ExtensionTest {
  protected:
    PatternPhone() {
        addLegacyClass();
        addNodes(kLegacy, {"intensity", "cp_trigger_index", "cp_trigger_queue"});
    }
};

// One failure of the driver: what was written before it, and the last line of the service.
struct PatternFailure {
    const char* name;
    Fault fault;
    std::vector<std::string> writes;
    const char* line;
};

using ExtensionPattern = PatternPhone;

TEST_F(ExtensionPattern, AmplitudeOutOfRangeIsAnIllegalArgumentAndNothingIsWritten) {
    const auto extension = makeExtension();
    for (const int32_t amplitude : {0, -1, 10001, 65537, kIntMin, kIntMin + 1, kIntMax}) {
        for (const bool repeat : {false, true}) {
            log.clear();
            EXPECT_EQ(exceptionOf(extension->performPrebakedHapticPattern(5, amplitude, repeat)),
                      EX_ILLEGAL_ARGUMENT);
            const std::string number = std::to_string(amplitude);
            EXPECT_THAT(log.lines(),
                        ElementsAre("I V_4_0: performPrebakedHapticPattern 5 : " + number +
                                            (repeat ? " : 1" : " : 0"),
                                    "I V_4_0: performPrebakedHapticPattern amplitude is abnormal " +
                                            number));
        }
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

using ExtensionPatternOnce = PatternPhone;

TEST_F(ExtensionPatternOnce, WritesIntensityAndIndexAndStarts) {
    const auto extension = makeExtension();
    EXPECT_TRUE(extension->performPrebakedHapticPattern(23, 6700, false).isOk());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open " + kIntensity + " O_RDWR",
                            "write " + kIntensity + " \"6700\\n\"", "close " + kIntensity,
                            "open " + kIndex + " O_RDWR", "write " + kIndex + " \"23\\n\"",
                            "close " + kIndex, "open " + kEnable + " O_RDWR",
                            "write " + kEnable + " \"1000\\n\"", "close " + kEnable));
    EXPECT_THAT(
            log.lines(),
            ElementsAre("I V_4_0: performPrebakedHapticPattern 23 : 6700 : 0",
                        "I HW_API: >> writeNode node:/timed_output/vibrator/intensity val:6700",
                        "I HW_API: << writeNode node OK : 5",
                        "I HW_API: >> writeNode "
                        "node:/timed_output/vibrator/cp_trigger_index val:23",
                        "I HW_API: << writeNode node OK : 3", "I HW_API: do_on for timeoutMs: 1000",
                        "I HW_API: >> writeNode node:/timed_output/vibrator/enable val:1000",
                        "I HW_API: << writeNode node OK : 5"));
}

TEST_F(ExtensionPatternOnce, IndexZeroIsChosenButNotStarted) {
    const auto extension = makeExtension();
    EXPECT_TRUE(extension->performPrebakedHapticPattern(0, 5000, false).isOk());
    EXPECT_THAT(kernel.writes(), ElementsAre(kIntensity + " \"5000\\n\"", kIndex + " \"0\\n\""));
    EXPECT_THAT(log.lines(), Not(Contains(HasSubstr("do_on"))));
}

TEST_F(ExtensionPatternOnce, AnyIndexIsPassedOn) {
    const auto extension = makeExtension();
    EXPECT_TRUE(extension->performPrebakedHapticPattern(kIntMin, 1, false).isOk());
    EXPECT_EQ(kernel.text(kIndex), "-2147483648\n");
    EXPECT_TRUE(extension->performPrebakedHapticPattern(kIntMax, 10000, false).isOk());
    EXPECT_EQ(kernel.text(kIndex), "2147483647\n");
    EXPECT_EQ(kernel.text(kIntensity), "10000\n");
}

TEST_F(ExtensionPatternOnce, NegativeIndexIsStartedToo) {
    const auto extension = makeExtension();
    EXPECT_TRUE(extension->performPrebakedHapticPattern(-3, 5000, false).isOk());
    EXPECT_THAT(kernel.writes(), ElementsAre(kIntensity + " \"5000\\n\"", kIndex + " \"-3\\n\"",
                                             kEnable + " \"1000\\n\""));
}

TEST_F(ExtensionPatternOnce, InterruptedCallsAreRepeated) {
    const auto extension = makeExtension();
    for (const std::string& node : {kIntensity, kIndex, kEnable}) {
        kernel.addFault({.path = node, .operation = Operation::kOpen, .error = EINTR});
        kernel.addFault({.path = node, .operation = Operation::kWrite, .error = EINTR});
    }
    EXPECT_TRUE(extension->performPrebakedHapticPattern(23, 6700, false).isOk());
    EXPECT_THAT(kernel.writes(), ElementsAre(kIntensity + " \"6700\\n\"", kIndex + " \"23\\n\"",
                                             kEnable + " \"1000\\n\""));
}

class FailingPatternOnce : public PatternPhone,
                           public testing::WithParamInterface<PatternFailure> {};

TEST_P(FailingPatternOnce, IsAnIllegalStateAndLeavesWhatWasWritten) {
    const auto extension = makeExtension();
    kernel.addFault(GetParam().fault);
    EXPECT_EQ(exceptionOf(extension->performPrebakedHapticPattern(23, 6700, false)),
              EX_ILLEGAL_STATE);
    EXPECT_EQ(kernel.writes(), GetParam().writes);
    EXPECT_EQ(log.lines().back(), GetParam().line);
}

const PatternFailure kFailuresOnce[] = {
        {"IntensityOpen",
         {.path = kIntensity, .operation = Operation::kOpen, .error = EACCES},
         {},
         "I V_4_0: performPrebakedHapticPattern intensity write fail"},
        {"IntensityWrite",
         {.path = kIntensity, .operation = Operation::kWrite, .error = EIO},
         {},
         "I V_4_0: performPrebakedHapticPattern intensity write fail"},
        {"IntensityShort",
         {.path = kIntensity, .operation = Operation::kWrite, .limit = 4},
         {kIntensity + " \"6700\""},
         "I V_4_0: performPrebakedHapticPattern intensity write fail"},
        {"IndexOpen",
         {.path = kIndex, .operation = Operation::kOpen, .error = EACCES},
         {kIntensity + " \"6700\\n\""},
         "I V_4_0: performPrebakedHapticPattern pattern write fail"},
        {"IndexWrite",
         {.path = kIndex, .operation = Operation::kWrite, .error = EIO},
         {kIntensity + " \"6700\\n\""},
         "I V_4_0: performPrebakedHapticPattern pattern write fail"},
        {"IndexShort",
         {.path = kIndex, .operation = Operation::kWrite, .limit = 1},
         {kIntensity + " \"6700\\n\"", kIndex + " \"2\""},
         "I V_4_0: performPrebakedHapticPattern pattern write fail"},
        {"StartOpen",
         {.path = kEnable, .operation = Operation::kOpen, .error = EACCES},
         {kIntensity + " \"6700\\n\"", kIndex + " \"23\\n\""},
         "I V_4_0: performPrebakedHapticPattern on fail"},
        {"StartWrite",
         {.path = kEnable, .operation = Operation::kWrite, .error = EIO},
         {kIntensity + " \"6700\\n\"", kIndex + " \"23\\n\""},
         "I V_4_0: performPrebakedHapticPattern on fail"},
        {"StartShort",
         {.path = kEnable, .operation = Operation::kWrite, .limit = 4},
         {kIntensity + " \"6700\\n\"", kIndex + " \"23\\n\"", kEnable + " \"1000\""},
         "I V_4_0: performPrebakedHapticPattern on fail"},
};

INSTANTIATE_TEST_SUITE_P(Extension, FailingPatternOnce, testing::ValuesIn(kFailuresOnce),
                         rowName<PatternFailure>);

class ExtensionPatternRepeated : public PatternPhone {
  protected:
    // The queue's bytes for a pattern that is repeated.
    std::string queued(int32_t patternIndex, int32_t amplitude) {
        EXPECT_TRUE(makeExtension()
                            ->performPrebakedHapticPattern(patternIndex, amplitude, true)
                            .isOk());
        return kernel.text(kQueue);
    }
};

TEST_F(ExtensionPatternRepeated, SwitchesToTheQueueFillsItWithAZeroByteAndStarts) {
    const auto extension = makeExtension();
    EXPECT_TRUE(extension->performPrebakedHapticPattern(3, 5000, true).isOk());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open " + kIndex + " O_RDWR", "write " + kIndex + " \"65534\\n\"",
                            "close " + kIndex, "open " + kQueue + " O_RDWR",
                            "write " + kQueue + " \"3.50, 10, 0~\\0\"", "close " + kQueue,
                            "open " + kEnable + " O_RDWR", "write " + kEnable + " \"1000\\n\"",
                            "close " + kEnable));
    EXPECT_THAT(
            log.lines(),
            ElementsAre("I V_4_0: performPrebakedHapticPattern 3 : 5000 : 1",
                        "I V_4_0: performPrebakedHapticPattern : 3.50, 10, 0~ , 12",
                        "I HW_API: >> writeNode "
                        "node:/timed_output/vibrator/cp_trigger_index val:65534",
                        "I HW_API: << writeNode node OK : 6", "I HW_API: do_on for timeoutMs: 1000",
                        "I HW_API: >> writeNode node:/timed_output/vibrator/enable val:1000",
                        "I HW_API: << writeNode node OK : 5"));
}

TEST_F(ExtensionPatternRepeated, AmplitudeIsDividedByAHundredRoundedDown) {
    EXPECT_EQ(queued(7, 10000), std::string("7.100, 10, 0~\0", 14));
    EXPECT_EQ(queued(5, 8000), std::string("5.80, 10, 0~\0", 13));
    EXPECT_EQ(queued(5, 199), std::string("5.1, 10, 0~\0", 12));
    EXPECT_EQ(queued(5, 99), std::string("5.0, 10, 0~\0", 12));
    EXPECT_EQ(queued(5, 1), std::string("5.0, 10, 0~\0", 12));
}

TEST_F(ExtensionPatternRepeated, IndexZeroIsQueuedToo) {
    EXPECT_EQ(queued(0, 5000), std::string("0.50, 10, 0~\0", 13));
}

TEST_F(ExtensionPatternRepeated, LongestIndicesFit) {
    EXPECT_EQ(queued(kIntMin, 10000), std::string("-2147483648.100, 10, 0~\0", 24));
    EXPECT_EQ(queued(kIntMax, 10000), std::string("2147483647.100, 10, 0~\0", 23));
}

TEST_F(ExtensionPatternRepeated, InterruptedCallsAreRepeated) {
    for (const std::string& node : {kIndex, kQueue, kEnable}) {
        kernel.addFault({.path = node, .operation = Operation::kOpen, .error = EINTR});
        kernel.addFault({.path = node, .operation = Operation::kWrite, .error = EINTR});
    }
    EXPECT_EQ(queued(3, 5000), std::string("3.50, 10, 0~\0", 13));
}

class FailingPatternRepeated : public PatternPhone,
                               public testing::WithParamInterface<PatternFailure> {};

TEST_P(FailingPatternRepeated, IsAnIllegalStateAndLeavesWhatWasWritten) {
    const auto extension = makeExtension();
    kernel.addFault(GetParam().fault);
    EXPECT_EQ(exceptionOf(extension->performPrebakedHapticPattern(3, 5000, true)),
              EX_ILLEGAL_STATE);
    EXPECT_EQ(kernel.writes(), GetParam().writes);
    EXPECT_EQ(log.lines().back(), GetParam().line);
}

const PatternFailure kFailuresRepeated[] = {
        {"SwitchOpen",
         {.path = kIndex, .operation = Operation::kOpen, .error = EACCES},
         {},
         "I V_4_0: performPrebakedHapticPattern write 0xFFFE fail"},
        {"SwitchWrite",
         {.path = kIndex, .operation = Operation::kWrite, .error = EIO},
         {},
         "I V_4_0: performPrebakedHapticPattern write 0xFFFE fail"},
        {"SwitchShort",
         {.path = kIndex, .operation = Operation::kWrite, .limit = 5},
         {kIndex + " \"65534\""},
         "I V_4_0: performPrebakedHapticPattern write 0xFFFE fail"},
        {"QueueOpen",
         {.path = kQueue, .operation = Operation::kOpen, .error = EACCES},
         {kIndex + " \"65534\\n\""},
         "I V_4_0: performPrebakedHapticPattern is fail: 13"},
        {"QueueWrite",
         {.path = kQueue, .operation = Operation::kWrite, .error = EIO},
         {kIndex + " \"65534\\n\""},
         "I V_4_0: performPrebakedHapticPattern repeat error"},
        {"QueueTakesAllButTheZeroByte",
         {.path = kQueue, .operation = Operation::kWrite, .limit = 12},
         {kIndex + " \"65534\\n\"", kQueue + " \"3.50, 10, 0~\""},
         "I V_4_0: performPrebakedHapticPattern repeat error"},
        {"QueueClaimsMore",
         {.path = kQueue, .operation = Operation::kWrite, .result = 14},
         {kIndex + " \"65534\\n\"", kQueue + " \"3.50, 10, 0~\\0\""},
         "I V_4_0: performPrebakedHapticPattern repeat error"},
        {"StartOpen",
         {.path = kEnable, .operation = Operation::kOpen, .error = EACCES},
         {kIndex + " \"65534\\n\"", kQueue + " \"3.50, 10, 0~\\0\""},
         "I V_4_0: performPrebakedHapticPattern on Trigger fail"},
        {"StartWrite",
         {.path = kEnable, .operation = Operation::kWrite, .error = EIO},
         {kIndex + " \"65534\\n\"", kQueue + " \"3.50, 10, 0~\\0\""},
         "I V_4_0: performPrebakedHapticPattern on Trigger fail"},
};

INSTANTIATE_TEST_SUITE_P(Extension, FailingPatternRepeated, testing::ValuesIn(kFailuresRepeated),
                         rowName<PatternFailure>);

TEST_F(ExtensionPatternRepeated, MissingQueueIsLoggedWithItsErrorAfterTheSwitch) {
    kernel.removeNode(kQueue);
    const auto extension = makeExtension();
    EXPECT_EQ(exceptionOf(extension->performPrebakedHapticPattern(3, 5000, true)),
              EX_ILLEGAL_STATE);
    EXPECT_THAT(kernel.writes(), ElementsAre(kIndex + " \"65534\\n\""));
    EXPECT_EQ(log.lines().back(), "I V_4_0: performPrebakedHapticPattern is fail: 2");
}

}  // namespace
}  // namespace aidl::vendor::quorvan::hardware::vibrator
