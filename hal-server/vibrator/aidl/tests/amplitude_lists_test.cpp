// SPDX-License-Identifier: Apache-2.0
//
// The extension's amplitude lists by motor.
#include <cerrno>
#include <memory>
#include <string>
#include <vector>

#include "tests/amplitude_list_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::StartsWith;

const Steps kA = {0, 3000, 4000, 6000, 8000, 10000};
const Steps kB = {0, 1500, 4000, 6000, 8000, 10000};
const Steps kC = {0, 3400, 4900, 6500, 8200, 10000};
const Steps kD = {0, 2000, 4000, 6000, 8000, 10000};
const Steps kE = {0, 1000, 5000, 9000};
const Steps kF = {0, 2000, 6000, 10000};
const Steps kNone = {};  // not offered

struct Motor {
    std::string name;
    int index;
    Steps type0;
    Steps type1WithIndexNode;
    Steps type1;
};

const Motor kMotors[] = {
        {"Coindc", 1, kNone, kNone, kNone},
        {"Linear", 2, kD, kC, kC},
        {"CoindcPmic", 3, kE, kE, kE},
        {"CoindcIndex", 4, kNone, kNone, kNone},
        {"LinearIndex", 5, kA, kD, kD},
        {"Linear0832Rc", 6, kA, kD, kD},
        {"Linear1040", 7, kA, kD, kD},
        {"LinearRcvmot", 8, kD, kC, kC},
        {"Linear1030", 9, kD, kD, kC},
        {"LinearIndexRc", 10, kB, kD, kD},
        {"LinearWatch", 11, kF, kF, kF},
        {"LinearActive", 12, kF, kF, kF},
        {"Unknown13", 13, kNone, kNone, kNone},
        {"Unknown14", 14, kNone, kNone, kNone},
        {"UnknownLargest", kIntMax, kNone, kNone, kNone},
};

class AmplitudeListOf : public LedsPhone, public testing::WithParamInterface<Motor> {
  protected:
    // Asks for one type's list and expects these steps, or the refusal of a motor without any.
    void expectSteps(Vibrator& extension, ZelAmplitudeType type, const Steps& expected) {
        log.clear();
        Steps list;
        const ndk::ScopedAStatus status = extension.getAmplitudeList(type, &list);
        EXPECT_EQ(exceptionOf(status), expected.empty() ? EX_UNSUPPORTED_OPERATION : EX_NONE);
        EXPECT_EQ(list, expected);
        EXPECT_EQ(log.lines().back(),
                  expected.empty()
                          ? "I V_4_0: getAmplitudeList false : EX_UNSUPPORTED_OPERATION"
                          : "I V_4_0: getAmplitudeList size: " + std::to_string(expected.size()));
        EXPECT_THAT(log.lines(), Contains("I V_4_0: zelGetAmplitudeList existing_motorType : " +
                                          std::to_string(GetParam().index)));
    }

    void expectLists(Vibrator& extension, bool hasIndexNode) {
        const Motor& motor = GetParam();
        expectSteps(extension, ZelAmplitudeType::DEFAULT, motor.type0);
        expectSteps(extension, ZelAmplitudeType::HAPTIC,
                    hasIndexNode ? motor.type1WithIndexNode : motor.type1);
        EXPECT_THAT(log.lines(),
                    Contains(hasIndexNode ? "I V_4_0: getAmplitudeList support index method"
                                          : "I V_4_0: getAmplitudeList NOT support index "
                                            "method"));
    }

    std::shared_ptr<NumberedMotor> makeMotor() {
        auto motor = std::make_shared<NumberedMotor>();
        motor->named = GetParam().index;
        return motor;
    }
};

TEST_P(AmplitudeListOf, NamedMotorWithoutTheIndexNode) {
    const auto motor = makeMotor();
    expectLists(*makeExtension(motor), false);
    EXPECT_EQ(motor->asked, 2);
    EXPECT_EQ(motor->askedByMethod, 0);
}

TEST_P(AmplitudeListOf, NamedMotorWithTheIndexNode) {
    kernel.addNode(kLeds + "cp_trigger_index");
    expectLists(*makeExtension(makeMotor()), true);
}

TEST_P(AmplitudeListOf, IndexNodeThatCannotBeWrittenCountsAsMissing) {
    kernel.addNode(kLeds + "cp_trigger_index", "0\n", Access::kReadOnly);
    expectLists(*makeExtension(makeMotor()), false);
}

TEST_P(AmplitudeListOf, MotorWithoutANameByItsNodes) {
    const auto motor = makeMotor();
    motor->byMethod = GetParam().index;
    const auto extension = makeExtension(motor);
    for (const int named : {0, -1, kIntMin}) {
        motor->named = named;
        expectLists(*extension, false);
        EXPECT_THAT(
                log.lines(),
                Contains("I V_4_0: Vibrator motor type is NONE. but ran vib method fallback : " +
                         std::to_string(GetParam().index)));
    }
    EXPECT_EQ(motor->askedByMethod, 6);
}

INSTANTIATE_TEST_SUITE_P(Motors, AmplitudeListOf, testing::ValuesIn(kMotors), rowName<Motor>);

TEST_F(AmplitudeList, EveryStepIsLoggedInOrder) {
    motor->named = 9;
    const auto extension = makeExtension(motor);
    EXPECT_EQ(get(*extension, ZelAmplitudeType::HAPTIC), EX_NONE);
    EXPECT_THAT(
            log.lines(),
            ElementsAre("I V_4_0: getAmplitudeList", "I V_4_0: getAmplitudeList amplitude type: 1",
                        "I HW_API: isNodeExistForRead node:/sys/class/vib_info_class/"
                        "vib_support_info/intensities - false",
                        "I HW_API: isNodeExistForRead node:/sys/class/leds/vibrator/intensities "
                        "- false",
                        "I HW_API: [isDynamicIntensityNodeExist]dynamic intensity node Not exist",
                        "I V_4_0: Not Support Dynamic Intensity",
                        "I V_4_0: zelGetAmplitudeList existing_motorType : 9",
                        "I HW_API: isNodeExist node:/leds/vibrator/cp_trigger_index",
                        "I HW_API: false", "I V_4_0: getAmplitudeList NOT support index method",
                        "I V_4_0: getAmplitudeList size: 6"));
}

TEST_F(AmplitudeList, FallsBackToTheMotorsNodes) {
    motor->byMethod = 3;
    const auto extension = makeExtension(motor);
    EXPECT_EQ(get(*extension), EX_NONE);
    EXPECT_THAT(list, ElementsAre(0, 1000, 5000, 9000));
    const std::vector<std::string> lines = log.lines();
    EXPECT_THAT(std::vector(lines.begin() + 5, lines.begin() + 8),
                ElementsAre("I V_4_0: Not Support Dynamic Intensity",
                            "I V_4_0: Vibrator motor type is NONE. but ran vib method fallback : 3",
                            "I V_4_0: zelGetAmplitudeList existing_motorType : 3"));
}

TEST_F(AmplitudeList, MotorThatNothingNamesIsAnIllegalState) {
    const auto extension = makeExtension(motor);
    EXPECT_EQ(get(*extension), EX_ILLEGAL_STATE);
    EXPECT_THAT(list, IsEmpty());
    const std::vector<std::string> lines = log.lines();
    EXPECT_THAT(std::vector(lines.begin() + 6, lines.end()),
                ElementsAre("I V_4_0: Vibrator motor type is NONE. but ran vib method fallback : 0",
                            "I V_4_0: Vibrator motor type is some problem."));
}

TEST_F(AmplitudeList, NegativeMotorByItsNodesIsAnIllegalState) {
    for (const int index : {-1, kIntMin}) {
        motor->byMethod = index;
        const auto extension = makeExtension(motor);
        EXPECT_EQ(get(*extension), EX_ILLEGAL_STATE);
        EXPECT_THAT(list, IsEmpty());
        const std::vector<std::string> lines = log.lines();
        EXPECT_THAT(
                std::vector(lines.begin() + 6, lines.end()),
                ElementsAre("I V_4_0: Vibrator motor type is NONE. but ran vib method fallback : " +
                                    std::to_string(index),
                            "I V_4_0: zelGetAmplitudeList existing_motorType : " +
                                    std::to_string(index),
                            "I V_4_0: getAmplitudeList motor type is NONE."));
    }
}

TEST_F(AmplitudeList, RealMotorTypeAndIndexNodeDecide) {
    kernel.addNode(kLeds + "motor_type", "LINEAR_1030\n");
    kernel.addNode(kLeds + "cp_trigger_index");
    const auto extension = makeExtension();
    EXPECT_EQ(get(*extension, ZelAmplitudeType::HAPTIC), EX_NONE);
    EXPECT_THAT(list, ElementsAre(0, 2000, 4000, 6000, 8000, 10000));
    kernel.removeNode(kLeds + "cp_trigger_index");
    EXPECT_EQ(get(*extension, ZelAmplitudeType::HAPTIC), EX_NONE);
    EXPECT_THAT(list, ElementsAre(0, 3400, 4900, 6500, 8200, 10000));
    EXPECT_EQ(get(*extension, ZelAmplitudeType::DEFAULT), EX_NONE);
    EXPECT_THAT(list, ElementsAre(0, 2000, 4000, 6000, 8000, 10000));
}

TEST_F(AmplitudeList, RealMotorWithoutATypeFollowsFromItsNodes) {
    kernel.addNode(kLeds + "haptic_engine");
    const auto extension = makeExtension();
    EXPECT_EQ(get(*extension), EX_NONE);
    EXPECT_THAT(log.lines(), Contains("I V_4_0: Vibrator motor type is NONE. but ran vib method "
                                      "fallback : 7"));
    EXPECT_THAT(list, ElementsAre(0, 3000, 4000, 6000, 8000, 10000));
}

TEST_F(AmplitudeList, PhoneWithoutADeviceHasNoList) {
    removeLedsClass();
    const auto extension = makeExtension();
    EXPECT_EQ(get(*extension), EX_UNSUPPORTED_OPERATION);  // COINDC, for want of every node
    EXPECT_THAT(list, IsEmpty());
}

TEST_F(AmplitudeList, OtherTypesAreAnIllegalArgumentAndAskNothing) {
    const auto extension = makeExtension(motor);
    for (const int32_t type : {2, 3, -1, kIntMin, kIntMax}) {
        log.clear();
        EXPECT_EQ(get(*extension, static_cast<ZelAmplitudeType>(type)), EX_ILLEGAL_ARGUMENT);
        EXPECT_THAT(list, IsEmpty());
        EXPECT_THAT(log.lines(),
                    ElementsAre("I V_4_0: getAmplitudeList",
                                "I V_4_0: getAmplitudeList amplitude type: " + std::to_string(type),
                                "I V_4_0: getAmplitudeList Fail - Type is Abnormal"));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_EQ(motor->asked, 0);
}

TEST_F(AmplitudeList, NullVectorIsAnIllegalArgument) {
    const auto extension = makeExtension(motor);
    EXPECT_EQ(exceptionOf(extension->getAmplitudeList(ZelAmplitudeType::DEFAULT, nullptr)),
              EX_ILLEGAL_ARGUMENT);
    EXPECT_THAT(log.lines(), ElementsAre("I V_4_0: getAmplitudeList",
                                         "I V_4_0: getAmplitudeList amplitude type: 0",
                                         "I V_4_0: getAmplitudeList Fail - Wrong Param: 0"));
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(AmplitudeList, VectorThatIsNotEmptyIsAnIllegalArgumentAndStaysAsItWas) {
    const auto extension = makeExtension(motor);
    list = {5};
    EXPECT_EQ(exceptionOf(extension->getAmplitudeList(ZelAmplitudeType::DEFAULT, &list)),
              EX_ILLEGAL_ARGUMENT);
    EXPECT_THAT(list, ElementsAre(5));
    EXPECT_THAT(
            log.lines(),
            ElementsAre("I V_4_0: getAmplitudeList", "I V_4_0: getAmplitudeList amplitude type: 0",
                        StartsWith("I V_4_0: getAmplitudeList Fail - Wrong Param: 0x")));
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(AmplitudeList, TypeIsLookedAtBeforeTheVector) {
    const auto extension = makeExtension(motor);
    EXPECT_EQ(exceptionOf(extension->getAmplitudeList(static_cast<ZelAmplitudeType>(2), nullptr)),
              EX_ILLEGAL_ARGUMENT);
    EXPECT_EQ(log.lines().back(), "I V_4_0: getAmplitudeList Fail - Type is Abnormal");
}

}  // namespace
}  // namespace aidl::vendor::quorvan::hardware::vibrator
