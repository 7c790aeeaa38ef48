// SPDX-License-Identifier: Apache-2.0
//
// The extension's number of stored patterns.
#include <cerrno>
#include <string>

#include "tests/extension_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::ElementsAre;

class NumberOfPatterns : public ExtensionTest {
  protected:
    NumberOfPatterns() { addLedsClass(); }

    int32_t countOf(const std::string& text) {
        kernel.addNode(kLeds + "num_waves", text, Access::kReadOnly);
        int32_t count = 77;
        EXPECT_TRUE(makeExtension()->getNumberOfPrebakedHapticPattern(&count).isOk());
        return count;
    }
};

TEST_F(NumberOfPatterns, IsWhatTheDriverSays) {
    EXPECT_EQ(countOf("137\n"), 137);
    EXPECT_THAT(log.lines(), ElementsAre("I V_4_0: getNumberOfPrebakedHapticPattern",
                                         "I HW_API: >> readNode node:/leds/vibrator/num_waves",
                                         "I HW_API: << readNode done",
                                         "I V_4_0: getNumberOfPrebakedHapticPattern value : 137"));
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/leds/vibrator/num_waves O_RDONLY",
                                            "close /sys/class/leds/vibrator/num_waves",
                                            "open /sys/class/leds/vibrator/num_waves O_RDONLY",
                                            "read /sys/class/leds/vibrator/num_waves 7 \"137\\n\"",
                                            "close /sys/class/leds/vibrator/num_waves"));
}

TEST_F(NumberOfPatterns, IsReadFromSevenCharacters) {
    EXPECT_EQ(countOf("123456789\n"), 1234567);
    EXPECT_EQ(countOf("-5\n"), -5);
    EXPECT_EQ(countOf("many\n"), 0);
    EXPECT_EQ(countOf(""), 0);
}

TEST_F(NumberOfPatterns, FailedReadIsMinusOneAndOk) {
    kernel.addFault({.path = kLeds + "num_waves", .operation = Operation::kRead, .error = EIO});
    EXPECT_EQ(countOf("137\n"), -1);
    EXPECT_EQ(log.lines().back(), "I V_4_0: getNumberOfPrebakedHapticPattern value : -1");
}

TEST_F(NumberOfPatterns, NodeThatOpensOnceOnlyIsMinusOneAndOk) {
    kernel.addFault({.path = kLeds + "num_waves",
                     .operation = Operation::kOpen,
                     .error = EACCES,
                     .after = 1});
    EXPECT_EQ(countOf("137\n"), -1);
}

TEST_F(NumberOfPatterns, InterruptedCallsAreRepeated) {
    kernel.addFault({.path = kLeds + "num_waves",
                     .operation = Operation::kOpen,
                     .error = EINTR,
                     .times = 3});
    kernel.addFault({.path = kLeds + "num_waves",
                     .operation = Operation::kRead,
                     .error = EINTR,
                     .times = 3});
    EXPECT_EQ(countOf("137\n"), 137);
}

TEST_F(NumberOfPatterns, WithoutTheNodeIsNotOfferedAndZero) {
    const auto extension = makeExtension();
    int32_t count = 77;
    EXPECT_EQ(exceptionOf(extension->getNumberOfPrebakedHapticPattern(&count)),
              EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(count, 0);
    EXPECT_THAT(log.lines(),
                ElementsAre("I V_4_0: getNumberOfPrebakedHapticPattern",
                            "I HW_API: isNodeExistForRead node:/sys/class/leds/vibrator/num_waves "
                            "- false",
                            "I V_4_0: getNumberOfPrebakedHapticPattern unsupports"));
}

TEST_F(NumberOfPatterns, OnForceFeedbackIsNotOfferedAndZero) {
    removeLedsClass();
    addForceFeedback();
    int32_t count = 77;
    EXPECT_EQ(exceptionOf(makeExtension()->getNumberOfPrebakedHapticPattern(&count)),
              EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(count, 0);
}

}  // namespace
}  // namespace aidl::vendor::quorvan::hardware::vibrator
