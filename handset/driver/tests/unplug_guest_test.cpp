// SPDX-License-Identifier: Apache-2.0
//
// A motor that goes away and comes back, and a node that shows something else once.
#include <fcntl.h>

#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/driver/tests/motor_file.h"
#include "handset/driver/tests/running_driver.h"

namespace handset {
namespace {

using testing::HasSubstr;
using testing::Not;

constexpr const char* kMotor = "/dev/input/event9";
constexpr const char* kDevices = "/proc/bus/input/devices";

TEST(Unplug, AMotorThatComesBackServesNewFilesOnly) {
    const RunningDriver driver(R"({"motor": {"event": 9}})");
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    EXPECT_EQ(driver.inside([&] {
        const MotorFile before(kMotor, O_RDWR);
        std::string results = before.upload();
        results += " " + driver.ask("unplug motor");
        results += before.upload();
        results += " " + openNode(kMotor, O_RDWR);
        results += " " + driver.ask("plug motor");
        results += before.upload();
        const MotorFile after(kMotor, O_RDWR);
        return results + " " + after.upload();
    }),
              "0 ok ENODEV ENODEV ok ENODEV 0");
    EXPECT_THAT(driver.rawJournal(), HasSubstr(R"("op":"unplug","node":"motor"})"));
    EXPECT_THAT(driver.rawJournal(), HasSubstr(R"("op":"plug","node":"motor"})"));
}

TEST(Unplug, TheListOfInputDevicesFollows) {
    const RunningDriver driver(R"({"motor": {"event": 9}, "faults": [
            {"node": "motor", "op": "upload", "unplug": true, "times": 1}]})");
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    const auto devices = [&] { return driver.inside([] { return readNode(kDevices); }); };
    EXPECT_THAT(devices(), HasSubstr("Handlers=event9 "));
    EXPECT_EQ(driver.inside([] { return MotorFile(kMotor, O_RDWR).upload(); }), "ENODEV");
    EXPECT_THAT(devices(), Not(HasSubstr("Handlers=event9 ")));
    EXPECT_THAT(devices(), HasSubstr("Handlers=sysrq kbd leds event0 "));
    driver.ask("plug motor");
    EXPECT_THAT(devices(), HasSubstr("Handlers=event9 "));
}

TEST(OtherContents, ANodeShowsThemOnce) {
    const RunningDriver driver(R"({"nodes": {"/sys/class/leds/vibrator/motor_type":
            {"mode": "ro", "text": "LINEAR_1040\n"}}, "faults": [
            {"node": "/sys/class/leds/vibrator/motor_type", "op": "read", "text": "COIN\n",
             "times": 1}]})");
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    const auto shown = [&] {
        return driver.inside([] { return readNode("/sys/class/leds/vibrator/motor_type"); });
    };
    EXPECT_EQ(shown(), "COIN\n");
    EXPECT_EQ(shown(), "LINEAR_1040\n");
    EXPECT_THAT(driver.rawJournal(), HasSubstr(R"("result":5,"fault":{"text":"COIN\n"},"took":)"));
}

}  // namespace
}  // namespace handset
