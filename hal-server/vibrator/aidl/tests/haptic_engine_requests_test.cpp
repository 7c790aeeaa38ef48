// SPDX-License-Identifier: Apache-2.0
//
// The extension's haptic-engine requests: packets, FIFO patterns, and what hybrid packets have in
// common with them.
#include <cerrno>
#include <string>
#include <vector>

#include "tests/extension_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using fake::Operation;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

using EnginePackets = std::vector<ZelHapticEnginePacket>;

ZelHapticEnginePacket packet(int32_t time, int32_t intensity, int32_t frequency,
                             int32_t overdrive) {
    ZelHapticEnginePacket packet;
    packet.time = time;
    packet.intensity = intensity;
    packet.frequency = frequency;
    packet.overdrive = overdrive;
    return packet;
}

// What both packet requests have in common. Each row plays `count` packets of zeros.
struct Request {
    const char* name;
    ndk::ScopedAStatus (*play)(Vibrator& extension, size_t count, int32_t amplitude);
    const char* leaf;
};

ndk::ScopedAStatus playPackets(Vibrator& extension, size_t count, int32_t amplitude) {
    return extension.performHapticEngine(EnginePackets(count), amplitude);
}

ndk::ScopedAStatus playHybridPackets(Vibrator& extension, size_t count, int32_t amplitude) {
    return extension.performHybridHapticEngine(std::vector<ZelHybridHapticEnginePacket>(count),
                                               amplitude);
}

const Request kRequests[] = {
        {"performHapticEngine", playPackets, "haptic_engine"},
        {"performHybridHapticEngine", playHybridPackets, "hybrid_haptic_engine"},
};

class PacketRequest : public ExtensionTest, public testing::WithParamInterface<Request> {
  protected:
    PacketRequest() {
        addLedsClass();
        kernel.addNode(node, "unset");
    }

    binder_exception_t play(Vibrator& extension, size_t count, int32_t amplitude) {
        return exceptionOf(GetParam().play(extension, count, amplitude));
    }

    // The lines from the method's name to its string.
    std::vector<std::string> linesOfOnePacket() const {
        return {line,
                line + " amplitude : 5000",
                line + " packet_cnt : 1",
                line + " total_size : 4",
                line + " : 4 0 0 0 0",
                "I "};  // the string's newline begins a record of its own
    }

    const std::string node = kLeds + GetParam().leaf;
    const std::string line = std::string("I V_4_0: ") + GetParam().name;
    const std::string opened = "open " + node + " O_RDWR";
    const std::string written = "write " + node + " \"4 0 0 0 0\\n\"";
    const std::string closed = "close " + node;
};

TEST_P(PacketRequest, IsWrittenInOneCallAndTheMotorStartedForAMillisecond) {
    const auto extension = makeExtension();
    EXPECT_EQ(play(*extension, 1, 5000), EX_NONE);
    EXPECT_THAT(kernel.calls(),
                ElementsAre(opened, written, closed, "open /sys/class/leds/vibrator/state O_RDWR",
                            "write /sys/class/leds/vibrator/state \"1\\n\"",
                            "close /sys/class/leds/vibrator/state",
                            "open /sys/class/leds/vibrator/duration O_RDWR",
                            "write /sys/class/leds/vibrator/duration \"1\\n\"",
                            "close /sys/class/leds/vibrator/duration",
                            "open /sys/class/leds/vibrator/activate O_RDWR",
                            "write /sys/class/leds/vibrator/activate \"1\\n\"",
                            "close /sys/class/leds/vibrator/activate"));
    std::vector<std::string> lines = linesOfOnePacket();
    lines.insert(lines.end(), {"I HW_API: do_on for timeoutMs: 1",
                               "I HW_API: >> writeNode node:/leds/vibrator/state val:1",
                               "I HW_API: << writeNode node OK : 2",
                               "I HW_API: >> writeNode node:/leds/vibrator/duration val:1",
                               "I HW_API: << writeNode node OK : 2",
                               "I HW_API: >> writeNode node:/leds/vibrator/activate val:1",
                               "I HW_API: << writeNode node OK : 2", line + " OK"});
    EXPECT_EQ(log.lines(), lines);
}

TEST_P(PacketRequest, EmptyListIsZeroAndStartsTheMotor) {
    const auto extension = makeExtension();
    EXPECT_EQ(play(*extension, 0, 10000), EX_NONE);
    EXPECT_EQ(kernel.text(node), "0\n");
    EXPECT_EQ(kernel.text(kLeds + "activate"), "1\n");
}

TEST_P(PacketRequest, AmplitudeOutOfRangeIsAnIllegalArgumentAndNothingIsWritten) {
    const auto extension = makeExtension();
    for (const int32_t amplitude : {0, -1, 10001, 65537, kIntMin, kIntMin + 1, kIntMax}) {
        log.clear();
        EXPECT_EQ(play(*extension, 2, amplitude), EX_ILLEGAL_ARGUMENT) << amplitude;
        const std::string number = std::to_string(amplitude);
        EXPECT_THAT(log.lines(), ElementsAre(line, line + " amplitude : " + number,
                                             line + " packet_cnt : 2", line + " total_size : 8",
                                             line + " amplitude is abnormal " + number));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_P(PacketRequest, SmallestAndLargestAmplitudeAreAccepted) {
    const auto extension = makeExtension();
    EXPECT_EQ(play(*extension, 1, 1), EX_NONE);
    EXPECT_EQ(play(*extension, 1, 10000), EX_NONE);
}

TEST_P(PacketRequest, Of339PacketsIsAccepted) {
    const auto extension = makeExtension();
    EXPECT_EQ(play(*extension, 339, 5000), EX_NONE);
    EXPECT_EQ(kernel.text(node).size(), 2717U);  // "1356" and 1356 times " 0", and the newline
    EXPECT_EQ(kernel.text(node).substr(0, 9), "1356 0 0 ");
}

TEST_P(PacketRequest, OfMorePacketsIsAnIllegalArgumentBeforeTheAmplitude) {
    const auto extension = makeExtension();
    const struct {
        size_t packets;
        const char* count;
        const char* size;
    } requests[] = {{340, "340", "1360"}, {10000, "10000", "40000"}};
    for (const auto& [packets, count, size] : requests) {
        log.clear();
        EXPECT_EQ(play(*extension, packets, 0), EX_ILLEGAL_ARGUMENT);
        EXPECT_THAT(log.lines(),
                    ElementsAre(line, line + " amplitude : 0", line + " packet_cnt : " + count,
                                line + " total_size : " + size, line + " packet size is exceed"));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_P(PacketRequest, NodeThatDoesNotOpenIsLoggedWithItsErrorAndAnIllegalState) {
    kernel.removeNode(node);
    const auto extension = makeExtension();
    EXPECT_EQ(play(*extension, 1, 5000), EX_ILLEGAL_STATE);
    std::vector<std::string> lines = linesOfOnePacket();
    lines.push_back(line + " is fail: 2");
    EXPECT_EQ(log.lines(), lines);
    kernel.addNode(node, "unset", fake::Access::kReadOnly);
    EXPECT_EQ(play(*extension, 1, 5000), EX_ILLEGAL_STATE);
    EXPECT_EQ(log.lines().back(), line + " is fail: 13");
    EXPECT_THAT(kernel.writes(), IsEmpty());
}

TEST_P(PacketRequest, InterruptedCallsAreRepeated) {
    const auto extension = makeExtension();
    kernel.addFault({.path = node, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    kernel.addFault({.path = node, .operation = Operation::kWrite, .error = EINTR, .times = 2});
    EXPECT_EQ(play(*extension, 1, 5000), EX_NONE);
    const std::vector<std::string> calls = kernel.calls();
    EXPECT_THAT(std::vector(calls.begin(), calls.begin() + 7),
                ElementsAre(opened + " = EINTR", opened + " = EINTR", opened, written + " = EINTR",
                            written + " = EINTR", written, closed));
    EXPECT_EQ(kernel.text(kLeds + "activate"), "1\n");
}

TEST_P(PacketRequest, MotorThatDoesNotStartIsNotReported) {
    const auto extension = makeExtension();
    kernel.addFault({.path = kLeds + "state", .operation = Operation::kWrite, .error = EIO});
    EXPECT_EQ(play(*extension, 1, 5000), EX_NONE);
    EXPECT_EQ(log.lines().back(), line + " OK");
    EXPECT_EQ(kernel.text(node), "4 0 0 0 0\n");
}

TEST_P(PacketRequest, OnTheLegacyClassTheNodesAreTheLegacyOnes) {
    removeLedsClass();
    addLegacyClass();
    kernel.addNode(kLegacy + GetParam().leaf);
    const auto extension = makeExtension();
    EXPECT_EQ(play(*extension, 1, 5000), EX_NONE);
    EXPECT_THAT(kernel.writes(), ElementsAre(kLegacy + GetParam().leaf + " \"4 0 0 0 0\\n\"",
                                             "/sys/class/timed_output/vibrator/enable \"1\\n\""));
}

INSTANTIATE_TEST_SUITE_P(Extension, PacketRequest, testing::ValuesIn(kRequests), rowName<Request>);

class HapticEngineRequest : public ExtensionTest {
  protected:
    HapticEngineRequest() {
        addLedsClass();
        kernel.addNode(node, "unset");
    }

    std::string textOf(const EnginePackets& packets, int32_t amplitude) {
        EXPECT_TRUE(makeExtension()->performHapticEngine(packets, amplitude).isOk());
        return kernel.text(node);
    }

    const std::string node = kLeds + "haptic_engine";
};

TEST_F(HapticEngineRequest, FieldsFollowInTheirOrderAndIntensitiesAreScaled) {
    EXPECT_EQ(textOf({packet(7, 10000, 2050, 0)}, 10000), "4 7 10000 2050 0\n");
    EXPECT_EQ(textOf({packet(1, 2000, 3, 4), packet(5, 6000, 7, 8)}, 5000),
              "8 1 1000 3 4 5 3000 7 8\n");
}

TEST_F(HapticEngineRequest, IntensityIsRoundedTowardZero) {
    EXPECT_EQ(textOf({packet(0, 9999, 0, 0)}, 1), "4 0 0 0 0\n");
    EXPECT_EQ(textOf({packet(0, 10000, 0, 0)}, 1), "4 0 1 0 0\n");
    EXPECT_EQ(textOf({packet(0, -9999, 0, 0)}, 1), "4 0 0 0 0\n");
    EXPECT_EQ(textOf({packet(0, -15000, 0, 0)}, 1), "4 0 -1 0 0\n");
}

TEST_F(HapticEngineRequest, ProductKeepsItsLow32Bits) {
    EXPECT_EQ(textOf({packet(0, 214749, 0, 0)}, 10000), "4 0 -214747 0 0\n");
    EXPECT_EQ(textOf({packet(0, kIntMax, 0, 0)}, 10000), "4 0 -1 0 0\n");
    EXPECT_EQ(textOf({packet(0, kIntMin, 0, 0)}, 10000), "4 0 0 0 0\n");
    EXPECT_EQ(textOf({packet(0, kIntMin, 0, 0)}, 9999), "4 0 -214748 0 0\n");
}

TEST_F(HapticEngineRequest, NumbersAreCutToNineCharactersTheirBlankIncluded) {
    EXPECT_EQ(textOf({packet(12345678, 0, -1234567, 0)}, 1), "4 12345678 0 -1234567 0\n");
    EXPECT_EQ(textOf({packet(123456789, 0, 1234567890, 0)}, 1), "4 1234567890 1234567890\n");
    EXPECT_EQ(textOf({packet(kIntMin, 0, kIntMax, 5)}, 1), "4 -214748360 2147483645\n");
    EXPECT_EQ(textOf({packet(1, 0, 2, kIntMax)}, 1), "4 1 0 2 21474836\n");
}

TEST_F(HapticEngineRequest, FailingWriteIsAnIllegalStateAndStartsNothing) {
    const auto extension = makeExtension();
    for (const fake::Fault& fault :
         {fake::Fault{.path = node, .operation = Operation::kWrite, .error = EIO},
          fake::Fault{.path = node, .operation = Operation::kWrite, .limit = 9},
          fake::Fault{.path = node, .operation = Operation::kWrite, .result = 11}}) {
        kernel.clear();
        kernel.addFault(fault);
        EXPECT_EQ(exceptionOf(extension->performHapticEngine(EnginePackets(1), 5000)),
                  EX_ILLEGAL_STATE);
        EXPECT_EQ(kernel.calls().size(), 3U);
        EXPECT_EQ(kernel.calls().back(), "close " + node);
        EXPECT_EQ(log.lines().back(), "I V_4_0: performHapticEngine UNKNOWN_ERROR");
    }
}

class RequestOnForceFeedback : public ExtensionTest {
  protected:
    RequestOnForceFeedback() { addForceFeedback(); }
};

TEST_F(RequestOnForceFeedback, PacketsAreRefusedSoftly) {
    const auto extension = makeExtension();
    EXPECT_TRUE(extension->performHapticEngine({packet(7, 10000, 2050, 0)}, 5000).isOk());
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_THAT(log.lines(),
                ElementsAre("I V_4_0: performHapticEngine",
                            "I V_4_0: performHapticEngine amplitude : 5000",
                            "I V_4_0: performHapticEngine packet_cnt : 1",
                            "I V_4_0: performHapticEngine total_size : 4",
                            "I V_4_0: performHapticEngine : 4 7 5000 2050 0", "I ",
                            "I V_4_0: performHapticEngine Fail - unsupported when forcefeedback"));
}

TEST_F(RequestOnForceFeedback, BadPacketArgumentsAreStillIllegal) {
    const auto extension = makeExtension();
    EXPECT_EQ(exceptionOf(extension->performHapticEngine({}, 0)), EX_ILLEGAL_ARGUMENT);
    EXPECT_EQ(exceptionOf(extension->performHapticEngine(EnginePackets(340), 1)),
              EX_ILLEGAL_ARGUMENT);
}

TEST_F(RequestOnForceFeedback, HybridPacketsAndFifoHaveNoNodeAndAreAnIllegalState) {
    const auto extension = makeExtension();
    EXPECT_EQ(exceptionOf(extension->performHybridHapticEngine({}, 5000)), EX_ILLEGAL_STATE);
    EXPECT_EQ(log.lines().back(), "I V_4_0: performHybridHapticEngine is fail: 2");
    EXPECT_EQ(exceptionOf(extension->performFifoHapticEngine(ZelFifoType::PATTERN_0)),
              EX_ILLEGAL_STATE);
    EXPECT_THAT(kernel.calls(), ElementsAre("open  O_RDWR = ENOENT", "open  O_RDWR = ENOENT"));
}

class FifoRequest : public ExtensionTest {
  protected:
    FifoRequest() {
        addLedsClass();
        kernel.addNode(node, "unset");
    }

    binder_exception_t play(Vibrator& extension, int32_t type) {
        return exceptionOf(extension.performFifoHapticEngine(static_cast<ZelFifoType>(type)));
    }

    const std::string node = kLeds + "fifo";
};

TEST_F(FifoRequest, EveryTypeIsWrittenAndNothingStarted) {
    const auto extension = makeExtension();
    for (int32_t type = 0; type <= 25; ++type) {
        kernel.clear();
        log.clear();
        const std::string number = std::to_string(type);
        EXPECT_EQ(play(*extension, type), EX_NONE) << type;
        EXPECT_THAT(kernel.calls(),
                    ElementsAre("open " + node + " O_RDWR",
                                "write " + node + " \"" + number + "\\n\"", "close " + node));
        EXPECT_THAT(log.lines(),
                    ElementsAre("I V_4_0: performFifoHapticEngine",
                                "I HW_API: >> writeNode node:/leds/vibrator/fifo val:" + number,
                                type < 10 ? "I HW_API: << writeNode node OK : 2"
                                          : "I HW_API: << writeNode node OK : 3",
                                "I V_4_0: performFIFOHapticEngine OK"));
    }
}

TEST_F(FifoRequest, OtherTypesAreAnIllegalArgumentAndNothingIsWritten) {
    const auto extension = makeExtension();
    for (const int32_t type : {26, 27, -1, kIntMin, kIntMax}) {
        log.clear();
        EXPECT_EQ(play(*extension, type), EX_ILLEGAL_ARGUMENT) << type;
        EXPECT_THAT(log.lines(), ElementsAre("I V_4_0: performFifoHapticEngine",
                                             "I V_4_0: performFifoHapticEngine is abnormal " +
                                                     std::to_string(type)));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(FifoRequest, FailingDriverIsAnIllegalStateWithoutALineOfItsOwn) {
    const struct {
        fake::Fault fault;
        const char* line;
    } failures[] = {
            {{.path = node, .operation = Operation::kOpen, .error = ENOENT},
             "I HW_API: node: /sys/class/leds/vibrator/fifoerrno: 2"},
            {{.path = node, .operation = Operation::kWrite, .error = EIO},
             "I HW_API: << writeNode node UNKNOWN_ERROR : 3 , -1"},
            {{.path = node, .operation = Operation::kWrite, .limit = 2},
             "I HW_API: << writeNode node UNKNOWN_ERROR : 3 , 2"},
    };
    const auto extension = makeExtension();
    for (const auto& [fault, line] : failures) {
        log.clear();
        kernel.addFault(fault);
        EXPECT_EQ(play(*extension, 25), EX_ILLEGAL_STATE);
        EXPECT_THAT(log.lines(),
                    ElementsAre("I V_4_0: performFifoHapticEngine",
                                "I HW_API: >> writeNode node:/leds/vibrator/fifo val:25", line));
    }
}

TEST_F(FifoRequest, InterruptedCallsAreRepeated) {
    const auto extension = makeExtension();
    kernel.addFault({.path = node, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    kernel.addFault({.path = node, .operation = Operation::kWrite, .error = EINTR, .times = 2});
    EXPECT_EQ(play(*extension, 25), EX_NONE);
    EXPECT_EQ(kernel.text(node), "25\n");
}

}  // namespace
}  // namespace aidl::vendor::quorvan::hardware::vibrator
