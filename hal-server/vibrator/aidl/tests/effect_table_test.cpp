// SPDX-License-Identifier: Apache-2.0
//
// Every cell of the effect table: what each effect writes on each kind of phone, in order, and the
// length that is reported, whether the driver goes along or not.
#include <cerrno>
#include <ostream>
#include <string>
#include <vector>

#include "tests/force_feedback_phone.h"
#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Operation;
using ::testing::ElementsAre;
using ::testing::ElementsAreArray;
using ::testing::IsEmpty;
using ::testing::Values;
using ::testing::ValuesIn;

constexpr int kOutOfRange[] = {0, 10001, 2147483647, -1, -2147483647 - 1};

constexpr char kDoubleClickIsOver[] =
        "I HW_API: End perform on another thread - performEffect_DOUBLE_CLICK";

struct Phone {
    const char* directory;
    const char* effectNode;  // beside "intensity"; null: no further node
    const char* startNode;   // written last when the motor is started
};

constexpr Phone kLegacyIndex = {"/sys/class/timed_output/vibrator/", "cp_trigger_index", "enable"};
constexpr Phone kLegacyPacket = {"/sys/class/timed_output/vibrator/", "haptic_engine", "enable"};
constexpr Phone kLegacyAmplitude = {"/sys/class/timed_output/vibrator/", nullptr, "enable"};
constexpr Phone kLedsIndex = {"/sys/class/leds/vibrator/", "cp_trigger_index", "activate"};
constexpr Phone kLedsPacket = {"/sys/class/leds/vibrator/", "haptic_engine", "activate"};
constexpr Phone kLedsAmplitude = {"/sys/class/leds/vibrator/", nullptr, "activate"};

// How the cell plays, which decides what becomes of a driver that fails.
enum class Way { kPattern, kPulse, kPacket, kDoubleClick };

struct Cell {
    const char* name;
    Phone phone;
    Effect effect;
    const char* effectName;
    int durationMs;
    Way way;
    std::vector<std::string> writes;  // at amplitude 6700: leaf and quoted data
};

void PrintTo(const Cell& cell, std::ostream* out) {
    *out << cell.name;
}

// clang-format off
const Cell kCells[] = {
    {"LegacyIndexClick", kLegacyIndex, Effect::CLICK, "CLICK", 60, Way::kPattern,
     {R"(intensity "6700\n")", R"(cp_trigger_index "10\n")", R"(enable "1000\n")"}},
    {"LegacyIndexDoubleClick", kLegacyIndex, Effect::DOUBLE_CLICK, "DOUBLE_CLICK", 110, Way::kPattern,
     {R"(intensity "6700\n")", R"(cp_trigger_index "14\n")", R"(enable "1000\n")"}},
    {"LegacyIndexTick", kLegacyIndex, Effect::TICK, "TICK", 60, Way::kPattern,
     {R"(intensity "6700\n")", R"(cp_trigger_index "50\n")", R"(enable "1000\n")"}},
    {"LegacyIndexHeavyClick", kLegacyIndex, Effect::HEAVY_CLICK, "HEAVY_CLICK", 110, Way::kPattern,
     {R"(intensity "6700\n")", R"(cp_trigger_index "23\n")", R"(enable "1000\n")"}},

    {"LegacyPacketClick", kLegacyPacket, Effect::CLICK, "CLICK", 17, Way::kPulse,
     {R"(intensity "6700\n")", R"(enable "7\n")"}},
    {"LegacyPacketDoubleClick", kLegacyPacket, Effect::DOUBLE_CLICK, "DOUBLE_CLICK", 95, Way::kDoubleClick,
     {R"(intensity "6700\n")", R"(enable "0\n")", R"(enable "10\n")", R"(enable "15\n")"}},
    {"LegacyPacketTick", kLegacyPacket, Effect::TICK, "TICK", 17, Way::kPacket,
     {R"(haptic_engine "4 7 4489 2050 0\n")", R"(enable "1\n")"}},
    {"LegacyPacketHeavyClick", kLegacyPacket, Effect::HEAVY_CLICK, "HEAVY_CLICK", 17, Way::kPacket,
     {R"(haptic_engine "4 7 4489 2000 1\n")", R"(enable "1\n")"}},

    {"LegacyAmplitudeClick", kLegacyAmplitude, Effect::CLICK, "CLICK", 17, Way::kPulse,
     {R"(intensity "6700\n")", R"(enable "7\n")"}},
    {"LegacyAmplitudeDoubleClick", kLegacyAmplitude, Effect::DOUBLE_CLICK, "DOUBLE_CLICK", 95, Way::kDoubleClick,
     {R"(intensity "6700\n")", R"(enable "0\n")", R"(enable "10\n")", R"(enable "15\n")"}},
    {"LegacyAmplitudeTick", kLegacyAmplitude, Effect::TICK, "TICK", 17, Way::kPulse,
     {R"(intensity "6700\n")", R"(enable "7\n")"}},
    {"LegacyAmplitudeHeavyClick", kLegacyAmplitude, Effect::HEAVY_CLICK, "HEAVY_CLICK", 17, Way::kPulse,
     {R"(intensity "6700\n")", R"(enable "7\n")"}},

    {"LedsIndexClick", kLedsIndex, Effect::CLICK, "CLICK", 60, Way::kPattern,
     {R"(intensity "6700\n")", R"(cp_trigger_index "10\n")",
      R"(state "1\n")", R"(duration "1000\n")", R"(activate "1\n")"}},
    {"LedsIndexDoubleClick", kLedsIndex, Effect::DOUBLE_CLICK, "DOUBLE_CLICK", 110, Way::kPattern,
     {R"(intensity "6700\n")", R"(cp_trigger_index "14\n")",
      R"(state "1\n")", R"(duration "1000\n")", R"(activate "1\n")"}},
    {"LedsIndexTick", kLedsIndex, Effect::TICK, "TICK", 60, Way::kPattern,
     {R"(intensity "6700\n")", R"(cp_trigger_index "50\n")",
      R"(state "1\n")", R"(duration "1000\n")", R"(activate "1\n")"}},
    {"LedsIndexHeavyClick", kLedsIndex, Effect::HEAVY_CLICK, "HEAVY_CLICK", 110, Way::kPattern,
     {R"(intensity "6700\n")", R"(cp_trigger_index "23\n")",
      R"(state "1\n")", R"(duration "1000\n")", R"(activate "1\n")"}},

    {"LedsPacketClick", kLedsPacket, Effect::CLICK, "CLICK", 17, Way::kPulse,
     {R"(intensity "6700\n")", R"(state "1\n")", R"(duration "7\n")", R"(activate "1\n")"}},
    {"LedsPacketDoubleClick", kLedsPacket, Effect::DOUBLE_CLICK, "DOUBLE_CLICK", 95, Way::kDoubleClick,
     {R"(intensity "6700\n")", R"(activate "0\n")",
      R"(state "1\n")", R"(duration "10\n")", R"(activate "1\n")",
      R"(state "1\n")", R"(duration "15\n")", R"(activate "1\n")"}},
    {"LedsPacketTick", kLedsPacket, Effect::TICK, "TICK", 17, Way::kPacket,
     {R"(haptic_engine "4 7 4489 2050 0\n")",
      R"(state "1\n")", R"(duration "1\n")", R"(activate "1\n")"}},
    {"LedsPacketHeavyClick", kLedsPacket, Effect::HEAVY_CLICK, "HEAVY_CLICK", 17, Way::kPacket,
     {R"(haptic_engine "4 7 4489 2000 1\n")",
      R"(state "1\n")", R"(duration "1\n")", R"(activate "1\n")"}},

    {"LedsAmplitudeClick", kLedsAmplitude, Effect::CLICK, "CLICK", 17, Way::kPulse,
     {R"(intensity "6700\n")", R"(state "1\n")", R"(duration "7\n")", R"(activate "1\n")"}},
    {"LedsAmplitudeDoubleClick", kLedsAmplitude, Effect::DOUBLE_CLICK, "DOUBLE_CLICK", 95, Way::kDoubleClick,
     {R"(intensity "6700\n")", R"(activate "0\n")",
      R"(state "1\n")", R"(duration "10\n")", R"(activate "1\n")",
      R"(state "1\n")", R"(duration "15\n")", R"(activate "1\n")"}},
    {"LedsAmplitudeTick", kLedsAmplitude, Effect::TICK, "TICK", 17, Way::kPulse,
     {R"(intensity "6700\n")", R"(state "1\n")", R"(duration "7\n")", R"(activate "1\n")"}},
    {"LedsAmplitudeHeavyClick", kLedsAmplitude, Effect::HEAVY_CLICK, "HEAVY_CLICK", 17, Way::kPulse,
     {R"(intensity "6700\n")", R"(state "1\n")", R"(duration "7\n")", R"(activate "1\n")"}},
};
// clang-format on

class EffectCell : public ServiceTest, public ::testing::WithParamInterface<Cell> {
  protected:
    EffectCell() {
        const Phone& phone = GetParam().phone;
        directory == kLegacy ? addLegacyClass() : addLedsClass();
        kernel.addNode(directory + "intensity");
        if (phone.effectNode != nullptr) kernel.addNode(directory + phone.effectNode);
    }

    // Plays the cell's effect, to the end of its double click.
    bool play(int amplitude) {
        const auto hwApi = makeHwApi();
        int durationMs = 3;
        const bool played = hwApi->preparePerform(GetParam().effect, amplitude, durationMs);
        EXPECT_EQ(durationMs, GetParam().durationMs);
        if (GetParam().way == Way::kDoubleClick) {
            EXPECT_TRUE(log.waitFor(kDoubleClickIsOver));
        }
        return played;
    }

    void failWrites(const std::string& leaf) {
        kernel.addFault({.path = directory + leaf,
                         .operation = Operation::kWrite,
                         .error = EIO,
                         .times = 0});
    }

    // The writes that were taken, without the directory that all of them must be in.
    std::vector<std::string> leafWrites() const {
        std::vector<std::string> leaves;
        for (const std::string& write : kernel.writes()) {
            EXPECT_EQ(write.substr(0, directory.size()), directory);
            leaves.push_back(write.substr(directory.size()));
        }
        return leaves;
    }

    const std::string directory = GetParam().phone.directory;
};

TEST_P(EffectCell, WritesItsNodesInOrderAndReportsItsLength) {
    EXPECT_TRUE(play(6700));
    EXPECT_THAT(leafWrites(), ElementsAreArray(GetParam().writes));
    EXPECT_EQ(log.lines().at(0), "I HW_API: [preparePerform]amplitude: 6700");
    EXPECT_EQ(log.lines().at(1), std::string("I HW_API: [preparePerform]") + GetParam().effectName);
}

TEST_P(EffectCell, OpensWritesAndClosesEachNodeAndAsksTheDriverNothingElse) {
    EXPECT_TRUE(play(6700));
    std::vector<std::string> expected;
    for (const std::string& write : GetParam().writes) {
        const std::string path = directory + write.substr(0, write.find(' '));
        expected.push_back("open " + path + " O_RDWR");
        expected.push_back("write " + directory + write);
        expected.push_back("close " + path);
    }
    if (GetParam().way == Way::kDoubleClick) {
        const int secondPulse = directory == kLeds ? 9 : 3;  // calls
        expected.insert(expected.end() - secondPulse, "sleep 70 ms");
    }
    EXPECT_THAT(kernel.calls(), ElementsAreArray(expected));
}

TEST_P(EffectCell, WhoseFirstNodeFailsIsRefusedWithItsLengthSet) {
    failWrites(GetParam().way == Way::kPacket ? "haptic_engine" : "intensity");
    EXPECT_FALSE(play(6700));
    if (GetParam().way != Way::kDoubleClick) {
        EXPECT_THAT(kernel.writes(), IsEmpty());
    }
}

TEST_P(EffectCell, WhoseStartFailsHasItsLengthSet) {
    failWrites(GetParam().phone.startNode);
    // Packets were taken by then, and a double click cannot be waited for.
    const bool isPlayed = GetParam().way == Way::kPacket || GetParam().way == Way::kDoubleClick;
    EXPECT_EQ(play(6700), isPlayed);
}

TEST_P(EffectCell, AtAnAmplitudeOutOfRangeIsRefusedWithItsLengthSet) {
    for (const int amplitude : kOutOfRange) {
        EXPECT_FALSE(play(amplitude)) << amplitude;
        if (GetParam().way != Way::kDoubleClick) {
            EXPECT_THAT(kernel.writes(), IsEmpty());
        }
    }
}

INSTANTIATE_TEST_SUITE_P(EffectTable, EffectCell, ValuesIn(kCells),
                         [](const auto& cell) { return cell.param.name; });

struct ForceFeedbackCell {
    const char* name;
    Effect effect;
    const char* effectName;
    int durationMs;
    const char* upload;
};

void PrintTo(const ForceFeedbackCell& cell, std::ostream* out) {
    *out << cell.name;
}

class EffectOnForceFeedback : public ForceFeedbackPhone,
                              public ::testing::WithParamInterface<ForceFeedbackCell> {
  protected:
    bool play(int amplitude) {
        const auto hwApi = makeHwApi();
        int durationMs = 3;
        const bool played = hwApi->preparePerform(GetParam().effect, amplitude, durationMs);
        EXPECT_EQ(durationMs, GetParam().durationMs);
        return played;
    }
};

TEST_P(EffectOnForceFeedback, SetsTheGainUploadsItsPatternAndPlaysIt) {
    EXPECT_TRUE(play(6700));
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /dev/input/event7 O_RDWR", "event type=21 code=96 value=6700",
                            GetParam().upload, "event type=21 code=0 value=1"));
    EXPECT_EQ(log.lines().at(1), std::string("I HW_API: [preparePerform]") + GetParam().effectName);
}

TEST_P(EffectOnForceFeedback, WhoseUploadFailsIsRefusedWithItsLengthSet) {
    kernel.addFault({.path = kMotorNode, .operation = Operation::kIoctl, .error = EINVAL});
    EXPECT_FALSE(play(6700));
}

TEST_P(EffectOnForceFeedback, WhoseStartFailsIsRefusedWithItsLengthSet) {
    kernel.addFault(
            {.path = kMotorNode, .operation = Operation::kWrite, .error = ENODEV, .after = 1});
    EXPECT_FALSE(play(6700));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern on fail");
}

TEST_P(EffectOnForceFeedback, AtAnAmplitudeOutOfRangeIsRefusedWithItsLengthSet) {
    for (const int amplitude : kOutOfRange) {
        EXPECT_FALSE(play(amplitude)) << amplitude;
        EXPECT_THAT(kernel.calls(), IsEmpty());
    }
}

// clang-format off
INSTANTIATE_TEST_SUITE_P(EffectTable, EffectOnForceFeedback, Values(
    ForceFeedbackCell{"Click", Effect::CLICK, "CLICK", 60,
        R"(upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 custom="00 00 0a 00")"},
    ForceFeedbackCell{"DoubleClick", Effect::DOUBLE_CLICK, "DOUBLE_CLICK", 110,
        R"(upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 custom="00 00 0e 00")"},
    ForceFeedbackCell{"Tick", Effect::TICK, "TICK", 60,
        R"(upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 custom="00 00 32 00")"},
    ForceFeedbackCell{"HeavyClick", Effect::HEAVY_CLICK, "HEAVY_CLICK", 110,
        R"(upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 custom="00 00 17 00")"}),
    [](const auto& cell) { return cell.param.name; });
// clang-format on

}  // namespace
}  // namespace aidl::android::hardware::vibrator
