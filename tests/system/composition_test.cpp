// SPDX-License-Identifier: Apache-2.0
//
// Compositions on each kind of phone: what the driver gets, and when clients are told that it is
// over.
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <iterator>
#include <limits>
#include <sstream>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/kernel_log.h"
#include "tests/support/phone_control.h"
#include "tests/support/process.h"
#include "tests/system/composition_client.h"

namespace qvx::test {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

// The guest is emulated: a client may be told so much later than on the minute.
constexpr double kLateMs = 60;

std::vector<std::string> uploads(const Phone& phone) {
    std::vector<std::string> result;
    for (const json& entry : phone.journal()) {
        if (entry.value("op", "") == "upload") result.push_back(entry.value("custom_hex", ""));
    }
    return result;
}

int countInLog(const Phone& phone, const std::string& text) {
    const std::string log = phone.log();
    int count = 0;
    for (size_t at = log.find(text); at != std::string::npos; at = log.find(text, at + 1)) ++count;
    return count;
}

size_t threadsOf(int pid) {
    return static_cast<size_t>(std::distance(
            std::filesystem::directory_iterator("/proc/" + std::to_string(pid) + "/task"), {}));
}

// What the kernel has logged about binder since it booted, oldest first.
std::vector<std::string> kernelOnBinder() {
    std::vector<std::string> lines;
    std::istringstream log(runCommand({"dmesg"}).out);
    for (std::string line; std::getline(log, line);) {
        if (line.find("binder_linux:") != std::string::npos) lines.push_back(line);
    }
    return lines;
}

json withQueue(json profile, const std::string& directory) {
    for (const char* leaf : {"cp_trigger_index", "cp_trigger_queue"}) {
        profile["nodes"][directory + leaf] = {{"mode", "rw"}, {"text", "0\n"}};
    }
    return profile;
}

TEST(ComposedWaveform, ReachesTheMotorToTheByte) {
    // Header with the number of sections; for each section amplitude, entry and pause.
    const std::vector<std::pair<std::vector<std::string>, std::string>> compositions = {
            {{"50,CLICK,1.0"},
             "00000200"
             "0000000000000032"
             "00640a0000000000"},
            {{"0,THUD,0.5"},
             "00000100"
             "00328c0000000000"},
            {{"20,NOOP,7"},
             "00000100"
             "0000000000000014"},
            {{"0,CLICK,0", "1000,LIGHT_TICK,0.29"},
             "00000200"
             "00010a00000003e8"
             "001d320000000000"},
            {{"0,SPIN,1", "0,QUICK_RISE,1", "0,SLOW_RISE,1", "0,QUICK_FALL,1", "0,LOW_TICK,1"},
             "00000500"
             "00648b0000000000"
             "0064890000000000"
             "00648a0000000000"
             "0064880000000000"
             "0064870000000000"},
    };
    const Phone phone("ff");
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    for (const auto& [words, waveform] : compositions) {
        phone.reset();
        std::vector<std::string> call = {"std", "compose"};
        call.insert(call.end(), words.begin(), words.end());
        EXPECT_EQ(phone.call(call)["exception"], 0) << words[0];
        EXPECT_THAT(uploads(phone), ElementsAre(waveform)) << words[0];
        EXPECT_EQ(phone.journal().back()["op"], "event");
        EXPECT_EQ(phone.journal().back()["value"], 1);
    }
}

TEST(ComposedWaveform, ThatTheMotorRefusesIsAnIllegalStateAndNotNotified) {
    const Phone phone("ff");
    phone.fault({{"node", "motor"}, {"op", "upload"}, {"errno", "ENOSPC"}, {"times", 1}});
    const json answer = phone.call({"std", "compose", "0,CLICK,1", "--callback"});
    EXPECT_EQ(answer["exception"], kIllegalState);
    EXPECT_TRUE(answer["callback"].is_null());
    EXPECT_EQ(countInLog(phone, "Starting compose on another thread"), 0);
    EXPECT_EQ(phone.call({"std", "compose", "0,CLICK,1", "--callback"})["exception"], 0);
}

// A phone with sysfs nodes: the client passes a callback and is never called.
void expectQueued(const Phone& phone, const std::vector<std::string>& start) {
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    phone.reset();
    const json answer = phone.call(
            {"--wait", "0.5", "std", "compose", "50,CLICK,1.0", "0,SPIN,0.29", "--callback"});
    EXPECT_EQ(answer["exception"], 0);
    EXPECT_EQ(answer["callback"], "timeout");
    std::vector<std::string> expected = {"cp_trigger_index 65534\n",
                                         "cp_trigger_queue 50,1.10000,123.2900,0"};
    expected.insert(expected.end(), start.begin(), start.end());
    EXPECT_EQ(phone.writes(), expected);
    EXPECT_EQ(countInLog(phone, "Starting compose on another thread"), 0);
}

TEST(QueuedComposition, OfTheLedClassIsWrittenAndStartedAndNotNotified) {
    expectQueued(Phone("leds"), {"state 1\n", "duration 1000\n", "activate 1\n"});
}

TEST(QueuedComposition, OfTheLegacyClassIsWrittenAndStartedAndNotNotified) {
    expectQueued(Phone(withQueue(builtInProfile("legacy"), "/sys/class/timed_output/vibrator/")),
                 {"enable 1000\n"});
}

TEST(QueuedComposition, ThatTheQueueTakesInPartIsAnIllegalStateAndNotStarted) {
    const Phone phone("leds");
    phone.reset();
    phone.fault({{"node", "/sys/class/leds/vibrator/cp_trigger_queue"},
                 {"op", "write"},
                 {"short", 3},
                 {"times", 1}});
    EXPECT_EQ(phone.call({"std", "compose", "50,CLICK,1.0"})["exception"], kIllegalState);
    EXPECT_THAT(phone.log(), HasSubstr("V_2_0: ret : 3\n"));
    EXPECT_THAT(phone.writes(),
                ElementsAre("cp_trigger_index 65534\n", "cp_trigger_queue 50,1.10000,0"));
}

TEST(QueuedComposition, WithoutAQueueIsAnIllegalState) {
    const Phone phone("legacy");
    EXPECT_EQ(phone.call({"std", "compose", "50,CLICK,1.0"})["exception"], kIllegalState);
    EXPECT_THAT(phone.log(), HasSubstr("V_2_0: compose write 0xFFFE fail\n"));
}

TEST(RefusedComposition, IsNotWaitedForAndReachesNoNode) {
    const Phone phone("ff");
    phone.reset();
    const std::vector<std::vector<std::string>> calls = {
            {"std", "compose", "--callback"},
            {"std", "compose", "1001,CLICK,1", "--callback"},
            {"std", "compose", "0,CLICK,1.1", "--callback"},
            {"std", "composePwle", "active,0.5,150,0.5,150,100", "--callback"},
            {"std", "composePwle", "--callback"},
    };
    for (const auto& call : calls) {
        const json answer = phone.call(call);
        EXPECT_EQ(answer["exception"], kIllegalArgument) << call[1];
        EXPECT_TRUE(answer["callback"].is_null()) << call[1];
    }
    EXPECT_THAT(phone.journal(), IsEmpty());
}

// When the motor was last started, on the clock of monotonicMs().
double motorStarted(const Phone& phone) {
    double started = 0;
    for (const json& entry : phone.journal()) {
        if (entry.value("op", "") == "event") started = entry.value("us", 0.0) / 1000;
    }
    return started;
}

TEST(Notification, ComesAfterTheWholeLengthAndSoonThen) {
    const Phone phone("ff");
    for (const int32_t delayMs : {0, 180, 980}) {
        inProcess(kRoot, [&phone, delayMs] {
            const auto vibrator = connectForCallbacks();
            ASSERT_NE(vibrator, nullptr);
            const double length = delayMs + 20;
            double best = std::numeric_limits<double>::infinity();
            for (int round = 0; round < 3; ++round) {
                const auto composed = composeAndWait(*vibrator, clickAfter(delayMs));
                ASSERT_TRUE(composed.has_value());
                const double played = composed->notified - motorStarted(phone);
                EXPECT_GE(played, length);
                best = std::min(best, played);
            }
            EXPECT_LE(best, length + kLateMs);
        });
    }
}

TEST(Notification, OfAPauseAloneComesAfterIt) {
    const Phone phone("ff");
    const json answer = phone.call({"std", "compose", "300,NOOP,1", "--callback"});
    ASSERT_TRUE(answer["callback"].is_number()) << answer;
    EXPECT_GE(answer["callback"], 300);
}

TEST(Notification, IsNotWaitedForByTheCallNorByOtherClients) {
    const Phone phone("ff");
    inProcess(kShell, [] {
        const auto vibrator = connectForCallbacks();
        ASSERT_NE(vibrator, nullptr);
        const auto notification = ndk::SharedRefBase::make<Notification>();
        ASSERT_TRUE(vibrator->compose(clickAfter(1000), notification).isOk());
        int32_t sizeMax = 0;
        EXPECT_TRUE(vibrator->getCompositionSizeMax(&sizeMax).isOk());
        EXPECT_EQ(notification->calls(), 0);
        EXPECT_TRUE(notification->wait().has_value());
    });
}

TEST(Notification, IsNotCancelledByOff) {
    const Phone phone("ff");
    inProcess(kShell, [] {
        const auto vibrator = connectForCallbacks();
        ASSERT_NE(vibrator, nullptr);
        const auto notification = ndk::SharedRefBase::make<Notification>();
        const double before = monotonicMs();
        ASSERT_TRUE(vibrator->compose(clickAfter(280), notification).isOk());
        EXPECT_TRUE(vibrator->off().isOk());
        const auto notified = notification->wait();
        ASSERT_TRUE(notified.has_value());
        EXPECT_GE(*notified - before, 300);
    });
}

TEST(Notification, OfEachOfTenOverlappingCompositionsComesOnceAtItsOwnTime) {
    const Phone phone("ff");
    phone.reset();
    inProcess(kShell, [] {
        const auto vibrator = connectForCallbacks();
        ASSERT_NE(vibrator, nullptr);
        struct Pending {
            std::shared_ptr<Notification> notification;
            double before;
            double length;
        };
        std::vector<Pending> all;
        for (int i = 0; i < 10; ++i) {
            // The later ones are over sooner.
            const int32_t delayMs = 980 - 80 * i;
            all.push_back({ndk::SharedRefBase::make<Notification>(), monotonicMs(),
                           static_cast<double>(delayMs + 20)});
            ASSERT_TRUE(vibrator->compose(clickAfter(delayMs), all.back().notification).isOk());
        }
        for (const Pending& one : all) {
            const auto notified = one.notification->wait();
            ASSERT_TRUE(notified.has_value());
            EXPECT_GE(*notified - one.before, one.length);
        }
        usleep(200000);  // for a second call, if there were one
        for (const Pending& one : all) EXPECT_EQ(one.notification->calls(), 1);
    });
    EXPECT_EQ(countInLog(phone, "Notifying compose complete"), 10);
}

TEST(Notification, LeavesNoThreadBehind) {
    const Phone phone("ff");
    const int pid = phone.servicePid();
    phone.call({"std", "compose", "0,CLICK,1", "--callback"});
    EXPECT_TRUE(eventually([&] { return threadsOf(pid) == 1; }));
}

TEST(Notification, OfAClientThatDiedHarmsNothing) {
    const Phone phone("ff");
    // The driver notes in two lines that nobody is left to be called, and shall note nothing else.
    const ExpectBinderComplaints expected;
    const std::vector<std::string> before = kernelOnBinder();
    const int pid = phone.servicePid();
    ASSERT_NE(pid, 0);
    phone.reset();
    {
        Process client(kShell, [](const Process::Ready& ready) {
            const auto vibrator = connectForCallbacks();
            ASSERT_NE(vibrator, nullptr);
            ASSERT_TRUE(vibrator->compose(clickAfter(980), ndk::SharedRefBase::make<Notification>())
                                .isOk());
            ready();
            pause();
        });
        client.kill();
        client.wait();
    }
    EXPECT_EQ(countInLog(phone, "Notifying compose complete"), 0) << "the client died too late";
    EXPECT_TRUE(eventually([&] { return countInLog(phone, "Notifying compose complete") == 1; }));
    EXPECT_TRUE(eventually([&] { return threadsOf(pid) == 1; }));
    EXPECT_EQ(phone.servicePid(), pid);
    EXPECT_TRUE(phone.call({"std", "compose", "0,CLICK,1", "--callback"})["callback"].is_number());
    std::vector<std::string> noted = kernelOnBinder();
    noted.erase(noted.begin(), noted.begin() + static_cast<ptrdiff_t>(before.size()));
    EXPECT_THAT(noted, ElementsAre(HasSubstr("cannot find target node"),
                                   HasSubstr("transaction async to 0:0 failed")));
}

}  // namespace
}  // namespace qvx::test
