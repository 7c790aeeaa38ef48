// SPDX-License-Identifier: Apache-2.0
//
// The program itself: what it prints where, and its exit status, on a machine without a service.
#include <string>

#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "command.h"

namespace {

using ::testing::HasSubstr;
using ::testing::StartsWith;

using qvx::test::CommandResult;

CommandResult run(const std::string& arguments) {
    return qvx::test::runShell(std::string(VIBCTL_COMMAND) + " " + arguments);
}

TEST(Program, HelpGoesToStandardOutputAndSucceeds) {
    for (const char* arguments : {"help", "--help", "-h"}) {
        const CommandResult result = run(arguments);
        EXPECT_EQ(result.status, 0) << arguments;
        EXPECT_THAT(result.out, StartsWith("usage: vibctl ")) << arguments;
        EXPECT_EQ(result.err, "") << arguments;
    }
    EXPECT_THAT(run("std help").out, HasSubstr("\n  compose DELAY_MS,PRIMITIVE,SCALE..."));
    EXPECT_THAT(run("ext --help").out, HasSubstr("\n  hasFeature FEATURE_NAME\n"));
    EXPECT_EQ(run("std on --help").out,
              "vibctl std on TIMEOUT_MS [--callback]\n  TIMEOUT_MS: an integer\n");
    EXPECT_EQ(run("std perform --help").status, 0);
}

TEST(Program, VersionIsPrinted) {
    const CommandResult result = run("--version");
    EXPECT_EQ(result.status, 0);
    EXPECT_THAT(result.out, StartsWith("vibctl "));
}

struct WrongUsage {
    const char* name;
    const char* arguments;
    const char* line;
};

class WrongUsageOf : public ::testing::TestWithParam<WrongUsage> {};

TEST_P(WrongUsageOf, GetsOneLineAndStatus2) {
    const CommandResult result = run(GetParam().arguments);
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.out, "");
    EXPECT_EQ(result.err, GetParam().line);
}

constexpr WrongUsage kWrongUsages[] = {
        {"NoCommand", "", "vibctl: no command given; there are std, ext, list, doctor and help\n"},
        {"Command", "foo",
         "vibctl: unknown command \"foo\"; there are std, ext, list, doctor and help\n"},
        {"Option", "--jsno list",
         "vibctl: unknown option \"--jsno\"; there are --json, --wait SECONDS, --callback, --help, "
         "--version\n"},
        {"Wait", "--wait never std off",
         "vibctl: --wait \"never\" is not a number of seconds from 0 to 86400\n"},
        {"Method", "std preform CLICK STRONG",
         "vibctl: std: unknown method \"preform\"; did you mean perform\n"},
        {"Number", "--json std on 1.5",
         "vibctl: std on: TIMEOUT_MS \"1.5\" is not an integer from -2147483648 to 2147483647; "
         "usage: vibctl std on TIMEOUT_MS [--callback]\n"},
        {"ArgumentCount", "ext setAmplitude",
         "vibctl: ext setAmplitude: takes 1 argument, got 0; usage: vibctl ext setAmplitude "
         "AMPLITUDE\n"},
        {"CompositionField", "std compose 50,CLICK,1.0 50,CLICK",
         "vibctl: std compose: packet \"50,CLICK\": 2 fields where 3 are wanted: "
         "DELAY_MS,PRIMITIVE,SCALE; usage: vibctl std compose DELAY_MS,PRIMITIVE,SCALE... "
         "[--callback]\n"},
        {"CompositionDelay", "std compose 2147483648,CLICK,1 --callback",
         "vibctl: std compose: packet \"2147483648,CLICK,1\": DELAY_MS \"2147483648\" is not an "
         "integer from -2147483648 to 2147483647; usage: vibctl std compose "
         "DELAY_MS,PRIMITIVE,SCALE... [--callback]\n"},
        {"CompositionPrimitive", "std compose 0,BUZZ,1 --callback",
         "vibctl: std compose: packet \"0,BUZZ,1\": PRIMITIVE \"BUZZ\" is neither a number from "
         "-2147483648 to 2147483647 nor one of NOOP, CLICK, THUD, SPIN, QUICK_RISE, SLOW_RISE, "
         "QUICK_FALL, LIGHT_TICK, LOW_TICK; usage: vibctl std compose DELAY_MS,PRIMITIVE,SCALE... "
         "[--callback]\n"},
        {"CompositionScale", "std compose 0,CLICK, --callback",
         "vibctl: std compose: packet \"0,CLICK,\": SCALE \"\" is not a number a float can hold "
         "(nor nan, inf, -inf); usage: vibctl std compose DELAY_MS,PRIMITIVE,SCALE... "
         "[--callback]\n"},
        {"PwleKind", "std composePwle pause,100 --callback",
         "vibctl: std composePwle: packet \"pause,100\": begins with neither active nor brake; "
         "usage: vibctl std composePwle SEGMENT... [--callback]\n"},
        {"PwleField", "std composePwle brake,CLAB",
         "vibctl: std composePwle: packet \"brake,CLAB\": 1 field where 2 are wanted: "
         "BRAKING,DURATION_MS; usage: vibctl std composePwle SEGMENT... [--callback]\n"},
        {"CallbackOfAQuery", "std getPrimitiveDuration CLICK --callback",
         "vibctl: std getPrimitiveDuration: takes no --callback, unlike on, perform, compose, "
         "composePwle; usage: vibctl std getPrimitiveDuration PRIMITIVE\n"},
        {"WaitWithoutSeconds", "std compose 0,CLICK,1 --callback --wait",
         "vibctl: --wait needs a number of seconds\n"},
        {"ArgumentOfDoctor", "doctor quickly",
         "vibctl: doctor takes no arguments; usage: vibctl [--json] doctor\n"},
        {"ArgumentOfList", "list all",
         "vibctl: list takes no arguments; usage: vibctl [--json] list\n"},
};

INSTANTIATE_TEST_SUITE_P(Program, WrongUsageOf, ::testing::ValuesIn(kWrongUsages),
                         [](const auto& usage) { return usage.param.name; });

TEST(Program, WithoutABinderDeviceSaysSoWithStatus3) {
    if (access("/dev/binder", F_OK) == 0) GTEST_SKIP() << "this machine has a binder device";
    for (const char* arguments : {"list", "std on -1", "ext setAmplitude -1", "--json std off"}) {
        const CommandResult result = run(arguments);
        EXPECT_EQ(result.status, 3) << arguments;
        EXPECT_EQ(result.out, "") << arguments;
        EXPECT_EQ(result.err, "vibctl: cannot open /dev/binder: No such file or directory\n")
                << arguments;
    }
}

TEST(Program, DoctorWithoutABinderDeviceSaysSoAndGoesOn) {
    if (access("/dev/binder", F_OK) == 0) GTEST_SKIP() << "this machine has a binder device";
    const CommandResult result = run("doctor");
    EXPECT_EQ(result.status, 1);
    EXPECT_THAT(result.out, StartsWith("bad      binder: cannot open /dev/binder: No such file or "
                                       "directory; next: load the kernel's binder driver"));
    EXPECT_THAT(result.out, HasSubstr("\nskipped  extension: needs the registered service\n"));
    EXPECT_EQ(result.err, "");
}

}  // namespace
