// SPDX-License-Identifier: Apache-2.0
//
// Prebaked patterns, once and repeating, on a force-feedback motor.
#include <cerrno>
#include <string>
#include <vector>

#include "tests/force_feedback_phone.h"
#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Operation;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

// The force-feedback operations that patterns call, one of which may fail.
class FailingForceFeedback : public HwApi {
  public:
    bool setForceFeedbackAmplitude(int gain) override {
        return answer("gain " + std::to_string(gain));
    }
    bool setForceFeedbackIndex(int index) override {
        return answer("index " + std::to_string(index));
    }
    bool setForceFeedbackDuration(int durationMs) override {
        return answer("duration " + std::to_string(durationMs));
    }
    bool triggerForceFeedbackVibration(bool on) override { return answer(on ? "start" : "stop"); }

    std::string refused;
    std::vector<std::string> requests;

  private:
    bool answer(const std::string& request) {
        requests.push_back(request);
        return request != refused;
    }
};

class PatternOnForceFeedback : public ServiceTest {
  protected:
    PatternOnForceFeedback() {
        useForceFeedback = true;
        kernel.clear();
        log.clear();
    }

    FailingForceFeedback hwApi;
};

TEST_F(PatternOnForceFeedback, OnceSetsGainAndIndexAndStarts) {
    EXPECT_TRUE(hwApi.performPrebakedHapticPattern(23, 6700, false));
    EXPECT_THAT(hwApi.requests, ElementsAre("gain 6700", "index 23", "duration 1000", "start"));
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern one shoot end");
}

TEST_F(PatternOnForceFeedback, OnceWithNegativeIndexIsStartedToo) {
    EXPECT_TRUE(hwApi.performPrebakedHapticPattern(-3, 5000, false));
    EXPECT_THAT(hwApi.requests, ElementsAre("gain 5000", "index -3", "duration 1000", "start"));
}

TEST_F(PatternOnForceFeedback, OnceWithIndexZeroIsNotStarted) {
    EXPECT_TRUE(hwApi.performPrebakedHapticPattern(0, 6700, false));
    EXPECT_THAT(hwApi.requests, ElementsAre("gain 6700", "index 0"));
}

TEST_F(PatternOnForceFeedback, RefusedGainOrIndexEndsItWithoutALine) {
    hwApi.refused = "gain 6700";
    EXPECT_FALSE(hwApi.performPrebakedHapticPattern(23, 6700, false));
    EXPECT_THAT(hwApi.requests, ElementsAre("gain 6700"));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern one shoot starts");
    hwApi.refused = "index 23";
    EXPECT_FALSE(hwApi.performPrebakedHapticPattern(23, 6700, false));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern one shoot starts");
}

TEST_F(PatternOnForceFeedback, RepeatWithIndexZeroIsRefused) {
    EXPECT_FALSE(hwApi.performPrebakedHapticPattern(0, 6700, true));
    EXPECT_THAT(hwApi.requests, IsEmpty());
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: performPrebakedHapticPattern 0 : 6700 : 1",
                            "I HW_API: performPrebakedHapticPattern repeat starts",
                            "I V_2_0: performPrebakedHapticPattern Cannot use patternIndex 0 with "
                            "repeat"));
}

TEST_F(PatternOnForceFeedback, RepeatWithRefusedGainEndsItWithoutALine) {
    hwApi.refused = "gain 6700";
    EXPECT_FALSE(hwApi.performPrebakedHapticPattern(23, 6700, true));
    EXPECT_EQ(log.lines().back(), "I HW_API: performPrebakedHapticPattern repeat starts");
}

TEST_F(PatternOnForceFeedback, RepeatThatCannotBeUploadedIsLogged) {
    EXPECT_FALSE(hwApi.performPrebakedHapticPattern(23, 6700, true));
    EXPECT_EQ(log.lines().back(), "I V_2_0: performPrebakedHapticPattern setAndTriggerOwt fail");
}

using PatternOnMotor = ForceFeedbackPhone;

TEST_F(PatternOnMotor, OnceUploadsTheIndexAndPlaysIt) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(23, 6700, false));
    EXPECT_THAT(
            kernel.calls(),
            ElementsAre(
                    "open /dev/input/event7 O_RDWR", "event type=21 code=96 value=6700",
                    R"(upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 custom="00 00 17 00")",
                    "event type=21 code=0 value=1"));
}

TEST_F(PatternOnMotor, OnceWithIndexZeroUploadsAndPlaysNothing) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(0, 6700, false));
    EXPECT_THAT(
            kernel.calls(),
            ElementsAre(
                    "open /dev/input/event7 O_RDWR", "event type=21 code=96 value=6700",
                    R"(upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 custom="00 00 00 00")"));
}

TEST_F(PatternOnMotor, RepeatedUploadsALoopAndPlaysIt) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(5, 6700, true));
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /dev/input/event7 O_RDWR", "event type=21 code=96 value=6700",
                            R"(upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 )"
                            R"(custom="00 00 01 ff 00 64 05 00 00 00 00 0a")",
                            "event type=21 code=0 value=1"));
    EXPECT_EQ(log.lines().back(), "I V_2_0: performPrebakedHapticPattern end");
}

TEST_F(PatternOnMotor, SecondPatternReplacesTheFirst) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(5, 6700, true));
    kernel.clear();
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(23, 10000, false));
    EXPECT_THAT(
            kernel.calls(),
            ElementsAre(
                    "event type=21 code=96 value=10000", "erase id=0",
                    R"(upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 custom="00 00 17 00")",
                    "event type=21 code=0 value=1"));
}

TEST_F(PatternOnMotor, RepeatThatCannotBeUploadedIsNotPlayed) {
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kMotorNode, .operation = Operation::kIoctl, .error = ENOSPC});
    EXPECT_FALSE(hwApi->performPrebakedHapticPattern(5, 6700, true));
    EXPECT_EQ(log.lines().back(), "I V_2_0: performPrebakedHapticPattern setAndTriggerOwt fail");
    EXPECT_EQ(kernel.calls().size(), 3U);
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
