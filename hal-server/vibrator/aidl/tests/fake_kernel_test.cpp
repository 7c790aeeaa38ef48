// SPDX-License-Identifier: Apache-2.0
//
// The fake kernel itself: were it wrong, every other test would be.
#include "tests/fake_kernel.h"

#include <fcntl.h>
#include <linux/input.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <fstream>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest-spi.h>
#include <gtest/gtest.h>

#include "tests/fake_motor.h"

namespace fake {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr char kNode[] = "/sys/class/test/node";

TEST(FakeKernel, MissingNodeIsNotThere) {
    FakeKernel kernel;
    EXPECT_EQ(open(kNode, O_RDONLY), -1);
    EXPECT_EQ(errno, ENOENT);
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/test/node O_RDONLY = ENOENT"));
}

TEST(FakeKernel, AccessThatANodeDoesNotGrantIsRefused) {
    FakeKernel kernel;
    kernel.addNode(kNode, "", Access::kReadOnly);
    EXPECT_EQ(open(kNode, O_RDWR), -1);
    EXPECT_EQ(errno, EACCES);
    EXPECT_EQ(open(kNode, O_WRONLY | O_TRUNC), -1);
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/test/node O_RDWR = EACCES",
                                            "open /sys/class/test/node O_WRONLY|O_TRUNC = EACCES"));
}

TEST(FakeKernel, NodeGivesBackWhatWasWrittenLast) {
    FakeKernel kernel;
    kernel.addNode(kNode, "first\n");
    const int descriptor = open(kNode, O_RDWR);
    char buffer[4] = {};
    EXPECT_EQ(read(descriptor, buffer, sizeof(buffer)), 4);
    EXPECT_EQ(write(descriptor, "1\n", 2), 2);
    EXPECT_EQ(lseek(descriptor, 0, SEEK_SET), 0);
    EXPECT_EQ(read(descriptor, buffer, sizeof(buffer)), 2);
    close(descriptor);
    EXPECT_EQ(kernel.text(kNode), "1\n");
    EXPECT_THAT(
            kernel.calls(),
            ElementsAre("open /sys/class/test/node O_RDWR", "read /sys/class/test/node 4 \"firs\"",
                        "write /sys/class/test/node \"1\\n\"",
                        "read /sys/class/test/node 4 \"1\\n\"", "close /sys/class/test/node"));
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/test/node \"1\\n\""));
}

TEST(FakeKernel, FaultsHitTheCallsTheyAreMeantFor) {
    FakeKernel kernel;
    kernel.addNode(kNode);
    kernel.addFault({.path = kNode, .operation = Operation::kWrite, .error = EIO, .after = 1});
    kernel.addFault({.path = kNode, .operation = Operation::kWrite, .limit = 3, .times = 2});
    const int descriptor = open(kNode, O_RDWR);
    EXPECT_EQ(write(descriptor, "12345", 5), 3);
    EXPECT_EQ(write(descriptor, "12345", 5), -1);
    EXPECT_EQ(errno, EIO);
    EXPECT_EQ(write(descriptor, "12345", 5), 3);
    EXPECT_EQ(write(descriptor, "12345", 5), 5);
    close(descriptor);
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/test/node O_RDWR",
                            "write /sys/class/test/node \"12345\" = 3",
                            "write /sys/class/test/node \"12345\" = EIO",
                            "write /sys/class/test/node \"12345\" = 3",
                            "write /sys/class/test/node \"12345\"", "close /sys/class/test/node"));
}

TEST(FakeKernel, StreamsAreCaught) {
    FakeKernel kernel;
    kernel.addNode(kNode, "7 8\n");
    std::fstream stream(kNode, std::ios::in | std::ios::out);
    int value = 0;
    stream >> value;
    EXPECT_EQ(value, 7);
    stream.close();
    EXPECT_THAT(kernel.calls(), ElementsAre("fopen /sys/class/test/node r+",
                                            "read /sys/class/test/node 8191 \"7 8\\n\"",
                                            "close /sys/class/test/node"));
}

TEST(FakeKernel, OtherFilesAreTheRealKernels) {
    FakeKernel kernel;
    std::ifstream stream("/proc/self/comm");
    std::string name;
    EXPECT_TRUE(std::getline(stream, name));
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST(FakeKernel, LeakedDescriptorFailsTheTest) {
    static int leaked = -1;
    EXPECT_NONFATAL_FAILURE(
            {
                FakeKernel kernel;
                kernel.addNode(kNode);
                leaked = open(kNode, O_RDONLY);
            },
            "/sys/class/test/node is still open");
    close(leaked);
}

TEST(FakeKernel, SleepTakesNoTime) {
    FakeKernel kernel;
    const timespec duration = {.tv_sec = 3600, .tv_nsec = 70'000'000};
    EXPECT_EQ(nanosleep(&duration, nullptr), 0);
    EXPECT_THAT(kernel.calls(), ElementsAre("sleep 3600070 ms"));
}

TEST(FakeKernel, DelayTakesRealTimeAndNothingElse) {
    using std::chrono::milliseconds;
    FakeKernel kernel;
    kernel.addNode(kNode);
    kernel.addFault({.path = kNode, .delay = milliseconds(50)});
    const auto started = std::chrono::steady_clock::now();
    close(open(kNode, O_RDONLY));
    EXPECT_GE(std::chrono::steady_clock::now() - started, milliseconds(50));
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/test/node O_RDONLY", "close /sys/class/test/node"));
}

TEST(FakeMotor, FollowsTheKernelsRulesForEffects) {
    constexpr char kMotor[] = "/dev/input/event7";
    FakeKernel kernel;
    kernel.addDevice(kMotor, std::make_shared<FakeMotor>(1));
    const int descriptor = open(kMotor, O_RDWR);
    int16_t custom[] = {0, 5};
    ff_effect effect = {};
    effect.type = FF_PERIODIC;
    effect.id = -1;
    effect.replay.length = 500;
    effect.u.periodic.waveform = FF_CUSTOM;
    effect.u.periodic.custom_len = 2;
    effect.u.periodic.custom_data = custom;
    EXPECT_EQ(ioctl(descriptor, EVIOCSFF, &effect), 0);
    EXPECT_EQ(effect.id, 0);
    effect.id = -1;
    EXPECT_EQ(ioctl(descriptor, EVIOCSFF, &effect), -1);
    EXPECT_EQ(errno, ENOSPC);
    EXPECT_EQ(ioctl(descriptor, EVIOCRMFF, 0), 0);
    EXPECT_EQ(ioctl(descriptor, EVIOCRMFF, 0), -1);
    EXPECT_EQ(errno, EINVAL);
    input_event event = {};
    event.type = EV_FF;
    event.code = FF_GAIN;
    event.value = 5000;
    EXPECT_EQ(write(descriptor, &event, sizeof(event)), 24);
    close(descriptor);
    EXPECT_THAT(
            kernel.calls(),
            ElementsAre(
                    "open /dev/input/event7 O_RDWR",
                    "upload id=-1 type=0x51 waveform=0x5d length=500 delay=0 custom=\"00 00 05 "
                    "00\"",
                    "upload id=-1 type=0x51 waveform=0x5d length=500 delay=0 custom=\"00 00 05 00\""
                    " = ENOSPC",
                    "erase id=0", "erase id=0 = EINVAL", "event type=21 code=96 value=5000",
                    "close /dev/input/event7"));
}

}  // namespace
}  // namespace fake
