// SPDX-License-Identifier: Apache-2.0
//
// The client over a real binder: exit statuses, callbacks, and every way in which there may be no
// service.
#include <sys/mount.h>
#include <unistd.h>

#include <chrono>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include <android-base/strings.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "platform/servicemanager/tests/processes.h"
#include "tests/support/command.h"
#include "tests/support/fake_root.h"
#include "tests/support/kernel_log.h"
#include "vibctl/tests/fake_service.h"

namespace {

using processes::Manager;
using qvx::test::CommandResult;
using ::testing::HasSubstr;

constexpr const char* kRefused =
        "setAmplitude: EX_ILLEGAL_ARGUMENT; an argument was refused: see phone log, on a board "
        "logcat\n";

constexpr const char* kManifest =
        "<manifest version=\"1.0\" type=\"device\"><hal format=\"aidl\">"
        "<name>android.hardware.vibrator</name><version>2</version>"
        "<fqname>IVibrator/default</fqname></hal></manifest>";

// Both of the program's streams are in the result's `out`.
CommandResult run(const std::string& arguments) {
    return qvx::test::runShell(std::string(VIBCTL_PROGRAM) + " " + arguments + " 2>&1");
}

// How often the driver has been asked for this since the guest's start.
long countOf(const std::string& request) {
    constexpr const char* kStatistics = "/sys/kernel/debug/binder/stats";
    if (access(kStatistics, R_OK) != 0) mount("none", "/sys/kernel/debug", "debugfs", 0, nullptr);
    std::ifstream file(kStatistics);
    long count = 0;
    for (std::string word; file >> word && word != "proc";) {
        if (word == request) file >> count;
    }
    return count;
}

class VibctlTest : public ::testing::Test {
  protected:
    VibctlTest() { mRoot.put("/vendor/etc/vintf/manifest.xml", kManifest); }

    qvx::test::FakeRoot mRoot;
};

class VibctlWithService : public VibctlTest {
  protected:
    static void expect(const std::string& arguments, int status, const std::string& output) {
        const CommandResult result = run(arguments);
        EXPECT_EQ(result.status, status) << arguments;
        EXPECT_EQ(result.out, output) << arguments;
    }

    static nlohmann::json callbackOf(const std::string& arguments, int status = 0) {
        const CommandResult result = run("--json " + arguments);
        EXPECT_EQ(result.status, status) << result.out;
        return nlohmann::json::parse(result.out).at("callback");
    }

    Manager mManager{mRoot.path(), "android.hardware.vibrator.IVibrator/default 1000\n"};
    qvx::test::Process mService = processes::serve(1000, fake::registerServices);
};

TEST_F(VibctlTest, WithoutAServiceManagerEndsInSecondsWithOneLine) {
    const qvx::test::ExpectBinderComplaints expected;
    const auto before = std::chrono::steady_clock::now();
    for (const char* arguments : {"list", "std off", "ext setAmplitude -1"}) {
        const CommandResult result = run(arguments);
        EXPECT_EQ(result.status, 3) << arguments;
        EXPECT_EQ(result.out,
                  "vibctl: no service manager has answered for 2 s; see vibctl doctor\n");
    }
    EXPECT_LT(std::chrono::steady_clock::now() - before, std::chrono::seconds(20));
}

TEST_F(VibctlTest, WithoutTheServiceNamesIt) {
    const Manager manager(mRoot.path());
    for (const char* arguments : {"std off", "ext setAmplitude -1"}) {
        const CommandResult result = run(arguments);
        EXPECT_EQ(result.status, 3);
        EXPECT_EQ(
                result.out,
                "vibctl: android.hardware.vibrator.IVibrator/default is not registered; see vibctl "
                "doctor\n");
    }
    EXPECT_EQ(run("list").out, "manager\n");
}

TEST_F(VibctlWithService, ListsServicesButNotTheExtension) {
    expect("list", 0, "android.hardware.vibrator.IVibrator/default\nmanager\n");
    const nlohmann::json line = nlohmann::json::parse(run("--json list").out);
    EXPECT_EQ(line.at("result"),
              (nlohmann::json{"android.hardware.vibrator.IVibrator/default", "manager"}));
}

TEST_F(VibctlWithService, ReportsSuccess) {
    expect("std on 500", 0, "on: ok\n");
    expect("std setAmplitude nan", 0, "setAmplitude: ok\n");
    expect("std perform CLICK LIGHT", 0, "perform: ok, 0 ms\n");
    expect("std getInterfaceVersion", 0, "getInterfaceVersion: ok, 2\n");
    expect("std getInterfaceHash", 0,
           "getInterfaceHash: ok, ea8742d6993e1a82917da38b9938e537aa7fcb54\n");
}

TEST_F(VibctlWithService, ReportsExceptionsWithStatus1) {
    expect("std setAmplitude 1", 1, kRefused);
    expect("std on 1", 1,
           "on: EX_ILLEGAL_STATE: no \"motor\"; the driver refused: see phone log, on a board "
           "logcat\n");
    expect("std on 2", 1, "on: EX_SERVICE_SPECIFIC 7\n");
    EXPECT_THAT(run("--json std on 1").out,
                HasSubstr(R"("exception":-5,"status":0,"message":"no \"motor\"","result":null,)"));
}

TEST_F(VibctlWithService, ReportsTransportFailuresWithStatus3) {
    expect("std getQFactor", 3,
           "getQFactor: EX_TRANSACTION_FAILED STATUS_UNKNOWN_TRANSACTION; see vibctl doctor\n");
    EXPECT_THAT(run("--json std getQFactor").out, HasSubstr(R"("exception":-129,"status":-74,)"));
    const qvx::test::ExpectBinderComplaints expected;
    expect("std on 3", 3, "on: EX_TRANSACTION_FAILED STATUS_DEAD_OBJECT; see vibctl doctor\n");
}

TEST_F(VibctlWithService, WaitsForAnAnswerNoLongerThanToldTo) {
    const qvx::test::ExpectBinderComplaints expected;
    expect("--timeout 0.5 std on 4", 3,
           "on: EX_TRANSACTION_FAILED STATUS_TIMED_OUT: no answer within 0.5 s; see vibctl "
           "doctor\n");
    EXPECT_THAT(run("--json --timeout 0.5 std on 4").out,
                HasSubstr(R"("exception":-129,"status":-110,"message":"no answer within 0.5 s",)"));
    // It owes two answers.
    mService.kill();
}

TEST_F(VibctlWithService, HearsOfTheServicesDeathWhileItAwaitsTheCallback) {
    const qvx::test::ExpectBinderComplaints expected;
    const auto before = std::chrono::steady_clock::now();
    expect("--wait 120 std compose 1000,CLICK,1 --callback", 3,
           "compose: EX_TRANSACTION_FAILED STATUS_DEAD_OBJECT: the service died before it called "
           "back; see vibctl doctor\n");
    EXPECT_LT(std::chrono::steady_clock::now() - before, std::chrono::seconds(60));
}

TEST_F(VibctlWithService, TurnsTheMotorOffWhenItIsInterruptedAndToldTo) {
    const std::string wait = "--wait 120 std compose 0,CLICK,1 --callback";
    const auto interrupt = [](const std::string& arguments) {
        return qvx::test::runShell(std::string(VIBCTL_PROGRAM) + " " + arguments +
                                   " 2>&1 & sleep 2; kill -TERM $!; wait $!");
    };
    EXPECT_EQ(interrupt(wait).status, 128 + 15);
    expect("std getCompositionSizeMax", 0, "getCompositionSizeMax: ok, 0\n");
    const CommandResult result = interrupt("--off-on-interrupt " + wait);
    EXPECT_EQ(result.status, 128 + 15);
    EXPECT_EQ(result.out, "vibctl: interrupted; the motor is off\n");
    expect("std getCompositionSizeMax", 0, "getCompositionSizeMax: ok, 1\n");
}

TEST_F(VibctlWithService, SendsATransactionByItsNumber) {
    // off(), setAmplitude(nan) and the extension's setAmplitude(-1).
    expect("raw std 2", 0, "raw: ok, reply 00000000\n");
    expect("raw std 6 0000c07f", 0, "raw: ok, reply 00000000\n");
    expect("raw ext 8 ffffffff", 0, "raw: ok, reply 00000000\n");
    EXPECT_THAT(run("raw ext 8 01000000").out, HasSubstr("raw: EX_ILLEGAL_ARGUMENT; "));
    EXPECT_THAT(run("--json raw std 2").out,
                HasSubstr(R"({"iface":"std","method":"raw","exception":0,"status":0,"message":"",)"
                          R"("result":"00000000",)"));
    EXPECT_EQ(run("raw std 999").status, 3);
    EXPECT_EQ(run("raw std 6").status, 3) << "a transaction that is cut short";
}

CommandResult session(const std::string& lines) {
    return qvx::test::runShell("printf '%s\\n' " + lines + " | " VIBCTL_PROGRAM " session 2>&1");
}

TEST_F(VibctlWithService, AnswersCallAfterCallInASession) {
    const CommandResult result = session(
            R"('["std","on","500"]' 'nonsense' '["std","compose","20,CLICK,1","--callback"]' )"
            R"('["std","setAmplitude","1"]' '["ext","hasFeature","x"]')");
    EXPECT_EQ(result.status, 2);
    std::vector<std::string> texts;
    for (const std::string& line : android::base::Split(result.out, "\n")) {
        if (!line.empty()) texts.push_back(nlohmann::json::parse(line).at("text"));
    }
    ASSERT_EQ(texts.size(), 5U) << result.out;
    EXPECT_EQ(texts[0], "ok");
    EXPECT_THAT(texts[1], testing::StartsWith("session: a list such as "));
    EXPECT_THAT(texts[2], testing::StartsWith("ok, completed after "));
    EXPECT_THAT(texts[3], testing::StartsWith("EX_ILLEGAL_ARGUMENT"));
    EXPECT_EQ(texts[4], "ok, false");
}

TEST_F(VibctlWithService, GoesOnWithASessionWhenTheServiceDies) {
    const qvx::test::ExpectBinderComplaints expected;
    const CommandResult result = session(
            R"('["std","compose","20,CLICK,1","--callback"]' '["std","on","3"]' '["std","off"]')");
    EXPECT_EQ(result.status, 3);
    EXPECT_THAT(result.out, HasSubstr("STATUS_DEAD_OBJECT; see vibctl doctor"));
    EXPECT_THAT(result.out, HasSubstr("IVibrator/default is not registered; see vibctl doctor"));
}

TEST_F(VibctlWithService, PrintsWhatTheServiceDumps) {
    expect("dump", 0, std::string(100000, 'x'));
    expect("dump ext", 0, "");
    EXPECT_THAT(run("--json dump ext").out,
                HasSubstr(R"({"iface":"ext","method":"dump","exception":0,"status":0,"message":"",)"
                          R"("result":"","callback":null,)"));
}

TEST_F(VibctlWithService, ReachesTheExtension) {
    expect("ext setAmplitude -1", 0, "setAmplitude: ok\n");
    expect("ext setAmplitude 1", 1, kRefused);
    expect("ext hasFeature x", 0, "hasFeature: ok, false\n");
    expect("ext hasFeature -- --json", 0, "hasFeature: ok, true\n");
    expect("ext getInterfaceVersion", 0, "getInterfaceVersion: ok, 4\n");
}

TEST_F(VibctlWithService, ReportsWhenACompositionCompletes) {
    const nlohmann::json callback = callbackOf("std compose 300,CLICK,1 --callback");
    ASSERT_TRUE(callback.is_number());
    EXPECT_GE(callback.get<int>(), 300);
    EXPECT_LT(callback.get<int>(), 2000);
    EXPECT_THAT(run("std compose 20,CLICK,1 --callback").out,
                HasSubstr("compose: ok, completed after "));
}

// Whoever ends before the driver has confirmed that leaves a complaint in the kernel's log.
TEST_F(VibctlWithService, EndsWithoutAskingForNoNoticeOfTheServicesDeath) {
    const long asked = countOf("BC_REQUEST_DEATH_NOTIFICATION:");
    const long takenBack = countOf("BC_CLEAR_DEATH_NOTIFICATION:");
    EXPECT_TRUE(callbackOf("std compose 20,CLICK,1 --callback").is_number());
    EXPECT_EQ(countOf("BC_REQUEST_DEATH_NOTIFICATION:"), asked + 1);
    EXPECT_EQ(countOf("BC_CLEAR_DEATH_NOTIFICATION:"), takenBack);
}

TEST_F(VibctlWithService, ReportsWhenAPiecewiseLinearCompositionCompletes) {
    const nlohmann::json callback = callbackOf("std composePwle brake,CLAB,300 --callback");
    ASSERT_TRUE(callback.is_number());
    EXPECT_GE(callback.get<int>(), 300);
    EXPECT_LT(callback.get<int>(), 2000);
    EXPECT_EQ(callbackOf("--wait 0.2 std composePwle brake,CLAB,0 --callback", 4), "timeout");
    expect("std composePwle --callback", 1, "composePwle: EX_NULL_POINTER\n");
}

TEST_F(VibctlWithService, PassesNoCallbackUnlessAskedTo) {
    expect("std compose 300,CLICK,1", 1, "compose: EX_NULL_POINTER\n");
    expect("std composePwle brake,CLAB,300", 1, "composePwle: EX_NULL_POINTER\n");
}

TEST_F(VibctlWithService, WaitsForACompletionNoLongerThanToldTo) {
    EXPECT_EQ(callbackOf("--wait 0.2 std compose 0,CLICK,1 --callback", 4), "timeout");
    EXPECT_EQ(callbackOf("--wait 0 std compose 0,CLICK,1 --callback", 4), "timeout");
    expect("--wait 0.2 std compose 0,CLICK,1 --callback", 4,
           "compose: ok, not completed within 200 ms\n");
}

TEST_F(VibctlWithService, PassesACallbackToPerformWithoutWaitingForIt) {
    EXPECT_EQ(callbackOf("std perform CLICK LIGHT --callback"), nullptr);
}

TEST_F(VibctlWithService, DoesNotWaitWhenTheCallWasRefused) {
    expect("--wait 60 std compose --callback", 1, "compose: EX_NULL_POINTER\n");
}

}  // namespace
