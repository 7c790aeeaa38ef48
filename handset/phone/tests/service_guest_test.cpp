// SPDX-License-Identifier: Apache-2.0
//
// The service's life beside the phone's, and what is told of both.
#include <csignal>
#include <fstream>
#include <regex>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/phone/tests/phone_tool.h"
#include "tests/support/kernel_log.h"

namespace handset {
namespace {

using testing::HasSubstr;
using testing::MatchesRegex;
using testing::StartsWith;

nlohmann::json status() {
    return nlohmann::json::parse(run("phone status --json").output, nullptr, false);
}

using PhoneService = Phone;

TEST_F(PhoneService, AServiceThatDiesIsStartedAgain) {
    ASSERT_EQ(run("phone up").status, 0);
    const pid_t first = state()["service"];
    EXPECT_EQ(run("phone service kill").status, 0);
    EXPECT_FALSE(runs(first));
    ASSERT_TRUE(comesTrue([] { return run("phone status").status == 0; }));
    const nlohmann::json now = status();
    EXPECT_EQ(now["registered"], true);
    EXPECT_EQ(now["starts"], 2);
    EXPECT_NE(now["service"], first);
}

TEST_F(PhoneService, OneThatDiesAtOnceWaitsForItsPeriod) {
    ASSERT_EQ(run("phone up").status, 0);
    EXPECT_EQ(run("phone service restart").status, 0);
    kill(state()["service"], SIGKILL);
    ASSERT_TRUE(comesTrue([] { return state()["service"] == 0; }));
    const Ran ran = run("phone status");
    EXPECT_EQ(ran.status, 1);
    EXPECT_THAT(ran.output,
                StartsWith("phone is up: profile leds, the service exited with status 137"));
    EXPECT_THAT(ran.output, HasSubstr("; it starts again in "));
}

TEST_F(PhoneService, AStoppedServiceStaysSoUntilItIsStarted) {
    ASSERT_EQ(run("phone up").status, 0);
    EXPECT_EQ(run("phone service stop").status, 0);
    EXPECT_EQ(run("phone status").output, "phone is up: profile leds, service stopped\n");
    EXPECT_EQ(status()["registered"], false);
    const Ran start = run("phone service start");
    EXPECT_EQ(start.status, 0) << start.errors;
    EXPECT_THAT(start.output, StartsWith("phone is up: profile leds, service registered, pid "));
    EXPECT_THAT(run("phone service start").errors,
                StartsWith("phone: the service runs already, pid "));
}

TEST_F(PhoneService, WrongActionsAreNamed) {
    const Ran wrong = run("phone service halt");
    EXPECT_EQ(wrong.status, 2);
    EXPECT_THAT(wrong.errors, HasSubstr("halt"));
    EXPECT_THAT(wrong.errors, HasSubstr("stop"));
}

TEST_F(PhoneService, AfterTheManagersDeathNothingIsRegistered) {
    const qvx::test::ExpectBinderComplaints complaints;  // what was on its way to the manager
    ASSERT_EQ(run("phone up").status, 0);
    kill(state()["manager"], SIGKILL);
    ASSERT_TRUE(comesTrue([] { return state()["manager"] == 0; }));
    const Ran ran = run("phone status");
    EXPECT_EQ(ran.status, 1);
    EXPECT_THAT(ran.output,
                StartsWith("phone is up: profile leds, the service manager has ended, service not "
                           "to be found, pid "));
    EXPECT_EQ(status()["registered"], false);
    EXPECT_TRUE(status()["manager"].is_null());
}

TEST_F(PhoneService, EveryLogLineBeginsWithItsTime) {
    ASSERT_EQ(run("phone up").status, 0);
    const std::string log = run("phone log").output;
    std::istringstream lines(log);
    int64_t last = 0;
    for (std::string line; std::getline(lines, line);) {
        ASSERT_THAT(line, MatchesRegex("[0-9]+ .*"));
        EXPECT_GE(std::stoll(line), last);
        last = std::stoll(line);
    }
    EXPECT_GT(last, 0);
}

TEST_F(PhoneService, FaultsAreListedWithTheirStrikes) {
    ASSERT_EQ(run("phone up --no-service").status, 0);
    const std::string node = "/sys/class/leds/vibrator/duration";
    EXPECT_EQ(run("phone fault node=" + node + " op=open errno=EIO delay=1 every=3").status, 0);
    const std::string tries = "for i in 1 2 3 4; do cat " + node + "; done";
    run("phone exec -- sh -c '" + tries + "'");
    EXPECT_EQ(run("phone fault --list").output,
              node + " open errno=EIO delay=1 ms every=3: struck 1 of 4 calls\n");
}

TEST_F(PhoneService, TheMotorIsUnpluggedNowOrLater) {
    ASSERT_EQ(run("phone up --no-service --profile ff").status, 0);
    const auto devices = [] { return run("phone exec -- cat /proc/bus/input/devices").output; };
    EXPECT_THAT(devices(), HasSubstr("qvx_vibrator_inputff"));
    EXPECT_EQ(run("phone unplug").status, 0);
    EXPECT_THAT(devices(), testing::Not(HasSubstr("qvx_vibrator_inputff")));
    EXPECT_EQ(run("phone plug --after 100").status, 0);
    EXPECT_TRUE(
            comesTrue([&] { return devices().find("qvx_vibrator_inputff") != std::string::npos; }));
    EXPECT_EQ(run("phone unplug --after never").status, 2);
}

TEST_F(PhoneService, OneListingHasTheDriversAndTheServicesLines) {
    ASSERT_EQ(run("phone up").status, 0);
    const std::string listing = run("phone journal --pretty").output;
    EXPECT_THAT(listing, HasSubstr(" open    leds/vibrator/activate "));
    EXPECT_THAT(listing, HasSubstr(" log     "));
    std::istringstream lines(listing);
    double last = 0;
    for (std::string line; std::getline(lines, line);) {
        EXPECT_GE(std::stod(line), last);
        last = std::stod(line);
    }
}

TEST_F(PhoneService, AFollowerEndsWithThePhone) {
    ASSERT_EQ(run("phone up --no-service").status, 0);
    const Ran both =
            run("phone journal --pretty --follow & phone exec -- "
                "cat /sys/class/leds/vibrator/num_waves >/dev/null; phone down; wait");
    EXPECT_THAT(both.output, HasSubstr(" read    leds/vibrator/num_waves 4\n"));
}

}  // namespace
}  // namespace handset
