// SPDX-License-Identifier: Apache-2.0
//
// The faults that a profile puts on a node, met by real processes.
#include <fcntl.h>
#include <sys/time.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/driver/tests/running_driver.h"

namespace handset {
namespace {

using Lines = std::vector<std::string>;

std::string profileWith(const std::string& faults) {
    return R"({"nodes": {
        "/sys/class/leds/vibrator/duration": {"mode": "rw", "text": "0\n"},
        "/sys/class/leds/vibrator/num_waves": {"mode": "ro", "text": "137\n"}},
        "faults": [)" +
           faults + "]}";
}

std::string onDuration(const std::string& op, const std::string& rest) {
    return R"({"node": "/sys/class/leds/vibrator/duration", "op": ")" + op + "\", " + rest + "}";
}

// With either driver; a class of its own for what the kernel does before a driver is asked.
class SysfsFaults : public testing::TestWithParam<const char*> {
  protected:
    // What a client gets from several calls with these faults in force.
    std::string withFaults(const std::string& faults, const std::function<std::string()>& work) {
        const RunningDriver driver(profileWith(faults), GetParam());
        EXPECT_TRUE(driver.isReady()) << driver.errors();
        std::string result = driver.inside(1000, work);
        struck.clear();
        for (const std::string& line : driver.journal()) {
            if (line.find("\"fault\"") != std::string::npos) struck.push_back(line);
        }
        return result;
    }

    Lines struck;
};

class SysfsOpenFaults : public SysfsFaults {};

INSTANTIATE_TEST_SUITE_P(With, SysfsFaults, testing::ValuesIn(kBothDrivers), driverName);
INSTANTIATE_TEST_SUITE_P(With, SysfsOpenFaults, testing::Values(""), driverName);

std::string threeWrites() {
    std::string results;
    for (int i = 0; i < 3; ++i) results += writeNode(kDuration, "500\n", O_RDWR) + " ";
    return results + readNode(kDuration);
}

std::string twoReads() {
    const std::string first = readNode(kDuration);
    return first + " " + readNode(kDuration);
}

TEST_P(SysfsFaults, AWriteFailsAndStoresNothing) {
    EXPECT_EQ(withFaults(onDuration("write", R"("errno": "EIO", "after": 1, "times": 1)"),
                         threeWrites),
              "4 EIO 4 500\n");
    EXPECT_EQ(struck.at(0),
              R"({"uid":1000,"op":"write","node":"/sys/class/leds/vibrator/duration",)"
              R"("data":"500\n","result":"EIO","fault":{"errno":"EIO"}})");
}

TEST_P(SysfsFaults, AreCountedUntilTheyAreForgotten) {
    const RunningDriver driver(profileWith(onDuration("write", R"("errno": "EINTR", "times": 1)")),
                               GetParam());
    const std::string second =
            onDuration("write", R"("errno":"ENOSPC","after":2,"every":2,"times":2)");
    EXPECT_EQ(driver.ask("fault " + second), "ok ");
    const auto write = [] { return writeNode(kDuration, "1\n", O_WRONLY); };
    std::string results;
    for (int i = 0; i < 8; ++i) results += driver.inside(1000, write) + " ";
    EXPECT_EQ(results, "EINTR 2 2 ENOSPC 2 ENOSPC 2 2 ");
    EXPECT_EQ(driver.ask("faults"),
              R"(ok [{"node":"/sys/class/leds/vibrator/duration","op":"write","errno":"EINTR",)"
              R"("times":1,"seen":8,"struck":1},)"
              R"({"node":"/sys/class/leds/vibrator/duration","op":"write","errno":"ENOSPC",)"
              R"("after":2,"times":2,"every":2,"seen":8,"struck":2}])");
    EXPECT_EQ(driver.ask("unplug /sys/class/leds/vibrator/duration"), "ok ");
    EXPECT_THAT(driver.inside(1000, write), testing::EndsWith("ENODEV"));
    EXPECT_EQ(driver.ask("clear"), "ok ");
    EXPECT_EQ(driver.inside(1000, write), "2");
    EXPECT_EQ(driver.ask("faults"), "ok []");
}

TEST_P(SysfsFaults, AnInterruptedWriteIsJustThat) {
    EXPECT_EQ(withFaults(onDuration("write", R"("errno": "EINTR", "times": 2)"), threeWrites),
              "EINTR EINTR 4 500\n");
}

TEST_P(SysfsOpenFaults, AnOpenIsRefused) {
    EXPECT_EQ(withFaults(onDuration("open", R"("errno": "EACCES", "times": 1)"), threeWrites),
              "open EACCES 4 4 500\n");
    EXPECT_EQ(struck.at(0), R"({"uid":1000,"op":"open","node":"/sys/class/leds/vibrator/duration",)"
                            R"("flags":"O_RDWR","error":"EACCES","fault":{"errno":"EACCES"}})");
}

TEST_P(SysfsFaults, AShortWriteTakesTheFirstBytes) {
    EXPECT_EQ(withFaults(onDuration("write", R"("short": 2, "after": 2, "times": 1)"), threeWrites),
              "4 4 2 50");
    EXPECT_EQ(struck.at(0),
              R"({"uid":1000,"op":"write","node":"/sys/class/leds/vibrator/duration",)"
              R"("data":"500\n","result":2,"fault":{"short":2}})");
}

TEST_P(SysfsFaults, AWriteMayTakeNothing) {
    EXPECT_EQ(withFaults(onDuration("write", R"("short": 0)"), threeWrites), "0 0 0 ");
}

TEST_P(SysfsFaults, AReadFailsOrIsShort) {
    EXPECT_EQ(withFaults(onDuration("read", R"("errno": "EIO", "times": 1)"), twoReads), "EIO 0\n");
    EXPECT_EQ(withFaults(onDuration("read", R"("short": 1, "times": 1)"), twoReads), "0 0\n");
}

TEST_P(SysfsFaults, UnpluggedNodesAreGone) {
    EXPECT_EQ(withFaults(onDuration("write", R"("unplug": true, "after": 1)"),
                         [] { return threeWrites() + " " + readNode(kWaves); }),
              *GetParam() == '\0' ? "4 ENODEV open ENODEV open ENODEV 137\n"
                                  : "4 ENODEV ENODEV ENODEV 137\n");
    EXPECT_EQ(struck.at(0),
              R"({"uid":1000,"op":"write","node":"/sys/class/leds/vibrator/duration",)"
              R"("data":"500\n","result":"ENODEV","fault":{"errno":"ENODEV","unplug":true}})");
}

double secondsOf(const std::function<void()>& work) {
    const auto start = std::chrono::steady_clock::now();
    work();
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

TEST_P(SysfsFaults, ADelayKeepsTheCallerWaiting) {
    EXPECT_EQ(withFaults(onDuration("write", R"("delay": 300, "times": 1)"),
                         [] {
                             std::string results;
                             const double seconds = secondsOf(
                                     [&] { results = writeNode(kDuration, "1\n", O_RDWR); });
                             return results + (seconds >= 0.29 ? " waited" : " hurried");
                         }),
              "2 waited");
}

TEST_P(SysfsFaults, ASignalCutsADelayShort) {
    EXPECT_EQ(withFaults(onDuration("write", R"("delay": 60000, "times": 1)"),
                         [] {
                             struct sigaction action {};
                             action.sa_handler = [](int) {};
                             action.sa_flags = SA_RESTART;
                             sigaction(SIGALRM, &action, nullptr);
                             // Again and again: a busy machine may not have begun to write yet.
                             const itimerval timer{{0, 200000}, {0, 200000}};
                             setitimer(ITIMER_REAL, &timer, nullptr);
                             std::string results;
                             const double seconds = secondsOf(
                                     [&] { results = writeNode(kDuration, "1\n", O_RDWR); });
                             const itimerval none{};
                             setitimer(ITIMER_REAL, &none, nullptr);
                             return results + (seconds < 30 ? " at once" : " late") +
                                    readNode(kDuration);
                         }),
              "EINTR at once0\n");
    EXPECT_EQ(struck.at(0),
              R"({"uid":1000,"op":"write","node":"/sys/class/leds/vibrator/duration",)"
              R"("data":"1\n","result":"EINTR","fault":{"delay":60000}})");
}

TEST_P(SysfsOpenFaults, OneCallersDelayHoldsUpNobodyElse) {
    EXPECT_EQ(withFaults(onDuration("open", R"("delay": 60000, "times": 1)"),
                         [] {
                             std::thread([] { openNode(kDuration, O_RDWR); }).detach();
                             usleep(100000);
                             return readNode(kWaves);
                         }),
              "137\n");
}

}  // namespace
}  // namespace handset
