// SPDX-License-Identifier: Apache-2.0
//
// The doctor on broken phones, one row each: what was done to a healthy one, and the line that has
// to name the cause and the next step.
#include <gtest/gtest.h>

#include "vibctl/doctor/doctor.h"
#include "vibctl/tests/doctor_root.h"

namespace vibctl {
namespace {

// A user that no file here belongs to, whatever user runs the test.
constexpr uid_t kStranger = 4242;
constexpr const char* kProgram = "/vendor/bin/hw/android.hardware.vibrator-service.quorvan";
constexpr const char* kFragment =
        "/vendor/etc/vintf/manifest/android.hardware.vibrator-service.quorvan.xml";
constexpr const char* kFunctions = "/sys/class/vib_info_class/vib_support_info/functions";
constexpr const char* kList = "/proc/bus/input/devices";
const std::string kLeds = "/sys/class/leds/vibrator/";
const std::string kLegacy = "/sys/class/timed_output/vibrator/";

struct Phone {
    fake::Root root;
    BinderFacts facts;

    // The service ends; nobody else is registered.
    void endService() {
        root.remove("/proc/312");
        facts.registered = false;
        facts.registrant = 0;
    }

    // A force-feedback phone instead of the LED-class one.
    void becomeForceFeedback() const {
        root.remove(kLeds);
        root.put(kList,
                 "N: Name=\"keys\"\nH: Handlers=kbd event0 \n\nN: "
                 "Name=\"qvx_vibrator_inputff\"\nH: Handlers=event3 \n\n");
        root.put("/dev/input/event3", "");
        root.putNodes("/sys/class/qvx_vib_inputff/control",
                      {"use_kyp_index", "event_cmd", "f0_stored"});
        root.put("/efs/FactoryApp/vibrator_calibration", "137\n");
    }

    // A file that the service's user may not open; who owns it depends on who runs the test.
    void deny(const std::string& path) const { root.chmod(path, 0600); }
};

void makeHealthy(Phone& phone) {
    phone.facts.device = "/dev/binder";
    phone.facts.declared = true;
    phone.facts.registered = true;
    phone.facts.registrant = 312;
    phone.facts.version = 2;
    phone.facts.extensionVersion = 4;
    const fake::Root& root = phone.root;
    root.put("/dev/binder", "");
    root.putFragment();
    root.putProcess(7, {"/system/bin/servicemanager"}, 0);
    root.putState(7, 'S', 100);
    root.putProcess(312, {kProgram}, kStranger);
    root.putState(312, 'S', 200);
    root.putNodes(kLeds, {"activate", "duration", "state", "intensity", "haptic_engine"});
    root.put(kLeds + "motor_type", "LINEAR_1040\n");
    root.put(kLeds + "intensities", "0,5000,10000\n");
    root.put(kLeds + "haptic_intensities", "0,5000,10000\n");
    root.put(kFunctions, "INTENSITY HAPTIC_ENGINE PRIMITIVE_EFFECT_COMPOSE\n");
}

struct Broken {
    const char* name;
    void (*damage)(Phone& phone);
    // The line, in which an owner that depends on who runs the test is written "OWNER".
    std::string line;
};

const Broken kPhones[] = {
        // binder and the service manager
        {"NoBinder",
         [](Phone& phone) {
             phone.root.remove("/dev/binder");
             phone.facts.deviceProblem = "cannot open /dev/binder: No such file or directory";
         },
         "bad  binder: there is no /dev/binder; next: modprobe binder_linux devices=binder"},
        {"BinderForRootOnly", [](Phone& phone) { phone.deny("/dev/binder"); },
         "bad  binder: user 4242 cannot open /dev/binder (OWNER 0600); next: chmod 0666 "
         "/dev/binder"},
        {"NoServiceManager",
         [](Phone& phone) {
             phone.root.remove("/proc/7");
             phone.facts.managerProblem = "no service manager has answered for 2 s";
         },
         "bad  service manager: it does not run; next: start it, before the service"},
        {"StoppedServiceManager",
         [](Phone& phone) {
             phone.root.putState(7, 'T', 100);
             phone.facts.managerProblem = "no service manager has answered for 2 s";
         },
         "bad  service manager: process 7 is stopped; next: kill -CONT 7"},
        {"HungServiceManager",
         [](Phone& phone) {
             phone.facts.managerProblem = "no service manager has answered for 2 s";
         },
         "bad  service manager: process 7 runs and does not answer; next: restart it, then the "
         "service"},

        // the declaration
        {"NoFragment",
         [](Phone& phone) {
             phone.root.remove(kFragment);
             phone.root.putProcess(8, {"/sbin/servicemanager", "--root", "/image"}, 0);
             phone.root.remove("/proc/7");
             phone.facts.declared = false;
         },
         "bad  declaration: no manifest names IVibrator/default; next: install its .xml "
         "in ROOT/image/vendor/etc/vintf/manifest"},
        {"FragmentOfAnotherInstance",
         [](Phone& phone) {
             phone.root.edit(kFragment, "IVibrator/default", "IVibrator/defualt");
             phone.facts.declared = false;
         },
         "bad  declaration: its .xml names IVibrator/defualt; next: name IVibrator/default"},
        {"FragmentOfAnotherPackage",
         [](Phone& phone) {
             phone.root.edit(kFragment, "<name>android", "<name>vendor");
             phone.facts.declared = false;
         },
         "bad  declaration: its .xml is for vendor.hardware.vibrator; next: write "
         "android.hardware.vibrator"},
        {"FragmentOfAnotherFormat",
         [](Phone& phone) {
             phone.root.edit(kFragment, "aidl", "hidl");
             phone.facts.declared = false;
         },
         "bad  declaration: its .xml has the format \"hidl\"; next: write "
         "format=\"aidl\""},
        {"FragmentOfAnotherType",
         [](Phone& phone) {
             phone.root.edit(kFragment, "\"device\"", "\"framework\"");
             phone.facts.declared = false;
         },
         "bad  declaration: its .xml has the type \"framework\"; next: write "
         "type=\"device\""},
        {"FragmentOfAnotherVersion", [](Phone& phone) { phone.root.edit(kFragment, ">2<", ">1<"); },
         "bad  declaration: its .xml has version 1, the service 2; next: write "
         "<version>2</version>"},
        {"FragmentCutShort",
         [](Phone& phone) {
             phone.root.edit(kFragment, "</manifest>", "");
             phone.facts.declared = false;
         },
         "bad  declaration: its .xml is no XML, line 4; next: correct it"},
        {"FragmentWithoutAnInstance",
         [](Phone& phone) {
             phone.root.edit(kFragment, "<fqname>IVibrator/default</fqname>", "");
             phone.facts.declared = false;
         },
         "bad  declaration: its .xml names no instance; next: name IVibrator/default"},
        {"FragmentWhereTheManagerDoesNotLook", [](Phone& phone) { phone.facts.declared = false; },
         "bad  declaration: the service manager does not see its .xml; next: start it "
         "where that is"},

        // the service
        {"ServiceNotStarted", [](Phone& phone) { phone.endService(); },
         "bad  registration: the service does not run; next: start it; should it end at once, its "
         "log says why"},
        {"ServiceRefused",
         [](Phone& phone) {
             phone.endService();
             phone.facts.declared = false;
         },
         "bad  registration: the service does not run; next: see declaration, then start it"},
        {"ServiceUnregistered",
         [](Phone& phone) {
             phone.facts.registered = false;
             phone.facts.registrant = 0;
         },
         "bad  registration: process 312 runs unregistered; next: see both their logs"},
        {"ServiceOlderThanTheManager",
         [](Phone& phone) {
             phone.facts.registered = false;
             phone.facts.registrant = 0;
             phone.root.putState(7, 'S', 300);
         },
         "bad  registration: process 312 is unknown to the younger service manager; next: restart "
         "it"},
        {"StoppedService",
         [](Phone& phone) {
             phone.root.putState(312, 'T', 200);
             phone.facts.serviceProblem = "has not answered for 2 s";
         },
         "bad  registration: process 312 is stopped; next: kill -CONT 312"},
        {"HungService",
         [](Phone& phone) { phone.facts.serviceProblem = "has not answered for 2 s"; },
         "bad  registration: process 312 has not answered for 2 s; next: see its log, then restart "
         "it"},
        {"ServiceHungInTheDriver",
         [](Phone& phone) {
             phone.facts.serviceProblem = "has not answered for 2 s";
             phone.root.put("/proc/312/task/315/syscall", "1 0x5 0x7ffd 0x4 0x0 0x0 0x0 0x0 0x0\n");
             std::filesystem::create_directory(phone.root.at("/proc/312/fd"));
             std::filesystem::create_symlink("/sys/class/leds/vibrator/duration",
                                             phone.root.at("/proc/312/fd/5"));
         },
         "bad  registration: process 312 hangs in vibrator/duration; next: see the kernel log"},
        {"AnotherService",
         [](Phone& phone) {
             phone.root.remove("/proc/312");
             phone.root.putProcess(312, {"/vendor/bin/hw/other-vibrator"}, kStranger);
         },
         "bad  registration: process 312, other-vibrator, has registered it; next: remove that "
         "other service"},
        {"OlderInterface", [](Phone& phone) { phone.facts.version = 1; },
         "bad  registration: process 312 has version 1, not 2; next: install this service's own "
         "program"},
        {"ServiceOfRoot",
         [](Phone& phone) {
             phone.root.remove("/proc/312");
             phone.root.putProcess(312, {kProgram}, 0);
         },
         "bad  user: process 312 is user 0, who opens what others cannot; next: run it as user "
         "1000"},
        {"NoExtension",
         [](Phone& phone) { phone.facts.extensionProblem = "the service has no extension"; },
         "bad  extension: the service has no extension; next: install this service's own program"},
        {"OlderExtension", [](Phone& phone) { phone.facts.extensionVersion = 3; },
         "bad  extension: it has version 3, not 4; next: install this service's own program"},

        // the device class
        {"NoNodeAtAll",
         [](Phone& phone) {
             phone.root.remove(kLeds);
             phone.root.put(kList, "N: Name=\"keys\"\nH: Handlers=kbd event0 \n\n");
         },
         "bad  device class: no timed_output or leds node, no motor in the input list; next: load "
         "the driver"},
        {"NoInputDevices", [](Phone& phone) { phone.root.remove(kLeds); },
         "bad  device class: no node, and no /proc/bus/input/devices; next: enable CONFIG_INPUT"},
        {"NoState", [](Phone& phone) { phone.root.remove(kLeds + "state"); },
         "bad  device class: two of three LED nodes are there; the driver lacks state; next: add "
         "it"},
        {"ActivateAlone",
         [](Phone& phone) {
             phone.root.remove(kLeds + "state");
             phone.root.remove(kLeds + "duration");
         },
         "bad  device class: one of three LED nodes is there; the driver lacks duration, state; "
         "next: add it"},
        {"DurationDenied", [](Phone& phone) { phone.deny(kLeds + "duration"); },
         "bad  device class: user 4242 cannot open vibrator/duration (OWNER 0600); next: chown it "
         "to 4242"},
        {"EnableDenied",
         [](Phone& phone) {
             phone.root.put(kLegacy + "enable");
             phone.deny(kLegacy + "enable");
         },
         "bad  device class: user 4242 cannot open vibrator/enable (OWNER 0600); next: chown it to "
         "4242"},
        {"MotorOfAnotherName",
         [](Phone& phone) {
             phone.becomeForceFeedback();
             phone.root.edit(kList, "qvx_vibrator_inputff", "qvx_vibrator");
         },
         "bad  device class: the motor is called \"qvx_vibrator\"; next: call it "
         "qvx_vibrator_inputff"},
        {"MotorWithTwoHandlers",
         [](Phone& phone) {
             phone.becomeForceFeedback();
             phone.root.edit(kList, "=event3", "=js0 event3");
         },
         "bad  device class: the motor's handlers are \"js0 event3\", not one event; next: report "
         "EV_FF only"},

        // the nodes
        {"IntensityDenied", [](Phone& phone) { phone.deny(kLeds + "intensity"); },
         "bad  nodes: user 4242 cannot open vibrator/intensity (OWNER 0600); next: chown it to "
         "4242"},
        {"EngineReadOnly", [](Phone& phone) { phone.root.chmod(kLeds + "haptic_engine", 0444); },
         "bad  nodes: user 4242 cannot open vibrator/haptic_engine (OWNER 0444); next: chown it to "
         "4242"},
        {"CalibrationUnreadable",
         [](Phone& phone) {
             phone.becomeForceFeedback();
             phone.deny("/efs/FactoryApp/vibrator_calibration");
         },
         "bad  nodes: user 4242 cannot open FactoryApp/vibrator_calibration (OWNER 0600); next: "
         "chown it to 4242"},
        {"EventNodeMissing",
         [](Phone& phone) {
             phone.becomeForceFeedback();
             phone.root.remove("/dev/input/event3");
         },
         "bad  nodes: input/event3: No such file or directory; next: see the kernel log"},

        // what the nodes say
        {"MotorTypeUnknown",
         [](Phone& phone) { phone.root.put(kLeds + "motor_type", "LINEAR_1041\n"); },
         "bad  motor type: \"LINEAR_1041\" is unknown and counts as NONE; next: write LINEAR_1040"},
        {"MotorTypeWithoutANewline",
         [](Phone& phone) { phone.root.put(kLeds + "motor_type", "LINEAR_1040"); },
         "bad  motor type: \"LINEAR_1040\" without a newline is read as \"LINEAR_104\"; next: add "
         "the newline"},
        {"FeatureWordMisspelt",
         [](Phone& phone) {
             phone.root.put(kFunctions, "INTENSITY HAPTIC_ENGINE PRIMITVE_EFFECT_COMPOSE\n");
         },
         "bad  feature words: \"PRIMITVE_EFFECT_COMPOSE\" is none, so off; next: write "
         "PRIMITIVE_EFFECT_COMPOSE"},
        {"FeatureWordsSeparatedByCommas",
         [](Phone& phone) { phone.root.put(kFunctions, "INTENSITY,HAPTIC_ENGINE\n"); },
         "note feature words: hasFeature needs single spaces between them; next: separate them so"},
        {"FeatureWordsInLines",
         [](Phone& phone) { phone.root.put(kFunctions, "INTENSITY\nHAPTIC_ENGINE\n"); },
         "note feature words: hasFeature needs single spaces between them; next: separate them so"},
        {"FeatureWithoutItsNode", [](Phone& phone) { phone.root.remove(kLeds + "haptic_engine"); },
         "note feature words: HAPTIC_ENGINE is listed without a node; next: add haptic_engine"},
        {"NodeWithoutItsFeature", [](Phone& phone) { phone.root.put(kLeds + "fifo"); },
         "note feature words: FIFO_HAPTIC_ENGINE is not listed, so clients miss it; next: list it"},
        {"NoFeatureWords", [](Phone& phone) { phone.root.remove(kFunctions); },
         "note feature words: without functions, no compositions, no external control; next: add "
         "the node"},
        {"IntensityTableUnreadable",
         [](Phone& phone) { phone.root.put(kLeds + "haptic_intensities", "0;5000;10000\n"); },
         "bad  intensities: haptic_intensities holds \"0;5000;10000\"; next: write numbers, commas "
         "between"},
        {"IntensityTableEmpty", [](Phone& phone) { phone.root.put(kLeds + "intensities", "\n"); },
         "bad  intensities: intensities holds \"\"; next: write numbers, commas between"},
        {"NodeMisnamed", [](Phone& phone) { phone.root.put(kLeds + "cp_trigger_indx"); },
         "bad  node names: the service never opens cp_trigger_indx; next: call it "
         "cp_trigger_index"},
        {"CalibrationEmpty",
         [](Phone& phone) {
             phone.becomeForceFeedback();
             phone.root.put("/efs/FactoryApp/vibrator_calibration", " \n");
         },
         "bad  calibration: vibrator_calibration is empty: none is used; next: calibrate the phone "
         "again"},
        {"CalibrationWithoutItsNode",
         [](Phone& phone) {
             phone.becomeForceFeedback();
             phone.root.remove("/sys/class/qvx_vib_inputff/control/f0_stored");
         },
         "bad  calibration: there is no node f0_stored to write it to; next: add it to the driver"},
};

class BrokenPhone : public ::testing::TestWithParam<Broken> {};

std::string replaced(std::string text, const std::string& from, const std::string& to) {
    const size_t at = text.find(from);
    return at == std::string::npos ? text : text.replace(at, from.size(), to);
}

TEST_P(BrokenPhone, GetsItsCauseAndTheNextStep) {
    Phone phone;
    makeHealthy(phone);
    ASSERT_TRUE(allIsWell(diagnose(phone.facts, phone.root.path())));
    GetParam().damage(phone);
    const std::string owner = std::to_string(geteuid()) + ":" + std::to_string(getegid());
    std::string line = replaced(GetParam().line, "OWNER", owner);
    line = replaced(line, "ROOT", phone.root.path().string());
    std::vector<std::string> lines;
    for (const Finding& finding : diagnose(phone.facts, phone.root.path())) {
        lines.push_back(humanLine(finding, false));
        EXPECT_LE(lines.back().size(), 100u) << lines.back();
    }
    if (line.size() > 100) {
        // Only the path of the test's own directory, which is as long as it is, may be too much.
        ASSERT_NE(GetParam().line.find("ROOT"), std::string::npos) << line;
        line = humanLine(bad("declaration", "no manifest names IVibrator/default",
                             line.substr(line.find("install"))),
                         false);
    }
    EXPECT_EQ(std::count(lines.begin(), lines.end(), line), 1) << "among\n"
                                                               << ::testing::PrintToString(lines);
    EXPECT_EQ(allIsWell(diagnose(phone.facts, phone.root.path())), line.starts_with("note"));
}

INSTANTIATE_TEST_SUITE_P(Doctor, BrokenPhone, ::testing::ValuesIn(kPhones),
                         [](const auto& phone) { return phone.param.name; });

// What a healthy phone, and one on which only the service does not run, are not told.
TEST(Doctor, DoesNotBlameADriverForAServiceThatDoesNotRun) {
    Phone phone;
    makeHealthy(phone);
    phone.endService();
    for (const Finding& finding : diagnose(phone.facts, phone.root.path())) {
        EXPECT_EQ(finding.answer == Answer::kBad, finding.check == "registration")
                << humanLine(finding, false);
    }
}

}  // namespace
}  // namespace vibctl
