// SPDX-License-Identifier: Apache-2.0
//
// What the driver offers: features, perform method, amplitude control.
#include <cerrno>
#include <ostream>
#include <string>
#include <tuple>
#include <vector>

#include "tests/force_feedback_phone.h"
#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::Combine;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Values;
using ::testing::ValuesIn;

class Capabilities : public ServiceTest {
  protected:
    Capabilities() { addLedsClass(); }
};

using HasFeature = Capabilities;

TEST_F(HasFeature, WordWithinALongerWordCounts) {
    kernel.addNode(kFunctions, "FIFO_HAPTIC_ENGINE\n", Access::kReadOnly);
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->hasFeature(qvx_features::FIFO_HAPTIC_ENGINE), 1);
    EXPECT_EQ(hwApi->hasFeature(qvx_features::HAPTIC_ENGINE), 1);
    EXPECT_EQ(hwApi->hasFeature(qvx_features::HYBRID_HAPTIC_ENGINE), 0);
}

TEST_F(HasFeature, ForceTouchIntensityAnswersForIntensityToo) {
    kernel.addNode(kFunctions, "FORCE_TOUCH_INTENSITY\n", Access::kReadOnly);
    EXPECT_EQ(makeHwApi()->hasFeature(qvx_features::INTENSITY), 1);
}

TEST_F(HasFeature, EachFeatureAsksForItsOwnWord) {
    static constexpr struct {
        qvx_features feature;
        const char* word;
    } kFeatures[] = {
            {qvx_features::INTENSITY, "INTENSITY"},
            {qvx_features::FORCE_TOUCH_INTENSITY, "FORCE_TOUCH_INTENSITY"},
            {qvx_features::MULTI_FREQUENCY, "MULTI_FREQUENCY"},
            {qvx_features::HAPTIC_ENGINE, "HAPTIC_ENGINE"},
            {qvx_features::INDEX_HAPTIC_PATTERN, "INDEX_HAPTIC_PATTERN"},
            {qvx_features::KYPINDEX_HAPTIC_PATTERN, "KYPINDEX_HAPTIC_PATTERN"},
            {qvx_features::ENHANCED_HAPTIC_ENGINE, "ENHANCED_HAPTIC_ENGINE"},
            {qvx_features::FIFO_HAPTIC_ENGINE, "FIFO_HAPTIC_ENGINE"},
            {qvx_features::HYBRID_HAPTIC_ENGINE, "HYBRID_HAPTIC_ENGINE"},
            {qvx_features::ENHANCED_HYBRID_HAPTIC_ENGINE, "ENHANCED_HYBRID_HAPTIC_ENGINE"},
            {qvx_features::CAPABILITY_EXTERNAL_CONTROL, "CAPABILITY_EXTERNAL_CONTROL"},
            {qvx_features::COMMON_INPUTFF_INTERFACE, "COMMON_INPUTFF_INTERFACE"},
            {qvx_features::PRIMITIVE_EFFECT_COMPOSE, "PRIMITIVE_EFFECT_COMPOSE"},
    };
    const auto hwApi = makeHwApi();
    for (const auto& [feature, word] : kFeatures) {
        const std::string text(word);
        kernel.addNode(kFunctions, text);
        EXPECT_EQ(hwApi->hasFeature(feature), 1) << word;
        kernel.addNode(kFunctions, text.substr(0, text.size() - 1));
        EXPECT_EQ(hwApi->hasFeature(feature), 0) << word;
    }
}

TEST_F(HasFeature, EveryLineReadIsLoggedUpToTheMatch) {
    kernel.addNode(kFunctions, "MULTI_FREQUENCY\nHAPTIC_ENGINE\nINTENSITY\n", Access::kReadOnly);
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->hasFeature(qvx_features::HAPTIC_ENGINE), 1);
    // The line's own newline goes to the logger, which makes an empty record of what follows it.
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: [hasFeature] debug functions=MULTI_FREQUENCY", "I ",
                            "I HW_API: [hasFeature] debug functions=HAPTIC_ENGINE", "I "));
    EXPECT_EQ(kernel.calls().front(),
              "open /sys/class/vib_info_class/vib_support_info/functions O_RDONLY");
    EXPECT_EQ(kernel.calls().back(), "close /sys/class/vib_info_class/vib_support_info/functions");
}

TEST_F(HasFeature, WordsOfOneLineAreAllFound) {
    kernel.addNode(kFunctions, "INTENSITY HAPTIC_ENGINE PRIMITIVE_EFFECT_COMPOSE",
                   Access::kReadOnly);
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->hasFeature(qvx_features::PRIMITIVE_EFFECT_COMPOSE), 1);
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [hasFeature] debug functions=INTENSITY "
                                         "HAPTIC_ENGINE PRIMITIVE_EFFECT_COMPOSE"));
}

TEST_F(HasFeature, WordSplitByThe1023CharacterLimitIsNotFound) {
    kernel.addNode(kFunctions, std::string(1020, 'x') + "INTENSITY\n", Access::kReadOnly);
    EXPECT_EQ(makeHwApi()->hasFeature(qvx_features::INTENSITY), 0);
}

TEST_F(HasFeature, EmptyListIsNo) {
    kernel.addNode(kFunctions, "", Access::kReadOnly);
    EXPECT_EQ(makeHwApi()->hasFeature(qvx_features::INTENSITY), 0);
}

TEST_F(HasFeature, MissingListIsMinusOne) {
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->hasFeature(qvx_features::INTENSITY), -1);
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [hasFeature]fopen error!!"));
}

TEST_F(HasFeature, ListThatCannotBeReadIsNo) {
    kernel.addNode(kFunctions, "INTENSITY\n", Access::kReadOnly);
    kernel.addFault({.path = kFunctions, .operation = Operation::kRead, .error = EIO});
    EXPECT_EQ(makeHwApi()->hasFeature(qvx_features::INTENSITY), 0);
}

TEST_F(HasFeature, WordAfterAZeroByteOfItsLineIsNotFound) {
    kernel.addNode(kFunctions, std::string("X\0INTENSITY\nHAPTIC_ENGINE\n", 26), Access::kReadOnly);
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->hasFeature(qvx_features::INTENSITY), 0);
    EXPECT_EQ(hwApi->hasFeature(qvx_features::HAPTIC_ENGINE), 1);
}

TEST_F(HasFeature, LowerCaseIsAnotherWord) {
    kernel.addNode(kFunctions, "intensity\n", Access::kReadOnly);
    EXPECT_EQ(makeHwApi()->hasFeature(qvx_features::INTENSITY), 0);
}

TEST_F(HasFeature, ListThatMayNotBeReadIsMinusOne) {
    kernel.addNode(kFunctions, "INTENSITY\n", Access::kWriteOnly);
    EXPECT_EQ(makeHwApi()->hasFeature(qvx_features::INTENSITY), -1);
}

TEST_F(HasFeature, InterruptedOpenAndReadAreRepeated) {
    kernel.addNode(kFunctions, "INTENSITY\n", Access::kReadOnly);
    kernel.addFault(
            {.path = kFunctions, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    kernel.addFault(
            {.path = kFunctions, .operation = Operation::kRead, .error = EINTR, .times = 2});
    EXPECT_EQ(makeHwApi()->hasFeature(qvx_features::INTENSITY), 1);
}

TEST_F(HasFeature, NumberThatIsNoFeatureIsNo) {
    kernel.addNode(kFunctions, "INTENSITY\n", Access::kReadOnly);
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->hasFeature(static_cast<qvx_features>(13)), 0);
    EXPECT_EQ(hwApi->hasFeature(static_cast<qvx_features>(-1)), 0);
}

using PerformMethod = Capabilities;

TEST_F(PerformMethod, PrebakedIndexComesFirst) {
    kernel.addNode(kLeds + "cp_trigger_index");
    kernel.addNode(kLeds + "haptic_engine");
    kernel.addNode(kLeds + "intensity");
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorPerformMethod(), 1);
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: isNodeExist node:/leds/vibrator/cp_trigger_index",
                            "I HW_API: true", "I HW_API: getMotorPerformMethod type : 1"));
}

TEST_F(PerformMethod, NothingIsNoneAfterEachNodeWasAskedFor) {
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorPerformMethod(), 0);
    EXPECT_THAT(
            log.lines(),
            ElementsAre("I HW_API: isNodeExist node:/leds/vibrator/cp_trigger_index",
                        "I HW_API: false",
                        "I HW_API: isNodeExist node:/leds/vibrator/haptic_engine",
                        "I HW_API: false", "I HW_API: isNodeExist node:/leds/vibrator/intensity",
                        "I HW_API: false", "I HW_API: getMotorPerformMethod type : 0"));
}

TEST_F(PerformMethod, ReadOnlyNodeDoesNotCount) {
    kernel.addNode(kLeds + "cp_trigger_index", "0\n", Access::kReadOnly);
    kernel.addNode(kLeds + "intensity");
    EXPECT_EQ(makeHwApi()->getMotorPerformMethod(), 3);
}

struct MethodRow {
    const char* name;
    std::vector<const char*> leaves;
    int method;
};

void PrintTo(const MethodRow& nodes, std::ostream* out) {
    *out << nodes.name;
}

const MethodRow kMethodRows[] = {
        {"None", {}, 0},
        {"Intensity", {"intensity"}, 3},
        {"HapticEngine", {"haptic_engine"}, 2},
        {"HapticEngineAndIntensity", {"haptic_engine", "intensity"}, 2},
        {"Index", {"cp_trigger_index"}, 1},
        {"IndexAndIntensity", {"cp_trigger_index", "intensity"}, 1},
        {"IndexAndHapticEngine", {"cp_trigger_index", "haptic_engine"}, 1},
        {"All", {"cp_trigger_index", "haptic_engine", "intensity"}, 1},
};

// The method on both classes: true stands for the LED class.
class PerformMethodOfClass : public ServiceTest,
                             public ::testing::WithParamInterface<std::tuple<bool, MethodRow>> {};

TEST_P(PerformMethodOfClass, FollowsFromTheNodesAndIsKeptFromTheStart) {
    const auto& [isLeds, nodes] = GetParam();
    isLeds ? addLedsClass() : addLegacyClass();
    for (const char* leaf : nodes.leaves) kernel.addNode((isLeds ? kLeds : kLegacy) + leaf);
    const auto hwApi = makeHwApi();
    EXPECT_EQ(motorPerformMethod, nodes.method);
    EXPECT_EQ(hwApi->getMotorPerformMethod(), nodes.method);
    EXPECT_EQ(log.lines().back(),
              "I HW_API: getMotorPerformMethod type : " + std::to_string(nodes.method));
}

INSTANTIATE_TEST_SUITE_P(PerformMethods, PerformMethodOfClass,
                         Combine(Values(false, true), ValuesIn(kMethodRows)), [](const auto& row) {
                             return std::string(std::get<0>(row.param) ? "Leds" : "Legacy") +
                                    std::get<1>(row.param).name;
                         });

TEST_F(ForceFeedbackPhone, PlaysEffectsByIndex) {
    const auto hwApi = makeHwApi();
    EXPECT_EQ(motorPerformMethod, 1);
    EXPECT_EQ(hwApi->getMotorPerformMethod(), 1);
    EXPECT_EQ(log.lines().back(), "I HW_API: getMotorPerformMethod type : 1");
}

TEST_F(ServiceTest, WithoutADeviceThereIsNoPerformMethod) {
    const auto hwApi = makeHwApi();
    EXPECT_EQ(motorPerformMethod, 0);
    EXPECT_FALSE(hwApi->isAmplitudeControlExist());
}

using AmplitudeControl = Capabilities;

TEST_F(AmplitudeControl, IsTheIntensityNode) {
    const auto hwApi = makeHwApi();
    EXPECT_FALSE(hwApi->isAmplitudeControlExist());
    kernel.addNode(kLeds + "intensity");
    EXPECT_TRUE(hwApi->isAmplitudeControlExist());
}

TEST_F(ForceFeedbackPhone, HasAmplitudeControlWithoutLookingAtANode) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->isAmplitudeControlExist());
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [isAmplitudeControlExist]return true"));
}

using DynamicIntensityNode = Capabilities;

TEST_F(DynamicIntensityNode, InformationClassIsPreferred) {
    kernel.addNode(kInfo + "intensities", "1\n", Access::kReadOnly);
    kernel.addNode(kInfo + "haptic_intensities", "1\n", Access::kReadOnly);
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->isDynamicIntensityNodeExist());
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [isDynamicIntensityNodeExist]new dynamic "
                                         "intensity node exist"));
    EXPECT_EQ(kernel.calls().size(), 4U);
}

TEST_F(DynamicIntensityNode, DeviceClassStandsIn) {
    kernel.addNode(kInfo + "intensities", "1\n", Access::kReadOnly);
    kernel.addNode(kLeds + "intensities", "1\n", Access::kReadOnly);
    kernel.addNode(kLeds + "haptic_intensities", "1\n", Access::kReadOnly);
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->isDynamicIntensityNodeExist());
    EXPECT_EQ(log.lines().back(),
              "I HW_API: [isDynamicIntensityNodeExist]old dynamic intensity node exist");
}

TEST_F(DynamicIntensityNode, HalfAPairOnEachSideIsNone) {
    for (const auto& [shared, own] : {std::pair("intensities", "haptic_intensities"),
                                      std::pair("haptic_intensities", "intensities")}) {
        kernel.addNode(kInfo + shared, "1\n", Access::kReadOnly);
        kernel.addNode(kLeds + own, "1\n", Access::kReadOnly);
        const auto hwApi = makeHwApi();
        EXPECT_FALSE(hwApi->isDynamicIntensityNodeExist());
        EXPECT_EQ(log.lines().back(),
                  "I HW_API: [isDynamicIntensityNodeExist]dynamic intensity node Not exist");
        kernel.removeNode(kInfo + shared);
        kernel.removeNode(kLeds + own);
    }
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
