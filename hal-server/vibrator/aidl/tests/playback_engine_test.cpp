// SPDX-License-Identifier: Apache-2.0
//
// The extension's playback engine: sequences of stored patterns through the driver's queue.
#include <cerrno>
#include <string>
#include <vector>

#include "tests/extension_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using fake::Fault;
using fake::Operation;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

using PlaybackPackets = std::vector<ZelPlaybackPacket>;

const std::string kLedsIndex = kLeds + "cp_trigger_index";
const std::string kLedsQueue = kLeds + "cp_trigger_queue";

ZelPlaybackPacket packet(int32_t patternIndex, int32_t level, int32_t option) {
    ZelPlaybackPacket packet;
    packet.patternIndex = patternIndex;
    packet.level = level;
    packet.option = option;
    return packet;
}

class PlaybackEngine : public ExtensionTest {
  protected:
    PlaybackEngine() {
        addLedsClass();
        addNodes(kLeds, {"cp_trigger_index", "cp_trigger_queue"});
    }
};

TEST_F(PlaybackEngine, SwitchesToTheQueueFillsItAndStarts) {
    const auto extension = makeExtension();
    EXPECT_TRUE(extension->performPlaybackEngine({packet(5, 100, 0), packet(7, 80, 3)}, true, 0)
                        .isOk());
    EXPECT_THAT(
            kernel.calls(),
            ElementsAre("open " + kLedsIndex + " O_RDWR", "write " + kLedsIndex + " \"65534\\n\"",
                        "close " + kLedsIndex, "open " + kLedsQueue + " O_RDWR",
                        "write " + kLedsQueue + " \"5.100,7.80,3,~\\0\"", "close " + kLedsQueue,
                        "open /sys/class/leds/vibrator/state O_RDWR",
                        "write /sys/class/leds/vibrator/state \"1\\n\"",
                        "close /sys/class/leds/vibrator/state",
                        "open /sys/class/leds/vibrator/duration O_RDWR",
                        "write /sys/class/leds/vibrator/duration \"1000\\n\"",
                        "close /sys/class/leds/vibrator/duration",
                        "open /sys/class/leds/vibrator/activate O_RDWR",
                        "write /sys/class/leds/vibrator/activate \"1\\n\"",
                        "close /sys/class/leds/vibrator/activate"));
    EXPECT_THAT(log.lines(),
                ElementsAre("I V_4_0: performPlaybackEngine",
                            "I V_4_0: performPlaybackEngine packet_cnt : 2",
                            "I V_4_0: performPlaybackEngine repeat : 1",
                            "I V_4_0: performPlaybackEngine repeatCnt : 0",
                            "I V_4_0: Packet data size with repeat option : 15",
                            "I V_4_0: Packet data with repeat option : 5.100,7.80,3,~",
                            "I HW_API: >> writeNode node:/leds/vibrator/cp_trigger_index val:65534",
                            "I HW_API: << writeNode node OK : 6", "I V_4_0: ret : 15",
                            "I HW_API: do_on for timeoutMs: 1000",
                            "I HW_API: >> writeNode node:/leds/vibrator/state val:1",
                            "I HW_API: << writeNode node OK : 2",
                            "I HW_API: >> writeNode node:/leds/vibrator/duration val:1000",
                            "I HW_API: << writeNode node OK : 5",
                            "I HW_API: >> writeNode node:/leds/vibrator/activate val:1",
                            "I HW_API: << writeNode node OK : 2",
                            "I V_4_0: performPlaybackEngine end"));
}

struct Sequence {
    const char* name;
    PlaybackPackets packets;
    bool repeat;
    int32_t repeatCnt;
    const char* text;  // without the zero byte
};

class PlaybackSequence : public PlaybackEngine, public testing::WithParamInterface<Sequence> {};

TEST_P(PlaybackSequence, IsThisTextAndAZeroByte) {
    const auto extension = makeExtension();
    const Sequence& sequence = GetParam();
    EXPECT_TRUE(
            extension->performPlaybackEngine(sequence.packets, sequence.repeat, sequence.repeatCnt)
                    .isOk());
    EXPECT_EQ(kernel.text(kLedsQueue), sequence.text + std::string(1, '\0'));
    EXPECT_EQ(log.line(5),
              std::string("I V_4_0: Packet data with repeat option : ") + sequence.text);
}

const Sequence kSequences[] = {
        {"OnePacketOnce", {packet(5, 100, 0)}, false, 0, "5.100"},
        {"OnceWhateverTheCount", {packet(5, 100, 0)}, false, 7, "5.100"},
        {"OnceWithANegativeCount", {packet(5, 100, 0)}, false, -5, "5.100"},
        {"OnceWithTheSmallestCount", {packet(5, 100, 0)}, false, kIntMin, "5.100"},
        {"OptionAtTheEnd", {packet(5, 100, 0), packet(7, 80, 3)}, false, 0, "5.100,7.80,3"},
        {"OptionInTheMiddle", {packet(7, 80, 3), packet(5, 100, 0)}, false, 0, "7.80,3,5.100"},
        {"Endless", {packet(5, 100, 0), packet(7, 80, 3)}, true, 0, "5.100,7.80,3,~"},
        {"Twice", {packet(5, 100, 0)}, true, 2, "5.100,2!"},
        {"OnceByCount", {packet(5, 100, 0)}, true, 1, "5.100,1!"},
        {"LargestCount", {packet(5, 100, 0)}, true, kIntMax, "5.100,2147483647!"},
        {"NegativeOption", {packet(3, 50, -1), packet(4, 60, 0)}, false, 0, "3.50,-1,4.60"},
        {"Zeros", {packet(0, 0, 0)}, false, 0, "0.0"},
        {"SmallestNumbers",
         {packet(kIntMin, kIntMin, kIntMin)},
         true,
         3,
         "-2147483648.-2147483648,-2147483648,3!"},
        {"LargestNumbers",
         {packet(kIntMax, kIntMax, kIntMax)},
         false,
         0,
         "2147483647.2147483647,2147483647"},
};

INSTANTIATE_TEST_SUITE_P(Extension, PlaybackSequence, testing::ValuesIn(kSequences),
                         rowName<Sequence>);

TEST_F(PlaybackEngine, TwoHundredPacketsAreAccepted) {
    const auto extension = makeExtension();
    EXPECT_TRUE(extension->performPlaybackEngine(PlaybackPackets(200), true, 0).isOk());
    EXPECT_EQ(kernel.text(kLedsQueue).size(), 802U);
    EXPECT_EQ(log.line(4), "I V_4_0: Packet data size with repeat option : 802");
}

TEST_F(PlaybackEngine, LongestSequenceIsNeverCut) {
    const auto extension = makeExtension();
    EXPECT_TRUE(
            extension
                    ->performPlaybackEngine(PlaybackPackets(200, packet(kIntMin, kIntMin, kIntMin)),
                                            true, kIntMax)
                    .isOk());
    std::string expected;
    for (int i = 0; i < 200; ++i) expected += "-2147483648.-2147483648,-2147483648,";
    expected += "2147483647!";
    expected += '\0';
    EXPECT_EQ(kernel.text(kLedsQueue), expected);
    EXPECT_EQ(log.line(4), "I V_4_0: Packet data size with repeat option : 7212");
}

TEST_F(PlaybackEngine, NoPacketsAndMoreThan200AreAnIllegalArgument) {
    const auto extension = makeExtension();
    for (const size_t count : {0U, 201U, 10000U}) {
        log.clear();
        EXPECT_EQ(exceptionOf(extension->performPlaybackEngine(PlaybackPackets(count), false, -5)),
                  EX_ILLEGAL_ARGUMENT)
                << count;
        EXPECT_THAT(
                log.lines(),
                ElementsAre("I V_4_0: performPlaybackEngine",
                            "I V_4_0: performPlaybackEngine packet_cnt : " + std::to_string(count),
                            "I V_4_0: performPlaybackEngine repeat : 0",
                            "I V_4_0: performPlaybackEngine repeatCnt : -5",
                            "I V_4_0: performPlaybackEngine packet size is something worng"));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(PlaybackEngine, NegativeRepeatCountIsAnIllegalArgument) {
    const auto extension = makeExtension();
    for (const int32_t count : {-1, -5, kIntMin}) {
        log.clear();
        EXPECT_EQ(exceptionOf(extension->performPlaybackEngine(PlaybackPackets(1), true, count)),
                  EX_ILLEGAL_ARGUMENT);
        EXPECT_THAT(
                log.lines(),
                ElementsAre("I V_4_0: performPlaybackEngine",
                            "I V_4_0: performPlaybackEngine packet_cnt : 1",
                            "I V_4_0: performPlaybackEngine repeat : 1",
                            "I V_4_0: performPlaybackEngine repeatCnt : " + std::to_string(count),
                            "I V_4_0: performPlaybackEngine repeatCnt minus. It's worng."));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(PlaybackEngine, CountOfPacketsIsLookedAtBeforeTheRepeatCount) {
    const auto extension = makeExtension();
    EXPECT_EQ(exceptionOf(extension->performPlaybackEngine({}, true, -1)), EX_ILLEGAL_ARGUMENT);
    EXPECT_EQ(log.lines().back(), "I V_4_0: performPlaybackEngine packet size is something worng");
}

// One failure of the driver while it gets "5.100": what was written, and the service's last lines.
struct PlaybackFailure {
    const char* name;
    Fault fault;
    std::vector<std::string> writes;
    std::vector<std::string> lines;  // from the service's own
};

class FailingPlayback : public PlaybackEngine,
                        public testing::WithParamInterface<PlaybackFailure> {};

TEST_P(FailingPlayback, IsAnIllegalStateAndLeavesWhatWasWritten) {
    const auto extension = makeExtension();
    kernel.addFault(GetParam().fault);
    EXPECT_EQ(exceptionOf(extension->performPlaybackEngine({packet(5, 100, 0)}, false, 0)),
              EX_ILLEGAL_STATE);
    EXPECT_EQ(kernel.writes(), GetParam().writes);
    std::vector<std::string> lines;
    for (const std::string& line : log.lines()) {
        if (line.starts_with("I V_4_0: ")) lines.push_back(line);
    }
    EXPECT_EQ(std::vector(lines.begin() + 6, lines.end()), GetParam().lines);
}

const std::string kSwitched = kLedsIndex + " \"65534\\n\"";
const std::string kQueued = kLedsQueue + " \"5.100\\0\"";

const PlaybackFailure kFailures[] = {
        {"SwitchOpen",
         {.path = kLedsIndex, .operation = Operation::kOpen, .error = EACCES},
         {},
         {"I V_4_0: performPlaybackEngine write 0xFFFE fail"}},
        {"SwitchWrite",
         {.path = kLedsIndex, .operation = Operation::kWrite, .error = EIO},
         {},
         {"I V_4_0: performPlaybackEngine write 0xFFFE fail"}},
        {"SwitchShort",
         {.path = kLedsIndex, .operation = Operation::kWrite, .limit = 5},
         {kLedsIndex + " \"65534\""},
         {"I V_4_0: performPlaybackEngine write 0xFFFE fail"}},
        {"QueueOpen",
         {.path = kLedsQueue, .operation = Operation::kOpen, .error = ENOENT},
         {kSwitched},
         {"I V_4_0: performPlaybackEngine is fail: 2"}},
        {"QueueWrite",
         {.path = kLedsQueue, .operation = Operation::kWrite, .error = EIO},
         {kSwitched},
         {"I V_4_0: ret : -1", "I V_4_0: performPlaybackEngine repeat error"}},
        {"QueueTakesAllButTheZeroByte",
         {.path = kLedsQueue, .operation = Operation::kWrite, .limit = 5},
         {kSwitched, kLedsQueue + " \"5.100\""},
         {"I V_4_0: ret : 5", "I V_4_0: performPlaybackEngine repeat error"}},
        {"StartState",
         {.path = kLeds + "state", .operation = Operation::kWrite, .error = EIO},
         {kSwitched, kQueued},
         {"I V_4_0: ret : 6", "I V_4_0: performPlaybackEngine on Trigger fail"}},
        {"StartActivate",
         {.path = kLeds + "activate", .operation = Operation::kOpen, .error = EACCES},
         {kSwitched, kQueued, kLeds + "state \"1\\n\"", kLeds + "duration \"1000\\n\""},
         {"I V_4_0: ret : 6", "I V_4_0: performPlaybackEngine on Trigger fail"}},
};

INSTANTIATE_TEST_SUITE_P(Extension, FailingPlayback, testing::ValuesIn(kFailures),
                         rowName<PlaybackFailure>);

TEST_F(PlaybackEngine, InterruptedCallsAreRepeated) {
    const auto extension = makeExtension();
    for (const std::string& node : {kLedsIndex, kLedsQueue, kLeds + "state"}) {
        kernel.addFault({.path = node, .operation = Operation::kOpen, .error = EINTR, .times = 2});
        kernel.addFault({.path = node, .operation = Operation::kWrite, .error = EINTR, .times = 2});
    }
    EXPECT_TRUE(extension->performPlaybackEngine({packet(5, 100, 0)}, false, 0).isOk());
    EXPECT_EQ(kernel.text(kLedsQueue), std::string("5.100\0", 6));
}

TEST_F(PlaybackEngine, OnForceFeedbackHasNoQueueAndIsAnIllegalState) {
    removeLedsClass();
    addForceFeedback();
    const auto extension = makeExtension();
    EXPECT_EQ(exceptionOf(extension->performPlaybackEngine({packet(5, 100, 0)}, false, 0)),
              EX_ILLEGAL_STATE);
    EXPECT_EQ(log.lines().back(), "I V_4_0: performPlaybackEngine write 0xFFFE fail");
    EXPECT_THAT(kernel.calls(), ElementsAre("open  O_RDWR = ENOENT"));
}

}  // namespace
}  // namespace aidl::vendor::quorvan::hardware::vibrator
