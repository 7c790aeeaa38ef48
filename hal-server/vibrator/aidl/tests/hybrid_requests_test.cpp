// SPDX-License-Identifier: Apache-2.0
//
// The extension's hybrid packets: how their values are written, and what a driver that does not
// take them is answered.
#include <cerrno>
#include <string>
#include <vector>

#include "tests/extension_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Not;

using HybridPackets = std::vector<ZelHybridHapticEnginePacket>;

constexpr auto kPlain = ZelHybridHapticEnginePacketType::PLAIN;
constexpr auto kPrefixed = ZelHybridHapticEnginePacketType::PREFIXED;

ZelHybridHapticEnginePacket hybrid(int32_t time, int32_t intensity,
                                   ZelHybridHapticEnginePacketType type, int32_t value,
                                   int32_t frequency) {
    ZelHybridHapticEnginePacket packet;
    packet.time = time;
    packet.intensity = intensity;
    packet.type = type;
    packet.value = value;
    packet.frequency = frequency;
    return packet;
}

class HybridRequest : public ExtensionTest {
  protected:
    HybridRequest() {
        addLedsClass();
        kernel.addNode(node, "unset");
    }

    std::string textOf(const HybridPackets& packets, int32_t amplitude) {
        EXPECT_TRUE(makeExtension()->performHybridHapticEngine(packets, amplitude).isOk());
        return kernel.text(node);
    }

    const std::string node = kLeds + "hybrid_haptic_engine";
};

TEST_F(HybridRequest, ValueOfType0IsBareAndOfType1BehindANumberSign) {
    EXPECT_EQ(textOf({hybrid(5, 5000, kPrefixed, 3, 170)}, 10000), "4 5 5000 #3 170\n");
    EXPECT_EQ(textOf({hybrid(5, 5000, kPlain, 3, 170)}, 10000), "4 5 5000 3 170\n");
    EXPECT_EQ(textOf({hybrid(1, 10000, kPlain, -2, 3), hybrid(4, 10000, kPrefixed, -5, 6)}, 2500),
              "8 1 2500 -2 3 4 2500 #-5 6\n");
    EXPECT_THAT(log.lines(), Not(Contains(HasSubstr("abnormal"))));
}

TEST_F(HybridRequest, ValueOfAnotherTypeIsLeftOutAndLoggedWhileTheCountStays) {
    for (const int32_t type : {2, -1, kIntMin, kIntMax}) {
        const auto unknown = static_cast<ZelHybridHapticEnginePacketType>(type);
        EXPECT_EQ(textOf({hybrid(1, 2, kPlain, 3, 4), hybrid(5, 6, unknown, 7, 8)}, 10000),
                  "8 1 2 3 4 5 6 8\n");
        EXPECT_EQ(log.line(4), "I V_4_0: ZelHybridHapticEnginePacketType idx : 1 is abnormal : " +
                                       std::to_string(type));
        EXPECT_EQ(log.line(5), "I V_4_0: performHybridHapticEngine : 8 1 2 3 4 5 6 8");
        EXPECT_EQ(log.lines().back(), "I V_4_0: performHybridHapticEngine OK");
    }
}

TEST_F(HybridRequest, EveryPacketOfAnotherTypeIsLogged) {
    const auto unknown = static_cast<ZelHybridHapticEnginePacketType>(9);
    EXPECT_EQ(textOf(HybridPackets(2, hybrid(1, 2, unknown, 3, 4)), 10000), "8 1 2 4 1 2 4\n");
    EXPECT_EQ(log.line(4), "I V_4_0: ZelHybridHapticEnginePacketType idx : 0 is abnormal : 9");
    EXPECT_EQ(log.line(5), "I V_4_0: ZelHybridHapticEnginePacketType idx : 1 is abnormal : 9");
}

TEST_F(HybridRequest, IntensityIsRoundedTowardZeroAndWraps) {
    EXPECT_EQ(textOf({hybrid(0, 9999, kPlain, 0, 0)}, 1), "4 0 0 0 0\n");
    EXPECT_EQ(textOf({hybrid(0, -15000, kPlain, 0, 0)}, 1), "4 0 -1 0 0\n");
    EXPECT_EQ(textOf({hybrid(0, kIntMax, kPlain, 0, 0)}, 10000), "4 0 -1 0 0\n");
    EXPECT_EQ(textOf({hybrid(0, kIntMin, kPlain, 0, 0)}, 9999), "4 0 -214748 0 0\n");
}

TEST_F(HybridRequest, NumbersAreCutToNineCharactersTheirSignsAndBlankIncluded) {
    EXPECT_EQ(textOf({hybrid(1, 0, kPrefixed, 1234567, 2)}, 1), "4 1 0 #1234567 2\n");
    EXPECT_EQ(textOf({hybrid(1, 0, kPrefixed, 12345678, 2)}, 1), "4 1 0 #123456782\n");
    EXPECT_EQ(textOf({hybrid(1, 0, kPrefixed, kIntMin, 2)}, 1), "4 1 0 #-21474832\n");
    EXPECT_EQ(textOf({hybrid(kIntMin, 0, kPlain, kIntMax, kIntMin)}, 1),
              "4 -214748360 214748364-2147483\n");
}

TEST_F(HybridRequest, LongestTextIsNeverCut) {
    const HybridPackets packets(339, hybrid(kIntMin, kIntMin, kPrefixed, kIntMin, kIntMin));
    const std::string text = textOf(packets, 9999);
    // "1356 ", then 339 packets of 9, 8, 9 and 9 characters.
    EXPECT_EQ(text.size(), 11870U);
    std::string expected = "1356 ";
    for (int i = 0; i < 339; ++i) expected += "-21474836-214748 #-2147483-21474836";
    expected.back() = '\n';
    EXPECT_EQ(text, expected);
    EXPECT_EQ(kernel.text(kLeds + "activate"), "1\n");
}

TEST_F(HybridRequest, ShortWriteIsOkWithoutVibration) {
    const auto extension = makeExtension();
    for (const size_t taken : {0U, 1U, 15U}) {
        kernel.clear();
        kernel.addFault({.path = node, .operation = Operation::kWrite, .limit = taken});
        EXPECT_TRUE(
                extension->performHybridHapticEngine({hybrid(5, 5000, kPrefixed, 3, 170)}, 10000)
                        .isOk());
        EXPECT_THAT(
                kernel.calls(),
                ElementsAre("open " + node + " O_RDWR",
                            "write " + node + " \"4 5 5000 #3 170\\n\" = " + std::to_string(taken),
                            "close " + node));
        EXPECT_EQ(log.lines().back(), "I V_4_0: performHybridHapticEngine OK");
        EXPECT_THAT(log.lines(), Not(Contains(HasSubstr("do_on"))));
    }
}

TEST_F(HybridRequest, FailingWriteIsOkWithoutVibration) {
    const auto extension = makeExtension();
    for (const int error : {EIO, ENODEV, EAGAIN, ENOSPC}) {
        kernel.clear();
        kernel.addFault({.path = node, .operation = Operation::kWrite, .error = error});
        EXPECT_TRUE(extension->performHybridHapticEngine({}, 10000).isOk());
        EXPECT_EQ(kernel.calls().size(), 3U);
        EXPECT_EQ(log.lines().back(), "I V_4_0: performHybridHapticEngine OK");
        EXPECT_THAT(log.lines(), Not(Contains(HasSubstr("do_on"))));
    }
}

}  // namespace
}  // namespace aidl::vendor::quorvan::hardware::vibrator
