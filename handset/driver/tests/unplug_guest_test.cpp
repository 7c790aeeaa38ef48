// SPDX-License-Identifier: Apache-2.0
//
// A motor that goes away and comes back, and a node that shows something else once.
#include <fcntl.h>

#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/driver/tests/test_motor.h"

namespace handset {
namespace {

using testing::HasSubstr;
using testing::Not;

constexpr const char* kDevices = "/proc/bus/input/devices";

// With either driver.
class Unplug : public testing::TestWithParam<const char*> {};

INSTANTIATE_TEST_SUITE_P(With, Unplug, testing::ValuesIn(kBothDrivers), driverName);

TEST_P(Unplug, AMotorThatComesBackServesNewFilesOnly) {
    const RunningDriver driver(R"({"motor": {}})", GetParam());
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    EXPECT_EQ(driver.inside([&] {
        const std::string path = motorPath();
        const MotorFile before(path, O_RDWR);
        std::string results = before.upload();
        results += " " + driver.ask("unplug motor");
        results += before.upload();
        results += " " + openNode(path, O_RDWR);
        results += " " + driver.ask("plug motor");
        results += before.upload();
        const MotorFile after(path, O_RDWR);
        return results + " " + after.upload();
    }),
              std::string("0 ok ENODEV ") + (*GetParam() == '\0' ? "ENODEV" : "ENOENT") +
                      " ok ENODEV 0");
    EXPECT_THAT(driver.rawJournal(), HasSubstr(R"("op":"unplug","node":"motor"})"));
    EXPECT_THAT(driver.rawJournal(), HasSubstr(R"("op":"plug","node":"motor"})"));
}

TEST_P(Unplug, TheListOfInputDevicesFollows) {
    const RunningDriver driver(R"({"motor": {}, "faults": [
            {"node": "motor", "op": "upload", "unplug": true, "times": 1}]})",
                               GetParam());
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    const auto devices = [&] { return driver.inside([] { return readNode(kDevices); }); };
    EXPECT_THAT(devices(), HasSubstr("\"qvx_vibrator_inputff\""));
    EXPECT_EQ(driver.inside([] { return OpenMotor().upload(); }), "ENODEV");
    driver.ask("settle");
    EXPECT_THAT(devices(), Not(HasSubstr("\"qvx_vibrator_inputff\"")));
    EXPECT_THAT(devices(), HasSubstr(" kbd "));
    EXPECT_EQ(driver.ask("clear"), "ok ");
    EXPECT_THAT(devices(), HasSubstr("\"qvx_vibrator_inputff\""));
    EXPECT_EQ(driver.inside(1000, [] { return OpenMotor().upload(); }), "0");
}

// With the kernel's driver, where the motor can go only when nobody is in a call.
TEST(UnplugOfTheKernels, AMotorDoesNotWaitForADelay) {
    const RunningDriver driver(R"({"motor": {}, "faults": [
            {"node": "motor", "op": "upload", "delay": 100000}]})",
                               QVX_MODULE);
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    EXPECT_EQ(driver.ask("unplug motor 3000"), "ok ");
    EXPECT_EQ(driver.inside(1000, [] { return OpenMotor().upload(); }), "ENODEV");
    EXPECT_THAT(driver.rawJournal(), HasSubstr(R"("fault":{"delay":100000},"took":)"));
}

class OtherContents : public testing::TestWithParam<const char*> {};

INSTANTIATE_TEST_SUITE_P(With, OtherContents, testing::ValuesIn(kBothDrivers), driverName);

TEST_P(OtherContents, ANodeShowsThemOnce) {
    const RunningDriver driver(R"({"nodes": {"/sys/class/leds/vibrator/motor_type":
            {"mode": "ro", "text": "LINEAR_1040\n"}}, "faults": [
            {"node": "/sys/class/leds/vibrator/motor_type", "op": "read", "text": "COIN\n",
             "times": 1}]})",
                               GetParam());
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
