// SPDX-License-Identifier: Apache-2.0
//
// The phone tool, used as an engineer uses it.
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>
#include <filesystem>
#include <fstream>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/driver/tests/test_files.h"
#include "handset/phone/tests/phone_tool.h"
#include "tests/support/kernel_log.h"

namespace handset {
namespace {

namespace fs = std::filesystem;

using testing::HasSubstr;
using testing::StartsWith;

// An executable script that stands in for the service.
class StandIn {
  public:
    explicit StandIn(const std::string& script) : mPath(fileIn(mDirectory, "service")) {
        fs::permissions(fs::path(mPath).parent_path(), fs::perms(0755));
        std::ofstream(mPath) << "#!/bin/sh\n" << script << "\n";
        fs::permissions(mPath, fs::perms(0755));
    }
    const std::string& path() const { return mPath; }

  private:
    TemporaryDir mDirectory;
    std::string mPath;
};

TEST_F(Phone, UpSaysThatTheServiceIsRegistered) {
    const Ran up = run("phone up");
    ASSERT_EQ(up.status, 0) << up.errors;
    const pid_t service = state()["service"];
    EXPECT_EQ(up.output, "phone is up: profile leds, service registered, pid " +
                                 std::to_string(service) + "\n");
    EXPECT_EQ(up.errors, "");
    EXPECT_EQ(run("phone status").output, up.output);
    EXPECT_TRUE(runs(service));
    const Ran journal = run("phone journal");
    EXPECT_THAT(journal.output, HasSubstr("\"node\":\"/sys/class/leds/vibrator/activate\""));
    EXPECT_THAT(run("phone log").output, HasSubstr("Vibrator using LED trigger"));
    EXPECT_EQ(run("phone down").output, "");
    EXPECT_FALSE(runs(service));
}

TEST_F(Phone, WrongWordsAreNamedWithWhatIsAccepted) {
    const std::pair<const char*, const char*> kUsages[] = {
            {"phone",
             "no command given; there are up, down, status, service, reset, fault, node, "
             "unplug, plug, journal, log, exec"},
            {"phone 'a\nb'",
             "unknown command \"a?b\"; there are up, down, status, service, reset, "
             "fault, node, unplug, plug, journal, log, exec"},
            {"phone down --now",
             "down: The following argument was not expected: --now; accepted: "
             "--help"},
            {"phone unplug --after ''",
             "unplug: --after: a number expected, not \"\"; accepted: "
             "--help, NODE, --after"},
            {"phone exec --user '' -- true",
             "exec: --user: a number expected, not \"\"; accepted: "
             "--help, --user, COMMAND"},
            {"phone up --out ''", "--out: a directory expected, not \"\""},
    };
    for (const auto& [command, line] : kUsages) {
        const Ran ran = run(command);
        EXPECT_EQ(ran.status, 2) << command;
        EXPECT_EQ(ran.output, "") << command;
        EXPECT_EQ(ran.errors, std::string("phone: ") + line + "\n");
    }
}

TEST_F(Phone, EveryBuiltInProfileComesUp) {
    for (const std::string profile : {"legacy", "ff", "none"}) {
        const Ran up = run("phone up --profile " + profile);
        EXPECT_EQ(up.status, 0) << up.errors;
        EXPECT_THAT(up.output,
                    StartsWith("phone is up: profile " + profile + ", service registered, pid "));
        EXPECT_EQ(run("phone down").status, 0);
        EXPECT_EQ(leftOvers(), "");
    }
}

TEST_F(Phone, TheServiceIsTheSystemUserWithoutCapabilities) {
    ASSERT_EQ(run("phone up").status, 0);
    const std::string status =
            contentOf("/proc/" + std::to_string(state()["service"].get<pid_t>()) + "/status");
    EXPECT_THAT(status, HasSubstr("\nUid:\t1000\t1000\t1000\t1000\n"));
    EXPECT_THAT(status, HasSubstr("\nGid:\t1000\t1000\t1000\t1000\n"));
    EXPECT_THAT(status, HasSubstr("\nGroups:\t1000 1004 1007 \n"));
    for (const char* set : {"CapInh", "CapPrm", "CapEff", "CapAmb"}) {
        EXPECT_THAT(status, HasSubstr(std::string("\n") + set + ":\t0000000000000000\n"));
    }
}

TEST_F(Phone, AServiceThatEndsIsReportedWithItsLastWords) {
    const StandIn service("echo first words >&2; echo last words >&2; kill -ABRT $$");
    const Ran up = run("phone up --service " + service.path());
    EXPECT_EQ(up.status, 1);
    EXPECT_EQ(up.output, "");
    EXPECT_EQ(up.errors, "phone: the service exited with status 134: last words\n");
    EXPECT_EQ(leftOvers(), "");
}

TEST_F(Phone, AServiceThatEndsWithoutAWordIsReportedToo) {
    const Ran up = run("phone up --service /bin/false");
    EXPECT_EQ(up.status, 1);
    EXPECT_EQ(up.errors, "phone: the service exited with status 1\n");
}

TEST_F(Phone, WithoutAServiceTheDriverIsThereAllTheSame) {
    const Ran up = run("phone up --no-service --profile legacy");
    EXPECT_EQ(up.status, 0) << up.errors;
    EXPECT_EQ(up.output, "phone is up: profile legacy, no service\n");
    EXPECT_EQ(run("phone exec -- cat /sys/class/timed_output/vibrator/enable").output, "0\n");
}

TEST_F(Phone, AMissingPartIsNamed) {
    EXPECT_EQ(run("phone up --service /nowhere/service").errors,
              "phone: /nowhere/service: No such file or directory; build it first\n");
    EXPECT_EQ(run("phone up --service /nowhere/service").status, 2);
}

TEST_F(Phone, AnUnknownProfileGetsTheListOfKnownOnes) {
    const Ran up = run("phone up --profile bogus");
    EXPECT_EQ(up.status, 2);
    EXPECT_EQ(up.output, "");
    EXPECT_THAT(up.errors, StartsWith("phone: no profile named \"bogus\"; there are "));
    EXPECT_THAT(up.errors,
                HasSubstr("there are ff, leds, leds-amplitude, leds-haptic-engine, leds-none, "
                          "leds-prebaked-index, legacy, legacy-amplitude, legacy-haptic-engine, "
                          "legacy-none, legacy-prebaked-index, none, or give a file's path"));
    EXPECT_EQ(run("phone up --profile ./bogus.json").errors,
              "phone: profile ./bogus.json: No such file or directory\n");
}

TEST_F(Phone, AWrongProfileGetsTheDriversLine) {
    const TemporaryDir directory;
    std::ofstream(fileIn(directory, "p.json")) << "{\n  \"nodes\": 3\n}";
    const Ran up = run("phone up --profile " + fileIn(directory, "p.json"));
    EXPECT_EQ(up.status, 2);
    EXPECT_EQ(up.errors, "phone: " + fileIn(directory, "p.json") +
                                 ": nodes: an object expected, not a whole number\n");
    std::ofstream(fileIn(directory, "p.json")) << "{\n  nodes\n}";
    EXPECT_EQ(run("phone up --profile " + fileIn(directory, "p.json")).errors,
              "phone: " + fileIn(directory, "p.json") +
                      ": line 2, column 3: no valid JSON at \"nodes\"\n");
}

TEST_F(Phone, AnOutputDirectoryIsMadeAndFilled) {
    const TemporaryDir directory;
    ASSERT_EQ(run("phone up --out " + fileIn(directory, "a/b")).status, 0);
    EXPECT_EQ(run("phone down").status, 0);
    EXPECT_NE(contentOf(fileIn(directory, "a/b/journal.jsonl")), "");
    EXPECT_NE(contentOf(fileIn(directory, "a/b/service.log")), "");
    EXPECT_EQ(run("phone up --out /proc/none").errors,
              "phone: /proc/none: No such file or directory\n");
}

TEST_F(Phone, OnePhoneAtATime) {
    ASSERT_EQ(run("phone up --no-service").status, 0);
    const Ran second = run("phone up --profile legacy");
    EXPECT_EQ(second.status, 2);
    EXPECT_EQ(second.errors,
              "phone: a phone is up already: profile leds; \"phone down\" ends it\n");
    EXPECT_EQ(run("phone status").output, "phone is up: profile leds, no service\n");
}

TEST_F(Phone, TwoUpsAtOnceMakeOnePhone) {
    const Ran both = run("phone up --no-service & phone up --no-service; wait");
    EXPECT_EQ(both.output, "phone is up: profile leds, no service\n");
    EXPECT_THAT(both.errors, StartsWith("phone: a phone is up already"));
}

TEST_F(Phone, DownIsQuietWhenNothingIsUp) {
    const Ran down = run("phone down; phone down");
    EXPECT_EQ(down.status, 0);
    EXPECT_EQ(down.output + down.errors, "");
    EXPECT_EQ(run("phone status").output, "phone is down\n");
    EXPECT_EQ(run("phone status").status, 1);
}

TEST_F(Phone, WhatNeedsAPhoneSaysSo) {
    for (const std::string command :
         {"reset", "fault node=motor", "fault --clear", "node /x", "exec -- true"}) {
        const Ran ran = run("phone " + command);
        EXPECT_EQ(ran.status, 2) << command;
        EXPECT_EQ(ran.errors, "phone: no phone is up; \"phone up\" starts one\n") << command;
    }
}

TEST_F(Phone, AKilledSupervisorTakesEverythingWithIt) {
    const qvx::test::ExpectBinderComplaints complaints;  // work is lost when all die at once
    ASSERT_EQ(run("phone up --profile ff").status, 0);
    const nlohmann::json before = state();
    kill(before["supervisor"], SIGKILL);
    EXPECT_TRUE(comesTrue([&] {
        return !runs(before["driver"]) && !runs(before["manager"]) && !runs(before["service"]);
    }));
    EXPECT_EQ(run("phone status").output, "phone is down\n");
    // A new phone comes up over what is left of the old one.
    EXPECT_EQ(run("phone up").status, 0);
    rmdir("/efs");  // what a killed driver cannot take away
}

TEST_F(Phone, AnInterruptedUpIsCleanedUp) {
    const StandIn service("sleep 100");
    run("phone up --service " + service.path() + " & sleep 1; kill -KILL $!");
    EXPECT_TRUE(comesTrue([] { return leftOvers().empty(); })) << leftOvers();
}

TEST_F(Phone, ADriversDeathEndsThePhone) {
    ASSERT_EQ(run("phone up").status, 0);
    const nlohmann::json before = state();
    kill(before["driver"], SIGKILL);
    EXPECT_TRUE(comesTrue([] { return leftOvers().empty(); })) << leftOvers();
    EXPECT_FALSE(runs(before["service"]));
}

TEST_F(Phone, FaultsAreAddedWhileItRuns) {
    ASSERT_EQ(run("phone up --no-service").status, 0);
    const std::string node = "/sys/class/leds/vibrator/duration";
    const std::string write = "phone exec --user 1000 -- sh -c 'echo 5 > " + node + "'";
    EXPECT_EQ(run("phone fault node=" + node + " op=open errno=EIO times=1").status, 0);
    EXPECT_NE(run(write).status, 0);
    EXPECT_EQ(run(write).status, 0);
    EXPECT_EQ(
            run("phone fault '{\"node\": \"" + node + "\", \"op\": \"open\", \"errno\": \"EIO\"}'")
                    .status,
            0);
    EXPECT_NE(run(write).status, 0);
    EXPECT_EQ(run("phone fault --clear").status, 0);
    EXPECT_EQ(run(write).status, 0);
    const Ran wrong = run("phone fault node=" + node + " op=write errno=EFOO");
    EXPECT_EQ(wrong.status, 2);
    EXPECT_EQ(wrong.errors,
              "phone: fault.errno: \"EFOO\" unknown; accepted: an error's name, such as EIO, "
              "EINTR, EACCES\n");
}

TEST_F(Phone, NodesAreShownAndSet) {
    ASSERT_EQ(run("phone up --no-service").status, 0);
    EXPECT_EQ(run("phone node /sys/class/leds/vibrator/num_waves").output, "137\n");
    EXPECT_EQ(run("phone node /sys/class/leds/vibrator/num_waves '12\n'").status, 0);
    EXPECT_EQ(run("phone exec -- cat /sys/class/leds/vibrator/num_waves").output, "12\n");
    EXPECT_EQ(run("phone node /sys/class/nothing").errors,
              "phone: the profile has no node \"/sys/class/nothing\"\n");
}

TEST_F(Phone, ResetEmptiesJournalAndLog) {
    ASSERT_EQ(run("phone up").status, 0);
    EXPECT_NE(run("phone journal").output, "");
    EXPECT_NE(run("phone log").output, "");
    EXPECT_EQ(run("phone reset").status, 0);
    EXPECT_EQ(run("phone journal").output, "");
    EXPECT_EQ(run("phone log").output, "");
    run("phone exec -- cat /sys/class/leds/vibrator/num_waves");
    EXPECT_THAT(run("phone journal").output, StartsWith("{\"n\":1,"));
}

TEST_F(Phone, ExecRunsACommandAmongThePhonesNodes) {
    ASSERT_EQ(run("phone up --no-service").status, 0);
    EXPECT_EQ(run("phone exec -- ls /sys/class").output, "leds\nvib_info_class\n");
    EXPECT_EQ(run("phone exec --user 1000 -- id -u").output, "1000\n");
    EXPECT_EQ(run("phone exec --user 1000 -- id -G").output, "1000 1004 1007\n");
    EXPECT_EQ(run("phone exec --user 2000 -- id -G").output, "2000\n");
    EXPECT_EQ(run("phone exec -- sh -c 'exit 7'").status, 7);
    EXPECT_EQ(run("cd /usr/lib && phone exec -- pwd").output, "/usr/lib\n");
    const Ran missing = run("phone exec -- no-such-command");
    EXPECT_EQ(missing.status, 127);
    EXPECT_EQ(missing.errors, "phone: no-such-command: No such file or directory\n");
}

TEST_F(Phone, ManyRoundsFitInOneBoot) {
    for (int round = 0; round < 10; ++round) {
        const Ran up = run("phone up && phone down");
        ASSERT_EQ(up.status, 0) << up.errors;
    }
}

}  // namespace
}  // namespace handset
