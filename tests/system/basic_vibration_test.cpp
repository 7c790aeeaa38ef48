// SPDX-License-Identifier: Apache-2.0
//
// On, off, amplitude and the reports of the standard interface, on each kind of phone with sysfs
// nodes and on a phone without a motor.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/phone_control.h"

namespace qvx::test {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

constexpr int kUnsupportedOperation = -7;

const json kLedsWithAmplitude = {
        {"nodes",
         {{"/sys/class/leds/vibrator/state", {{"mode", "rw"}, {"text", "0\n"}}},
          {"/sys/class/leds/vibrator/duration", {{"mode", "rw"}, {"text", "0\n"}}},
          {"/sys/class/leds/vibrator/activate", {{"mode", "rw"}, {"text", "0\n"}}},
          {"/sys/class/leds/vibrator/intensity", {{"mode", "rw"}, {"text", "0\n"}}}}}};

const json kLedsWithoutAmplitude = {
        {"nodes",
         {{"/sys/class/leds/vibrator/state", {{"mode", "rw"}, {"text", "0\n"}}},
          {"/sys/class/leds/vibrator/duration", {{"mode", "rw"}, {"text", "0\n"}}},
          {"/sys/class/leds/vibrator/activate", {{"mode", "rw"}, {"text", "0\n"}}}}}};

json withFunctions(json profile, const std::string& functions) {
    profile["nodes"]["/sys/class/vib_info_class/vib_support_info/functions"] = {
            {"mode", "ro"}, {"text", functions}};
    return profile;
}

TEST(LedsPhone, OnWritesStateThenDurationThenActivate) {
    const Phone phone("leds");
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    phone.reset();
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], 0);
    EXPECT_THAT(phone.writes(), ElementsAre("state 1\n", "duration 500\n", "activate 1\n"));
}

TEST(LedsPhone, OffWritesActivateOnly) {
    const Phone phone("leds");
    phone.reset();
    EXPECT_EQ(phone.call({"std", "off"})["exception"], 0);
    EXPECT_THAT(phone.writes(), ElementsAre("activate 0\n"));
}

TEST(LedsPhone, NegativeDurationReachesTheDriver) {
    const Phone phone("leds");
    phone.reset();
    EXPECT_EQ(phone.call({"std", "on", "-1"})["exception"], 0);
    EXPECT_THAT(phone.writes(), ElementsAre("state 1\n", "duration -1\n", "activate 1\n"));
}

TEST(LedsPhone, NodesAreWrittenByTheSystemUser) {
    const Phone phone("leds");
    phone.reset();
    phone.call({"std", "on", "500"});
    ASSERT_FALSE(phone.journal().empty());
    for (const json& entry : phone.journal()) {
        EXPECT_EQ(entry["uid"], 1000) << entry;
        EXPECT_EQ(entry["pid"], phone.servicePid()) << entry;
    }
}

TEST(LedsPhone, EachNodeIsOpenedReadWriteAndClosed) {
    const Phone phone("leds");
    phone.reset();
    phone.call({"std", "off"});
    const std::vector<json> journal = phone.journal();
    ASSERT_EQ(journal.size(), 3U);
    EXPECT_EQ(journal[0]["op"], "open");
    EXPECT_EQ(journal[0]["flags"], "O_RDWR");
    EXPECT_EQ(journal[1]["op"], "write");
    EXPECT_EQ(journal[1]["result"], 2);
    EXPECT_EQ(journal[2]["op"], "close");
}

TEST(LegacyPhone, OnWritesTheDurationToEnable) {
    const Phone phone("legacy");
    phone.reset();
    EXPECT_EQ(phone.call({"std", "on", "250"})["exception"], 0);
    EXPECT_THAT(phone.writes(), ElementsAre("enable 250\n"));
}

TEST(LegacyPhone, OnZeroWritesZeroToEnable) {
    const Phone phone("legacy");
    phone.reset();
    EXPECT_EQ(phone.call({"std", "on", "0"})["exception"], 0);
    EXPECT_THAT(phone.writes(), ElementsAre("enable 0\n"));
}

TEST(LegacyPhone, OffWritesZeroToEnable) {
    const Phone phone("legacy");
    phone.reset();
    EXPECT_EQ(phone.call({"std", "off"})["exception"], 0);
    EXPECT_THAT(phone.writes(), ElementsAre("enable 0\n"));
}

TEST(PhoneWithoutMotor, RegistersAndAnswersIllegalState) {
    const Phone phone("none");
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"std", "off"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"std", "getCapabilities"})["result"], 0);
    EXPECT_THAT(phone.log(), HasSubstr("HW_API: Fail to find CS40L26 info"));
}

TEST(Amplitude, IsScaledToTenThousandAndTruncated) {
    const Phone phone(kLedsWithAmplitude);
    phone.reset();
    EXPECT_EQ(phone.call({"std", "setAmplitude", "1.0"})["exception"], 0);
    EXPECT_EQ(phone.call({"std", "setAmplitude", "0.5"})["exception"], 0);
    EXPECT_EQ(phone.call({"std", "setAmplitude", "0.00019"})["exception"], 0);
    EXPECT_EQ(phone.call({"std", "setAmplitude", "nan"})["exception"], 0);
    EXPECT_THAT(phone.writes(), ElementsAre("intensity 10000\n", "intensity 5000\n",
                                            "intensity 1\n", "intensity 0\n"));
}

TEST(Amplitude, OutOfRangeIsRefusedAndNothingIsWritten) {
    const Phone phone(kLedsWithAmplitude);
    phone.reset();
    for (const char* amplitude : {"0", "-1", "1.1", "inf"}) {
        EXPECT_EQ(phone.call({"std", "setAmplitude", amplitude})["exception"], kIllegalArgument)
                << amplitude;
    }
    EXPECT_THAT(phone.writes(), IsEmpty());
}

TEST(Amplitude, WithoutIntensityNodeIsUnsupportedWhateverTheValue) {
    const Phone phone(kLedsWithoutAmplitude);
    EXPECT_EQ(phone.call({"std", "setAmplitude", "0.5"})["exception"], kUnsupportedOperation);
    EXPECT_EQ(phone.call({"std", "setAmplitude", "7"})["exception"], kUnsupportedOperation);
    EXPECT_THAT(phone.log(), HasSubstr("V_2_0: Vibrator setAmplitude not supprot"));
}

TEST(Capabilities, FollowNodeAndFunctionList) {
    {
        const Phone phone(kLedsWithoutAmplitude);
        EXPECT_EQ(phone.call({"std", "getCapabilities"})["result"], 0);
    }
    {
        const Phone phone(kLedsWithAmplitude);
        EXPECT_EQ(phone.call({"std", "getCapabilities"})["result"], 4);
    }
    {
        const Phone phone(withFunctions(kLedsWithAmplitude,
                                        "CAPABILITY_EXTERNAL_CONTROL\nPRIMITIVE_EFFECT_COMPOSE\n"));
        EXPECT_EQ(phone.call({"std", "getCapabilities"})["result"], 60);
    }
}

TEST(ExternalControl, IsConfirmedByTheFunctionListAndWritesNothing) {
    const Phone phone(withFunctions(kLedsWithAmplitude, "CAPABILITY_EXTERNAL_CONTROL\n"));
    phone.reset();
    EXPECT_EQ(phone.call({"std", "setExternalControl", "true"})["exception"], 0);
    EXPECT_EQ(phone.call({"std", "setExternalControl", "false"})["exception"], 0);
    EXPECT_THAT(phone.writes(), IsEmpty());
}

TEST(ExternalControl, WithoutTheFeatureIsUnsupported) {
    const Phone phone(kLedsWithAmplitude);
    EXPECT_EQ(phone.call({"std", "setExternalControl", "true"})["exception"],
              kUnsupportedOperation);
}

TEST(DeclinedOperations, AnswerUnsupported) {
    const Phone phone("leds");
    const std::vector<std::vector<std::string>> calls = {
            {"std", "alwaysOnEnable", "0", "CLICK", "STRONG"},
            {"std", "alwaysOnDisable", "0"},
            {"std", "getResonantFrequency"},
            {"std", "getQFactor"},
            {"std", "getFrequencyResolution"},
            {"std", "getFrequencyMinimum"},
            {"std", "getBandwidthAmplitudeMap"},
            {"std", "getPwlePrimitiveDurationMax"},
            {"std", "getPwleCompositionSizeMax"},
            {"std", "getSupportedBraking"},
            {"std", "on", "100", "--callback"},
    };
    for (const auto& call : calls) {
        const json answer = phone.call(call);
        EXPECT_EQ(answer["exception"], kUnsupportedOperation) << call[1];
        EXPECT_TRUE(answer["result"].is_null()) << call[1];
    }
    EXPECT_THAT(phone.log(), HasSubstr("V_2_0: [getQFactor]unsupported"));
}

TEST(Interface, AnswersVersionAndHash) {
    const Phone phone("leds");
    EXPECT_EQ(phone.call({"std", "getInterfaceVersion"})["result"], 2);
    EXPECT_EQ(phone.call({"std", "getInterfaceHash"})["result"],
              "ea8742d6993e1a82917da38b9938e537aa7fcb54");
    EXPECT_EQ(phone.call({"ext", "getInterfaceVersion"})["result"], 4);
}

}  // namespace
}  // namespace qvx::test
