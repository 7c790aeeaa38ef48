// SPDX-License-Identifier: Apache-2.0
//
// The standard service: statuses, results, log lines and driver writes of every operation but
// effects and compositions.
#include "tests/vibrator_test.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <limits>
#include <memory>
#include <string>
#include <vector>

#include "tests/fake_motor.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

using Life = VibratorTest;

TEST_F(Life, BeginningAndEndAreLogged) {
    {
        const auto hwApi = makeHwApi();
        ndk::SharedRefBase::make<Vibrator>(hwApi);
    }
    EXPECT_THAT(log.lines(),
                ElementsAre("E V_2_0: Vibrator::Vibrator()", "E V_2_0: Vibrator::~Vibrator()"));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-CORE"));
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(Life, EndClosesTheForceFeedbackDeviceAndKeepsItsNumber) {
    kernel.addDevice("/dev/input/event7", std::make_shared<fake::FakeMotor>());
    auto vibrator = makeVibrator();
    inputFD = kernel.open("/dev/input/event7", 2);
    const int number = inputFD;
    vibrator.reset();
    EXPECT_EQ(kernel.openDescriptors(), 0U);
    EXPECT_EQ(inputFD, number);
    EXPECT_THAT(log.lines(),
                ElementsAre("E V_2_0: Vibrator::~Vibrator()", "E V_2_0: inputFD close"));
}

TEST_F(Life, EndClosesTheDeviceAlsoAsDescriptorZero) {
    kernel.addDevice("/dev/input/event7", std::make_shared<fake::FakeMotor>());
    auto vibrator = makeVibrator();
    const int saved = dup(STDIN_FILENO);
    close(STDIN_FILENO);
    inputFD = kernel.open("/dev/input/event7", O_RDWR);
    ASSERT_EQ(inputFD, 0);
    vibrator.reset();
    EXPECT_EQ(kernel.openDescriptors(), 0U);
    EXPECT_EQ(log.line(1), "E V_2_0: inputFD close");
    dup2(saved, STDIN_FILENO);
    close(saved);
}

using GetCapabilities = VibratorTest;

TEST_F(GetCapabilities, NothingIsZero) {
    int32_t capabilities = -1;
    EXPECT_TRUE(makeVibrator()->getCapabilities(&capabilities).isOk());
    EXPECT_EQ(capabilities, 0);
    EXPECT_EQ(log.lines().front(), "E V_2_0: Vibrator reporting capabilities");
}

TEST_F(GetCapabilities, IntensityNodeIsAmplitudeControl) {
    kernel.addNode(kLeds + "intensity");
    int32_t capabilities = 0;
    EXPECT_TRUE(makeVibrator()->getCapabilities(&capabilities).isOk());
    EXPECT_EQ(capabilities, 4);
}

TEST_F(GetCapabilities, ComposeFeatureIsComposeEffects) {
    kernel.addNode(kFunctions, "PRIMITIVE_EFFECT_COMPOSE\n", Access::kReadOnly);
    int32_t capabilities = 0;
    EXPECT_TRUE(makeVibrator()->getCapabilities(&capabilities).isOk());
    EXPECT_EQ(capabilities, 32);
}

TEST_F(GetCapabilities, ExternalControlFeatureIsBothExternalBits) {
    kernel.addNode(kFunctions, "CAPABILITY_EXTERNAL_CONTROL\n", Access::kReadOnly);
    int32_t capabilities = 0;
    EXPECT_TRUE(makeVibrator()->getCapabilities(&capabilities).isOk());
    EXPECT_EQ(capabilities, 24);
}

TEST_F(GetCapabilities, AllTogetherIs60) {
    kernel.addNode(kLeds + "intensity");
    kernel.addNode(kFunctions, "CAPABILITY_EXTERNAL_CONTROL PRIMITIVE_EFFECT_COMPOSE\n",
                   Access::kReadOnly);
    int32_t capabilities = 0;
    EXPECT_TRUE(makeVibrator()->getCapabilities(&capabilities).isOk());
    EXPECT_EQ(capabilities, 60);
}

TEST_F(GetCapabilities, EveryQuestionIsLogged) {
    kernel.addNode(kLeds + "intensity");
    kernel.addNode(kFunctions, "CAPABILITY_EXTERNAL_CONTROL\nPRIMITIVE_EFFECT_COMPOSE\n",
                   Access::kReadOnly);
    const auto vibrator = makeVibrator();
    int32_t capabilities = 0;
    EXPECT_TRUE(vibrator->getCapabilities(&capabilities).isOk());
    EXPECT_THAT(
            log.lines(),
            ElementsAre("E V_2_0: Vibrator reporting capabilities",
                        "I HW_API: isNodeExist node:/leds/vibrator/intensity", "I HW_API: true",
                        "I HW_API: [hasFeature] debug functions=CAPABILITY_EXTERNAL_CONTROL", "I ",
                        "I HW_API: [hasFeature] debug functions=PRIMITIVE_EFFECT_COMPOSE", "I ",
                        "I HW_API: [hasFeature] debug functions=CAPABILITY_EXTERNAL_CONTROL",
                        "I "));
}

TEST_F(GetCapabilities, ListThatCannotBeOpenedIsNoYes) {
    kernel.addNode(kLeds + "intensity");
    const auto vibrator = makeVibrator();
    int32_t capabilities = 0;
    EXPECT_TRUE(vibrator->getCapabilities(&capabilities).isOk());
    EXPECT_EQ(capabilities, 4);
    EXPECT_THAT(log.lines(), Contains("I HW_API: [hasFeature]fopen error!!").Times(2));
}

using OnOff = VibratorTest;

TEST_F(OnOff, OnStartsTheMotor) {
    const auto vibrator = makeVibrator();
    EXPECT_TRUE(vibrator->on(500, nullptr).isOk());
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/state \"1\\n\"",
                                             "/sys/class/leds/vibrator/duration \"500\\n\"",
                                             "/sys/class/leds/vibrator/activate \"1\\n\""));
    EXPECT_EQ(log.lines().front(), "E V_2_0: Vibrator on for timeoutMs: 500");
}

TEST_F(OnOff, ZeroAndNegativeDurationsArePassedOn) {
    const auto vibrator = makeVibrator();
    EXPECT_TRUE(vibrator->on(0, nullptr).isOk());
    EXPECT_EQ(kernel.text(kLeds + "duration"), "0\n");
    EXPECT_TRUE(vibrator->on(-2147483647 - 1, nullptr).isOk());
    EXPECT_EQ(kernel.text(kLeds + "duration"), "-2147483648\n");
}

TEST_F(OnOff, OnWithACallbackIsNotOfferedAndLeavesTheMotorStill) {
    const auto vibrator = makeVibrator();
    EXPECT_EQ(exceptionOf(vibrator->on(100, callback)), EX_UNSUPPORTED_OPERATION);
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_THAT(log.lines(), ElementsAre("E V_2_0: Vibrator on for timeoutMs: 100",
                                         "E Not support on() callback"));
}

TEST_F(OnOff, OffStopsTheMotor) {
    const auto vibrator = makeVibrator();
    EXPECT_TRUE(vibrator->off().isOk());
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/activate \"0\\n\""));
    EXPECT_EQ(log.lines().front(), "E V_2_0: Vibrator off");
}

TEST_F(OnOff, FailingDriverIsAnIllegalState) {
    const auto vibrator = makeVibrator();
    kernel.addFault(
            {.path = kLeds + "activate", .operation = Operation::kWrite, .error = EIO, .times = 2});
    EXPECT_EQ(exceptionOf(vibrator->on(500, nullptr)), EX_ILLEGAL_STATE);
    EXPECT_EQ(exceptionOf(vibrator->off()), EX_ILLEGAL_STATE);
}

class SetAmplitude : public VibratorTest {
  protected:
    SetAmplitude() { kernel.addNode(kLeds + "intensity", "unset"); }
};

TEST_F(SetAmplitude, FullAndHalfAreTenAndFiveThousand) {
    const auto vibrator = makeVibrator();
    EXPECT_TRUE(vibrator->setAmplitude(1.0F).isOk());
    EXPECT_EQ(kernel.text(kLeds + "intensity"), "10000\n");
    EXPECT_TRUE(vibrator->setAmplitude(0.5F).isOk());
    EXPECT_EQ(kernel.text(kLeds + "intensity"), "5000\n");
    EXPECT_THAT(log.lines(), Contains("E V_2_0: Vibrator set amplitude: 1"));
    EXPECT_THAT(log.lines(), Contains("E V_2_0: Vibrator set amplitude: 0.5"));
}

TEST_F(SetAmplitude, FractionIsCutNotRounded) {
    const auto vibrator = makeVibrator();
    EXPECT_TRUE(vibrator->setAmplitude(0.99999F).isOk());
    EXPECT_EQ(kernel.text(kLeds + "intensity"), "9999\n");
    EXPECT_TRUE(vibrator->setAmplitude(0.00001F).isOk());
    EXPECT_EQ(kernel.text(kLeds + "intensity"), "0\n");
    EXPECT_EQ(log.line(0), "E V_2_0: Vibrator set amplitude: 0.99999");
}

TEST_F(SetAmplitude, ProductIsOfSinglePrecision) {
    const auto vibrator = makeVibrator();
    EXPECT_TRUE(vibrator->setAmplitude(0.0003F).isOk());
    EXPECT_EQ(kernel.text(kLeds + "intensity"), "3\n");
}

TEST_F(SetAmplitude, OutOfRangeIsAnIllegalArgumentWithoutALine) {
    const auto vibrator = makeVibrator();
    for (const float amplitude :
         {0.0F, -0.0F, -0.5F, 1.0001F, 2.0F, std::numeric_limits<float>::infinity(),
          -std::numeric_limits<float>::infinity()}) {
        log.clear();
        EXPECT_EQ(exceptionOf(vibrator->setAmplitude(amplitude)), EX_ILLEGAL_ARGUMENT);
        EXPECT_EQ(log.lines().back(), "I HW_API: true");
    }
    EXPECT_EQ(kernel.text(kLeds + "intensity"), "unset");
}

TEST_F(SetAmplitude, NotANumberIsAcceptedAndWritesZero) {
    const auto vibrator = makeVibrator();
    EXPECT_TRUE(vibrator->setAmplitude(std::numeric_limits<float>::quiet_NaN()).isOk());
    EXPECT_EQ(kernel.text(kLeds + "intensity"), "0\n");
}

TEST_F(SetAmplitude, FailingDriverIsAnIllegalState) {
    const auto vibrator = makeVibrator();
    kernel.addFault({.path = kLeds + "intensity", .operation = Operation::kWrite, .error = EIO});
    EXPECT_EQ(exceptionOf(vibrator->setAmplitude(0.5F)), EX_ILLEGAL_STATE);
}

TEST_F(SetAmplitude, WithoutControlIsNotOfferedWhateverTheValue) {
    kernel.removeNode(kLeds + "intensity");
    const auto vibrator = makeVibrator();
    EXPECT_EQ(exceptionOf(vibrator->setAmplitude(0.5F)), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(exceptionOf(vibrator->setAmplitude(7.0F)), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(log.lines().back(), "E V_2_0: Vibrator setAmplitude not supprot");
}

// The force-feedback gain, taken or refused.
class FakeGain : public HwApi {
  public:
    bool setForceFeedbackAmplitude(int gain) override {
        gains.push_back(gain);
        return accepts;
    }

    bool accepts = true;
    std::vector<int> gains;
};

TEST_F(SetAmplitude, IsTheGainOnForceFeedback) {
    const auto hwApi = std::make_shared<FakeGain>();
    const auto vibrator = ndk::SharedRefBase::make<Vibrator>(hwApi);
    useForceFeedback = true;
    EXPECT_TRUE(vibrator->setAmplitude(0.5F).isOk());
    hwApi->accepts = false;
    EXPECT_EQ(exceptionOf(vibrator->setAmplitude(1.0F)), EX_ILLEGAL_STATE);
    EXPECT_THAT(hwApi->gains, ElementsAre(5000, 10000));
    EXPECT_EQ(kernel.text(kLeds + "intensity"), "unset");
}

using ExternalControl = VibratorTest;

TEST_F(ExternalControl, IsConfirmedWhereTheDriverListsItAndNothingIsWritten) {
    kernel.addNode(kFunctions, "CAPABILITY_EXTERNAL_CONTROL\n", Access::kReadOnly);
    const auto vibrator = makeVibrator();
    EXPECT_TRUE(vibrator->setExternalControl(true).isOk());
    EXPECT_TRUE(vibrator->setExternalControl(false).isOk());
    EXPECT_THAT(kernel.writes(), IsEmpty());
    EXPECT_THAT(log.lines(), Contains("E Vibrator set external control: 1"));
    EXPECT_THAT(log.lines(), Contains("E Vibrator set external control: 0"));
}

TEST_F(ExternalControl, IsNotOfferedWhereTheDriverDoesNotListItOrHasNoList) {
    const auto vibrator = makeVibrator();
    EXPECT_EQ(exceptionOf(vibrator->setExternalControl(true)), EX_UNSUPPORTED_OPERATION);
    kernel.addNode(kFunctions, "INTENSITY\n", Access::kReadOnly);
    EXPECT_EQ(exceptionOf(vibrator->setExternalControl(true)), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(exceptionOf(vibrator->setExternalControl(false)), EX_UNSUPPORTED_OPERATION);
}

using Declined = VibratorTest;

TEST_F(Declined, AlwaysOnIsNeverEnabledAndLogsTheQuerysLine) {
    kernel.addNode(kLeds + "intensity");
    const auto vibrator = makeVibrator();
    EXPECT_EQ(exceptionOf(vibrator->alwaysOnEnable(1, Effect::CLICK, EffectStrength::LIGHT)),
              EX_UNSUPPORTED_OPERATION);
    EXPECT_THAT(log.lines(), ElementsAre("E V_2_0: Vibrator getSupportedAlwaysOnEffects "));
}

TEST_F(Declined, OperationsLogTheirNameAndLeaveTheirResultAlone) {
    const auto vibrator = makeVibrator();
    float number = 1.5F;
    int32_t integer = 77;
    std::vector<float> numbers = {2.5F};
    std::vector<Braking> brakings = {Braking::NONE};
    EXPECT_EQ(exceptionOf(vibrator->alwaysOnDisable(1)), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(exceptionOf(vibrator->getResonantFrequency(&number)), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(exceptionOf(vibrator->getQFactor(&number)), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(exceptionOf(vibrator->getFrequencyResolution(&number)), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(exceptionOf(vibrator->getFrequencyMinimum(&number)), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(exceptionOf(vibrator->getBandwidthAmplitudeMap(&numbers)), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(exceptionOf(vibrator->getPwlePrimitiveDurationMax(&integer)),
              EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(exceptionOf(vibrator->getPwleCompositionSizeMax(&integer)), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(exceptionOf(vibrator->getSupportedBraking(&brakings)), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(number, 1.5F);
    EXPECT_EQ(integer, 77);
    EXPECT_THAT(numbers, ElementsAre(2.5F));
    EXPECT_THAT(brakings, ElementsAre(Braking::NONE));
    EXPECT_THAT(log.lines(), ElementsAre("E V_2_0: [alwaysOnDisable]unsupported",
                                         "E V_2_0: [getResonantFrequency]unsupported",
                                         "E V_2_0: [getQFactor]unsupported",
                                         "E V_2_0: [getFrequencyResolution]unsupported",
                                         "E V_2_0: [getFrequencyMinimum]unsupported",
                                         "E V_2_0: [getBandwidthAmplitudeMap]unsupported",
                                         "E V_2_0: [getPwlePrimitiveDurationMax]unsupported",
                                         "E V_2_0: [getPwleCompositionSizeMax]unsupported",
                                         "E V_2_0: [getSupportedBraking]unsupported"));
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(VibratorTest, WithoutADeviceEveryRequestIsAnsweredAndNoneSucceeds) {
    for (const char* leaf : {"activate", "duration", "state"}) {
        kernel.removeNode(kLeds + leaf);
    }
    const auto vibrator = makeVibrator();
    int32_t result = 0;
    EXPECT_EQ(exceptionOf(vibrator->on(500, nullptr)), EX_ILLEGAL_STATE);
    EXPECT_EQ(exceptionOf(vibrator->off()), EX_ILLEGAL_STATE);
    EXPECT_EQ(exceptionOf(vibrator->setAmplitude(0.5F)), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(
            exceptionOf(vibrator->perform(Effect::CLICK, EffectStrength::LIGHT, nullptr, &result)),
            EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(exceptionOf(vibrator->setExternalControl(true)), EX_UNSUPPORTED_OPERATION);
    EXPECT_TRUE(vibrator->getCapabilities(&result).isOk());
    EXPECT_EQ(result, 0);
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
