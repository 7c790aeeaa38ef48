// SPDX-License-Identifier: Apache-2.0
//
// What motor this is, guessed from the nodes that there are.
#include <ostream>
#include <string>
#include <tuple>
#include <vector>

#include "tests/force_feedback_phone.h"
#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using ::testing::Combine;
using ::testing::ElementsAre;
using ::testing::Values;
using ::testing::ValuesIn;

class MotorIndexByMethod : public ServiceTest {
  protected:
    MotorIndexByMethod() { addLedsClass(); }
};

TEST_F(MotorIndexByMethod, PrebakedAndHapticEngineIsLinearIndex) {
    kernel.addNode(kLeds + "cp_trigger_index");
    kernel.addNode(kLeds + "haptic_engine");
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndexbyMethod(), 5);
    EXPECT_THAT(
            log.lines(),
            ElementsAre("I HW_API: getMotorIndexbyMethod >> ",
                        "I HW_API: isNodeExist node:/leds/vibrator/cp_trigger_index",
                        "I HW_API: true", "I HW_API: isNodeExist node:/leds/vibrator/haptic_engine",
                        "I HW_API: true", "I HW_API: getMotorIndexbyMethod : 5 <<"));
}

TEST_F(MotorIndexByMethod, HapticEngineIsAskedForEvenWithoutPrebakedPatterns) {
    kernel.addNode(kLeds + "intensity");
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndexbyMethod(), 2);
    EXPECT_THAT(
            log.lines(),
            ElementsAre("I HW_API: getMotorIndexbyMethod >> ",
                        "I HW_API: isNodeExist node:/leds/vibrator/cp_trigger_index",
                        "I HW_API: false",
                        "I HW_API: isNodeExist node:/leds/vibrator/haptic_engine",
                        "I HW_API: false", "I HW_API: isNodeExist node:/leds/vibrator/intensity",
                        "I HW_API: true", "I HW_API: getMotorIndexbyMethod : 2 <<"));
}

TEST_F(MotorIndexByMethod, NothingIsACoinMotor) {
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndexbyMethod(), 1);
    EXPECT_EQ(log.lines().back(), "I HW_API: getMotorIndexbyMethod : 1 <<");
}

struct GuessRow {
    const char* name;
    std::vector<const char*> leaves;
    const char* motorType;  // null: no such node
    int index;
};

void PrintTo(const GuessRow& nodes, std::ostream* out) {
    *out << nodes.name;
}

const GuessRow kGuessRows[] = {
        {"PrebakedAndHapticEngineIsLinearIndex", {"cp_trigger_index", "haptic_engine"}, nullptr, 5},
        {"PrebakedAloneIsLinear1030", {"cp_trigger_index"}, nullptr, 9},
        {"PrebakedWhateverTheTypeIsLinear1030", {"cp_trigger_index"}, "LINEAR_1040\n", 9},
        {"HapticEngineWithoutATypeIsLinear1040", {"haptic_engine"}, nullptr, 7},
        {"HapticEngineOfALinear1040IsLinear1040", {"haptic_engine"}, "LINEAR_1040\n", 7},
        {"HapticEngineOfAnotherTypeIsLinear0832RC", {"haptic_engine"}, "LINEAR_1030\n", 6},
        {"HapticEngineOfATypeWithoutItsLineFeedIsLinear0832RC",
         {"haptic_engine"},
         "LINEAR_1040",
         6},
        {"IntensityAloneIsLinear", {"intensity"}, nullptr, 2},
        {"IntensityWhateverTheTypeIsLinear", {"intensity"}, "LINEAR_1040\n", 2},
        {"NothingIsCoinDc", {}, nullptr, 1},
};

// The guess on both classes: true stands for the LED class.
class MotorIndexGuess : public ServiceTest,
                        public ::testing::WithParamInterface<std::tuple<bool, GuessRow>> {};

TEST_P(MotorIndexGuess, FollowsFromTheNodes) {
    const auto& [isLeds, nodes] = GetParam();
    const std::string directory = isLeds ? kLeds : kLegacy;
    isLeds ? addLedsClass() : addLegacyClass();
    for (const char* leaf : nodes.leaves) kernel.addNode(directory + leaf);
    if (nodes.motorType != nullptr) kernel.addNode(directory + "motor_type", nodes.motorType);
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndexbyMethod(), nodes.index);
    EXPECT_EQ(log.lines().back(),
              "I HW_API: getMotorIndexbyMethod : " + std::to_string(nodes.index) + " <<");
}

INSTANTIATE_TEST_SUITE_P(MotorTypes, MotorIndexGuess,
                         Combine(Values(false, true), ValuesIn(kGuessRows)), [](const auto& row) {
                             return std::string(std::get<0>(row.param) ? "Leds" : "Legacy") +
                                    std::get<1>(row.param).name;
                         });

// Force feedback has none of the nodes but an amplitude.
TEST_F(ForceFeedbackPhone, GuessedMotorIsLinear) {
    const auto hwApi = makeHwApi();
    EXPECT_EQ(hwApi->getMotorIndexbyMethod(), 2);
    EXPECT_THAT(kernel.calls(), ElementsAre("open  O_RDWR = ENOENT", "open  O_RDWR = ENOENT"));
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
