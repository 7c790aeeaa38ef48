// SPDX-License-Identifier: Apache-2.0
//
// The designs that come with the project, played on a whole phone.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/command.h"
#include "tests/support/kernel_log.h"
#include "tests/support/phone_control.h"

namespace qvx::test {
namespace {

using testing::HasSubstr;

struct Design {
    const char* name;
    std::vector<std::string> writes;  // of the LED class, which offers packets
};

// Packets are started like a vibration of one millisecond.
std::vector<std::string> packets(const std::string& text) {
    return {"haptic_engine " + text + "\n", "state 1\n", "duration 1\n", "activate 1\n"};
}

const Design kDesigns[] = {
        {"heartbeat.ahap", packets("28 20 10000 1700 0 130 0 1700 0 20 6000 1700 0 630 0 1700 0 20 "
                                   "10000 1700 0 130 0 "
                                   "1700 0 20 6000 1700 0")},
        {"notification.ahap", packets("12 20 8000 2300 0 80 0 2300 0 20 10000 2300 0")},
        {"ramp.ahap", packets("16 20 2000 2000 0 20 4000 2000 0 20 6000 2000 0 20 8000 2000 0")},
        {"texture.ahap", packets("28 20 5000 2500 0 20 0 2500 0 20 5000 2500 0 20 0 2500 0 20 5000 "
                                 "2500 0 20 0 2500 "
                                 "0 20 5000 2500 0")},
        {"knock.ahap", packets("12 20 10000 1500 0 100 0 1500 0 20 10000 1500 0")},
        {"success.ahap", packets("12 20 5000 2000 0 80 0 2100 0 150 8000 2100 0")},
        {"error.ahap",
         packets("20 60 10000 2400 0 40 0 2400 0 60 10000 2400 0 40 0 2400 0 60 10000 2400 0")},
        {"engine.ahap", packets("8 200 4000 1500 0 100 9000 1800 0")},
        {"raindrops.ahap", packets("28 20 3000 2400 0 50 0 2200 0 20 5000 2200 0 110 0 2500 0 20 "
                                   "2000 2500 0 50 0 2300 "
                                   "0 20 6000 2300 0")},
        {"alarm.jsonl",
         {"intensity 10000\n", "state 1\n", "duration 200\n", "activate 1\n", "state 1\n",
          "duration 200\n", "activate 1\n", "activate 0\n"}},
        {"countdown.jsonl",
         {"state 1\n", "duration 30\n", "activate 1\n", "state 1\n", "duration 30\n",
          "activate 1\n", "haptic_engine 4 100 10000 2000 0\n", "state 1\n", "duration 1\n",
          "activate 1\n"}},
};

TEST(Play, WritesWhatEachDesignIsMadeOf) {
    const Phone phone("leds");
    for (const Design& design : kDesigns) {
        phone.reset();
        const CommandResult result =
                runCommand({"vibctl", "play", std::string(DESIGNS "/") + design.name});
        EXPECT_EQ(result.status, 0) << design.name << result.out << result.err;
        EXPECT_THAT(result.out, HasSubstr(" ms late: ")) << design.name;
        EXPECT_EQ(phone.writes(), design.writes) << design.name;
    }
}

TEST(Play, PlaysStepsAndASequenceFromStandardInput) {
    const Phone phone("leds");
    phone.reset();
    EXPECT_EQ(runCommand({"vibctl", "play", "0", "50", "20", "60", "--amplitudes", "0,1,0,0.5"})
                      .status,
              0);
    EXPECT_EQ(runShell("echo '{\"method\": \"off\"}' | vibctl play -").status, 0);
    EXPECT_THAT(phone.writes(),
                testing::ElementsAre("intensity 10000\n", "state 1\n", "duration 50\n",
                                     "activate 1\n", "intensity 5000\n", "state 1\n",
                                     "duration 60\n", "activate 1\n", "activate 0\n"));
}

TEST(Play, TurnsTheMotorOffWhenItIsInterrupted) {
    const Phone phone("leds");
    phone.reset();
    const CommandResult result = runShell(
            "vibctl play 0 9000 1000 9000 --repeat 9 2>&1 & sleep 3; kill -TERM $!; wait $!");
    EXPECT_EQ(result.status, 128 + 15);
    EXPECT_THAT(result.out, HasSubstr("vibctl: interrupted; the motor is off\n"));
    EXPECT_THAT(phone.writes(), testing::ElementsAre("state 1\n", "duration 9000\n", "activate 1\n",
                                                     "activate 0\n"));
}

TEST(Play, PlaysNothingOfAFileThatIsWrong) {
    const Phone phone("leds");
    phone.reset();
    const CommandResult result = runShell(
            "printf '{\"method\": \"on\", \"args\": [50]}\\n{\"method\": \"preform\"}\\n' | vibctl "
            "play -");
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err,
              "vibctl: -: line 2: method: std: unknown method \"preform\"; did you mean perform\n");
    EXPECT_THAT(phone.writes(), testing::IsEmpty());
}

TEST(Play, MakesCompositionsWhereThereAreNoPackets) {
    // The client is gone when the composition ends and its callback is called.
    const ExpectBinderComplaints expected;
    const Phone phone("ff");
    const CommandResult result =
            runCommand({"vibctl", "play", DESIGNS "/notification.ahap", "--explain"});
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_THAT(result.out, HasSubstr("line 4: transient at 0 ms, intensity 0.8, sharpness 0.8: "
                                      "CLICK\nline 5: transient at 100 ms, intensity 1, sharpness "
                                      "0.8: CLICK\n"));
    EXPECT_THAT(result.out, HasSubstr(" ms late: std compose 0,CLICK,0.8 80,CLICK,1: ok\n"));
}

}  // namespace
}  // namespace qvx::test
