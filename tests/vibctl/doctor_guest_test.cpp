// SPDX-License-Identifier: Apache-2.0
//
// The doctor on whole phones: the built-in ones, and phones on which something is broken.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sstream>

#include "kernel_log.h"
#include "phone_control.h"

namespace qvx::test {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

constexpr const char* kFragment =
        "/vendor/etc/vintf/manifest/android.hardware.vibrator-service.quorvan.xml";
constexpr const char* kBinder = "ok       binder: /dev/binder opens";
constexpr const char* kManager = "ok       service manager: answers";
constexpr const char* kDeclared =
        "ok       declaration: "
        "/vendor/etc/vintf/manifest/android.hardware.vibrator-service.quorvan.xml declares "
        "android.hardware.vibrator.IVibrator/default";
constexpr const char* kRegistered =
        "ok       registration: process PID has registered "
        "android.hardware.vibrator.IVibrator/default version 2";
constexpr const char* kUser = "ok       user: process PID runs as user 1000";
constexpr const char* kExtension =
        "ok       extension: vendor.quorvan.hardware.vibrator.IZelVibrator version 4 is attached";
constexpr const char* kNoInputDevice = "ok       input device: not needed by this device class";

struct Diagnosis {
    int status = -1;
    std::vector<std::string> lines;  ///< with PID for the service's process id
};

/// Runs the doctor where the command is, by default where the handset runs its commands.
Diagnosis diagnose(const Phone& phone, const std::vector<std::string>& where = {}) {
    std::vector<std::string> command = where;
    command.insert(command.end(), {"vibctl", "doctor"});
    const CommandResult result = runCommand(command);
    EXPECT_EQ(result.err, "");
    Diagnosis diagnosis{result.status, {}};
    const std::string process = "process " + std::to_string(phone.servicePid());
    std::istringstream text(result.out);
    for (std::string line; std::getline(text, line);) {
        const size_t at = line.find(process);
        if (at != std::string::npos) line.replace(at, process.size(), "process PID");
        diagnosis.lines.push_back(line);
    }
    return diagnosis;
}

std::string lineAbout(const Diagnosis& diagnosis, const std::string& check) {
    for (const std::string& line : diagnosis.lines) {
        if (line.find(" " + check + ": ") == 8) return line;
    }
    return "no line about " + check;
}

TEST(Doctor, FindsALegacyPhoneWell) {
    const Phone phone("legacy");
    const Diagnosis diagnosis = diagnose(phone);
    EXPECT_EQ(diagnosis.status, 0);
    EXPECT_THAT(
            diagnosis.lines,
            ElementsAre(kBinder, kManager, kDeclared, kRegistered, kUser,
                        "ok       device class: legacy class, "
                        "/sys/class/timed_output/vibrator/enable opens; LED class and force "
                        "feedback are not looked for after it",
                        StartsWith("ok       nodes: user 1000 can open all 9 that the driver has; "
                                   "it lacks vibrator/use_kyp_index, vibrator/cp_trigger_index, "),
                        kNoInputDevice, kExtension));
}

TEST(Doctor, FindsALedsPhoneWell) {
    const Phone phone("leds");
    const Diagnosis diagnosis = diagnose(phone);
    EXPECT_EQ(diagnosis.status, 0);
    EXPECT_THAT(
            diagnosis.lines,
            ElementsAre(kBinder, kManager, kDeclared, kRegistered, kUser,
                        "ok       device class: LED class, activate, duration and state in "
                        "/sys/class/leds/vibrator/ open; not legacy class, "
                        "/sys/class/timed_output/vibrator/enable: No such file or directory; force "
                        "feedback is not looked for after it",
                        "ok       nodes: user 1000 can open all 25 that the driver has",
                        kNoInputDevice, kExtension));
}

TEST(Doctor, FindsAForceFeedbackPhoneWell) {
    const Phone phone("ff");
    const Diagnosis diagnosis = diagnose(phone);
    EXPECT_EQ(diagnosis.status, 0);
    EXPECT_THAT(
            diagnosis.lines,
            ElementsAre(kBinder, kManager, kDeclared, kRegistered, kUser,
                        "ok       device class: force feedback, /proc/bus/input/devices lists "
                        "\"qvx_vibrator_inputff\"; not legacy class, "
                        "/sys/class/timed_output/vibrator/enable: No such file or directory; not "
                        "LED class, /sys/class/leds/vibrator/activate: No such file or directory",
                        "ok       nodes: user 1000 can open all 8 that the driver has",
                        testing::MatchesRegex("ok       input device: \"qvx_vibrator_inputff\" is "
                                              "/dev/input/event[0-9]+"),
                        kExtension));
}

TEST(Doctor, FindsWhatAPhoneWithoutAMotorLacks) {
    const Phone phone("none");
    const Diagnosis diagnosis = diagnose(phone);
    EXPECT_EQ(diagnosis.status, 1);
    EXPECT_THAT(
            diagnosis.lines,
            ElementsAre(kBinder, kManager, kDeclared, kRegistered, kUser,
                        "bad      device class: none; not legacy class, "
                        "/sys/class/timed_output/vibrator/enable: No such file or directory; not "
                        "LED class, /sys/class/leds/vibrator/activate: No such file or directory; "
                        "not force feedback, see input device; next: load the vibrator's driver; "
                        "docs/bring-up.md tells which nodes decide",
                        "skipped  nodes: without a device class none is needed",
                        "bad      input device: no \"qvx_vibrator_inputff\" in "
                        "/proc/bus/input/devices, which lists \"AT Translated Set 2 keyboard\"; "
                        "next: give the driver's input device that name",
                        kExtension));
}

TEST(Doctor, LeavesTheDriversNodesAsTheyAre) {
    const Phone phone("ff");
    phone.reset();
    diagnose(phone);
    for (const nlohmann::json& line : phone.journal()) {
        EXPECT_THAT(line.value("op", ""), testing::AnyOf("open", "close")) << line.dump();
    }
}

TEST(Doctor, PrintsAnObjectALineForPrograms) {
    const Phone phone("leds");
    const CommandResult result = runCommand({"vibctl", "--json", "doctor"});
    EXPECT_EQ(result.status, 0);
    EXPECT_THAT(result.out,
                StartsWith("{\"check\":\"binder\",\"ok\":true,\"text\":\"/dev/binder opens\","
                           "\"next\":null}\n{\"check\":\"service manager\",\"ok\":true,"));
    EXPECT_EQ(std::count(result.out.begin(), result.out.end(), '\n'), 9);
}

TEST(Doctor, WithTheServiceNotUpLooksAtTheNodesOfItsOwnView) {
    const Phone phone("leds", {"--no-service"});
    const Diagnosis diagnosis = diagnose(phone, {"phone", "exec", "--"});
    EXPECT_EQ(diagnosis.status, 1);
    EXPECT_EQ(lineAbout(diagnosis, "registration"),
              "bad      registration: android.hardware.vibrator.IVibrator/default is not "
              "registered and no android.hardware.vibrator-service.quorvan runs; next: start the "
              "service; where it ends at once, its log names the failed check");
    EXPECT_EQ(lineAbout(diagnosis, "user"),
              "skipped  user: the service does not run; nodes are judged for user 1000");
    EXPECT_EQ(lineAbout(diagnosis, "nodes"),
              "ok       nodes: user 1000 can open all 25 that the driver has");
    EXPECT_EQ(lineAbout(diagnosis, "extension"),
              "skipped  extension: needs the registered service");
}

TEST(Doctor, DoesNotWaitForAServiceThatHangs) {
    // Its late answer finds nobody.
    const ExpectBinderComplaints expected;
    const Phone phone("leds");
    const std::string pid = std::to_string(phone.servicePid());
    ASSERT_EQ(runCommand({"kill", "-STOP", pid}).status, 0);
    const Diagnosis diagnosis = diagnose(phone);
    runCommand({"kill", "-CONT", pid});
    EXPECT_EQ(runCommand({"vibctl", "std", "off"}).status, 0);
    EXPECT_EQ(diagnosis.status, 1);
    EXPECT_EQ(lineAbout(diagnosis, "registration"),
              "bad      registration: process PID has registered "
              "android.hardware.vibrator.IVibrator/default, but it has not answered for 2 seconds; "
              "next: look into the service's log for the call that it hangs in, then restart it");
    EXPECT_EQ(lineAbout(diagnosis, "extension"),
              "skipped  extension: needs the registered service");
}

TEST(Doctor, WithoutAFragmentSaysWhichFileIsMissing) {
    const Phone phone("leds", {"--no-service"});
    std::filesystem::remove(kFragment);
    const Diagnosis diagnosis = diagnose(phone);
    EXPECT_EQ(diagnosis.status, 1);
    EXPECT_EQ(lineAbout(diagnosis, "declaration"),
              "bad      declaration: no manifest declares "
              "android.hardware.vibrator.IVibrator/default: there is none below "
              "/vendor/etc/vintf/manifest; next: install "
              "android.hardware.vibrator-service.quorvan.xml in /vendor/etc/vintf/manifest");
}

TEST(Doctor, NamesANodeThatTheServicesUserCannotOpen) {
    const Phone phone("leds");
    const std::string node = "/sys/class/leds/vibrator/motor_type";
    ASSERT_EQ(runCommand({"phone", "exec", "--", "chown", "0:0", node}).status, 0);
    ASSERT_EQ(runCommand({"phone", "exec", "--", "chmod", "0644", node}).status, 0);
    const Diagnosis diagnosis = diagnose(phone);
    EXPECT_EQ(diagnosis.status, 1);
    EXPECT_EQ(lineAbout(diagnosis, "nodes"),
              "bad      nodes: user 1000 cannot open /sys/class/leds/vibrator/motor_type "
              "read-write: Permission denied (owner 0:0, mode 0644); next: let user 1000 open "
              "/sys/class/leds/vibrator/motor_type (ueventd.rc or a udev rule), then restart the "
              "service");
}

TEST(Doctor, NamesTheNodeThatHidesTheDeviceClass) {
    const Phone phone("leds", {"--no-service"});
    const std::string node = "/sys/class/leds/vibrator/state";
    ASSERT_EQ(runCommand({"phone", "exec", "--", "chown", "0:0", node}).status, 0);
    ASSERT_EQ(runCommand({"phone", "exec", "--", "chmod", "0600", node}).status, 0);
    EXPECT_EQ(lineAbout(diagnose(phone, {"phone", "exec", "--"}), "device class"),
              "bad      device class: none; not legacy class, "
              "/sys/class/timed_output/vibrator/enable: No such file or directory; not LED class, "
              "/sys/class/leds/vibrator/state: Permission denied; not force feedback, see input "
              "device; next: let user 1000 open /sys/class/leds/vibrator/state (ueventd.rc or a "
              "udev rule), then restart the service");
}

TEST(Doctor, ListsTheNamesWhenTheMotorHasAnother) {
    nlohmann::json profile = builtInProfile("ff");
    profile["motor"]["name"] = "qvx_vibrator";
    const Phone phone(profile);
    const Diagnosis diagnosis = diagnose(phone);
    EXPECT_EQ(diagnosis.status, 1);
    EXPECT_EQ(lineAbout(diagnosis, "input device"),
              "bad      input device: no \"qvx_vibrator_inputff\" in /proc/bus/input/devices, "
              "which lists \"AT Translated Set 2 keyboard\", \"qvx_vibrator\"; next: give the "
              "driver's input device that name");
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
    const Diagnosis diagnosis = diagnose(phone);
    EXPECT_EQ(diagnosis.status, 1);
    EXPECT_THAT(lineAbout(diagnosis, "declaration"), StartsWith(GetParam().complaint));
    EXPECT_THAT(lineAbout(diagnosis, "registration"), StartsWith("bad "));
}

constexpr WrongFragment kWrongFragments[] = {
        {"Instance", "IVibrator/default", "IVibrator/vibrator",
         "bad      declaration: no manifest declares android.hardware.vibrator.IVibrator/default, "
         "only the instance vibrator of its interface; next: install "},
        {"Package", "<name>android.hardware.vibrator<", "<name>vendor.quorvan.hardware.vibrator<",
         "bad      declaration: no manifest declares android.hardware.vibrator.IVibrator/default: "
         "there is /vendor/etc/vintf/manifest/android.hardware.vibrator-service.quorvan.xml; next: "
         "install "},
        {"Format", "format=\"aidl\"", "format=\"hidl\"",
         "bad      declaration: no manifest declares android.hardware.vibrator.IVibrator/default: "
         "there is /vendor/etc/vintf/manifest/android.hardware.vibrator-service.quorvan.xml; next: "
         "install "},
        {"Type", "type=\"device\"", "type=\"framework\"",
         "bad      declaration: no manifest declares android.hardware.vibrator.IVibrator/default: "
         "manifest /vendor/etc/vintf/manifest/android.hardware.vibrator-service.quorvan.xml is "
         "passed over: line 4: type \"framework\" where \"device\" is expected; next: install "},
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
