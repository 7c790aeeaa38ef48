// SPDX-License-Identifier: Apache-2.0
//
// The vendor's interface on phones whose nodes answer otherwise than usual: other texts, nodes that
// are missing, a driver that fails.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/system/extension_calls.h"

namespace qvx::test {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;

const std::string kDirectory = "/sys/class/leds/vibrator/";
const std::string kInfoDirectory = "/sys/class/vib_info_class/vib_support_info/";

// The LED-class phone without its feature list and its own intensity lists, with one more node or
// another text for one.
json plainLeds(const std::string& leaf = "", const std::string& text = "") {
    json profile = builtInProfile("leds");
    for (const std::string& node :
         {kInfoDirectory + "functions", kInfoDirectory + "intensities",
          kInfoDirectory + "haptic_intensities", kDirectory + "intensities",
          kDirectory + "haptic_intensities"}) {
        profile["nodes"].erase(node);
    }
    if (!leaf.empty()) profile["nodes"][kDirectory + leaf] = {{"mode", "rw"}, {"text", text}};
    return profile;
}

TEST(Extension, SingleLettersOfEventCmdAnswerThePostureQueries) {
    const struct {
        const char* text;
        bool directory;
        bool tentMode;
    } rows[] = {{"ON\n", true, true},
                {"1\n", false, false},
                {"FOLD\n", true, false},
                {"TENT\n", false, true},
                {"O", false, false}};
    const Phone phone("leds");
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    for (const auto& [text, directory, tentMode] : rows) {
        runCommand({"phone", "node", kDirectory + "event_cmd", text});
        EXPECT_EQ(phone.call({"ext", "supportsFolderStatusSetting"})["result"], directory) << text;
        EXPECT_EQ(phone.call({"ext", "supportsFolderTentModeStatusSetting"})["result"], tentMode)
                << text;
    }
}

TEST(Extension, AmplitudeListFollowsTheMotorAndTheIndexNode) {
    json profile = plainLeds("motor_type", "LINEAR_1030\n");
    {
        const Phone phone(profile);
        EXPECT_EQ(phone.call({"ext", "getAmplitudeList", "1"})["result"],
                  json({0, 2000, 4000, 6000, 8000, 10000}));
    }
    profile["nodes"].erase(kDirectory + "cp_trigger_index");
    const Phone phone(profile);
    EXPECT_EQ(phone.call({"ext", "getAmplitudeList", "1"})["result"],
              json({0, 3400, 4900, 6500, 8200, 10000}));
}

TEST(Extension, WithoutAFeatureListNodesAnswer) {
    json profile = plainLeds();
    profile["nodes"].erase(kDirectory + "fifo");
    const Phone phone(profile);
    EXPECT_EQ(phone.call({"ext", "supportsFifoHapticEngine"})["result"], false);
    EXPECT_EQ(phone.call({"ext", "supportsHybridHapticEngine"})["result"], true);
    EXPECT_EQ(phone.call({"ext", "supportsHasFeature"})["result"], false);
    EXPECT_EQ(phone.call({"ext", "hasFeature", "INTENSITY"})["exception"], -7);
}

TEST(Extension, HasFeatureKnowsTheWholeWordsThatABuiltInPhoneLists) {
    const struct {
        const char* profile;
        const char* listed;
        const char* other;
    } rows[] = {{"leds", "PRIMITIVE_EFFECT_COMPOSE", "COMMON_INPUTFF_INTERFACE"},
                {"legacy", "ENHANCED_HAPTIC_ENGINE", "FIFO_HAPTIC_ENGINE"},
                {"ff", "COMMON_INPUTFF_INTERFACE", "HAPTIC_ENGINE"},
                {"leds-haptic-engine", "HAPTIC_ENGINE", "INDEX_HAPTIC_PATTERN"},
                {"legacy-prebaked-index", "INDEX_HAPTIC_PATTERN", "HAPTIC_PATTERN"}};
    for (const auto& [profile, listed, other] : rows) {
        const Phone phone(profile);
        EXPECT_EQ(phone.call({"ext", "hasFeature", "INTENSITY"})["result"], true) << profile;
        EXPECT_EQ(phone.call({"ext", "hasFeature", listed})["result"], true) << profile;
        EXPECT_EQ(phone.call({"ext", "hasFeature", other})["result"], false) << profile;
        EXPECT_EQ(phone.call({"ext", "hasFeature", "HAPTIC"})["result"], false) << profile;
    }
}

TEST(Extension, OnlySpacesSeparateTheWordsOfHasFeature) {
    json profile = builtInProfile("leds");
    profile["nodes"][kInfoDirectory + "functions"]["text"] = "INTENSITY\nHAPTIC_ENGINE\n";
    const Phone phone(profile);
    EXPECT_EQ(phone.call({"ext", "hasFeature", "HAPTIC_ENGINE"})["result"], false);
    EXPECT_EQ(phone.call({"ext", "supportsHapticEngine"})["result"], true);
}

TEST(Extension, WithoutADeviceNothingIsOfferedAndNothingWorks) {
    const Phone phone("none");
    EXPECT_EQ(phone.call({"ext", "supportsAmplitudeControl"})["result"], false);
    EXPECT_EQ(phone.call({"ext", "setAmplitude", "5000"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"ext", "setFolderStatus", "0"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"ext", "performHapticEngine", "1"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"ext", "performHybridHapticEngine", "1"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"ext", "perform", "CLICK", "0"})["exception"], -7);
    EXPECT_EQ(phone.call({"ext", "getNumberOfPrebakedHapticPattern"})["exception"], -7);
}

TEST(Extension, HybridShortOrFailingWriteIsOkWithoutVibration) {
    const Phone phone("leds");
    for (const json& fault : {json{{"short", 3}}, json{{"errno", "EIO"}}}) {
        phone.reset();
        json whole = {{"node", kDirectory + "hybrid_haptic_engine"}, {"op", "write"}, {"times", 1}};
        whole.update(fault);
        phone.fault(whole);
        EXPECT_EQ(phone.call({"ext", "performHybridHapticEngine", "10000",
                              "5,5000,1,3,170"})["exception"],
                  0);
        EXPECT_THAT(phone.writes(), ElementsAre("hybrid_haptic_engine 4 5 5000 #3 170\n"));
        EXPECT_THAT(phone.log(), HasSubstr("V_4_0: performHybridHapticEngine OK\n"));
    }
}

TEST(Extension, PlainShortWriteIsAnIllegalStateWithoutVibration) {
    const Phone phone("leds");
    phone.reset();
    phone.fault(
            {{"node", kDirectory + "haptic_engine"}, {"op", "write"}, {"short", 3}, {"times", 1}});
    EXPECT_EQ(phone.call({"ext", "performHapticEngine", "10000", "7,10000,2050,0"})["exception"],
              kIllegalState);
    EXPECT_THAT(phone.writes(), ElementsAre("haptic_engine 4 7 10000 2050 0\n"));
    EXPECT_THAT(phone.log(), HasSubstr("V_4_0: performHapticEngine UNKNOWN_ERROR\n"));
}

TEST(Extension, InterruptedDriverIsAskedAgain) {
    const Phone phone("leds");
    phone.reset();
    phone.fault({{"node", kDirectory + "event_cmd"},
                 {"op", "write"},
                 {"errno", "EINTR"},
                 {"times", 2}});
    EXPECT_EQ(phone.call({"ext", "setFolderStatus", "1"})["exception"], 0);
    EXPECT_THAT(journalInWords(phone),
                ElementsAre("open event_cmd O_RDWR", "write event_cmd FOLDER_CLOSE\n = EINTR",
                            "write event_cmd FOLDER_CLOSE\n = EINTR",
                            "write event_cmd FOLDER_CLOSE\n"));
}

TEST(Extension, FailedQueueStartsNothing) {
    const Phone phone("leds");
    phone.reset();
    phone.fault({{"node", kDirectory + "cp_trigger_queue"}, {"op", "open"}, {"errno", "EBUSY"}});
    EXPECT_EQ(phone.call({"ext", "performPlaybackEngine", "true", "0", "5,100,0"})["exception"],
              kIllegalState);
    EXPECT_EQ(phone.call({"ext", "performPrebakedHapticPattern", "3", "5000", "true"})["exception"],
              kIllegalState);
    EXPECT_THAT(phone.writes(),
                ElementsAre("cp_trigger_index 65534\n", "cp_trigger_index 65534\n"));
    EXPECT_THAT(phone.log(), HasSubstr("V_4_0: performPlaybackEngine is fail: 16\n"));
    EXPECT_THAT(phone.log(), HasSubstr("V_4_0: performPrebakedHapticPattern is fail: 16\n"));
}

}  // namespace
}  // namespace qvx::test
