// SPDX-License-Identifier: Apache-2.0
//
// On, off, amplitude, the running question and the caller check, on each device class.
#include <cerrno>
#include <string>
#include <vector>

#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Operation;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class BasicControl : public ServiceTest {};

using OnLeds = BasicControl;

TEST_F(OnLeds, OnWritesStateDurationAndActivateInThisOrder) {
    addLedsClass();
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->do_on(500));
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/leds/vibrator/state O_RDWR",
                                            "write /sys/class/leds/vibrator/state \"1\\n\"",
                                            "close /sys/class/leds/vibrator/state",
                                            "open /sys/class/leds/vibrator/duration O_RDWR",
                                            "write /sys/class/leds/vibrator/duration \"500\\n\"",
                                            "close /sys/class/leds/vibrator/duration",
                                            "open /sys/class/leds/vibrator/activate O_RDWR",
                                            "write /sys/class/leds/vibrator/activate \"1\\n\"",
                                            "close /sys/class/leds/vibrator/activate"));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: do_on for timeoutMs: 500",
                            "I HW_API: >> writeNode node:/leds/vibrator/state val:1",
                            "I HW_API: << writeNode node OK : 2",
                            "I HW_API: >> writeNode node:/leds/vibrator/duration val:500",
                            "I HW_API: << writeNode node OK : 4",
                            "I HW_API: >> writeNode node:/leds/vibrator/activate val:1",
                            "I HW_API: << writeNode node OK : 2"));
}

TEST_F(OnLeds, OffWritesActivateOnly) {
    addLedsClass();
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->do_off());
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/activate \"0\\n\""));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: do_off",
                            "I HW_API: >> writeNode node:/leds/vibrator/activate val:0",
                            "I HW_API: << writeNode node OK : 2"));
}

TEST_F(OnLeds, FailedStateWriteEndsTheSequence) {
    addLedsClass();
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kLeds + "state", .operation = Operation::kWrite, .error = EIO});
    EXPECT_FALSE(hwApi->do_on(500));
    EXPECT_THAT(kernel.writes(), IsEmpty());
    EXPECT_EQ(log.lines().back(), "I HW_API: Vibrator on THE_DEVICE_STATE error");
}

TEST_F(OnLeds, FailedDurationWriteLeavesTheStateWritten) {
    addLedsClass();
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kLeds + "duration", .operation = Operation::kWrite, .limit = 1});
    EXPECT_FALSE(hwApi->do_on(500));
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/state \"1\\n\"",
                                             "/sys/class/leds/vibrator/duration \"5\""));
    EXPECT_EQ(log.lines().back(), "I HW_API: Vibrator on THE_DEVICE_DURATION error");
    EXPECT_EQ(kernel.text(kLeds + "state"), "1\n");
}

TEST_F(OnLeds, FailedActivateWriteLeavesTheOthersWritten) {
    addLedsClass();
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kLeds + "activate", .operation = Operation::kOpen, .error = EACCES});
    EXPECT_FALSE(hwApi->do_on(500));
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/state \"1\\n\"",
                                             "/sys/class/leds/vibrator/duration \"500\\n\""));
    EXPECT_EQ(log.lines().back(), "I HW_API: Vibrator on THE_DEVICE_ACTIVATE error");
}

TEST_F(OnLeds, FailedOffHasNoLineOfItsOwn) {
    addLedsClass();
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kLeds + "activate", .operation = Operation::kWrite, .error = EIO});
    EXPECT_FALSE(hwApi->do_off());
    EXPECT_EQ(log.lines().back(), "I HW_API: << writeNode node UNKNOWN_ERROR : 2 , -1");
}

TEST_F(OnLeds, RunningIsWhatTheDurationNodeSays) {
    addLedsClass();
    const auto hwApi = makeHwApi();
    kernel.addNode(kLeds + "duration", "1\n");
    EXPECT_TRUE(hwApi->isVibrating());
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/leds/vibrator/duration O_RDONLY",
                                            "read /sys/class/leds/vibrator/duration 7 \"1\\n\"",
                                            "close /sys/class/leds/vibrator/duration"));
    EXPECT_EQ(log.lines().back(), "I HW_API: isVibrating : true");
    kernel.addNode(kLeds + "duration", "0\n");
    EXPECT_FALSE(hwApi->isVibrating());
    EXPECT_EQ(log.lines().back(), "I HW_API: isVibrating : false");
}

using OnLegacy = BasicControl;

TEST_F(OnLegacy, OnWritesTheDurationToEnable) {
    addLegacyClass();
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->do_on(500));
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/timed_output/vibrator/enable \"500\\n\""));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: do_on for timeoutMs: 500",
                            "I HW_API: >> writeNode node:/timed_output/vibrator/enable val:500",
                            "I HW_API: << writeNode node OK : 4"));
}

TEST_F(OnLegacy, ZeroAndNegativeDurationsArePassedOn) {
    addLegacyClass();
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->do_on(0));
    EXPECT_TRUE(hwApi->do_on(-1));
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/timed_output/vibrator/enable \"0\\n\"",
                                             "/sys/class/timed_output/vibrator/enable \"-1\\n\""));
}

TEST_F(OnLegacy, FailedOnIsLogged) {
    addLegacyClass();
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kLegacy + "enable", .operation = Operation::kWrite, .error = EIO});
    EXPECT_FALSE(hwApi->do_on(500));
    EXPECT_EQ(log.lines().back(), "I HW_API: Vibrator on THE_DEVICE error");
}

TEST_F(OnLegacy, OffWritesZeroToEnable) {
    addLegacyClass();
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->do_off());
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/timed_output/vibrator/enable \"0\\n\""));
    kernel.addFault({.path = kLegacy + "enable", .operation = Operation::kWrite, .error = EIO});
    EXPECT_FALSE(hwApi->do_off());
}

TEST_F(OnLegacy, RunningIsWhatTheEnableNodeSays) {
    addLegacyClass();
    const auto hwApi = makeHwApi();
    kernel.addNode(kLegacy + "enable", "37\n");
    EXPECT_TRUE(hwApi->isVibrating());
    kernel.addNode(kLegacy + "enable", "0\n");
    EXPECT_FALSE(hwApi->isVibrating());
}

TEST_F(BasicControl, WithoutADeviceNothingRunsAndNothingStarts) {
    const auto hwApi = makeHwApi();
    EXPECT_FALSE(hwApi->do_on(500));
    EXPECT_FALSE(hwApi->do_off());
    EXPECT_FALSE(hwApi->setAmplitude(1));
    EXPECT_FALSE(hwApi->isVibrating());
}

using Amplitude = BasicControl;

TEST_F(Amplitude, SmallestAndLargestAreWrittenUnchanged) {
    addLedsClass();
    kernel.addNode(kLeds + "intensity");
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->setAmplitude(1));
    EXPECT_TRUE(hwApi->setAmplitude(10000));
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/intensity \"1\\n\"",
                                             "/sys/class/leds/vibrator/intensity \"10000\\n\""));
    EXPECT_EQ(log.lines().front(), "I HW_API: setAmplitude : INTENSITY 1");
}

TEST_F(Amplitude, OutOfRangeIsRefusedAndNothingWritten) {
    addLedsClass();
    kernel.addNode(kLeds + "intensity");
    const auto hwApi = makeHwApi();
    for (const int amplitude : {0, 10001, -1, -2147483647 - 1, 2147483647}) {
        log.clear();
        EXPECT_FALSE(hwApi->setAmplitude(amplitude));
        EXPECT_THAT(log.lines(),
                    ElementsAre("I HW_API: setAmplitude : INTENSITY " + std::to_string(amplitude),
                                "I HW_API: setAmplitude amplitude is abnormal " +
                                        std::to_string(amplitude)));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(Amplitude, FailedWriteIsLogged) {
    addLegacyClass();
    const auto hwApi = makeHwApi();
    EXPECT_FALSE(hwApi->setAmplitude(5000));
    EXPECT_EQ(log.lines().back(), "I HW_API: setAmplitude : INTENSITY error");
}

TEST_F(BasicControl, RootAndSystemMayAsk) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->checkClientUID(0));
    EXPECT_TRUE(hwApi->checkClientUID(1000));
    EXPECT_FALSE(hwApi->checkClientUID(1001));
    EXPECT_FALSE(hwApi->checkClientUID(999));
    EXPECT_FALSE(hwApi->checkClientUID(2000));
    EXPECT_FALSE(hwApi->checkClientUID(101000));
    EXPECT_FALSE(hwApi->checkClientUID(-1));
    EXPECT_THAT(log.lines(), IsEmpty());
}

// The force-feedback operations that basic control calls, answering as the test says.
class FakeForceFeedback : public HwApi {
  public:
    bool setForceFeedbackDuration(int durationMs) override {
        requests.push_back("duration " + std::to_string(durationMs));
        return accepts;
    }
    bool setForceFeedbackAmplitude(int gain) override {
        requests.push_back("gain " + std::to_string(gain));
        return accepts;
    }
    bool triggerForceFeedbackVibration(bool on) override {
        requests.emplace_back(on ? "start" : "stop");
        return accepts && triggers;
    }

    bool accepts = true;
    bool triggers = true;
    std::vector<std::string> requests;
};

class OnForceFeedback : public ServiceTest {
  protected:
    OnForceFeedback() {
        useForceFeedback = true;
        kernel.clear();
        log.clear();
    }

    FakeForceFeedback hwApi;
};

TEST_F(OnForceFeedback, OnSetsTheDurationAndStarts) {
    EXPECT_TRUE(hwApi.do_on(500));
    EXPECT_THAT(hwApi.requests, ElementsAre("duration 500", "start"));
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: do_on for timeoutMs: 500"));
}

TEST_F(OnForceFeedback, RefusedDurationIsNotStarted) {
    hwApi.accepts = false;
    EXPECT_FALSE(hwApi.do_on(500));
    EXPECT_THAT(hwApi.requests, ElementsAre("duration 500"));
}

TEST_F(OnForceFeedback, FailedStartFails) {
    hwApi.triggers = false;
    EXPECT_FALSE(hwApi.do_on(500));
}

TEST_F(OnForceFeedback, OffStops) {
    EXPECT_TRUE(hwApi.do_off());
    EXPECT_THAT(hwApi.requests, ElementsAre("stop"));
    hwApi.accepts = false;
    EXPECT_FALSE(hwApi.do_off());
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: do_off", "I HW_API: do_off"));
}

TEST_F(OnForceFeedback, AmplitudeIsTheGain) {
    EXPECT_TRUE(hwApi.setAmplitude(10000));
    EXPECT_FALSE(hwApi.setAmplitude(10001));
    EXPECT_THAT(hwApi.requests, ElementsAre("gain 10000"));
    hwApi.accepts = false;
    EXPECT_FALSE(hwApi.setAmplitude(1));
    EXPECT_EQ(log.lines().back(), "I HW_API: setAmplitude : FF INTENSITY error");
}

TEST_F(OnForceFeedback, NeverSaysThatItRuns) {
    EXPECT_TRUE(hwApi.do_on(500));
    EXPECT_FALSE(hwApi.isVibrating());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/timed_output/vibrator/enable O_RDONLY = ENOENT"));
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
