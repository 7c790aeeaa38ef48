// SPDX-License-Identifier: Apache-2.0
// Requests on a phone with a force-feedback motor: what is uploaded, erased and played.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "phone_control.h"

namespace qvx::test {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;

// What the motor saw, in short: "upload LENGTH CUSTOM_HEX", "erase ID", "event CODE VALUE".
std::vector<std::string> motorRequests(const Phone& phone) {
    std::vector<std::string> result;
    for (const json& entry : phone.journal()) {
        const std::string op = entry.value("op", "");
        if (op == "upload") {
            result.push_back("upload " + std::to_string(entry.value("length", -1)) + " " +
                             entry.value("custom_hex", ""));
        } else if (op == "erase") {
            result.push_back("erase " + std::to_string(entry.value("id", -1)));
        } else if (op == "event") {
            result.push_back("event " + std::to_string(entry.value("code", -1)) + " " +
                             std::to_string(entry.value("value", -1)));
        }
    }
    return result;
}

TEST(ForceFeedbackPhone, OnUploadsAnEffectOfThatLengthAndPlaysIt) {
    const Phone phone("ff");
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
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
    EXPECT_THAT(motorRequests(phone), ElementsAre("event 96 5000"));
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
                ElementsAre("upload 0 0000020000000000000000320064010000000000", "event 0 1"));
}

TEST(ForceFeedbackPhone, NegativeDelayIsRefusedByTheWaveformCompiler) {
    const Phone phone("ff");
    phone.reset();
    EXPECT_EQ(phone.call({"std", "compose", "-5,CLICK,1.0"})["exception"], -5);
    EXPECT_THAT(motorRequests(phone), testing::IsEmpty());
}

TEST(ForceFeedbackPhone, FailedUploadIsIllegalState) {
    const Phone phone("ff");
    phone.reset();
    phone.fault({{"node", "motor"}, {"op", "upload"}, {"errno", "ENOSPC"}, {"times", 1}});
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], -5);
    EXPECT_THAT(phone.log(), HasSubstr("HW_API: [uploadForceFeedbackeffect]ioctl fail: "));
}

}  // namespace
}  // namespace qvx::test
