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

class MotorFaults : public testing::Test {
  protected:
    // What a client gets from several calls with these faults in force.
    static std::string withFaults(const std::string& faults,
                                  const std::function<std::string()>& work) {
        const RunningDriver driver(profileWith(faults));
        EXPECT_TRUE(driver.isReady()) << driver.errors();
        std::string result = driver.inside(1000, work);
        uploads = linesOf(driver, "upload");
        erases = linesOf(driver, "erase");
        events = linesOf(driver, "event");
        return result;
    }

    static Lines uploads;
    static Lines erases;
    static Lines events;
};

Lines MotorFaults::uploads;
Lines MotorFaults::erases;
Lines MotorFaults::events;

TEST_F(MotorFaults, AnOpenFails) {
    EXPECT_EQ(withFaults(onMotor("open", R"("errno": "EINTR", "times": 1)"),
                         [] {
                             const std::string first = openNode(kMotor, O_RDWR);
                             return first + " " + openNode(kMotor, O_RDWR);
                         }),
              "EINTR ok");
}

TEST_F(MotorFaults, AnUploadFailsAndTakesNoId) {
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

TEST_F(MotorFaults, AnEraseFailsAndLeavesTheEffect) {
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

TEST_F(MotorFaults, AnEventFailsOrIsShort) {
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

TEST_F(MotorFaults, ASignalCutsAnUploadsDelayShort) {
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

TEST_F(MotorFaults, AnUnpluggedMotorIsGoneForEveryCall) {
    EXPECT_EQ(withFaults(onMotor("upload", R"("unplug": true, "after": 1)"),
                         [] {
                             const OpenMotor motor;
                             std::string results;
                             int version = 0;
                             for (const std::string& result :
                                  {motor.upload(), motor.upload(), motor.upload(),
                                   motor.event(0, 1), motor.erase(0),
                                   outcome(ioctl(motor.fd(), EVIOCGVERSION, &version)),
                                   openNode(kMotor, O_RDWR)}) {
                                 results += result + " ";
                             }
                             return results;
                         }),
              "0 ENODEV ENODEV ENODEV ENODEV ENODEV ENODEV ");
}

}  // namespace
}  // namespace handset
