// SPDX-License-Identifier: Apache-2.0
// The maker's interface through real binder: who may call, and what reaches the driver.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "phone_control.h"

namespace qvx::test {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

constexpr int kSecurity = -1;
constexpr int kIllegalArgument = -3;

const json kLeds = {
        {"nodes",
         {{"/sys/class/leds/vibrator/state", {{"mode", "rw"}, {"text", "0\n"}}},
          {"/sys/class/leds/vibrator/duration", {{"mode", "rw"}, {"text", "0\n"}}},
          {"/sys/class/leds/vibrator/activate", {{"mode", "rw"}, {"text", "0\n"}}},
          {"/sys/class/leds/vibrator/intensity", {{"mode", "rw"}, {"text", "0\n"}}},
          {"/sys/class/leds/vibrator/multi_freq", {{"mode", "rw"}, {"text", "0\n"}}},
          {"/sys/class/leds/vibrator/motor_type", {{"mode", "rw"}, {"text", "LINEAR_1030\n"}}},
          {"/sys/class/leds/vibrator/event_cmd", {{"mode", "rw"}, {"text", "ON\n"}}},
          {"/sys/class/leds/vibrator/fifo", {{"mode", "rw"}, {"text", "0\n"}}},
          {"/sys/class/leds/vibrator/haptic_engine", {{"mode", "rw"}, {"text", "\n"}}},
          {"/sys/class/leds/vibrator/hybrid_haptic_engine", {{"mode", "rw"}, {"text", "\n"}}},
          {"/sys/class/leds/vibrator/cp_trigger_index", {{"mode", "rw"}, {"text", "0\n"}}},
          {"/sys/class/leds/vibrator/cp_trigger_queue", {{"mode", "rw"}, {"text", "\n"}}}}}};

// One call as another user, on the phone that is up.
json callAs(const std::string& user, const std::vector<std::string>& words) {
    std::vector<std::string> command = {"phone", "exec", "--user", user, "--", "vibctl", "--json"};
    command.insert(command.end(), words.begin(), words.end());
    return json::parse(runCommand(command).out, nullptr, false);
}

TEST(Extension, RefusedCallersGetOkAndTouchNothing) {
    const Phone phone(kLeds);
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    phone.reset();
    for (const char* user : {"1001", "2000", "10123"}) {
        EXPECT_EQ(callAs(user, {"ext", "setAmplitude", "5000"})["exception"], 0) << user;
        const json supported = callAs(user, {"ext", "supportsAmplitudeControl"});
        EXPECT_EQ(supported["exception"], 0) << user;
        EXPECT_EQ(supported["result"], false) << user;
        EXPECT_EQ(callAs(user, {"ext", "hasFeature", "INTENSITY"})["exception"], kSecurity) << user;
    }
    EXPECT_THAT(phone.writes(), IsEmpty());
    EXPECT_THAT(phone.log(), HasSubstr("V_4_0: Pemission denied (2000)\n"));
}

TEST(Extension, SystemAndRootAreServed) {
    const Phone phone(kLeds);
    phone.reset();
    EXPECT_EQ(callAs("1000", {"ext", "setAmplitude", "1"})["exception"], 0);
    EXPECT_EQ(phone.call({"ext", "setAmplitude", "10000"})["exception"], 0);
    EXPECT_THAT(phone.writes(), ElementsAre("intensity 1\n", "intensity 10000\n"));
}

TEST(Extension, AmplitudeOutOfRangeIsRefused) {
    const Phone phone(kLeds);
    phone.reset();
    for (const char* amplitude : {"0", "-1", "10001", "-2147483648", "2147483647"}) {
        EXPECT_EQ(phone.call({"ext", "setAmplitude", amplitude})["exception"], kIllegalArgument)
                << amplitude;
    }
    EXPECT_THAT(phone.writes(), IsEmpty());
}

TEST(Extension, PostureCommandsEndInALineFeed) {
    const Phone phone(kLeds);
    phone.reset();
    EXPECT_EQ(phone.call({"ext", "setFolderStatus", "1"})["exception"], 0);
    EXPECT_EQ(phone.call({"ext", "setFolderTentModeStatus", "0"})["exception"], 0);
    EXPECT_EQ(phone.call({"ext", "setFolderStatus", "2"})["exception"], kIllegalArgument);
    EXPECT_THAT(phone.writes(),
                ElementsAre("event_cmd FOLDER_CLOSE\n", "event_cmd FOLDER_TENT_OPEN\n"));
}

TEST(Extension, SingleLettersOfEventCmdAnswerThePostureQueries) {
    const Phone phone(kLeds);
    EXPECT_EQ(phone.call({"ext", "supportsFolderStatusSetting"})["result"], true);
    EXPECT_EQ(phone.call({"ext", "supportsFolderTentModeStatusSetting"})["result"], true);
}

TEST(Extension, AmplitudeListFollowsTheMotorAndTheIndexNode) {
    const Phone phone(kLeds);
    EXPECT_EQ(phone.call({"ext", "getAmplitudeList", "1"})["result"],
              json({0, 2000, 4000, 6000, 8000, 10000}));
    json withoutIndex = kLeds;
    withoutIndex["nodes"].erase("/sys/class/leds/vibrator/cp_trigger_index");
    runCommand({"phone", "down"});
    const Phone other(withoutIndex);
    EXPECT_EQ(other.call({"ext", "getAmplitudeList", "1"})["result"],
              json({0, 3400, 4900, 6500, 8200, 10000}));
}

TEST(Extension, HapticEnginePacketsAreScaledAndStartTheMotor) {
    const Phone phone(kLeds);
    phone.reset();
    EXPECT_EQ(phone.call({"ext", "performHapticEngine", "5000", "7,10000,2050,0"})["exception"], 0);
    EXPECT_THAT(phone.writes(), ElementsAre("haptic_engine 4 7 5000 2050 0\n", "state 1\n",
                                            "duration 1\n", "activate 1\n"));
}

TEST(Extension, HybridShortWriteIsOkWithoutVibration) {
    const Phone phone(kLeds);
    phone.reset();
    phone.fault({{"node", "/sys/class/leds/vibrator/hybrid_haptic_engine"},
                 {"op", "write"},
                 {"short", 3},
                 {"times", 1}});
    EXPECT_EQ(phone.call(
                      {"ext", "performHybridHapticEngine", "10000", "5,5000,1,3,170"})["exception"],
              0);
    EXPECT_THAT(phone.writes(), ElementsAre("hybrid_haptic_engine 4 5 5000 #3 170\n"));
}

TEST(Extension, RepeatedPatternIsQueuedWithItsZeroByte) {
    const Phone phone(kLeds);
    phone.reset();
    EXPECT_EQ(phone.call({"ext", "performPrebakedHapticPattern", "3", "5000", "true"})["exception"],
              0);
    EXPECT_THAT(phone.writes(), ElementsAre("cp_trigger_index 65534\n",
                                            std::string("cp_trigger_queue 3.50, 10, 0~") + '\0',
                                            "state 1\n", "duration 1000\n", "activate 1\n"));
}

TEST(Extension, PlaybackSequenceEndsWithItsRepeatCount) {
    const Phone phone(kLeds);
    phone.reset();
    EXPECT_EQ(phone.call({"ext", "performPlaybackEngine", "true", "2", "5,100,0",
                          "7,80,3"})["exception"],
              0);
    EXPECT_EQ(phone.writes()[1], std::string("cp_trigger_queue 5.100,7.80,3,2!") + '\0');
}

TEST(Extension, FifoTypesEndAtTwentyFive) {
    const Phone phone(kLeds);
    phone.reset();
    EXPECT_EQ(phone.call({"ext", "performFifoHapticEngine", "25"})["exception"], 0);
    EXPECT_EQ(phone.call({"ext", "performFifoHapticEngine", "26"})["exception"], kIllegalArgument);
    EXPECT_EQ(phone.call({"ext", "performFifoHapticEngine", "-1"})["exception"], kIllegalArgument);
    EXPECT_THAT(phone.writes(), ElementsAre("fifo 25\n"));
}

}  // namespace
}  // namespace qvx::test
