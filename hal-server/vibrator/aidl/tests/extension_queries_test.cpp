// SPDX-License-Identifier: Apache-2.0
//
// The extension's capability queries: the driver's feature list, what answers in its place, and
// questions for a word of the client's choice.
#include <cerrno>
#include <string>
#include <vector>

#include "tests/extension_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::ElementsAre;
using ::testing::StartsWith;

constexpr char kAsksTheList[] =
        "open /sys/class/vib_info_class/vib_support_info/functions O_RDONLY";

struct FeatureQueryRow {
    const char* name;
    Query query;
    const char* word;         // of the driver's list
    const char* leaf;         // the node that answers without a list; null: something else does
    bool yesOnForceFeedback;  // without a list
};

const FeatureQueryRow kFeatureQueries[] = {
        {"supportsAmplitudeControl", &Vibrator::supportsAmplitudeControl, "INTENSITY", "intensity",
         true},
        {"supportsForceTouchAmplitudeControl", &Vibrator::supportsForceTouchAmplitudeControl,
         "FORCE_TOUCH_INTENSITY", "force_touch_intensity", false},
        {"supportsFrequencyControl", &Vibrator::supportsFrequencyControl, "MULTI_FREQUENCY",
         "multi_freq", false},
        {"supportsHapticEngine", &Vibrator::supportsHapticEngine, "HAPTIC_ENGINE", "haptic_engine",
         true},
        {"supportsPrebakedHapticPattern", &Vibrator::supportsPrebakedHapticPattern,
         "INDEX_HAPTIC_PATTERN", "cp_trigger_index", true},
        {"supportsEnhancedQuorvanHapticPattern", &Vibrator::supportsEnhancedQuorvanHapticPattern,
         "ENHANCED_HAPTIC_ENGINE", nullptr, false},
        {"supportsFifoHapticEngine", &Vibrator::supportsFifoHapticEngine, "FIFO_HAPTIC_ENGINE",
         "fifo", false},
        {"supportsHybridHapticEngine", &Vibrator::supportsHybridHapticEngine,
         "HYBRID_HAPTIC_ENGINE", "hybrid_haptic_engine", false},
        {"supportsEnhancedHybridHapticPattern", &Vibrator::supportsEnhancedHybridHapticPattern,
         "ENHANCED_HYBRID_HAPTIC_ENGINE", nullptr, false},
};

class FeatureBackedQuery : public ExtensionTest,
                           public testing::WithParamInterface<FeatureQueryRow> {
  protected:
    bool answer(Vibrator& extension, bool expected) {
        return ask(extension, GetParam().query, expected);
    }

    const std::string entry = std::string("I V_4_0: ") + GetParam().name;
};

TEST_P(FeatureBackedQuery, ListedWordIsYesWithoutALookAtAnyNode) {
    addLedsClass();
    kernel.addNode(kFunctions, std::string(GetParam().word) + "\n", Access::kReadOnly);
    const auto extension = makeExtension();
    EXPECT_TRUE(answer(*extension, true));
    EXPECT_THAT(kernel.calls(),
                ElementsAre(kAsksTheList, StartsWith("read " + kFunctions), "close " + kFunctions));
    EXPECT_THAT(log.lines(), ElementsAre(entry,
                                         std::string("I HW_API: [hasFeature] debug functions=") +
                                                 GetParam().word,
                                         "I "));
}

TEST_P(FeatureBackedQuery, ListWithoutTheWordIsNoWhateverNodesThereAre) {
    addLedsClass();
    addNodes(kLeds, {"intensity", "force_touch_intensity", "multi_freq", "haptic_engine",
                     "cp_trigger_index", "fifo", "hybrid_haptic_engine"});
    kernel.addNode(kLeds + "motor_type", "LINEAR_1040\n");
    kernel.addNode(kFunctions, "CAPABILITY_EXTERNAL_CONTROL\n", Access::kReadOnly);
    const auto extension = makeExtension();
    EXPECT_FALSE(answer(*extension, false));
    EXPECT_THAT(kernel.calls(), testing::Each(testing::HasSubstr("/vib_support_info/functions")));
    EXPECT_THAT(
            log.lines(),
            ElementsAre(entry, "I HW_API: [hasFeature] debug functions=CAPABILITY_EXTERNAL_CONTROL",
                        "I "));
}

TEST_P(FeatureBackedQuery, ListThatOpensAndCannotBeReadIsNo) {
    addLedsClass();
    if (GetParam().leaf != nullptr) kernel.addNode(kLeds + GetParam().leaf);
    kernel.addNode(kFunctions, GetParam().word, Access::kReadOnly);
    const auto extension = makeExtension();
    kernel.addFault({.path = kFunctions, .operation = Operation::kRead, .error = EIO});
    EXPECT_FALSE(answer(*extension, false));
    EXPECT_THAT(log.lines(), ElementsAre(entry));
}

TEST_P(FeatureBackedQuery, InterruptedLookAtTheListIsRepeated) {
    addLedsClass();
    kernel.addNode(kFunctions, GetParam().word, Access::kReadOnly);
    const auto extension = makeExtension();
    kernel.addFault(
            {.path = kFunctions, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    kernel.addFault({.path = kFunctions, .operation = Operation::kRead, .error = EINTR});
    EXPECT_TRUE(answer(*extension, true));
}

TEST_P(FeatureBackedQuery, WithoutAListForceFeedbackAnswersForSome) {
    addForceFeedback();
    const auto extension = makeExtension();
    const bool expected = GetParam().yesOnForceFeedback;
    EXPECT_EQ(answer(*extension, expected), expected);
    if (!expected) return;
    EXPECT_THAT(kernel.calls(), ElementsAre(std::string(kAsksTheList) + " = ENOENT"));
    EXPECT_THAT(log.lines(),
                ElementsAre(entry, "I HW_API: [hasFeature]fopen error!!",
                            std::string("I V_4_0: [") + GetParam().name + "]return true"));
}

TEST_P(FeatureBackedQuery, WithoutAListAndADeviceIsNo) {
    const auto extension = makeExtension();
    EXPECT_FALSE(answer(*extension, false));
}

INSTANTIATE_TEST_SUITE_P(Extension, FeatureBackedQuery, testing::ValuesIn(kFeatureQueries),
                         rowName<FeatureQueryRow>);

std::vector<FeatureQueryRow> queriesWithANode() {
    std::vector<FeatureQueryRow> rows;
    for (const FeatureQueryRow& row : kFeatureQueries) {
        if (row.leaf != nullptr) rows.push_back(row);
    }
    return rows;
}

class NodeBackedQuery : public FeatureBackedQuery {};

TEST_P(NodeBackedQuery, WithoutAListTheNodesPresenceIsYes) {
    addLedsClass();
    kernel.addNode(kLeds + GetParam().leaf);
    const auto extension = makeExtension();
    EXPECT_TRUE(answer(*extension, true));
    EXPECT_THAT(kernel.calls(), ElementsAre(std::string(kAsksTheList) + " = ENOENT",
                                            "open " + kLeds + GetParam().leaf + " O_RDWR",
                                            "close " + kLeds + GetParam().leaf));
    EXPECT_THAT(log.lines(), ElementsAre(entry, "I HW_API: [hasFeature]fopen error!!",
                                         std::string("I HW_API: isNodeExist node:/leds/vibrator/") +
                                                 GetParam().leaf,
                                         "I HW_API: true"));
}

TEST_P(NodeBackedQuery, WithoutAListTheNodesAbsenceIsNo) {
    addLedsClass();
    const auto extension = makeExtension();
    EXPECT_FALSE(answer(*extension, false));
    EXPECT_THAT(log.lines(), ElementsAre(entry, "I HW_API: [hasFeature]fopen error!!",
                                         std::string("I HW_API: isNodeExist node:/leds/vibrator/") +
                                                 GetParam().leaf,
                                         "I HW_API: false"));
}

TEST_P(NodeBackedQuery, NodeThatCannotBeWrittenCountsAsAbsent) {
    addLedsClass();
    kernel.addNode(kLeds + GetParam().leaf, "0\n", Access::kReadOnly);
    EXPECT_FALSE(answer(*makeExtension(), false));
}

TEST_P(NodeBackedQuery, UnreadableListCountsAsNone) {
    addLedsClass();
    kernel.addNode(kLeds + GetParam().leaf);
    kernel.addNode(kFunctions, "CAPABILITY_EXTERNAL_CONTROL\n", Access::kWriteOnly);
    EXPECT_TRUE(answer(*makeExtension(), true));
}

TEST_P(NodeBackedQuery, OnTheLegacyClassItIsTheLegacyNode) {
    addLegacyClass();
    kernel.addNode(kLegacy + GetParam().leaf);
    EXPECT_TRUE(answer(*makeExtension(), true));
}

INSTANTIATE_TEST_SUITE_P(Extension, NodeBackedQuery, testing::ValuesIn(queriesWithANode()),
                         rowName<FeatureQueryRow>);

using FeatureQueries = ExtensionTest;

TEST_F(FeatureQueries, WordWithinALongerWordIsEnough) {
    addLedsClass();
    kernel.addNode(kFunctions, "FIFO_HAPTIC_ENGINE\n", Access::kReadOnly);
    const auto extension = makeExtension();
    EXPECT_TRUE(ask(*extension, &Vibrator::supportsHapticEngine, true));
    EXPECT_TRUE(ask(*extension, &Vibrator::supportsFifoHapticEngine, true));
    EXPECT_FALSE(ask(*extension, &Vibrator::supportsHybridHapticEngine, false));
}

TEST_F(FeatureQueries, AnswerFollowsTheListFromCallToCall) {
    addLedsClass();
    kernel.addNode(kFunctions, "MULTI_FREQUENCY\n", Access::kReadOnly);
    const auto extension = makeExtension();
    EXPECT_TRUE(ask(*extension, &Vibrator::supportsFrequencyControl, true));
    kernel.addNode(kFunctions, "INTENSITY\n", Access::kReadOnly);
    EXPECT_FALSE(ask(*extension, &Vibrator::supportsFrequencyControl, false));
}

TEST_F(FeatureQueries, EnhancedPatternWithoutAListIsLinear1040) {
    addLedsClass();
    kernel.addNode(kLeds + "motor_type", "LINEAR_1040\n");
    const auto extension = makeExtension();
    EXPECT_TRUE(ask(*extension, &Vibrator::supportsEnhancedQuorvanHapticPattern, true));
    kernel.addNode(kLeds + "motor_type", "LINEAR_1030\n");
    EXPECT_FALSE(ask(*extension, &Vibrator::supportsEnhancedQuorvanHapticPattern, false));
}

TEST_F(FeatureQueries, EnhancedPatternWithoutAListAndAMotorTypeIsTheHapticEngineNode) {
    addLedsClass();
    kernel.addNode(kLeds + "haptic_engine");
    const auto extension = makeExtension();
    EXPECT_TRUE(ask(*extension, &Vibrator::supportsEnhancedQuorvanHapticPattern, true));
    kernel.removeNode(kLeds + "haptic_engine");
    EXPECT_FALSE(ask(*extension, &Vibrator::supportsEnhancedQuorvanHapticPattern, false));
}

class CountingMotor : public core::HwApi {
  public:
    int getMotorIndex() override { return index; }

    int index = 0;
};

TEST_F(FeatureQueries, EnhancedHybridPatternWithoutAListIsMotor11Alone) {
    const auto motor = std::make_shared<CountingMotor>();
    const auto extension = makeExtension(motor);
    for (motor->index = -1; motor->index <= 14; ++motor->index) {
        const bool expected = motor->index == 11;
        EXPECT_EQ(ask(*extension, &Vibrator::supportsEnhancedHybridHapticPattern, expected),
                  expected)
                << motor->index;
    }
}

TEST_F(FeatureQueries, EnhancedHybridPatternWithoutAListReadsTheMotorType) {
    addLedsClass();
    kernel.addNode(kLeds + "motor_type", "LINEAR_WATCH\n");
    const auto extension = makeExtension();
    EXPECT_TRUE(ask(*extension, &Vibrator::supportsEnhancedHybridHapticPattern, true));
    kernel.addNode(kLeds + "motor_type", "LINEAR_ACTIVE\n");
    EXPECT_FALSE(ask(*extension, &Vibrator::supportsEnhancedHybridHapticPattern, false));
}

}  // namespace
}  // namespace aidl::vendor::quorvan::hardware::vibrator
