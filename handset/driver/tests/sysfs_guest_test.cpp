// SPDX-License-Identifier: Apache-2.0
//
// The driver's nodes, opened by real processes.
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/time.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <fstream>
#include <string>
#include <thread>

#include <gtest/gtest.h>

#include "handset/driver/tests/running_driver.h"

namespace handset {
namespace {

using Lines = std::vector<std::string>;

const std::string kDirectory = "/sys/class/leds/vibrator/";
const std::string kKind = kDirectory + "motor_type";
const std::string kTrigger = kDirectory + "trigger";

constexpr const char* kProfile = R"({"nodes": {
        "/sys/class/leds/vibrator/duration": {"mode": "rw", "text": "0\n"},
        "/sys/class/leds/vibrator/motor_type": {"mode": "rw", "text": "LINEAR\n", "hold": true},
        "/sys/class/leds/vibrator/num_waves": {"mode": "ro", "text": "137\n"},
        "/sys/class/leds/vibrator/trigger": {"mode": "wo"}},
        "files": {"/efs/FactoryApp/vibrator_calibration": "137\n"}})";

class SysfsNodes : public testing::Test {
  protected:
    void SetUp() override { ASSERT_TRUE(mDriver.isReady()) << mDriver.errors(); }

    RunningDriver mDriver{kProfile};
};

TEST_F(SysfsNodes, AWriteIsJournaledToTheByte) {
    EXPECT_EQ(mDriver.inside(1000, [] { return writeNode(kDuration, "500\n", O_RDWR); }), "4");
    EXPECT_EQ(mDriver.journal(),
              (Lines{R"({"uid":1000,"op":"open","node":"/sys/class/leds/vibrator/duration",)"
                     R"("flags":"O_RDWR","error":0})",
                     R"({"uid":1000,"op":"write","node":"/sys/class/leds/vibrator/duration",)"
                     R"("data":"500\n","result":4})",
                     R"({"uid":1000,"op":"close","node":"/sys/class/leds/vibrator/duration"})"}));
}

TEST_F(SysfsNodes, AReadIsJournaledWithSizeAndResult) {
    EXPECT_EQ(mDriver.inside(1000,
                             [] {
                                 const int fd = open(kWaves.c_str(), O_RDONLY);
                                 char text[7];
                                 const ssize_t first = read(fd, text, sizeof text);
                                 return std::to_string(first) +
                                        std::to_string(read(fd, text, sizeof text));
                             }),
              "40");
    const Lines journal = mDriver.journal();
    ASSERT_GE(journal.size(), 3U);
    EXPECT_EQ(journal[0], R"({"uid":1000,"op":"open","node":"/sys/class/leds/vibrator/num_waves",)"
                          R"("flags":"O_RDONLY","error":0})");
    EXPECT_EQ(journal[1], R"({"uid":1000,"op":"read","node":"/sys/class/leds/vibrator/num_waves",)"
                          R"("size":7,"result":4})");
    EXPECT_EQ(journal[2], R"({"uid":1000,"op":"read","node":"/sys/class/leds/vibrator/num_waves",)"
                          R"("size":7,"result":0})");
}

TEST_F(SysfsNodes, TheJournalNamesTheProcessNotTheThread) {
    const std::string pid = mDriver.inside([] {
        std::thread([] { writeNode(kDuration, "1\n", O_WRONLY); }).join();
        return std::to_string(getpid());
    });
    const std::string journal = mDriver.rawJournal();
    EXPECT_EQ(journal.substr(0, 7), "{\"n\":1,");
    size_t lines = 0;
    for (size_t at = journal.find("\"pid\":" + pid + ","); at != std::string::npos;
         at = journal.find("\"pid\":" + pid + ",", at + 1)) {
        ++lines;
    }
    EXPECT_EQ(lines, 3U) << journal;
}

TEST_F(SysfsNodes, BytesThatAreNoTextAreJournaledAsHex) {
    mDriver.inside([] { return writeNode(kDuration, std::string("a\xff\0", 3), O_WRONLY); });
    EXPECT_EQ(mDriver.journal().at(1),
              R"({"uid":0,"op":"write","node":"/sys/class/leds/vibrator/duration",)"
              R"("hex":"61ff00","result":3})");
}

TEST_F(SysfsNodes, OpenFlagsAreJournaled) {
    mDriver.inside([] {
        openNode(kDuration, O_WRONLY | O_TRUNC);
        openNode(kDuration, O_RDWR | O_APPEND | O_NONBLOCK);
        return openNode(kDuration, O_WRONLY | O_CREAT);
    });
    std::string flags;
    for (const std::string& line : mDriver.journal()) {
        if (const size_t at = line.find("\"flags\":"); at != std::string::npos) {
            flags += line.substr(at + 8, line.find(',', at) - at - 8) + " ";
        }
    }
    EXPECT_EQ(flags, "\"O_WRONLY|O_TRUNC\" \"O_RDWR|O_APPEND|O_NONBLOCK\" \"O_WRONLY\" ");
}

TEST_F(SysfsNodes, RootTooIsRefusedWhatANodeHasNoMethodFor) {
    EXPECT_EQ(mDriver.inside([] { return openNode(kWaves, O_RDWR); }), "EACCES");
    EXPECT_EQ(mDriver.inside([] { return openNode(kWaves, O_WRONLY); }), "EACCES");
    EXPECT_EQ(mDriver.inside([] { return openNode(kWaves, O_RDONLY); }), "ok");
    EXPECT_EQ(mDriver.inside([] { return openNode(kTrigger, O_RDWR); }), "EACCES");
    EXPECT_EQ(mDriver.inside([] { return openNode(kTrigger, O_RDONLY); }), "EACCES");
    EXPECT_EQ(mDriver.inside([] { return openNode(kTrigger, O_WRONLY); }), "ok");
}

TEST_F(SysfsNodes, ARefusedOpenIsJournaled) {
    mDriver.inside(1000, [] { return openNode(kWaves, O_RDWR); });
    EXPECT_EQ(mDriver.journal(),
              Lines{R"({"uid":1000,"op":"open","node":"/sys/class/leds/vibrator/num_waves",)"
                    R"("flags":"O_RDWR","error":"EACCES"})"});
}

TEST_F(SysfsNodes, TheSystemUserMayAndOthersMayOnlyRead) {
    EXPECT_EQ(mDriver.inside(1000, [] { return openNode(kDuration, O_RDWR); }), "ok");
    EXPECT_EQ(mDriver.inside(2000, [] { return openNode(kDuration, O_RDWR); }), "EACCES");
    EXPECT_EQ(mDriver.inside(2000, [] { return openNode(kDuration, O_WRONLY); }), "EACCES");
    EXPECT_EQ(mDriver.inside(2000, [] { return openNode(kDuration, O_RDONLY); }), "ok");
    EXPECT_EQ(mDriver.inside(2000, [] { return openNode(kTrigger, O_WRONLY); }), "EACCES");
}

TEST_F(SysfsNodes, AttributesAreSysfss) {
    EXPECT_EQ(mDriver.inside([] {
        struct stat node {};
        struct stat directory {};
        stat(kDuration.c_str(), &node);
        stat(kDirectory.c_str(), &directory);
        return std::to_string(node.st_mode) + " " + std::to_string(node.st_uid) + " " +
               std::to_string(node.st_gid) + " " + std::to_string(node.st_size) + " " +
               std::to_string(directory.st_mode) + " " + std::to_string(directory.st_uid);
    }),
              "33204 1000 1000 4096 16877 0");  // 0100664, 040755
}

TEST_F(SysfsNodes, ChangingTheModeChangesWhoMay) {
    EXPECT_EQ(mDriver.inside(2000, [] { return outcome(chmod(kDuration.c_str(), 0666)); }),
              "EPERM");
    EXPECT_EQ(mDriver.inside(1000, [] { return outcome(chmod(kDuration.c_str(), 0444)); }), "0");
    EXPECT_EQ(mDriver.inside([] { return openNode(kDuration, O_RDWR); }), "EACCES");
    EXPECT_EQ(mDriver.inside([] { return outcome(chown(kDuration.c_str(), 2000, 2000)); }), "0");
    EXPECT_EQ(mDriver.inside(2000, [] { return outcome(chmod(kDuration.c_str(), 0600)); }), "0");
    EXPECT_EQ(mDriver.inside(2000, [] { return openNode(kDuration, O_RDWR); }), "ok");
    EXPECT_EQ(mDriver.inside(1000, [] { return openNode(kDuration, O_RDONLY); }), "EACCES");
}

TEST_F(SysfsNodes, PermissionBitsMakeNoMethods) {
    EXPECT_EQ(mDriver.inside([] { return outcome(chmod(kWaves.c_str(), 0666)); }), "0");
    EXPECT_EQ(mDriver.inside([] { return outcome(chmod(kTrigger.c_str(), 0666)); }), "0");
    EXPECT_EQ(mDriver.inside([] { return writeNode(kWaves, "1\n", O_RDWR); }), "EIO");
    EXPECT_EQ(mDriver.inside([] { return readNode(kTrigger); }), "EIO");
    EXPECT_EQ(mDriver.inside([] { return readNode(kWaves); }), "137\n");
}

TEST_F(SysfsNodes, TruncationNeedsThePermissionToWrite) {
    EXPECT_EQ(mDriver.inside(1000, [] { return openNode(kDuration, O_RDONLY | O_TRUNC); }), "ok");
    EXPECT_EQ(mDriver.inside(1000, [] { return openNode(kWaves, O_RDONLY | O_TRUNC); }), "EACCES");
}

TEST_F(SysfsNodes, NothingIsCreatedOrRemoved) {
    EXPECT_EQ(mDriver.inside([] { return openNode(kDirectory + "new", O_WRONLY | O_CREAT); }),
              "EACCES");
    EXPECT_EQ(mDriver.inside([] { return openNode(kDirectory + "new", O_WRONLY); }), "ENOENT");
    EXPECT_EQ(mDriver.inside([] { return outcome(mkdir((kDirectory + "new").c_str(), 0755)); }),
              "EPERM");
    EXPECT_EQ(mDriver.inside([] { return outcome(unlink(kDuration.c_str())); }), "EPERM");
    EXPECT_EQ(mDriver.inside([] {
        return outcome(mknod((kDirectory + "new").c_str(), S_IFREG | 0644, 0));
    }),
              "EACCES");
    EXPECT_EQ(mDriver.inside([] {
        return outcome(rename(kDuration.c_str(), (kDirectory + "new").c_str()));
    }),
              "EPERM");
}

TEST_F(SysfsNodes, EveryWriteIsAFreshStore) {
    EXPECT_EQ(mDriver.inside([] {
        const int fd = open(kDuration.c_str(), O_RDWR);
        std::string results = outcome(write(fd, "12345\n", 6));
        results += outcome(write(fd, "7\n", 2));
        results += outcome(pwrite(fd, "9", 1, 100));
        return results + readNode(kDuration);
    }),
              "6219");
}

TEST_F(SysfsNodes, TruncationChangesNothing) {
    EXPECT_EQ(mDriver.inside([] {
        openNode(kDuration, O_WRONLY | O_TRUNC);
        return outcome(truncate(kDuration.c_str(), 0)) + readNode(kDuration);
    }),
              "00\n");
}

TEST_F(SysfsNodes, AReadInPiecesGoesThroughOneShowing) {
    EXPECT_EQ(mDriver.inside([] {
        writeNode(kDuration, "123456\n", O_WRONLY);
        const int fd = open(kDuration.c_str(), O_RDONLY);
        char text[16] = {};
        const ssize_t first = read(fd, text, 3);
        writeNode(kDuration, "x\n", O_WRONLY);
        const ssize_t second = read(fd, text + first, sizeof text - 1 - first);
        const std::string shown(text, first + second);
        const ssize_t again = pread(fd, text, sizeof text, 0);
        return shown + std::string(text, again);
    }),
              "123456\nx\n");
}

TEST_F(SysfsNodes, ANodeThatHoldsTakesWritesAndKeepsItsText) {
    EXPECT_EQ(
            mDriver.inside([] { return writeNode(kKind, "COINDC\n", O_WRONLY) + readNode(kKind); }),
            "7LINEAR\n");
}

TEST_F(SysfsNodes, ALongTextArrivesInOnePiece) {
    const std::string text(13600, '7');
    EXPECT_EQ(mDriver.inside([&] { return writeNode(kDuration, text, O_RDWR); }), "13600");
    EXPECT_EQ(mDriver.journal().at(1),
              R"({"uid":0,"op":"write","node":"/sys/class/leds/vibrator/duration","data":")" +
                      text + R"(","result":13600})");
    EXPECT_EQ(mDriver.inside([&] { return readNode(kDuration) == text ? "same" : "other"; }),
              "same");
}

TEST_F(SysfsNodes, ACloseIsJournaledBeforeTheNextOpen) {
    mDriver.inside([] {
        for (int i = 0; i < 200; ++i) writeNode(i % 2 == 0 ? kDuration : kTrigger, "1", O_WRONLY);
        return "";
    });
    std::string order;
    for (const std::string& line : mDriver.journal()) {
        const size_t at = line.find("\"op\":\"") + 6;
        order += line[at];
    }
    std::string expected;
    for (int i = 0; i < 200; ++i) expected += "owc";
    EXPECT_EQ(order, expected);
}

TEST_F(SysfsNodes, ARequestFindsEveryCloseInTheJournal) {
    for (size_t closes = 1; closes <= 100; ++closes) {
        mDriver.inside([] { return openNode(kDuration, O_WRONLY); });
        EXPECT_EQ(mDriver.journal().size(), 2 * closes);
    }
}

TEST_F(SysfsNodes, DirectoriesListTheirNodes) {
    EXPECT_EQ(mDriver.inside([] {
        std::string names;
        for (const auto& entry : std::filesystem::directory_iterator(kDirectory)) {
            names += entry.path().filename().string() + " ";
        }
        for (const auto& entry : std::filesystem::directory_iterator("/sys/class")) {
            names += entry.path().string() + " ";
        }
        return names;
    }),
              "duration motor_type num_waves trigger /sys/class/leds ");
}

}  // namespace
}  // namespace handset
