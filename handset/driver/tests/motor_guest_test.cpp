// SPDX-License-Identifier: Apache-2.0
//
// The motor's character device, used by real processes.
#include <fcntl.h>
#include <linux/input.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <sys/time.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstring>
#include <fstream>
#include <string>
#include <string_view>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/driver/tests/test_motor.h"

namespace handset {
namespace {

class Motor : public testing::Test {
  protected:
    void SetUp() override { ASSERT_TRUE(mDriver.isReady()) << mDriver.errors(); }

    RunningDriver mDriver{profileWith("")};
};

TEST_F(Motor, TheNodeIsTheSystemUsersAndTheInputGroups) {
    struct stat node {};
    ASSERT_EQ(stat(kMotor, &node), 0);
    EXPECT_TRUE(S_ISCHR(node.st_mode));
    EXPECT_EQ(node.st_mode & 07777U, 0660U);
    EXPECT_EQ(node.st_uid, 1000U);
    EXPECT_EQ(node.st_gid, 1004U);
    EXPECT_EQ(mDriver.inside(1000, [] { return openNode(kMotor, O_RDWR); }), "ok");
    EXPECT_EQ(mDriver.inside(2000, [] { return openNode(kMotor, O_RDWR); }), "EACCES");
}

TEST_F(Motor, TheListOfInputDevicesNamesIt) {
    const std::string list = mDriver.inside([] { return readNode("/proc/bus/input/devices"); });
    EXPECT_NE(list.find("\nN: Name=\"qvx_vibrator_inputff\"\n"), std::string::npos) << list;
    EXPECT_NE(list.find("\nH: Handlers=event9 \n"), std::string::npos) << list;
}

TEST_F(Motor, AnUploadIsJournaledWithItsData) {
    EXPECT_EQ(mDriver.inside(1000, [] { return OpenMotor().upload(-1, 5, 500); }), "0");
    const Lines journal = mDriver.journal();
    ASSERT_EQ(journal.size(), 4U);
    EXPECT_EQ(journal[0], R"({"uid":1000,"op":"open","node":"motor","flags":"O_RDWR","error":0})");
    EXPECT_EQ(journal[1],
              R"({"uid":1000,"op":"upload","node":"motor","id":-1,"result":0,"type":81,)"
              R"("waveform":93,"length":500,"delay":0,"direction":0,"button":0,"interval":0,)"
              R"("period":0,"magnitude":0,"offset":0,"phase":0,"attack_length":0,)"
              R"("attack_level":0,"fade_length":0,"fade_level":0,"custom_len":2,)"
              R"("custom_hex":"00000500"})");
    EXPECT_EQ(journal[2], R"({"uid":1000,"op":"erase","node":"motor","id":0,"result":0})");
    EXPECT_EQ(journal[3], R"({"uid":1000,"op":"close","node":"motor"})");
}

TEST_F(Motor, AnUploadOfTheLargestWaveformArrivesWhole) {
    EXPECT_EQ(mDriver.inside([] {
        static int16_t data[576];
        for (int16_t i = 0; i < 576; ++i) data[i] = i;
        ff_effect effect = MotorFile::record(-1, 0, data, 576);
        return OpenMotor().upload(effect);
    }),
              "0");
    const Lines uploads = linesOf(mDriver, "upload");
    ASSERT_EQ(uploads.size(), 1U);
    EXPECT_NE(uploads[0].find("\"custom_len\":576,\"custom_hex\":\"0000010002000300"),
              std::string::npos);
    EXPECT_EQ(uploads[0].substr(uploads[0].size() - 14), "3d023e023f02\"}");
}

TEST_F(Motor, IdsFollowTheKernelsRules) {
    EXPECT_EQ(mDriver.inside([] {
        const OpenMotor one;
        const OpenMotor other;
        std::string results;
        for (const std::string& result :
             {one.upload(), other.upload(), one.upload(), one.upload(),  // 0 1 2, then full
              one.upload(0), one.upload(1), other.upload(2), one.upload(3), one.upload(-2),
              one.erase(1), one.erase(3), one.erase(-1), other.erase(1), other.erase(1),
              one.upload()}) {
            results += result + " ";
        }
        return results;
    }),
              "0 1 2 ENOSPC 0 EACCES EACCES EINVAL EINVAL EACCES EINVAL EINVAL 0 EINVAL 1 ");
}

TEST_F(Motor, OnlyTheIdIsWrittenBack) {
    EXPECT_EQ(mDriver.inside([] {
        int16_t data[2] = {};
        ff_effect effect = MotorFile::record(-1, 500, data, 2);
        effect.direction = 77;
        const ff_effect before = effect;
        OpenMotor().upload(effect);
        const bool onlyId = effect.id == 0 && effect.direction == before.direction &&
                            memcmp(&effect.u, &before.u, sizeof effect.u) == 0;
        return onlyId ? "only" : "more";
    }),
              "only");
}

TEST_F(Motor, BadPointersAreFaults) {
    EXPECT_EQ(mDriver.inside([] {
        int16_t* nowhere = nullptr;
        ff_effect effect = MotorFile::record(-1, 500, nowhere + 8, 2);
        const OpenMotor motor;
        std::string results = motor.upload(effect);
        results += " " + outcome(ioctl(motor.fd(), EVIOCSFF, nullptr));
        results += " " + outcome(ioctl(motor.fd(), EVIOCGVERSION, nullptr));
        return results + " " + motor.upload();
    }),
              "EFAULT EFAULT EFAULT 0");
    EXPECT_EQ(linesOf(mDriver, "upload").size(), 1U);
}

TEST_F(Motor, ARefusedUploadsSamplesAreNotLookedAt) {
    EXPECT_EQ(mDriver.inside([] {
        int16_t* nowhere = nullptr;
        ff_effect effect = MotorFile::record(2, 500, nowhere + 8, 2);
        return OpenMotor().upload(effect);
    }),
              "EINVAL");
    const Lines uploads = linesOf(mDriver, "upload");
    ASSERT_EQ(uploads.size(), 1U);
    EXPECT_NE(uploads[0].find(R"("custom_len":2,"custom_hex":"")"), std::string::npos);
}

TEST_F(Motor, WhatTheMotorDoesNotHaveIsRefused) {
    EXPECT_EQ(mDriver.inside([] {
        const OpenMotor motor;
        ff_effect effect{};
        effect.id = -1;
        effect.type = FF_CONSTANT;
        std::string results = motor.upload(effect);
        effect.type = FF_PERIODIC;
        effect.u.periodic.waveform = FF_SINE;
        results += " " + motor.upload(effect);
        effect = MotorFile::record(-1, 0, nullptr, 0x7fffffff);
        results += " " + motor.upload(effect);
        effect = {};
        effect.id = -1;
        effect.type = FF_RUMBLE;
        return results + " " + motor.upload(effect);
    }),
              "EINVAL EINVAL EINVAL 0");
    const Lines uploads = linesOf(mDriver, "upload");
    ASSERT_EQ(uploads.size(), 4U);
    EXPECT_THAT(uploads[0], testing::StartsWith(R"("op":"upload","node":"motor","id":-1,)"
                                                R"("result":"EINVAL","type":82,)"));
    EXPECT_NE(uploads[3].find(R"("result":0,"type":81,"waveform":90,)"), std::string::npos);
}

TEST_F(Motor, EveryEventIsRecorded) {
    EXPECT_EQ(mDriver.inside(1000,
                             [] {
                                 const OpenMotor motor;
                                 motor.upload();
                                 std::string results;
                                 for (const std::string& result :
                                      {motor.event(0, 1), motor.event(0, 0),
                                       motor.event(FF_GAIN, 5000), motor.event(FF_GAIN, 70000),
                                       motor.event(0xffff, 1), motor.event(7, -1)}) {
                                     results += result + " ";
                                 }
                                 return results;
                             }),
              "24 24 24 24 24 24 ");
    EXPECT_EQ(
            linesOf(mDriver, "event"),
            (Lines{
                    R"("op":"event","node":"motor","type":21,"code":0,"value":1,"result":24})",
                    R"("op":"event","node":"motor","type":21,"code":0,"value":0,"result":24})",
                    R"("op":"event","node":"motor","type":21,"code":96,"value":5000,"result":24})",
                    R"("op":"event","node":"motor","type":21,"code":96,"value":70000,"result":24})",
                    R"("op":"event","node":"motor","type":21,"code":65535,"value":1,"result":24})",
                    R"("op":"event","node":"motor","type":21,"code":7,"value":-1,"result":24})",
            }));
}

TEST_F(Motor, EventsAreTakenWhole) {
    EXPECT_EQ(mDriver.inside([] {
        const OpenMotor motor;
        input_event events[3] = {};
        std::string results = outcome(write(motor.fd(), events, sizeof events));
        results += " " + outcome(write(motor.fd(), events, sizeof events[0] + 5));
        return results + " " + outcome(write(motor.fd(), events, 23));
    }),
              "72 24 EINVAL");
    EXPECT_EQ(linesOf(mDriver, "event").size(), 4U);
    const Lines writes = linesOf(mDriver, "write");
    ASSERT_EQ(writes.size(), 1U);
    EXPECT_NE(writes[0].find("\"result\":\"EINVAL\""), std::string::npos);
}

TEST_F(Motor, AFilesModeSaysWhatItMayDo) {
    EXPECT_EQ(mDriver.inside([] {
        const OpenMotor readOnly(O_RDONLY);
        const OpenMotor writeOnly(O_WRONLY);
        std::string results;
        for (const std::string& result :
             {readOnly.upload(), readOnly.event(0, 1), writeOnly.upload(), writeOnly.event(0, 1)}) {
            results += result + " ";
        }
        return results;
    }),
              "0 EBADF 1 24 ");
}

TEST_F(Motor, CloseErasesTheFilesEffectsInOrder) {
    EXPECT_EQ(mDriver.inside([] {
        const OpenMotor kept;
        std::string results;
        {
            const OpenMotor closed;
            results += closed.upload();
            results += kept.upload();
            results += closed.upload();
        }
        results += kept.upload();
        return results + kept.upload();
    }),
              "01202");
    const Lines erases = linesOf(mDriver, "erase");
    ASSERT_EQ(erases.size(), 5U);
    EXPECT_EQ(erases[0], R"("op":"erase","node":"motor","id":0,"result":0})");
    EXPECT_EQ(erases[1], R"("op":"erase","node":"motor","id":2,"result":0})");
}

TEST_F(Motor, AKilledClientsEffectsAreErased) {
    mDriver.inside([] {
        const OpenMotor motor;
        motor.upload();
        kill(getpid(), SIGKILL);
        return "";
    });
    EXPECT_EQ(linesOf(mDriver, "erase"),
              Lines{R"("op":"erase","node":"motor","id":0,"result":0})"});
    EXPECT_EQ(linesOf(mDriver, "close").size(), 1U);
}

TEST_F(Motor, QuestionsAreAnswered) {
    EXPECT_EQ(mDriver.inside([] {
        const OpenMotor motor;
        int version = 0;
        int effects = 0;
        char name[64] = {};
        unsigned char bits[16] = {};
        input_id id{};
        ioctl(motor.fd(), EVIOCGVERSION, &version);
        ioctl(motor.fd(), EVIOCGEFFECTS, &effects);
        ioctl(motor.fd(), EVIOCGID, &id);
        const int length = ioctl(motor.fd(), EVIOCGNAME(sizeof name), name);
        const int bytes = ioctl(motor.fd(), EVIOCGBIT(EV_FF, sizeof bits), bits);
        return std::to_string(version) + " " + std::to_string(effects) + " " +
               std::to_string(id.bustype) + " " + std::to_string(length) + " " + name + " " +
               std::to_string(bytes) + " " + std::to_string(bits[10]) + " " +
               outcome(ioctl(motor.fd(), EVIOCGUNIQ(64), name)) + " " +
               outcome(ioctl(motor.fd(), EVIOCGRAB, 1));
    }),
              "65537 3 6 21 qvx_vibrator_inputff 16 3 ENOENT EINVAL");
}

TEST_F(Motor, ThereIsNothingToRead) {
    EXPECT_EQ(mDriver.inside([] {
        const OpenMotor motor(O_RDWR | O_NONBLOCK);
        input_event event{};
        pollfd polled{motor.fd(), POLLIN | POLLOUT, 0};
        const int ready = poll(&polled, 1, 0);
        return outcome(read(motor.fd(), &event, sizeof event)) + " " +
               outcome(read(motor.fd(), &event, 5)) + " " + std::to_string(ready) + " " +
               std::to_string(polled.revents);
    }),
              "EAGAIN EINVAL 1 4");
}

TEST_F(Motor, TheDeviceGoesAwayWithTheDriver) {
    EXPECT_EQ(mDriver.end(SIGTERM), 0);
    EXPECT_NE(access(kMotor, F_OK), 0);
}

TEST(MotorNumber, TheNextFreeOneIsTakenWhereNoneIsAsked) {
    const RunningDriver driver(R"({"motor": {}})");
    ASSERT_TRUE(driver.isReady()) << driver.errors();
    const std::string list = driver.inside([] { return readNode("/proc/bus/input/devices"); });
    const size_t at = list.rfind("Handlers=event") + 14;
    const std::string number = list.substr(at, list.find(' ', at) - at);
    EXPECT_NE(number, "0");
    EXPECT_EQ(access(("/dev/input/event" + number).c_str(), F_OK), 0);
}

TEST(MotorNumber, ATakenOneIsRefused) {
    const RunningDriver first(profileWith(""));
    ASSERT_TRUE(first.isReady()) << first.errors();
    RunningDriver second(profileWith(""));
    EXPECT_FALSE(second.isReady());
    EXPECT_EQ(second.end(0), 1);
    EXPECT_EQ(second.errors(), "handset-driver: motor.event: /dev/input/event9 exists already\n");
}

}  // namespace
}  // namespace handset
