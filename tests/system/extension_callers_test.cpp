// SPDX-License-Identifier: Apache-2.0
// Who may call the maker's interface, method by method, with the user id that the kernel reports.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "extension_calls.h"

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
        // The list of this phone has a line for each word, and only blanks part words here.
        {"hasFeature INTENSITY", "false", "null", -1, "[hasFeature]Fail - "},
};

class ServedCaller : public testing::TestWithParam<const char*> {};

TEST_P(ServedCaller, GetsEveryMethodsAnswer) {
    const Phone phone("leds");
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    phone.reset();
    for (const Method& method : kMethods) {
        const json answer = callAs(GetParam(), extensionCall(method.words));
        EXPECT_EQ(answer["exception"], 0) << method.words;
        EXPECT_EQ(answer["status"], 0) << method.words;
        EXPECT_EQ(answer["result"], json::parse(method.served)) << method.words;
    }
    EXPECT_THAT(phone.log(), Not(HasSubstr("Pemission denied")));
}

INSTANTIATE_TEST_SUITE_P(Users, ServedCaller, testing::Values("0", "1000"));

class RefusedCaller : public testing::TestWithParam<const char*> {};

TEST_P(RefusedCaller, GetsEveryMethodsRefusalAndReachesNoNode) {
    const Phone phone("leds");
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    phone.reset();
    std::string expectedLines;
    for (const Method& method : kMethods) {
        const json answer = callAs(GetParam(), extensionCall(method.words));
        EXPECT_EQ(answer["exception"], method.refusal) << method.words;
        EXPECT_EQ(answer["status"], 0) << method.words;
        EXPECT_EQ(answer["result"], json::parse(method.refused)) << method.words;
        EXPECT_THAT(phone.log(), HasSubstr(std::string("V_4_0: ") + method.line +
                                           "Pemission denied (" + GetParam() + ")\n"))
                << method.words;
        phone.reset();
    }
    EXPECT_THAT(phone.journal(), IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(Users, RefusedCaller, testing::Values("1001", "2000", "10123"));

TEST(ExtensionBinder, IsFoundThroughTheStandardServiceAndNotByName) {
    const Phone phone("leds");
    EXPECT_EQ(runCommand({"vibctl", "list"}).out,
              "android.hardware.vibrator.IVibrator/default\nmanager\n");
    EXPECT_EQ(phone.call({"ext", "getInterfaceVersion"})["result"], 4);
    EXPECT_EQ(phone.call({"ext", "getInterfaceHash"})["result"],
              "a494dcbbfe8baded1569bcb7cb0d8f38ea65e21a");
}

TEST(ExtensionBinder, TellsItsVersionToAnyUser) {
    const Phone phone("leds");
    EXPECT_EQ(callAs("10123", {"ext", "getInterfaceVersion"})["result"], 4);
}

}  // namespace
}  // namespace qvx::test
