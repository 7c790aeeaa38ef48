// SPDX-License-Identifier: Apache-2.0
//
// The driver's life: what it takes, what it shows, and that it leaves nothing behind.
#include <fcntl.h>
#include <unistd.h>

#include <csignal>
#include <string>

#include <gtest/gtest.h>

#include "handset/driver/tests/running_driver.h"

namespace handset {
namespace {

using qvx::test::kRoot;
using qvx::test::Process;

constexpr const char* kCalibration = "/efs/FactoryApp/vibrator_calibration";

constexpr const char* kOneNode = R"({
    "nodes": {"/sys/class/leds/vibrator/duration": {"mode": "rw", "text": "0\n"}},
    "files": {"/efs/FactoryApp/vibrator_calibration": "137\n", "/efs/other": "x",
              "/etc/hostname": "phone\n"},
    "input_devices": "I: Bus=0000\n"})";

TEST(DriverLife, FilesAreSeenInsideOnly) {
    const std::string hostname = readNode("/etc/hostname");
    const RunningDriver driver(kOneNode);
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    EXPECT_EQ(driver.inside(1000, [] { return readNode(kCalibration); }), "137\n");
    EXPECT_EQ(driver.inside(1000, [] { return readNode("/efs/other"); }), "x");
    EXPECT_EQ(driver.inside(1000, [] { return writeNode("/efs/other", "y", O_WRONLY); }), "1");
    EXPECT_EQ(driver.inside([] { return readNode("/etc/hostname"); }), "phone\n");
    EXPECT_EQ(driver.inside([] { return readNode("/proc/bus/input/devices"); }), "I: Bus=0000\n");
    EXPECT_EQ(readNode(kCalibration), "open ENOENT");
    EXPECT_EQ(readNode("/etc/hostname"), hostname);
    EXPECT_NE(readNode("/proc/bus/input/devices"), "I: Bus=0000\n");
    EXPECT_EQ(readNode(kDuration), "open ENOENT");
}

TEST(DriverLife, ATerminatedDriverLeavesNothingBehind) {
    RunningDriver driver(kOneNode);
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    EXPECT_EQ(access("/efs", F_OK), 0);
    EXPECT_EQ(driver.end(SIGTERM), 0);
    EXPECT_NE(access("/efs", F_OK), 0);
    EXPECT_EQ(contentOf("/proc/self/mounts").find("handset /"), std::string::npos);
    EXPECT_EQ(driver.errors(), "");
}

TEST(DriverLife, AnInterruptedDriverLeavesNothingBehind) {
    RunningDriver driver(kOneNode);
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    EXPECT_EQ(driver.end(SIGINT), 0);
    EXPECT_NE(access("/efs", F_OK), 0);
}

TEST(DriverLife, StoppingIsARequestToo) {
    RunningDriver driver(kOneNode);
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    EXPECT_EQ(driver.ask("stop"), "ok ");
    EXPECT_EQ(driver.end(0), 0);
}

TEST(DriverLife, ADelayedCallerDoesNotHoldUpTheEnd) {
    RunningDriver driver(R"({"nodes": {"/sys/class/a/b": {"mode": "rw"}},
        "faults": [{"node": "/sys/class/a/b", "op": "write", "delay": 60000}]})");
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    Process client(kRoot, [&] {
        driver.inside([] { return writeNode("/sys/class/a/b", "1", O_WRONLY); });
    });
    while (driver.journal().empty()) usleep(1000);
    usleep(50000);
    EXPECT_EQ(driver.end(SIGTERM), 0);
    EXPECT_EQ(client.wait(), 0);
}

TEST(DriverLife, TheParentsDeathEndsIt) {
    int ends[2];
    ASSERT_EQ(pipe2(ends, O_CLOEXEC), 0);
    Process parent(kRoot, [&] {
        const RunningDriver driver(kOneNode);
        if (write(ends[1], driver.directory().data(), driver.directory().size()) < 0) _exit(1);
        pause();
    });
    char directory[64] = {};
    ASSERT_GT(read(ends[0], directory, sizeof directory - 1), 0);
    close(ends[0]);
    close(ends[1]);
    EXPECT_EQ(access("/efs", F_OK), 0);
    parent.kill();
    for (int i = 0; i < 1000 && access("/efs", F_OK) == 0; ++i) usleep(10000);
    EXPECT_NE(access("/efs", F_OK), 0);
    std::filesystem::remove_all(directory);
}

TEST(DriverLife, AKilledDriverFailsItsClients) {
    RunningDriver driver(kOneNode);
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    int go[2];
    ASSERT_EQ(pipe2(go, O_CLOEXEC), 0);
    int told[2];
    ASSERT_EQ(pipe2(told, O_CLOEXEC), 0);
    Process client(kRoot, [&] {
        driver.inside([&] {
            const int fd = open(kDuration.c_str(), O_RDWR);
            char byte = 0;
            if (write(told[1], "o", 1) < 0 || read(go[0], &byte, 1) < 0) return std::string();
            const std::string result = outcome(write(fd, "1", 1));
            if (write(told[1], result.data(), result.size()) < 0) return std::string();
            return std::string();
        });
    });
    char text[32] = {};
    ASSERT_EQ(read(told[0], text, 1), 1);
    EXPECT_EQ(driver.end(SIGKILL), 128 + SIGKILL);
    ASSERT_EQ(write(go[1], "g", 1), 1);
    ASSERT_GT(read(told[0], text, sizeof text - 1), 0);
    EXPECT_STREQ(text, "ENOTCONN");
    client.wait();
    for (const int fd : {go[0], go[1], told[0], told[1]}) close(fd);
    rmdir("/efs");  // what a killed driver cannot take away
}

TEST(DriverLife, TwoDriversDoNotSeeEachOther) {
    const RunningDriver first(R"({"nodes": {"/sys/class/a/b": {"mode": "rw", "text": "1"}}})");
    const RunningDriver second(R"({"nodes": {"/sys/class/a/b": {"mode": "rw", "text": "2"}}})");
    ASSERT_TRUE(first.isReady()) << first.errors();
    ASSERT_TRUE(second.isReady()) << second.errors();
    EXPECT_EQ(first.inside([] { return readNode("/sys/class/a/b"); }), "1");
    EXPECT_EQ(second.inside([] { return readNode("/sys/class/a/b"); }), "2");
    EXPECT_EQ(first.journal().size() / 2, second.journal().size() / 2);
}

TEST(DriverLife, ANodelessPhoneHasAnEmptyClassDirectory) {
    const RunningDriver driver("{}");
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    EXPECT_EQ(driver.inside([] {
        return std::filesystem::is_empty("/sys/class") ? "empty" : "not empty";
    }),
              "empty");
}

TEST(DriverLife, FaultsAndTextsChangeWhileItRuns) {
    const RunningDriver driver(kOneNode);
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    EXPECT_EQ(driver.ask("set /sys/class/leds/vibrator/duration \"77\\n\""), "ok ");
    EXPECT_EQ(driver.inside([] { return readNode(kDuration); }), "77\n");
    EXPECT_EQ(driver.ask(R"(fault {"node": "/sys/class/leds/vibrator/duration", "op": "open",)"
                         R"( "errno": "EIO"})"),
              "ok ");
    EXPECT_EQ(driver.inside([] { return readNode(kDuration); }), "open EIO");
    EXPECT_EQ(driver.ask("clear"), "ok ");
    EXPECT_EQ(driver.inside([] { return writeNode(kDuration, "5", O_RDWR); }), "1");
    EXPECT_EQ(driver.ask("get /sys/class/leds/vibrator/duration"), "ok \"5\"");
}

TEST(DriverLife, AResetJournalCountsFromOne) {
    const RunningDriver driver(kOneNode);
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    driver.inside([] { return openNode(kDuration, O_WRONLY); });
    EXPECT_EQ(driver.ask("reset"), "ok ");
    EXPECT_EQ(driver.rawJournal(), "");
    driver.inside([] { return openNode(kDuration, O_WRONLY); });
    EXPECT_EQ(driver.rawJournal().substr(0, 7), "{\"n\":1,");
}

TEST(DriverLife, AWrongProfileGetsOneLineAndLeavesNothing) {
    RunningDriver driver(R"({"nodes": {"/sys/class/a/b": {"mode": "rx"}}})");
    EXPECT_FALSE(driver.isReady());
    EXPECT_EQ(driver.end(0), 2);
    const std::string errors = driver.errors();
    EXPECT_EQ(errors.substr(errors.find("profile.json: ")),
              "profile.json: nodes[\"/sys/class/a/b\"].mode: \"rx\" unknown; accepted: rw, ro, "
              "wo\n");
    EXPECT_EQ(errors.substr(0, 21), "handset-driver: /tmp/");
}

}  // namespace
}  // namespace handset
