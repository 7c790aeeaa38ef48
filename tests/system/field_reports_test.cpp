// SPDX-License-Identifier: Apache-2.0
//
// Field reports, each as one short script and read from one merged listing: what was called, what
// was answered, what the driver saw.
#include <string>
#include <vector>

#include <android-base/strings.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/kernel_log.h"
#include "tests/support/phone_control.h"

namespace qvx::test {
namespace {

using testing::HasSubstr;
using testing::Not;

// Runs a script where the phone's nodes are seen; both streams are in the result's `out`.
CommandResult runScript(const std::string& script) {
    return runCommand({"phone", "exec", "--", "sh", "-c", "{ " + script + "\n} 2>&1"});
}

// What stands in the merged listing of calls, driver and log, without the times.
std::vector<std::string> listing() {
    std::vector<std::string> lines;
    for (const std::string& line :
         android::base::Split(runCommand({"phone", "journal", "--pretty"}).out, "\n")) {
        const size_t time = line.find_first_not_of(' ');
        if (time != std::string::npos) lines.push_back(line.substr(line.find(' ', time) + 1));
    }
    return lines;
}

// Each of these begins a line of the listing, in this order, with any others between.
void expectInOrder(const std::vector<std::string>& wanted) {
    const std::vector<std::string> lines = listing();
    size_t found = 0;
    for (const std::string& line : lines) {
        if (found < wanted.size() && line.starts_with(wanted[found])) ++found;
    }
    EXPECT_EQ(found, wanted.size()) << "no line \"" << (found < wanted.size() ? wanted[found] : "")
                                    << "\" at its place among\n"
                                    << android::base::Join(lines, "\n");
}

TEST(FieldReport, TheDriverHangsForFiveSeconds) {
    // The answer comes when its client has gone.
    const ExpectBinderComplaints expected;
    const Phone phone("ff");
    phone.reset();
    const CommandResult result = runScript(
            "phone fault node=motor op=upload delay=5000 times=1\n"
            "vibctl --timeout 0.5 std on 50\n"
            "vibctl --timeout 20 std off");
    EXPECT_EQ(result.out,
              "on: EX_TRANSACTION_FAILED STATUS_TIMED_OUT: no answer within 0.5 s; see vibctl "
              "doctor\noff: ok\n");
    expectInOrder({"call    std on 50",
                   "answer  std on 50: EX_TRANSACTION_FAILED STATUS_TIMED_OUT: no answer within "
                   "0.5 s",
                   "upload  id -1 = 0: custom effect, 50 ms: 0 0 [fault delay=5000 ms, took 50",
                   "event   play effect 0", "call    std off", "event   stop effect 0",
                   "answer  std off: ok, "});
}

TEST(FieldReport, ANodeFailsEveryThirdWrite) {
    const Phone phone("leds");
    phone.reset();
    const CommandResult result = runScript(
            "phone fault node=/sys/class/leds/vibrator/duration op=write errno=EIO every=3\n"
            "for i in 1 2 3 4; do vibctl std on 50; done");
    EXPECT_EQ(result.out,
              "on: ok\non: ok\non: EX_ILLEGAL_STATE; the driver refused: see phone log, on a board "
              "logcat\non: ok\n");
    const std::string write = "write   leds/vibrator/duration <- \"50\\n\"";
    expectInOrder({"call    std on 50", write, "answer  std on 50: ok", "call    std on 50", write,
                   "answer  std on 50: ok", "call    std on 50",
                   write + " = EIO [fault errno=EIO, took ",
                   "answer  std on 50: EX_ILLEGAL_STATE; the driver refused", "call    std on 50",
                   write, "answer  std on 50: ok"});
}

TEST(FieldReport, TheMotorIsUnpluggedDuringACompositionAndComesBack) {
    const Phone phone("ff");
    phone.reset();
    const CommandResult result = runScript(
            "vibctl --wait 60 std compose $(yes 1000,CLICK,1 | head -n 6) --callback &\n"
            "until phone journal | grep -q '\"op\":\"event\"'; do sleep 0.01; done\n"
            "phone unplug\nwait\n"
            "vibctl std on 50\n"
            "phone plug\n"
            "vibctl std on 50\n"
            "phone service restart >/dev/null\n"
            "vibctl std on 50");
    EXPECT_THAT(result.out, HasSubstr("compose: ok, completed after "));
    // What the service had opened stays dead, as on a board.
    EXPECT_THAT(result.out,
                testing::ContainsRegex("\non: EX_ILLEGAL_STATE; .*\non: EX_ILLEGAL_STATE; "));
    EXPECT_THAT(result.out, testing::EndsWith("\non: ok\n"));
    expectInOrder({"call    std compose 1000,CLICK,1 1000,CLICK,1 ", "event   play effect 0",
                   "unplug  motor", "call    std on 50",
                   "answer  std on 50: EX_ILLEGAL_STATE; the driver refused", "plug    motor",
                   "call    std on 50", "answer  std on 50: EX_ILLEGAL_STATE; the driver refused",
                   "call    std on 50", "answer  std on 50: ok"});
}

TEST(FieldReport, TheServiceDiesDuringACompositionAndIsStartedAgain) {
    const ExpectBinderComplaints expected;
    const Phone phone("ff");
    phone.reset();
    const int first = phone.servicePid();
    const CommandResult result = runScript(
            "vibctl --wait 60 std compose $(yes 1000,CLICK,1 | head -n 10) --callback &\n"
            "until phone journal | grep -q '\"op\":\"event\"'; do sleep 0.01; done\n"
            "phone service kill\n"
            "wait $!; echo status $?\n"
            "until phone status >/dev/null; do sleep 0.1; done\n"
            "vibctl std off");
    EXPECT_EQ(
            result.out,
            "compose: EX_TRANSACTION_FAILED STATUS_DEAD_OBJECT: the service died before it called "
            "back; see vibctl doctor\nstatus 3\noff: ok\n");
    EXPECT_NE(phone.servicePid(), first);
    const std::string composition =
            "std compose 1000,CLICK,1 1000,CLICK,1 1000,CLICK,1 "
            "1000,CLICK,1 1000,CLICK,1 1000,CLICK,1 1000,CLICK,1 1000,CLICK,1 1000,CLICK,1 "
            "1000,CLICK,1 --callback";
    expectInOrder({"call    " + composition, "event   play effect 0", "close   motor",
                   "answer  " + composition +
                           ": EX_TRANSACTION_FAILED STATUS_DEAD_OBJECT: the service died",
                   "call    std off", "answer  std off: ok"});
}

TEST(FieldReport, ANodeShowsWrongContentsOnce) {
    const Phone phone("leds");
    phone.reset();
    const CommandResult result = runScript(
            "phone fault "
            "'{\"node\": \"/sys/class/vib_info_class/vib_support_info/functions\", "
            "\"op\": \"read\", \"text\": \"NONE\\n\", \"times\": 1}'\n"
            "vibctl std getSupportedPrimitives\n"
            "vibctl std getSupportedPrimitives");
    EXPECT_EQ(result.out,
              "getSupportedPrimitives: ok, none\n"
              "getSupportedPrimitives: ok, NOOP CLICK THUD SPIN QUICK_RISE SLOW_RISE QUICK_FALL "
              "LIGHT_TICK LOW_TICK\n");
    const std::string read = "read    vib_info_class/vib_support_info/functions ";
    expectInOrder({"call    std getSupportedPrimitives", read + "5 [fault text=\"NONE\\n\", took ",
                   "answer  std getSupportedPrimitives: ok, none",
                   "call    std getSupportedPrimitives", read,
                   "answer  std getSupportedPrimitives: ok, NOOP CLICK"});
}

TEST(FieldReport, AServiceThatIsNotStartedIsNotTheDriversFault) {
    const Phone phone("leds");
    ASSERT_EQ(runCommand({"phone", "service", "stop"}).status, 0);
    const CommandResult result = runScript("vibctl std on 50; vibctl doctor");
    EXPECT_EQ(result.status, 1);
    EXPECT_THAT(result.out, HasSubstr("vibctl: android.hardware.vibrator.IVibrator/default is not "
                                      "registered; see vibctl doctor\n"));
    EXPECT_THAT(result.out, HasSubstr("\nbad  registration: the service does not run; next: "));
    EXPECT_THAT(result.out, HasSubstr("\nok   device class: LED class, "));
    EXPECT_THAT(result.out, HasSubstr("\nok   nodes: user 1000 can open all 25 "));
    EXPECT_THAT(result.out, HasSubstr("\none problem: registration\n"));
}

TEST(FieldReport, AManagerThatIsDeadIsNotToldAsARegistration) {
    const ExpectBinderComplaints expected;
    const Phone phone("leds");
    const CommandResult result = runScript(
            "kill -KILL $(pidof servicemanager)\n"
            "until phone status --json | grep -q '\"manager\":null'; do sleep 0.01; done\n"
            "phone status");
    EXPECT_EQ(result.status, 1);
    EXPECT_THAT(result.out, HasSubstr("the service manager has ended, "));
    EXPECT_THAT(result.out, Not(HasSubstr("registered")));
}

}  // namespace
}  // namespace qvx::test
