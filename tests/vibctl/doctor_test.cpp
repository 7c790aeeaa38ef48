// SPDX-License-Identifier: Apache-2.0
//
// The doctor's findings on phones made of plain files, and with answers over binder made up.
#include "doctor/doctor.h"

#include <sys/wait.h>
#include <unistd.h>

#include <functional>
#include <string>
#include <vector>

#include <fmt/format.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "doctor/driver.h"
#include "doctor/file_view.h"
#include "doctor/processes.h"
#include "fake_root.h"

namespace vibctl {
namespace {

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;

constexpr uid_t kSystem = 1000;
constexpr const char* kServiceProgram = "/vendor/bin/hw/android.hardware.vibrator-service.quorvan";

/// A phone on which all is well over binder.
BinderFacts healthyFacts() {
    BinderFacts facts;
    facts.device = "/dev/binder";
    facts.declared = true;
    facts.registered = true;
    facts.registrant = 312;
    facts.version = 2;
    facts.extensionVersion = 4;
    return facts;
}

class DoctorTest : public ::testing::Test {
  protected:
    /// An LED-class phone with few features, its service running.
    void makeHealthy() {
        mRoot.putFragment();
        mRoot.putProcess(312, {kServiceProgram}, kSystem);
        mRoot.putNodes("/sys/class/leds/vibrator", {"activate", "duration", "state", "intensity"});
    }

    /// The lines about one check.
    std::vector<std::string> linesOf(const std::string& check) const {
        std::vector<std::string> lines;
        for (const Finding& finding : diagnose(mFacts, mRoot.path())) {
            if (finding.check == check) lines.push_back(humanLine(finding));
        }
        return lines;
    }

    bool isWell() const { return allIsWell(diagnose(mFacts, mRoot.path())); }

    fake::Root mRoot;
    BinderFacts mFacts = healthyFacts();
};

TEST_F(DoctorTest, FindsAllWellOnAHealthyPhoneAndAsksEveryQuestionInOrder) {
    makeHealthy();
    std::vector<std::string> checks;
    for (const Finding& finding : diagnose(mFacts, mRoot.path())) {
        EXPECT_EQ(finding.answer, Answer::kGood) << humanLine(finding);
        EXPECT_EQ(finding.next, "");
        checks.push_back(finding.check);
    }
    EXPECT_THAT(checks, ElementsAre("binder", "service manager", "declaration", "registration",
                                    "user", "device class", "nodes", "input device", "extension"));
    EXPECT_TRUE(isWell());
}

TEST_F(DoctorTest, WithoutABinderDeviceSkipsWhatNeedsIt) {
    makeHealthy();
    mFacts = {};
    mFacts.deviceProblem = "cannot open /dev/binder: No such file or directory";
    EXPECT_THAT(linesOf("binder"),
                ElementsAre("bad      binder: cannot open /dev/binder: No such file or directory; "
                            "next: load the kernel's binder driver (modprobe binder_linux "
                            "devices=binder) and let everybody open the device (chmod 0666)"));
    EXPECT_THAT(linesOf("service manager"), ElementsAre("skipped  service manager: needs binder"));
    EXPECT_THAT(linesOf("registration"),
                ElementsAre("skipped  registration: needs a service manager; process 312 runs"));
    EXPECT_THAT(linesOf("user"), ElementsAre("ok       user: process 312 runs as user 1000"));
    EXPECT_THAT(linesOf("extension"),
                ElementsAre("skipped  extension: needs the registered service"));
    EXPECT_FALSE(isWell());
}

TEST_F(DoctorTest, WithoutAServiceManagerJudgesTheDeclarationByTheFiles) {
    makeHealthy();
    mFacts = {};
    mFacts.device = "/dev/binder";
    mFacts.managerProblem = "no service manager has answered for 2 seconds";
    EXPECT_THAT(linesOf("service manager"),
                ElementsAre("bad      service manager: no service manager has answered for 2 "
                            "seconds; next: start servicemanager, as the first user of binder"));
    EXPECT_THAT(linesOf("declaration"),
                ElementsAre("ok       declaration: " +
                            mRoot.at("/vendor/etc/vintf/manifest/"
                                     "android.hardware.vibrator-service.quorvan.xml") +
                            " declares android.hardware.vibrator.IVibrator/default"));
}

TEST_F(DoctorTest, ServiceThatDoesNotRunIsSaidToBeMissing) {
    mRoot.putFragment();
    mFacts.registered = false;
    mFacts.registrant = 0;
    EXPECT_THAT(
            linesOf("registration"),
            ElementsAre(
                    "bad      registration: android.hardware.vibrator.IVibrator/default is not "
                    "registered and no android.hardware.vibrator-service.quorvan runs; next: "
                    "start the service; where it ends at once, its log names the failed check"));
    EXPECT_THAT(linesOf("user"),
                ElementsAre("skipped  user: the service does not run; nodes are judged for user "
                            "1000"));
}

TEST_F(DoctorTest, ServiceThatRunsUnregisteredIsFoundByItsExecutable) {
    makeHealthy();
    mFacts.registered = false;
    mFacts.registrant = 0;
    EXPECT_THAT(linesOf("registration"),
                ElementsAre("bad      registration: process 312 runs, but "
                            "android.hardware.vibrator.IVibrator/default is not registered; next: "
                            "look into the logs of the service and the service manager"));
    EXPECT_THAT(linesOf("user"), ElementsAre("ok       user: process 312 runs as user 1000"));
}

TEST_F(DoctorTest, ServiceThatHangsIsBad) {
    makeHealthy();
    mFacts.serviceProblem = "it has not answered for 2 seconds";
    EXPECT_THAT(linesOf("registration"),
                ElementsAre("bad      registration: process 312 has registered "
                            "android.hardware.vibrator.IVibrator/default, but it has not answered "
                            "for 2 seconds; next: look into the service's log for the call that it "
                            "hangs in, then restart it"));
}

TEST_F(DoctorTest, OlderInterfaceIsBad) {
    makeHealthy();
    mFacts.version = 1;
    EXPECT_THAT(linesOf("registration"),
                ElementsAre("bad      registration: process 312 has registered "
                            "android.hardware.vibrator.IVibrator/default version 1 where 2 is "
                            "expected; next: stop the other vibrator service"));
}

TEST_F(DoctorTest, RootAsTheServicesUserIsBad) {
    makeHealthy();
    mFacts.registrant = 400;
    mRoot.putProcess(400, {kServiceProgram}, 0);
    EXPECT_THAT(linesOf("user"),
                ElementsAre("bad      user: process 400 runs as user 0; next: run it as user 1000 "
                            "(system): root hides which nodes others cannot open"));
}

TEST_F(DoctorTest, ExtensionMustBeAttachedAndOfVersion4) {
    makeHealthy();
    EXPECT_THAT(linesOf("extension"),
                ElementsAre("ok       extension: vendor.quorvan.hardware.vibrator.IZelVibrator "
                            "version 4 is attached"));
    mFacts.extensionVersion = 3;
    EXPECT_THAT(linesOf("extension"),
                ElementsAre("bad      extension: vendor.quorvan.hardware.vibrator.IZelVibrator has "
                            "version 3 where 4 is expected; next: update the service: it attaches "
                            "version 4 before it registers"));
    mFacts.extensionProblem = "android.hardware.vibrator.IVibrator/default has no extension";
    EXPECT_THAT(linesOf("extension"),
                ElementsAre("bad      extension: android.hardware.vibrator.IVibrator/default has "
                            "no extension; next: update the service: it attaches version 4 before "
                            "it registers"));
}

using DeclarationTest = DoctorTest;

TEST_F(DeclarationTest, MissingEverywhereSaysWhereToPutIt) {
    mFacts.declared = false;
    EXPECT_THAT(linesOf("declaration"),
                ElementsAre("bad      declaration: no manifest declares "
                            "android.hardware.vibrator.IVibrator/default: there is none below " +
                            mRoot.at("/vendor/etc/vintf/manifest") +
                            "; next: install android.hardware.vibrator-service.quorvan.xml in " +
                            mRoot.at("/vendor/etc/vintf/manifest")));
}

TEST_F(DeclarationTest, OfAnotherInstanceNamesThatInstance) {
    mFacts.declared = false;
    mRoot.put("/vendor/etc/vintf/manifest/v.xml",
              "<manifest version=\"1.0\" type=\"device\"><hal format=\"aidl\">"
              "<name>android.hardware.vibrator</name><fqname>IVibrator/defualt</fqname></hal>"
              "</manifest>");
    EXPECT_THAT(linesOf("declaration"),
                ElementsAre(HasSubstr(": no manifest declares "
                                      "android.hardware.vibrator.IVibrator/default, only the "
                                      "instance defualt of its interface; next: install ")));
}

TEST_F(DeclarationTest, InAFaultyFileNamesTheFault) {
    mFacts.declared = false;
    mRoot.put("/vendor/etc/vintf/manifest/v.xml", "<manifest version=\"1.0\" type=\"device\">");
    EXPECT_THAT(
            linesOf("declaration"),
            ElementsAre(HasSubstr("manifest " + mRoot.at("/vendor/etc/vintf/manifest/") +
                                  "v.xml is passed over: line 1: XML_ERROR_MISMATCHED_ELEMENT")));
}

TEST_F(DeclarationTest, OfOtherServicesNamesTheFilesThatWereRead) {
    mFacts.declared = false;
    mRoot.put("/odm/etc/vintf/manifest.xml", "<manifest version=\"1.0\" type=\"device\"/>");
    EXPECT_THAT(linesOf("declaration"),
                ElementsAre(HasSubstr(": there is " + mRoot.at("/odm/etc/vintf/manifest.xml") +
                                      "; next: ")));
}

TEST_F(DeclarationTest, ThatTheServiceManagerDoesNotSeeIsBad) {
    mRoot.putFragment();
    mFacts.declared = false;
    EXPECT_THAT(linesOf("declaration"),
                ElementsAre(HasSubstr("declares android.hardware.vibrator.IVibrator/default, but "
                                      "the service manager does not see it; next: run the service "
                                      "manager where that file is, or with --root")));
}

TEST_F(DeclarationTest, IsLookedForBelowTheRunningServiceManagersRoot) {
    mRoot.put("/image/vendor/etc/vintf/manifest.xml",
              "<manifest version=\"1.0\" type=\"device\"><hal format=\"aidl\">"
              "<name>android.hardware.vibrator</name><fqname>IVibrator/default</fqname></hal>"
              "</manifest>");
    const std::string line =
            "ok       declaration: " + mRoot.at("/image/vendor/etc/vintf/manifest.xml") +
            " declares android.hardware.vibrator.IVibrator/default";
    mRoot.putProcess(7, {"/usr/sbin/servicemanager", "--ready-fd", "3", "--root", "/image"}, 0);
    EXPECT_THAT(linesOf("declaration"), ElementsAre(line));
    std::filesystem::remove_all(mRoot.at("/proc/7"));
    mRoot.putProcess(8, {"/usr/sbin/servicemanager", "--root=/image"}, 0);
    EXPECT_THAT(linesOf("declaration"), ElementsAre(line));
}

using DeviceClassTest = DoctorTest;

TEST_F(DeviceClassTest, LegacyWinsOverLeds) {
    makeHealthy();
    mRoot.putNodes("/sys/class/timed_output/vibrator", {"enable"});
    EXPECT_THAT(linesOf("device class"),
                ElementsAre("ok       device class: legacy class, "
                            "/sys/class/timed_output/vibrator/enable opens; LED class and force "
                            "feedback are not looked for after it"));
    EXPECT_THAT(linesOf("nodes"),
                ElementsAre(HasSubstr("user 1000 can open all 1 that the driver has; it lacks "
                                      "vibrator/use_kyp_index, vibrator/intensity, ")));
}

TEST_F(DeviceClassTest, LedsSayWhyNotLegacy) {
    makeHealthy();
    EXPECT_THAT(linesOf("device class"),
                ElementsAre("ok       device class: LED class, activate, duration and state in "
                            "/sys/class/leds/vibrator/ open; not legacy class, "
                            "/sys/class/timed_output/vibrator/enable: No such file or directory; "
                            "force feedback is not looked for after it"));
    EXPECT_THAT(linesOf("input device"),
                ElementsAre("ok       input device: not needed by this device class"));
}

TEST_F(DeviceClassTest, LedsWithoutStateAreNotChosen) {
    mRoot.putNodes("/sys/class/leds/vibrator", {"activate", "duration"});
    mRoot.put("/proc/bus/input/devices", "N: Name=\"qvx_vibrator_inputff\"\nH: Handlers=event3 \n");
    EXPECT_THAT(linesOf("device class"),
                ElementsAre("ok       device class: force feedback, /proc/bus/input/devices lists "
                            "\"qvx_vibrator_inputff\"; not legacy class, "
                            "/sys/class/timed_output/vibrator/enable: No such file or directory; "
                            "not LED class, /sys/class/leds/vibrator/state: No such file or "
                            "directory"));
    EXPECT_THAT(linesOf("input device"), ElementsAre("ok       input device: "
                                                     "\"qvx_vibrator_inputff\" is "
                                                     "/dev/input/event3"));
}

TEST_F(DeviceClassTest, NoneNamesEveryObstacle) {
    EXPECT_THAT(linesOf("device class"),
                ElementsAre("bad      device class: none; not legacy class, "
                            "/sys/class/timed_output/vibrator/enable: No such file or directory; "
                            "not LED class, /sys/class/leds/vibrator/activate: No such file or "
                            "directory; not force feedback, see input device; next: load the "
                            "vibrator's driver; docs/bring-up.md tells which nodes decide"));
    EXPECT_THAT(linesOf("nodes"),
                ElementsAre("skipped  nodes: without a device class none is needed"));
    EXPECT_THAT(linesOf("input device"),
                ElementsAre("bad      input device: /proc/bus/input/devices: No such file or "
                            "directory; next: the kernel needs CONFIG_INPUT; mount /proc"));
}

TEST_F(DeviceClassTest, MotorOfAnotherNameIsListedAmongThoseFound) {
    mRoot.put("/proc/bus/input/devices",
              "N: Name=\"keys\"\nH: Handlers=kbd event0 \n\n"
              "N: Name=\"qvx_vibrator_inputf\"\nH: Handlers=event1 \n\n");
    EXPECT_THAT(linesOf("input device"),
                ElementsAre("bad      input device: no \"qvx_vibrator_inputff\" in "
                            "/proc/bus/input/devices, which lists \"keys\", "
                            "\"qvx_vibrator_inputf\"; next: give the driver's input device that "
                            "name"));
}

TEST_F(DeviceClassTest, MotorWithASecondHandlerIsBad) {
    mRoot.put("/proc/bus/input/devices",
              "N: Name=\"qvx_vibrator_inputff\"\nH: Handlers=kbd event1 \n");
    EXPECT_THAT(linesOf("input device"),
                ElementsAre(HasSubstr("\"qvx_vibrator_inputff\" has the handlers \"kbd event1\", "
                                      "where one event node is expected; next: ")));
    // The whole text is what the service opens.
    EXPECT_THAT(linesOf("nodes"), ElementsAre(HasSubstr("cannot open /dev/input/kbd event1 ")));
}

/// A user that the machine running the test does not have.
constexpr uid_t kStranger = 4242;

using NodesTest = DoctorTest;

std::string owner() {
    return fmt::format("(owner {}:{}, mode 0600)", geteuid(), getegid());
}

TEST_F(NodesTest, ThatTheServicesUserCannotOpenIsBadWithALineOfItsOwn) {
    makeHealthy();
    mRoot.putProcess(400, {kServiceProgram}, kStranger);
    mFacts.registrant = 400;
    mRoot.putNodes("/sys/class/leds/vibrator", {"haptic_engine", "num_waves"});
    mRoot.chmod("/sys/class/leds/vibrator/intensity", 0600);
    mRoot.chmod("/sys/class/leds/vibrator/haptic_engine", 0444);
    mRoot.chmod("/sys/class/leds/vibrator/num_waves", 0444);
    EXPECT_THAT(
            linesOf("nodes"),
            ElementsAre("bad      nodes: user 4242 cannot open /sys/class/leds/vibrator/intensity "
                        "read-write: Permission denied " +
                                owner() +
                                "; next: let user 4242 open /sys/class/leds/vibrator/intensity "
                                "(ueventd.rc or a udev rule), then restart the service",
                        HasSubstr("cannot open /sys/class/leds/vibrator/haptic_engine read-write: "
                                  "Permission denied")));
}

TEST_F(NodesTest, ThatDecideAboutTheClassAreNamedWhenTheyHideIt) {
    makeHealthy();
    mRoot.putProcess(400, {kServiceProgram}, kStranger);
    mFacts.registrant = 400;
    mRoot.chmod("/sys/class/leds/vibrator/duration", 0600);
    EXPECT_THAT(linesOf("device class"),
                ElementsAre(AllOf(HasSubstr("bad      device class: none; "),
                                  HasSubstr("not LED class, /sys/class/leds/vibrator/duration: "
                                            "Permission denied"),
                                  HasSubstr("; next: let user 4242 open "
                                            "/sys/class/leds/vibrator/duration (ueventd.rc or a "
                                            "udev rule), then restart the service"))));
}

TEST_F(NodesTest, MotorWithoutItsEventNodeIsBad) {
    mRoot.put("/proc/bus/input/devices", "N: Name=\"qvx_vibrator_inputff\"\nH: Handlers=event3 \n");
    EXPECT_THAT(linesOf("nodes"),
                ElementsAre("bad      nodes: user 1000 cannot open /dev/input/event3 read-write: "
                            "No such file or directory; next: look into the kernel log for what "
                            "the driver says"));
}

/// Runs `body` as a user that is neither root nor any that owns a file here; what it returns.
bool asSomebodyElse(const std::function<bool()>& body) {
    const pid_t child = fork();
    if (child == 0) {
        if (geteuid() == 0 && setresuid(4243, 4243, 4243) != 0) _exit(2);
        _exit(body() ? 0 : 1);
    }
    int status = 0;
    waitpid(child, &status, 0);
    return WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

struct ModeCase {
    const char* name;
    mode_t mode;
    User user;
    int error;  ///< of opening read-write
};

class ModeBits : public ::testing::TestWithParam<ModeCase> {};

TEST_P(ModeBits, DecideWhereTheUserCannotBeTakenOn) {
    const fake::Root root;
    root.put("/node");
    root.chmod("/node", GetParam().mode);
    EXPECT_TRUE(asSomebodyElse([&root] {
        const FileView view(root.path());
        User user = GetParam().user;
        if (user.groups == std::vector<gid_t>{0}) user.groups = {getegid()};
        const std::vector<Access> accesses = {{"/node", 2 /* O_RDWR */}};
        return !FileView::canBecome(user) && view.open(user, accesses)[0] == GetParam().error;
    }));
}

const ModeCase kModeCases[] = {
        {"Others", 0666, {kStranger, kStranger, {}}, 0},
        {"OthersMayOnlyRead", 0664, {kStranger, kStranger, {}}, 13},
        {"Group", 0660, {kStranger, kStranger, {0}}, 0},
        {"GroupCountsBeforeOthers", 0606, {kStranger, kStranger, {0}}, 13},
};

INSTANTIATE_TEST_SUITE_P(Doctor, ModeBits, ::testing::ValuesIn(kModeCases),
                         [](const auto& one) { return one.param.name; });

TEST(FileViewTest, FoldersMustLetTheUserThrough) {
    const fake::Root root;
    root.put("/folder/node");
    root.chmod("/folder", 0700);
    const std::vector<Access> accesses = {{"/folder/node", 0 /* O_RDONLY */}};
    const User stranger = {kStranger, kStranger, {}};
    EXPECT_THAT(FileView(root.path()).open(stranger, accesses), ElementsAre(13 /* EACCES */));
    // Kept open, because somebody else may not look the folder up again.
    const FileView view(root.path());
    EXPECT_TRUE(
            asSomebodyElse([&] { return view.open(stranger, accesses) == std::vector<int>{13}; }));
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

TEST(FindingLines, AreOneJsonObjectEachForPrograms) {
    EXPECT_EQ(jsonLine(good("nodes", "all \"open\"")),
              R"({"check":"nodes","ok":true,"text":"all \"open\"","next":null})");
    EXPECT_EQ(jsonLine(bad("user", "root", "change it")),
              R"({"check":"user","ok":false,"text":"root","next":"change it"})");
    EXPECT_EQ(jsonLine(skipped("extension", "needs it")),
              R"({"check":"extension","ok":null,"text":"needs it","next":null})");
}

TEST(FindingLines, AreAllWellOnlyWithoutABadOne) {
    EXPECT_TRUE(allIsWell(std::vector<Finding>{good("a", "x"), skipped("b", "y")}));
    EXPECT_FALSE(allIsWell(std::vector<Finding>{good("a", "x"), bad("b", "y", "z")}));
}

}  // namespace
}  // namespace vibctl
