// SPDX-License-Identifier: Apache-2.0
//
// Haptic engine packets: the string to the byte, its limits, and every way to fail.
#include <cerrno>
#include <string>
#include <vector>

#include "tests/force_feedback_phone.h"
#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

const std::string kHapticEngine = kLeds + "haptic_engine";

class HapticEngine : public ServiceTest {
  protected:
    HapticEngine() {
        addLedsClass();
        kernel.addNode(kHapticEngine);
    }

    // The string that the driver gets for one packet.
    std::string textOf(const HapticEnginePacket& packet, int amplitude) {
        EXPECT_TRUE(makeHwApi()->performHapticEngine({packet}, amplitude));
        return kernel.text(kHapticEngine);
    }
};

TEST_F(HapticEngine, OnePacketIsWrittenInOneCallAndTheMotorStarted) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performHapticEngine({{7, 10000, 2050, 0}}, 10000));
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/leds/vibrator/haptic_engine O_RDWR",
                            "write /sys/class/leds/vibrator/haptic_engine \"4 7 10000 2050 0\\n\"",
                            "close /sys/class/leds/vibrator/haptic_engine",
                            "open /sys/class/leds/vibrator/state O_RDWR",
                            "write /sys/class/leds/vibrator/state \"1\\n\"",
                            "close /sys/class/leds/vibrator/state",
                            "open /sys/class/leds/vibrator/duration O_RDWR",
                            "write /sys/class/leds/vibrator/duration \"1\\n\"",
                            "close /sys/class/leds/vibrator/duration",
                            "open /sys/class/leds/vibrator/activate O_RDWR",
                            "write /sys/class/leds/vibrator/activate \"1\\n\"",
                            "close /sys/class/leds/vibrator/activate"));
    EXPECT_THAT(
            log.lines(),
            ElementsAre("I HW_API: performHapticEngine",
                        "I HW_API: performHapticEngine amplitude : 10000",
                        "I HW_API: performHapticEngine packet_cnt : 1",
                        "I HW_API: performHapticEngine total_size : 4",
                        "I HW_API: performHapticEngine : 4 7 10000 2050 0", "I ",
                        "I HW_API: do_on for timeoutMs: 1",
                        "I HW_API: >> writeNode node:/leds/vibrator/state val:1",
                        "I HW_API: << writeNode node OK : 2",
                        "I HW_API: >> writeNode node:/leds/vibrator/duration val:1",
                        "I HW_API: << writeNode node OK : 2",
                        "I HW_API: >> writeNode node:/leds/vibrator/activate val:1",
                        "I HW_API: << writeNode node OK : 2", "I HW_API: performHapticEngine OK"));
}

TEST_F(ServiceTest, PacketsOfTheLegacyClassGoToItsOwnNode) {
    addLegacyClass();
    kernel.addNode(kLegacy + "haptic_engine");
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performHapticEngine({{7, 10000, 2000, 1}}, 3400));
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/timed_output/vibrator/haptic_engine "
                                             "\"4 7 3400 2000 1\\n\"",
                                             "/sys/class/timed_output/vibrator/enable \"1\\n\""));
}

TEST_F(ForceFeedbackPhone, HasNoNodeForPackets) {
    const auto hwApi = makeHwApi();
    EXPECT_FALSE(hwApi->performHapticEngine({{7, 10000, 2050, 0}}, 10000));
    EXPECT_THAT(kernel.calls(), ElementsAre("open  O_RDWR = ENOENT"));
    EXPECT_EQ(log.lines().back(), "I HW_API: performHapticEngine is fail: 2");
}

TEST_F(HapticEngine, PacketsFollowEachOther) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performHapticEngine({{1, 2000, 3, 4}, {5, 6000, 7, 8}}, 5000));
    EXPECT_EQ(kernel.text(kHapticEngine), "8 1 1000 3 4 5 3000 7 8\n");
}

TEST_F(HapticEngine, EmptySequenceIsZeroAndStarts) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performHapticEngine({}, 1));
    EXPECT_EQ(kernel.text(kHapticEngine), "0\n");
    EXPECT_EQ(kernel.text(kLeds + "activate"), "1\n");
}

TEST_F(HapticEngine, IntensityIsScaledTowardZero) {
    EXPECT_EQ(textOf({0, 10000, 0, 0}, 1), "4 0 1 0 0\n");
    EXPECT_EQ(textOf({0, 9999, 0, 0}, 1), "4 0 0 0 0\n");
    EXPECT_EQ(textOf({0, -9999, 0, 0}, 1), "4 0 0 0 0\n");
    EXPECT_EQ(textOf({0, -15000, 0, 0}, 1), "4 0 -1 0 0\n");
    EXPECT_EQ(textOf({0, 6700, 0, 0}, 6700), "4 0 4489 0 0\n");
}

TEST_F(HapticEngine, ProductKeepsItsLow32Bits) {
    EXPECT_EQ(textOf({0, 214749, 0, 0}, 10000), "4 0 -214747 0 0\n");
    EXPECT_EQ(textOf({0, 2147483647, 0, 0}, 10000), "4 0 -1 0 0\n");
    EXPECT_EQ(textOf({0, -2147483647 - 1, 0, 0}, 10000), "4 0 0 0 0\n");
    EXPECT_EQ(textOf({0, -2147483647 - 1, 0, 0}, 9999), "4 0 -214748 0 0\n");
    EXPECT_EQ(textOf({0, -2147483647 - 1, 0, 0}, 1), "4 0 -214748 0 0\n");
    EXPECT_EQ(textOf({0, 2147483647, 0, 0}, 1), "4 0 214748 0 0\n");
    EXPECT_EQ(textOf({0, 2147483647, 0, 0}, 9999), "4 0 214747 0 0\n");
}

TEST_F(HapticEngine, NumberOfEightDigitsKeepsItsBlank) {
    EXPECT_EQ(textOf({12345678, 0, -1234567, 0}, 1), "4 12345678 0 -1234567 0\n");
}

TEST_F(HapticEngine, LongerNumberIsCutToNineCharactersAndLosesItsBlank) {
    EXPECT_EQ(textOf({123456789, 0, 1234567890, 0}, 1), "4 1234567890 1234567890\n");
}

TEST_F(HapticEngine, LargestAndSmallestNumbersAreCutAndRunTogether) {
    EXPECT_EQ(textOf({2147483647, 0, -2147483647 - 1, 0}, 1), "4 2147483640 -214748360\n");
}

TEST_F(HapticEngine, NumberOfExactlyNineCharactersStandsWithoutABlank) {
    EXPECT_EQ(textOf({-12345678, 0, 1, 0}, 1), "4 -123456780 1 0\n");
    EXPECT_EQ(textOf({1, 0, 1, 12345678}, 1), "4 1 0 1 12345678\n");
}

TEST_F(HapticEngine, LastNumberThatWasCutLosesACharacterToTheLineFeed) {
    EXPECT_EQ(textOf({1, 0, 2, 123456789}, 1), "4 1 0 2 12345678\n");
    EXPECT_EQ(textOf({1, 0, 2, -2147483647 - 1}, 1), "4 1 0 2 -2147483\n");
}

TEST_F(HapticEngine, SequenceOf339PacketsIsWrittenWholeAndInOneCall) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performHapticEngine(
            std::vector<HapticEnginePacket>(339, {123, 10000, -456, 1}), 10000));
    std::string text = "1356 ";
    for (int i = 0; i < 339; ++i) text += "123 10000 -456 1 ";
    text.back() = '\n';
    EXPECT_EQ(kernel.text(kHapticEngine), text);
    EXPECT_EQ(kernel.writes().size(), 1U + 3U);
    EXPECT_EQ(log.lines().at(3), "I HW_API: performHapticEngine total_size : 1356");
}

TEST_F(HapticEngine, SequenceOf339PacketsOfTheLongestNumbersIsWrittenWhole) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performHapticEngine(
            std::vector<HapticEnginePacket>(
                    339, {-2147483647 - 1, -2147483647 - 1, -2147483647 - 1, 2147483647}),
            1));
    std::string text = "1356 ";
    for (int i = 0; i < 339; ++i) text += "-21474836-214748 -21474836214748364";
    text.back() = '\n';
    EXPECT_EQ(kernel.text(kHapticEngine), text);
}

TEST_F(HapticEngine, SequenceOf340PacketsIsTooLong) {
    const auto hwApi = makeHwApi();
    EXPECT_FALSE(hwApi->performHapticEngine(std::vector<HapticEnginePacket>(340), 0));
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: performHapticEngine",
                                         "I HW_API: performHapticEngine amplitude : 0",
                                         "I HW_API: performHapticEngine packet_cnt : 340",
                                         "I HW_API: performHapticEngine total_size : 1360",
                                         "I HW_API: performHapticEngine packet size is exceed"));
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(HapticEngine, AmplitudeOutOfRangeIsRefusedAndNothingWritten) {
    const auto hwApi = makeHwApi();
    EXPECT_FALSE(hwApi->performHapticEngine({{7, 10000, 2050, 0}}, 0));
    EXPECT_EQ(log.lines().back(), "I HW_API: performHapticEngine amplitude is abnormal 0");
    EXPECT_FALSE(hwApi->performHapticEngine({{7, 10000, 2050, 0}}, 10001));
    EXPECT_EQ(log.lines().back(), "I HW_API: performHapticEngine amplitude is abnormal 10001");
    for (const int amplitude : {-1, 2147483647, -2147483647 - 1}) {
        EXPECT_FALSE(hwApi->performHapticEngine({{7, 10000, 2050, 0}}, amplitude));
        EXPECT_EQ(log.lines().back(), "I HW_API: performHapticEngine amplitude is abnormal " +
                                              std::to_string(amplitude));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(HapticEngine, MissingNodeFails) {
    kernel.removeNode(kHapticEngine);
    const auto hwApi = makeHwApi();
    EXPECT_FALSE(hwApi->performHapticEngine({}, 1));
    EXPECT_EQ(log.lines().back(), "I HW_API: performHapticEngine is fail: 2");
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/leds/vibrator/haptic_engine O_RDWR = ENOENT"));
}

TEST_F(HapticEngine, NodeMustOpenForReadingAndWriting) {
    kernel.addNode(kHapticEngine, "\n", Access::kWriteOnly);
    EXPECT_FALSE(makeHwApi()->performHapticEngine({}, 1));
    EXPECT_EQ(log.lines().back(), "I HW_API: performHapticEngine is fail: 13");
}

TEST_F(HapticEngine, ShortAndFailedWritesStartNothing) {
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kHapticEngine, .operation = Operation::kWrite, .limit = 3});
    EXPECT_FALSE(hwApi->performHapticEngine({{7, 10000, 2050, 0}}, 10000));
    EXPECT_EQ(log.lines().back(), "I HW_API: performHapticEngine UNKNOWN_ERROR");
    kernel.addFault({.path = kHapticEngine, .operation = Operation::kWrite, .error = EIO});
    EXPECT_FALSE(hwApi->performHapticEngine({{7, 10000, 2050, 0}}, 10000));
    EXPECT_EQ(log.lines().back(), "I HW_API: performHapticEngine UNKNOWN_ERROR");
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/haptic_engine \"4 7\""));
}

TEST_F(HapticEngine, InterruptedCallsAreRepeated) {
    const auto hwApi = makeHwApi();
    kernel.addFault(
            {.path = kHapticEngine, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    kernel.addFault(
            {.path = kHapticEngine, .operation = Operation::kWrite, .error = EINTR, .times = 2});
    EXPECT_TRUE(hwApi->performHapticEngine({}, 1));
    EXPECT_EQ(kernel.text(kHapticEngine), "0\n");
}

TEST_F(HapticEngine, FailedStartIsIgnored) {
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kLeds + "state", .operation = Operation::kWrite, .error = EIO});
    EXPECT_TRUE(hwApi->performHapticEngine({}, 1));
    EXPECT_EQ(log.lines().back(), "I HW_API: performHapticEngine OK");
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
