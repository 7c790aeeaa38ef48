// SPDX-License-Identifier: Apache-2.0
//
// The faults that a profile puts on the motor, met by real processes.
#include <fcntl.h>
#include <linux/input.h>
#include <sys/ioctl.h>
#include <sys/time.h>
#include <unistd.h>

#include <csignal>
#include <functional>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/driver/tests/test_motor.h"

namespace handset {
namespace {

std::string onMotor(const std::string& op, const std::string& rest) {
    return R"({"node": "motor", "op": ")" + op + "\", " + rest + "}";
}

// With either driver; a class of its own for what the kernel does before a driver is asked.
class MotorFaults : public testing::TestWithParam<const char*> {
  protected:
    // What a client gets from several calls with these faults in force.
    std::string withFaults(const std::string& faults, const std::function<std::string()>& work) {
        const RunningDriver driver(R"({"motor": {}, "faults": [)" + faults + "]}", GetParam());
        EXPECT_TRUE(driver.isReady()) << driver.errors();
        std::string result = driver.inside(1000, work);
        uploads = linesOf(driver, "upload");
        erases = linesOf(driver, "erase");
        events = linesOf(driver, "event");
        return result;
    }

    Lines uploads;
    Lines erases;
    Lines events;
};

class MotorEventFaults : public MotorFaults {};

INSTANTIATE_TEST_SUITE_P(With, MotorFaults, testing::ValuesIn(kBothDrivers), driverName);
INSTANTIATE_TEST_SUITE_P(With, MotorEventFaults, testing::Values(""), driverName);

TEST_P(MotorEventFaults, AnOpenFails) {
    EXPECT_EQ(withFaults(onMotor("open", R"("errno": "EINTR", "times": 1)"),
                         [] {
                             const std::string first = openNode(motorPath(), O_RDWR);
                             return first + " " + openNode(motorPath(), O_RDWR);
                         }),
              "EINTR ok");
}

TEST_P(MotorFaults, AnUploadFailsAndTakesNoId) {
    EXPECT_EQ(withFaults(onMotor("upload", R"("errno": "ENOSPC", "after": 1, "times": 1)"),
                         [] {
                             const OpenMotor motor;
                             const std::string first = motor.upload();
                             const std::string second = motor.upload();
                             return first + " " + second + " " + motor.upload();
                         }),
              "0 ENOSPC 1");
    ASSERT_EQ(uploads.size(), 3U);
    EXPECT_THAT(uploads[1], testing::StartsWith(R"("op":"upload","node":"motor","id":-1,)"
                                                R"("result":"ENOSPC","type":81,)"));
}

TEST_P(MotorFaults, AnEraseFailsAndLeavesTheEffect) {
    EXPECT_EQ(withFaults(onMotor("erase", R"("errno": "EIO", "times": 1)"),
                         [] {
                             const OpenMotor motor;
                             motor.upload();
                             const std::string first = motor.erase(0);
                             const std::string again = motor.upload(0);
                             return first + " " + again + " " + motor.erase(0);
                         }),
              "EIO 0 0");
    EXPECT_EQ(
            erases,
            (Lines{R"("op":"erase","node":"motor","id":0,"result":"EIO","fault":{"errno":"EIO"}})",
                   R"("op":"erase","node":"motor","id":0,"result":0})"}));
}

TEST_P(MotorEventFaults, AnEventFailsOrIsShort) {
    EXPECT_EQ(withFaults(onMotor("write", R"("errno": "EIO", "times": 1)") + "," +
                                 onMotor("write", R"("short": 8, "after": 1, "times": 1)"),
                         [] {
                             const OpenMotor motor;
                             const std::string first = motor.event(0, 1);
                             const std::string second = motor.event(0, 1);
                             return first + " " + second + " " + motor.event(0, 1);
                         }),
              "EIO 8 24");
    EXPECT_EQ(
            events,
            (Lines{
                    R"("op":"event","node":"motor","type":21,"code":0,"value":1,"result":"EIO","fault":{"errno":"EIO"}})",
                    R"("op":"event","node":"motor","type":21,"code":0,"value":1,"result":8,"fault":{"short":8}})",
                    R"("op":"event","node":"motor","type":21,"code":0,"value":1,"result":24})",
            }));
}

TEST_P(MotorFaults, ASignalCutsAnUploadsDelayShort) {
    EXPECT_EQ(withFaults(onMotor("upload", R"("delay": 60000, "times": 1)"),
                         [] {
                             struct sigaction action {};
                             action.sa_handler = [](int) {};
                             sigaction(SIGALRM, &action, nullptr);
                             const itimerval timer{{0, 0}, {0, 200000}};
                             const OpenMotor motor;
                             setitimer(ITIMER_REAL, &timer, nullptr);
                             const std::string first = motor.upload();
                             return first + " " + motor.upload();
                         }),
              "EINTR 0");
}

TEST_P(MotorEventFaults, AnUnpluggedMotorIsGoneForEveryCall) {
    EXPECT_EQ(withFaults(onMotor("upload", R"("unplug": true, "after": 1)"),
                         [] {
                             const OpenMotor motor;
                             const std::string path = motorPath();
                             std::string results;
                             int version = 0;
                             for (const std::string& result :
                                  {motor.upload(), motor.upload(), motor.upload(),
                                   motor.event(0, 1), motor.erase(0),
                                   outcome(ioctl(motor.fd(), EVIOCGVERSION, &version)),
                                   openNode(path, O_RDWR)}) {
                                 results += result + " ";
                             }
                             return results;
                         }),
              "0 ENODEV ENODEV ENODEV ENODEV ENODEV ENODEV ");
}

}  // namespace
}  // namespace handset
