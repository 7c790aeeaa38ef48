// SPDX-License-Identifier: Apache-2.0
//
// The doctor on whole phones: the built-in ones, and phones on which something is broken.
#include <csignal>
#include <filesystem>
#include <fstream>
#include <sstream>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/kernel_log.h"
#include "tests/support/phone_control.h"

namespace qvx::test {
namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::StartsWith;

constexpr const char* kFragment =
        "/vendor/etc/vintf/manifest/android.hardware.vibrator-service.quorvan.xml";
constexpr const char* kBinder = "ok   binder: /dev/binder opens";
constexpr const char* kManager = "ok   service manager: answers";
constexpr const char* kDeclared = "ok   declaration: its .xml names IVibrator/default version 2";
constexpr const char* kRegistered = "ok   registration: process PID, version 2";
constexpr const char* kUser = "ok   user: process PID is user 1000";
constexpr const char* kExtension = "ok   extension: version 4";

struct Diagnosis {
    int status = -1;
    std::vector<std::string> lines;  // with PID for the service's process id
};

// Runs the doctor where the command is, by default where the handset runs its commands.
Diagnosis diagnose(int servicePid, const std::vector<std::string>& where = {}) {
    std::vector<std::string> command = where;
    command.insert(command.end(), {"vibctl", "doctor"});
    const CommandResult result = runCommand(command);
    EXPECT_EQ(result.err, "");
    Diagnosis diagnosis{result.status, {}};
    const std::string process = "process " + std::to_string(servicePid);
    std::istringstream text(result.out);
    for (std::string line; std::getline(text, line);) {
        EXPECT_LE(line.size(), 100u) << line;
        const size_t at = line.find(process);
        if (at != std::string::npos) line.replace(at, process.size(), "process PID");
        diagnosis.lines.push_back(line);
    }
    return diagnosis;
}

// The processes of that program; the service manager's is not told by the phone.
std::string pidOf(const std::string& program) {
    std::string out = runCommand({"pidof", program}).out;
    while (!out.empty() && out.back() == '\n') out.pop_back();
    return out;
}

struct Healthy {
    const char* profile;
    const char* deviceClass;
    const char* nodes;
    const char* features;
};

class HealthyPhone : public testing::TestWithParam<Healthy> {};

TEST_P(HealthyPhone, IsWell) {
    const Phone phone(GetParam().profile);
    phone.reset();
    const Diagnosis diagnosis = diagnose(phone.servicePid());
    EXPECT_EQ(diagnosis.status, 0);
    EXPECT_THAT(diagnosis.lines,
                testing::IsSupersetOf(
                        {std::string(kBinder), std::string(kManager), std::string(kDeclared),
                         std::string(kRegistered), std::string(kUser), std::string(kExtension),
                         std::string(GetParam().nodes), std::string(GetParam().features),
                         std::string("all is well")}));
    EXPECT_THAT(diagnosis.lines, Contains(StartsWith(GetParam().deviceClass)));
    EXPECT_THAT(diagnosis.lines, testing::Not(Contains(StartsWith("note"))));
    for (const nlohmann::json& line : phone.journal()) {
        EXPECT_THAT(line.value("op", ""), testing::AnyOf("open", "read", "close")) << line.dump();
    }
}

constexpr Healthy kHealthy[] = {
        {"legacy", "ok   device class: legacy class, /sys/class/timed_output/vibrator/",
         "ok   nodes: user 1000 can open all 9 that the driver has, of 24 known",
         "ok   features: amplitude, effects by packets, packets"},
        {"leds", "ok   device class: LED class, /sys/class/leds/vibrator/",
         "ok   nodes: user 1000 can open all 25 that the driver has, of 25 known",
         "ok   features: amplitude, effects by pattern, compositions, external control, packets, "
         "FIFO, hybrid"},
        {"ff", "ok   device class: force feedback, /dev/input/event",
         "ok   nodes: user 1000 can open all 8 that the driver has, of 8 known",
         "ok   features: amplitude, effects by pattern, compositions, external control"},
};

INSTANTIATE_TEST_SUITE_P(Doctor, HealthyPhone, testing::ValuesIn(kHealthy),
                         [](const auto& phone) { return phone.param.profile; });

TEST(Doctor, FindsWhatAPhoneWithoutAMotorLacks) {
    const Phone phone("none");
    const Diagnosis diagnosis = diagnose(phone.servicePid());
    EXPECT_EQ(diagnosis.status, 1);
    EXPECT_THAT(
            diagnosis.lines,
            ElementsAre(kBinder, kManager, kDeclared, kRegistered, kUser,
                        "bad  device class: no timed_output or leds node, no motor in the input "
                        "list; next: load the driver",
                        "skip nodes: without a device class none is needed", kExtension,
                        "one problem: device class"));
}

TEST(Doctor, PrintsAnObjectALineForPrograms) {
    const Phone phone("leds");
    const CommandResult result = runCommand({"vibctl", "--json", "doctor"});
    EXPECT_EQ(result.status, 0);
    EXPECT_THAT(result.out,
                StartsWith("{\"check\":\"binder\",\"ok\":true,\"text\":\"/dev/binder opens\","
                           "\"next\":null}\n{\"check\":\"service manager\",\"ok\":true,"));
}

TEST(Doctor, LooksForTheNodesWhereTheyAreWhenTheServiceDoesNotRun) {
    const Phone phone("leds", {"--no-service"});
    const Diagnosis diagnosis = diagnose(0);
    EXPECT_EQ(diagnosis.status, 1);
    EXPECT_THAT(
            diagnosis.lines,
            testing::IsSupersetOf(
                    {"bad  registration: the service does not run; next: start it; should it "
                     "end at once, its log says why",
                     "skip user: nodes are judged for user 1000",
                     "ok   nodes: user 1000 can open all 25 that the driver has, of 25 known",
                     "skip extension: needs the registered service", "one problem: registration"}));
}

TEST(Doctor, DoesNotWaitForAServiceThatIsStopped) {
    // Its late answer finds nobody.
    const ExpectBinderComplaints expected;
    const Phone phone("leds");
    const int pid = phone.servicePid();
    ASSERT_EQ(kill(pid, SIGSTOP), 0);
    const Diagnosis diagnosis = diagnose(pid);
    const CommandResult call = runCommand({"vibctl", "--timeout", "0.5", "std", "off"});
    ASSERT_EQ(kill(pid, SIGCONT), 0);
    EXPECT_EQ(call.status, 3);
    EXPECT_THAT(call.out, HasSubstr("STATUS_TIMED_OUT: no answer within 0.5 s; see vibctl doctor"));
    EXPECT_EQ(runCommand({"vibctl", "std", "off"}).status, 0);
    EXPECT_THAT(diagnosis.lines,
                Contains("bad  registration: process PID is stopped; next: kill -CONT " +
                         std::to_string(pid)));
}

TEST(Doctor, NamesTheNodeThatTheServiceHangsIn) {
    const ExpectBinderComplaints expected;
    const Phone phone("leds");
    phone.fault({{"node", "/sys/class/leds/vibrator/duration"},
                 {"op", "write"},
                 {"delay", 15000},
                 {"times", 1}});
    EXPECT_EQ(runCommand({"vibctl", "--timeout", "0.5", "std", "on", "50"}).status, 3);
    EXPECT_THAT(diagnose(phone.servicePid()).lines,
                Contains("bad  registration: process PID hangs in vibrator/duration; next: see the "
                         "kernel log"));
}

TEST(Doctor, TellsAStoppedServiceManagerFromOneThatIsGone) {
    const ExpectBinderComplaints expected;
    const Phone phone("leds");
    const std::string manager = pidOf("servicemanager");
    runCommand({"kill", "-STOP", manager});
    EXPECT_THAT(diagnose(phone.servicePid()).lines,
                Contains("bad  service manager: process " + manager +
                         " is stopped; next: kill -CONT " + manager));
    runCommand({"kill", "-KILL", manager});
    EXPECT_THAT(diagnose(phone.servicePid()).lines,
                testing::IsSupersetOf({"bad  service manager: it does not run; next: start it, "
                                       "before the service",
                                       "skip registration: process PID runs; needs a service "
                                       "manager"}));
}

TEST(Doctor, SaysThatBinderIsForRootOnly) {
    const Phone phone("leds");
    std::filesystem::permissions("/dev/binder", std::filesystem::perms(0600));
    const Diagnosis diagnosis = diagnose(phone.servicePid());
    std::filesystem::permissions("/dev/binder", std::filesystem::perms(0666));
    EXPECT_THAT(diagnosis.lines,
                Contains("bad  binder: user 1000 cannot open /dev/binder (0:0 0600); "
                         "next: chmod 0666 /dev/binder"));
}

TEST(Doctor, NamesANodeThatTheServicesUserCannotOpen) {
    const Phone phone("leds");
    const std::string node = "/sys/class/leds/vibrator/motor_type";
    ASSERT_EQ(runCommand({"phone", "exec", "--", "chown", "0:0", node}).status, 0);
    ASSERT_EQ(runCommand({"phone", "exec", "--", "chmod", "0644", node}).status, 0);
    const Diagnosis diagnosis = diagnose(phone.servicePid());
    EXPECT_EQ(diagnosis.status, 1);
    EXPECT_THAT(diagnosis.lines,
                Contains("bad  nodes: user 1000 cannot open vibrator/motor_type (0:0 "
                         "0644); next: chown it to 1000"));
}

TEST(Doctor, SaysThatTheMotorIsUnplugged) {
    const Phone phone("ff");
    ASSERT_EQ(runCommand({"phone", "unplug"}).status, 0);
    EXPECT_THAT(diagnose(phone.servicePid()).lines,
                Contains("bad  device class: control nodes, but no motor in the input list: it is "
                         "unplugged; next: plug it in"));
}

TEST(Doctor, SaysThatTheServiceStillHoldsAMotorThatHasComeBackSince) {
    const Phone phone("ff");
    ASSERT_EQ(runCommand({"vibctl", "std", "on", "50"}).status, 0);
    ASSERT_EQ(runCommand({"phone", "unplug"}).status, 0);
    ASSERT_EQ(runCommand({"phone", "plug"}).status, 0);
    EXPECT_EQ(runCommand({"vibctl", "std", "on", "50"}).status, 1);
    const Diagnosis diagnosis = diagnose(phone.servicePid());
    EXPECT_EQ(diagnosis.status, 1);
    EXPECT_THAT(diagnosis.lines,
                Contains(testing::MatchesRegex("bad  nodes: process PID still holds the unplugged "
                                               "input/event[0-9]+; next: restart the service")));
    EXPECT_EQ(diagnosis.lines.back(), "one problem: nodes");
    ASSERT_EQ(runCommand({"phone", "service", "restart"}).status, 0);
    EXPECT_EQ(runCommand({"vibctl", "std", "on", "50"}).status, 0);
    EXPECT_EQ(diagnose(phone.servicePid()).lines.back(), "all is well");
}

// These nodes are opened for each request, so nothing of an old driver stays behind.
TEST(Doctor, IsContentOnceANodeOfTheOtherClassesIsBack) {
    for (const auto& [profile, node] :
         {std::pair("leds", "/sys/class/leds/vibrator/duration"),
          std::pair("legacy", "/sys/class/timed_output/vibrator/enable")}) {
        const Phone phone(profile);
        ASSERT_EQ(runCommand({"vibctl", "std", "on", "50"}).status, 0);
        ASSERT_EQ(runCommand({"phone", "unplug", node}).status, 0);
        const std::vector<std::string> lines = diagnose(phone.servicePid()).lines;
        EXPECT_THAT(lines, Contains(HasSubstr(" has no device: the motor is unplugged; next: see "
                                              "the kernel log")));
        ASSERT_EQ(runCommand({"phone", "plug", node}).status, 0);
        EXPECT_EQ(runCommand({"vibctl", "std", "on", "50"}).status, 0);
        EXPECT_EQ(diagnose(phone.servicePid()).lines.back(), "all is well");
    }
}

TEST(Doctor, SaysThatTheMotorHasNoDevice) {
    const Phone phone("ff");
    phone.fault({{"node", "motor"}, {"op", "open"}, {"errno", "ENODEV"}});
    EXPECT_THAT(diagnose(phone.servicePid()).lines,
                Contains(testing::MatchesRegex("bad  nodes: input/event[0-9]+ has no device: the "
                                               "motor is unplugged; next: see the kernel log")));
}

// A fragment that names another instance, package or version of the format: the service manager
// refuses the service, the service ends, and the doctor says what is wrong with the file.
struct WrongFragment {
    const char* name;
    const char* from;
    const char* to;
    const char* complaint;
};

class Fragment : public testing::TestWithParam<WrongFragment> {};

TEST_P(Fragment, ThatIsWrongKeepsTheServiceFromRegistering) {
    const Phone phone("leds", {"--no-service"});
    std::ostringstream text;
    text << std::ifstream(kFragment).rdbuf();
    std::string fragment = text.str();
    const std::string from = GetParam().from;
    const size_t at = fragment.find(from);
    ASSERT_NE(at, std::string::npos) << fragment;
    std::ofstream(kFragment) << fragment.replace(at, from.size(), GetParam().to);

    const CommandResult service = phone.startService("1000");
    EXPECT_EQ(service.status, 128 + 6 /* SIGABRT */);
    EXPECT_THAT(service.err, HasSubstr("Check failed: STATUS_OK == AServiceManager_addService("));
    const Diagnosis diagnosis = diagnose(0);
    EXPECT_EQ(diagnosis.status, 1);
    EXPECT_THAT(diagnosis.lines,
                testing::IsSupersetOf({std::string(GetParam().complaint),
                                       std::string("bad  registration: the service does not run; "
                                                   "next: see declaration, then start it")}));
}

constexpr WrongFragment kWrongFragments[] = {
        {"Instance", "IVibrator/default", "IVibrator/vibrator",
         "bad  declaration: its .xml names IVibrator/vibrator; next: name IVibrator/default"},
        {"Package", "<name>android.hardware.vibrator<", "<name>vendor.quorvan.hardware.vibrator<",
         "bad  declaration: its .xml is for vendor.quorvan.hardware....; next: write "
         "android.hardware.vibrator"},
        {"Format", "format=\"aidl\"", "format=\"hidl\"",
         "bad  declaration: its .xml has the format \"hidl\"; next: write format=\"aidl\""},
        {"Type", "type=\"device\"", "type=\"framework\"",
         "bad  declaration: its .xml has the type \"framework\"; next: write type=\"device\""},
};

INSTANTIATE_TEST_SUITE_P(Doctor, Fragment, testing::ValuesIn(kWrongFragments),
                         [](const auto& wrong) { return wrong.param.name; });

TEST(Handset, InstallsTheProjectsOwnFragment) {
    const Phone phone("leds", {"--no-service"});
    std::ostringstream installed;
    std::ostringstream own;
    installed << std::ifstream(kFragment).rdbuf();
    own << std::ifstream(VINTF_FRAGMENT).rdbuf();
    EXPECT_EQ(installed.str(), own.str());
    EXPECT_THAT(own.str(), HasSubstr("<fqname>IVibrator/default</fqname>"));
}

}  // namespace
}  // namespace qvx::test
