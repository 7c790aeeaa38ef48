// SPDX-License-Identifier: Apache-2.0
//
// Who may call the vendor's interface, method by method, with the user id that the kernel reports.
#include <iterator>
#include <sstream>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/system/extension_calls.h"

namespace qvx::test {
namespace {

using nlohmann::json;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

struct Method {
    const char* words;
    const char* served;     // the result on a phone of the profile leds
    const char* refused;    // the result that others get
    int refusal = 0;        // the exception that others get
    const char* line = "";  // before the refusal's words in the log
};

// Every method of the interface, in its order.
constexpr Method kMethods[] = {
        {"supportsAmplitudeControl", "true", "false"},
        {"supportsForceTouchAmplitudeControl", "true", "false"},
        {"supportsFrequencyControl", "true", "false"},
        {"supportsHapticEngine", "true", "false"},
        {"supportsPrebakedHapticPattern", "true", "false"},
        {"supportsFolderStatusSetting", "true", "false"},
        {"supportsEnhancedQuorvanHapticPattern", "true", "false"},
        {"setAmplitude 5000", "null", "null"},
        {"setForceTouchAmplitude 5000", "null", "null"},
        {"setFrequencyType 4", "null", "null"},
        {"setFolderStatus 1", "null", "null"},
        {"getNumberOfPrebakedHapticPattern", "137", "0"},
        {"performHapticEngine 10000 7,10000,2050,0", "null", "null"},
        {"performPrebakedHapticPattern 3 5000 true", "null", "null"},
        {"getAmplitudeList 0", "[0,1800,3600,5400,7200,10000]", "[]"},
        {"perform CLICK 5000", "60", "0"},
        {"performPlaybackEngine false 0 5,100,0", "null", "null"},
        {"supportsFifoHapticEngine", "true", "false"},
        {"supportsHybridHapticEngine", "true", "false"},
        {"supportsEnhancedHybridHapticPattern", "true", "false"},
        {"performFifoHapticEngine 25", "null", "null"},
        {"performHybridHapticEngine 10000 5,5000,1,3,170", "null", "null"},
        {"supportsFolderTentModeStatusSetting", "true", "false"},
        {"setFolderTentModeStatus 0", "null", "null"},
        {"supportsHasFeature", "true", "null", -1, "[supportsHasFeature]Fail - "},
        {"hasFeature INTENSITY", "true", "null", -1, "[hasFeature]Fail - "},
};

std::vector<json> callEveryMethodAs(const std::string& user) {
    std::vector<std::string> calls;
    for (const Method& method : kMethods) calls.push_back(method.words);
    return callAllAs(user, calls);
}

TEST(ExtensionCaller, RootAndSystemGetEveryMethodsAnswer) {
    const Phone phone("leds");
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    for (const char* user : {"0", "1000"}) {
        const std::vector<json> answers = callEveryMethodAs(user);
        ASSERT_EQ(answers.size(), std::size(kMethods));
        for (size_t i = 0; i < answers.size(); ++i) {
            SCOPED_TRACE(std::string(kMethods[i].words) + " by " + user);
            EXPECT_EQ(answers[i]["exception"], 0);
            EXPECT_EQ(answers[i]["status"], 0);
            EXPECT_EQ(answers[i]["result"], json::parse(kMethods[i].served));
        }
    }
    EXPECT_THAT(phone.log(), Not(HasSubstr("Pemission denied")));
}

// The lines in which the service refuses, from the version in front of them.
std::vector<std::string> refusalsIn(const std::string& log) {
    std::vector<std::string> refusals;
    std::istringstream stream(log);
    for (std::string line; std::getline(stream, line);) {
        if (line.find("Pemission denied") == std::string::npos) continue;
        refusals.push_back(line.substr(line.find("V_4_0: ")));
    }
    return refusals;
}

TEST(ExtensionCaller, OthersGetEveryMethodsRefusalAndReachNoNode) {
    const Phone phone("leds");
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    phone.reset();
    std::vector<std::string> lines;
    for (const char* user : {"1001", "2000", "10123"}) {
        const std::vector<json> answers = callEveryMethodAs(user);
        ASSERT_EQ(answers.size(), std::size(kMethods));
        for (size_t i = 0; i < answers.size(); ++i) {
            SCOPED_TRACE(std::string(kMethods[i].words) + " by " + user);
            EXPECT_EQ(answers[i]["exception"], kMethods[i].refusal);
            EXPECT_EQ(answers[i]["status"], 0);
            EXPECT_EQ(answers[i]["result"], json::parse(kMethods[i].refused));
            lines.push_back(std::string("V_4_0: ") + kMethods[i].line + "Pemission denied (" +
                            user + ")");
        }
    }
    EXPECT_EQ(refusalsIn(phone.log()), lines);
    EXPECT_THAT(journalInWords(phone), IsEmpty());
}

TEST(ExtensionBinder, IsFoundThroughTheStandardServiceAndNotByName) {
    const Phone phone("leds");
    EXPECT_EQ(runCommand({"vibctl", "list"}).out,
              "android.hardware.vibrator.IVibrator/default\nmanager\n");
    EXPECT_EQ(phone.call({"ext", "getInterfaceVersion"})["result"], 4);
    EXPECT_EQ(callAllAs("10123", {"getInterfaceVersion"}).at(0)["result"], 4);
    EXPECT_EQ(phone.call({"ext", "getInterfaceHash"})["result"],
              "c0ff092fe8620379540f19df85a364bf30162688");
}

}  // namespace
}  // namespace qvx::test
