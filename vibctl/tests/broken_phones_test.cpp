// SPDX-License-Identifier: Apache-2.0
//
// The doctor on phones whose binder, declaration or service is broken.
#include "vibctl/tests/broken_phone.h"

namespace vibctl {
namespace {

const Broken kServices[] = {
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
        {"ServiceHoldsAMotorThatIsGone",
         [](Phone& phone) {
             phone.becomeForceFeedback();
             std::filesystem::create_directory(phone.root.at("/proc/312/fd"));
             std::filesystem::create_symlink("/dev/input/event3 (deleted)",
                                             phone.root.at("/proc/312/fd/9"));
         },
         "bad  nodes: process 312 still holds the unplugged input/event3; next: restart the "
         "service"},
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
};

INSTANTIATE_TEST_SUITE_P(Services, BrokenPhone, ::testing::ValuesIn(kServices),
                         [](const auto& phone) { return phone.param.name; });

}  // namespace
}  // namespace vibctl
