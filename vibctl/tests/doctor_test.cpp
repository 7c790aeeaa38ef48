// SPDX-License-Identifier: Apache-2.0
//
// The doctor on healthy phones made of plain files, the order of its questions, and its lines.
#include "vibctl/doctor/doctor.h"

#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "vibctl/doctor/driver.h"
#include "vibctl/doctor/processes.h"
#include "vibctl/tests/doctor_root.h"

namespace vibctl {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

constexpr const char* kProgram = "/vendor/bin/hw/android.hardware.vibrator-service.quorvan";

class DoctorTest : public ::testing::Test {
  protected:
    DoctorTest() {
        mFacts.device = "/dev/binder";
        mFacts.declared = true;
        mFacts.registered = true;
        mFacts.registrant = 312;
        mFacts.version = 2;
        mFacts.extensionVersion = 4;
        mRoot.put("/dev/binder", "");
        mRoot.putFragment();
        mRoot.putProcess(312, {kProgram}, 1000);
        mRoot.put("/sys/class/vib_info_class/vib_support_info/functions",
                  "INTENSITY INDEX_HAPTIC_PATTERN PRIMITIVE_EFFECT_COMPOSE "
                  "CAPABILITY_EXTERNAL_CONTROL HAPTIC_ENGINE FIFO_HAPTIC_ENGINE "
                  "HYBRID_HAPTIC_ENGINE\n");
    }

    std::vector<std::string> lines() const {
        std::vector<std::string> lines;
        for (const Finding& finding : diagnose(mFacts, mRoot.path())) {
            lines.push_back(humanLine(finding, false));
        }
        return lines;
    }

    fake::Root mRoot;
    BinderFacts mFacts;
};

TEST_F(DoctorTest, AsksEveryQuestionInTheOrderInWhichOneNeedsTheOther) {
    mRoot.putNodes("/sys/class/leds/vibrator", {"activate", "duration", "state", "intensity",
                                                "cp_trigger_index", "cp_trigger_queue", "num_waves",
                                                "haptic_engine", "fifo", "hybrid_haptic_engine"});
    mRoot.put("/sys/class/leds/vibrator/motor_type", "LINEAR_1040\n");
    EXPECT_THAT(
            lines(),
            ElementsAre("ok   binder: /dev/binder opens", "ok   service manager: answers",
                        "ok   declaration: its .xml names IVibrator/default version 2",
                        "ok   registration: process 312, version 2",
                        "ok   user: process 312 is user 1000",
                        "ok   device class: LED class, /sys/class/leds/vibrator/",
                        "ok   nodes: user 1000 can open all 12 that the driver has, of 25 known",
                        "ok   motor type: LINEAR_1040",
                        "ok   features: amplitude, effects by pattern, compositions, external "
                        "control, packets, FIFO, hybrid",
                        "ok   extension: version 4"));
}

TEST_F(DoctorTest, PrefersTheLegacyClassAndSaysWhatItOffers) {
    mRoot.putNodes("/sys/class/leds/vibrator", {"activate", "duration", "state"});
    mRoot.putNodes("/sys/class/timed_output/vibrator", {"enable"});
    mRoot.put("/sys/class/vib_info_class/vib_support_info/functions", "\n");
    EXPECT_THAT(lines(),
                ::testing::IsSupersetOf(
                        {"ok   device class: legacy class, /sys/class/timed_output/vibrator/",
                         "ok   nodes: user 1000 can open all 2 that the driver has, of 24 "
                         "known",
                         "ok   features: no effects"}));
}

TEST_F(DoctorTest, FindsAForceFeedbackMotor) {
    mRoot.put("/proc/bus/input/devices", "N: Name=\"qvx_vibrator_inputff\"\nH: Handlers=event3 \n");
    mRoot.put("/dev/input/event3", "");
    EXPECT_THAT(lines(), ::testing::IsSupersetOf(
                                 {"ok   device class: force feedback, /dev/input/event3",
                                  "ok   nodes: user 1000 can open all 2 that the driver has, of 8 "
                                  "known",
                                  "ok   features: amplitude, effects by pattern, compositions, "
                                  "external control"}));
}

TEST_F(DoctorTest, SkipsWhatNeedsBinderWithoutIt) {
    mRoot.remove("/dev/binder");
    mFacts.deviceProblem = "cannot open /dev/binder: No such file or directory";
    EXPECT_THAT(lines(), ::testing::IsSupersetOf(
                                 {"skip service manager: needs binder",
                                  "skip registration: process 312 runs; needs a service manager",
                                  "skip extension: needs the registered service"}));
}

TEST_F(DoctorTest, LooksForNodesInTheViewsOfOtherProcessesWhenTheServiceDoesNotRun) {
    mRoot.remove("/proc/312");
    mFacts.registered = false;
    mFacts.registrant = 0;
    const fake::Root other;
    other.putNodes("/sys/class/leds/vibrator", {"activate", "duration", "state"});
    for (const int pid : {1, 20, 21}) {
        mRoot.putProcess(pid, {"/bin/process"}, 0);
        const std::string link = mRoot.at("/proc/" + std::to_string(pid));
        std::filesystem::create_directory(link + "/ns");
        std::filesystem::create_symlink(pid == 21 ? "mnt:[2]" : "mnt:[1]", link + "/ns/mnt");
    }
    mRoot.remove("/proc/21/root");
    std::filesystem::create_directory_symlink(other.path(), mRoot.at("/proc/21/root"));
    EXPECT_THAT(lines(), ::testing::IsSupersetOf(
                                 {"skip user: nodes are judged for user 1000",
                                  "ok   device class: LED class, /sys/class/leds/vibrator/"}));
}

TEST(InputDevices, AreReadBlockByBlock) {
    const std::vector<InputDevice> devices = parseInputDevices(
            "I: Bus=0019\nN: Name=\"keys\"\nH: Handlers=kbd event0 \n\n"
            "I: Bus=0006\nH: Handlers=event8 \n\n"
            "N: Name=\"motor\"\nH: Handlers=event1");
    ASSERT_THAT(devices, SizeIs(2));
    EXPECT_EQ(devices[0].name, "keys");
    EXPECT_EQ(devices[0].handlers, "kbd event0");
    EXPECT_EQ(devices[1].name, "motor");
    EXPECT_EQ(devices[1].handlers, "event1");
    EXPECT_THAT(parseInputDevices(""), IsEmpty());
}

TEST(Processes, AreFoundByTheirExecutableAlsoWhenItWasReplaced) {
    const fake::Root root;
    root.putProcess(30, {"/bin/other"}, 5);
    root.putProcess(200, {"/bin/service (deleted)"}, 7);
    EXPECT_EQ(findProcess(root.path() / "proc", "service"), 200);
    EXPECT_EQ(findProcess(root.path() / "proc", "servic"), std::nullopt);
    EXPECT_EQ(userOf(root.path() / "proc", 200)->uid, 7u);
    EXPECT_THAT(userOf(root.path() / "proc", 200)->groups, ElementsAre(1004, 1007));
    EXPECT_FALSE(userOf(root.path() / "proc", 31).has_value());
}

TEST(FindingLine, HasAWordForTheAnswerAndForEachNextStep) {
    EXPECT_EQ(humanLine(good("nodes", "all open"), false), "ok   nodes: all open");
    EXPECT_EQ(humanLine(skipped("user", "needs it"), false), "skip user: needs it");
    EXPECT_EQ(humanLine(bad("user", "root", "change it"), false),
              "bad  user: root; next: change it");
    EXPECT_EQ(humanLine(note("words", "odd", "mend it"), false), "note words: odd; next: mend it");
}

TEST(FindingLine, IsCutAtAHundredColumnsBeforeItsNextStep) {
    const std::string line = humanLine(bad("nodes", std::string(200, 'x'), "change it"), false);
    EXPECT_EQ(line.size(), 100u);
    EXPECT_THAT(line, ::testing::EndsWith("xxx...; next: change it"));
}

TEST(FindingLine, IsColouredOnDemandInItsFirstWord) {
    EXPECT_EQ(humanLine(good("a", "b"), true), "\033[32mok  \033[0m a: b");
    EXPECT_EQ(humanLine(bad("a", "b", "c"), true), "\033[1;31mbad \033[0m a: b; next: c");
}

TEST(FindingLine, IsOneJsonObjectForPrograms) {
    EXPECT_EQ(jsonLine(good("nodes", "all \"open\"")),
              R"({"check":"nodes","ok":true,"text":"all \"open\"","next":null})");
    EXPECT_EQ(jsonLine(bad("user", "root", "change it")),
              R"({"check":"user","ok":false,"text":"root","next":"change it"})");
    EXPECT_EQ(jsonLine(note("words", "odd", "mend it")),
              R"({"check":"words","ok":true,"text":"odd","next":"mend it"})");
    EXPECT_EQ(jsonLine(skipped("extension", "needs it")),
              R"({"check":"extension","ok":null,"text":"needs it","next":null})");
}

TEST(ClosingLine, CountsProblemsAndNamesTheFirst) {
    const Finding well = good("a", "x");
    EXPECT_EQ(closingLine(std::vector{well, note("n", "x", "y"), skipped("b", "y")}),
              "all is well");
    EXPECT_EQ(closingLine(std::vector{well, bad("b", "y", "z")}), "one problem: b");
    EXPECT_EQ(closingLine(std::vector{well, bad("b", "y", "z"), bad("c", "y", "z")}),
              "2 problems; first: b");
}

}  // namespace
}  // namespace vibctl
