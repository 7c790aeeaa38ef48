// SPDX-License-Identifier: Apache-2.0
//
// Requests on a phone with a force-feedback motor: what is uploaded, erased and played.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/phone_control.h"
#include "tests/system/force_feedback_journal.h"

namespace qvx::test {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;

TEST(ForceFeedbackPhone, OnUploadsAnEffectOfThatLengthAndPlaysIt) {
    const Phone phone("ff");
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    phone.call({"std", "setAmplitude", "1.0"});  // opens the motor
    phone.reset();
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], 0);
    EXPECT_THAT(motorRequests(phone), ElementsAre("upload 500 00000000", "event 0 1"));
}

TEST(ForceFeedbackPhone, SecondOnErasesTheFirstEffect) {
    const Phone phone("ff");
    phone.call({"std", "on", "500"});
    phone.reset();
    EXPECT_EQ(phone.call({"std", "on", "250"})["exception"], 0);
    EXPECT_THAT(motorRequests(phone), ElementsAre("erase 0", "upload 250 00000000", "event 0 1"));
}

TEST(ForceFeedbackPhone, OffStopsTheUploadedEffect) {
    const Phone phone("ff");
    phone.call({"std", "on", "500"});
    phone.reset();
    EXPECT_EQ(phone.call({"std", "off"})["exception"], 0);
    EXPECT_THAT(motorRequests(phone), ElementsAre("event 0 0"));
}

TEST(ForceFeedbackPhone, AmplitudeIsSentAsGain) {
    const Phone phone("ff");
    phone.reset();
    EXPECT_EQ(phone.call({"std", "setAmplitude", "0.5"})["exception"], 0);
    EXPECT_THAT(motorRequests(phone), ElementsAre("open motor O_RDWR", "event 96 5000"));
}

TEST(ForceFeedbackPhone, CalibrationReachesTheDriver) {
    json profile = builtInProfile("ff");
    profile["files"]["/efs/FactoryApp/vibrator_calibration"] = " 137 \n";
    const Phone phone(profile);
    EXPECT_THAT(phone.writes(), testing::Contains("f0_stored 137\n"));
}

TEST(ForceFeedbackPhone, CompositionIsUploadedAsACompiledWaveformAndCompletes) {
    json profile = builtInProfile("ff");
    profile["nodes"].erase("/sys/class/qvx_vib_inputff/control/use_kyp_index");
    const Phone phone(profile);
    phone.reset();
    const json answer = phone.call({"std", "compose", "50,CLICK,1.0", "--callback"});
    EXPECT_EQ(answer["exception"], 0);
    EXPECT_TRUE(answer["callback"].is_number()) << answer;
    EXPECT_GE(answer["callback"].get<double>(), 70.0);
    EXPECT_THAT(motorRequests(phone),
                ElementsAre("open motor O_RDWR",
                            "upload 0 0000020000000000000000320064010000000000", "event 0 1"));
}

TEST(ForceFeedbackPhone, NegativeDelayIsRefusedByTheWaveformCompiler) {
    const Phone phone("ff");
    phone.reset();
    EXPECT_EQ(phone.call({"std", "compose", "-5,CLICK,1.0"})["exception"], -5);
    EXPECT_THAT(motorRequests(phone), testing::IsEmpty());
}

TEST(ForceFeedbackPhone, EveryFieldOfARequestIsAsTheDriverExpectsIt) {
    const Phone phone("ff");
    phone.reset();
    phone.call({"std", "on", "500"});
    phone.call({"std", "setAmplitude", "1.0"});
    phone.call({"std", "on", "70"});
    const auto upload = [](int length) {
        return json{{"uid", 1000},        {"op", "upload"},
                    {"node", "motor"},    {"id", -1},
                    {"result", 0},        {"type", 81},
                    {"waveform", 93},     {"length", length},
                    {"delay", 0},         {"direction", 0},
                    {"button", 0},        {"interval", 0},
                    {"period", 0},        {"magnitude", 0},
                    {"offset", 0},        {"phase", 0},
                    {"attack_length", 0}, {"attack_level", 0},
                    {"fade_length", 0},   {"fade_level", 0},
                    {"custom_len", 2},    {"custom_hex", "00000000"}};
    };
    const auto event = [](int code, int value) {
        return json{{"uid", 1000},  {"op", "event"},  {"node", "motor"}, {"type", 21},
                    {"code", code}, {"value", value}, {"result", 24}};
    };
    EXPECT_THAT(motorLines(phone), ElementsAre(json({{"uid", 1000},
                                                     {"op", "open"},
                                                     {"node", "motor"},
                                                     {"flags", "O_RDWR"},
                                                     {"error", 0}}),
                                               upload(500), event(0, 1), event(96, 10000),
                                               json({{"uid", 1000},
                                                     {"op", "erase"},
                                                     {"node", "motor"},
                                                     {"id", 0},
                                                     {"result", 0}}),
                                               upload(70), event(0, 1)));
}

TEST(ForceFeedbackPhone, DurationIsOfSixteenBits) {
    const Phone phone("ff");
    phone.reset();
    for (const char* duration : {"65536", "65535", "-1"}) {
        EXPECT_EQ(phone.call({"std", "on", duration})["exception"], 0) << duration;
    }
    EXPECT_THAT(motorRequests(phone),
                ElementsAre("open motor O_RDWR", "upload 0 00000000", "event 0 1", "erase 0",
                            "upload 65535 00000000", "event 0 1", "erase 0",
                            "upload 65535 00000000", "event 0 1"));
}

TEST(ForceFeedbackPhone, OffBeforeAnyOnStopsNoEffect) {
    const Phone phone("ff");
    phone.reset();
    EXPECT_EQ(phone.call({"std", "off"})["exception"], 0);
    EXPECT_THAT(motorRequests(phone), ElementsAre("open motor O_RDWR", "event 65535 0"));
}

TEST(ForceFeedbackPhone, OnAfterAnEffectStartsThatEffectAgain) {
    const Phone phone("ff");
    EXPECT_EQ(phone.call({"std", "perform", "CLICK", "STRONG"})["exception"], 0);
    phone.reset();
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], 0);
    EXPECT_THAT(motorRequests(phone), ElementsAre("event 0 1"));
}

TEST(ForceFeedbackPhone, SwitchesTheDriverToThePlatformsNumbersAtItsStart) {
    const Phone phone("ff");
    EXPECT_THAT(phone.writes(), ElementsAre("use_kyp_index 1\n", "f0_stored 137\n"));
    EXPECT_THAT(phone.log(), HasSubstr("HW_API: Vibrator using ForceFeedback\n"));
}

TEST(ForceFeedbackPhone, CalibrationOfWhiteSpaceIsNotPassedOn) {
    json profile = builtInProfile("ff");
    profile["files"]["/efs/FactoryApp/vibrator_calibration"] = " \n";
    const Phone phone(profile);
    EXPECT_THAT(phone.writes(), ElementsAre("use_kyp_index 1\n"));
    EXPECT_THAT(phone.log(), HasSubstr("HW_API: Fail - read vibrator_calibration\n"));
}

}  // namespace
}  // namespace qvx::test
