// SPDX-License-Identifier: Apache-2.0
//
// The program itself: what it prints where, and its exit status, on a machine without a service.
#include <unistd.h>

#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/command.h"

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
    EXPECT_EQ(run("help std on").out, run("std on --help").out);
    EXPECT_EQ(run("help ext").out, run("ext --help").out);
    EXPECT_EQ(run("doctor --help").out, run("help").out);
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
        {"NoCommand", "",
         "vibctl: no command given; there are std, ext, info, dump, raw, play, session, list, "
         "doctor and help\n"},
        {"Command", "foo",
         "vibctl: unknown command \"foo\"; there are std, ext, info, dump, raw, play, session, "
         "list, doctor and help\n"},
        {"Option", "--jsno list",
         "vibctl: unknown option \"--jsno\"; there are --json, --timeout SECONDS, --wait SECONDS, "
         "--callback, --off-on-interrupt, --amplitudes A,..., --repeat COUNT, --explain, --help, "
         "--version\n"},
        {"Wait", "--wait never std off",
         "vibctl: --wait \"never\" is not a number of seconds from 0 to 86400\n"},
        {"Method", "std preform CLICK STRONG",
         "vibctl: std: unknown method \"preform\"; did you mean perform\n"},
        {"Number", "std on 1.5",
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
         "vibctl: --wait needs its SECONDS\n"},
        {"ArgumentOfDoctor", "doctor quickly",
         "vibctl: doctor takes no arguments; usage: vibctl [--json] doctor\n"},
        {"ArgumentOfList", "list all",
         "vibctl: list takes no arguments; usage: vibctl [--json] list\n"},
        {"ArgumentOfInfo", "info all",
         "vibctl: info takes no arguments; usage: vibctl [--json] info\n"},
        {"SecondArgumentOfDump", "dump std ext",
         "vibctl: dump takes fewer arguments; usage: vibctl [--json] dump [std|ext]\n"},
        {"InterfaceOfDump", "dump all", "vibctl: dump: interface \"all\" is neither std nor ext\n"},
        {"InterfaceOfRaw", "raw 5", "vibctl: raw: interface \"5\" is neither std nor ext\n"},
        {"NothingToPlay", "play", "vibctl: play needs steps or a file; see vibctl help\n"},
        {"StepOfPlay", "play 0 ten",
         "vibctl: play: step \"ten\" is not an integer from 0 to 600000\n"},
        {"FileOfPlay", "play missing.ahap",
         "vibctl: play: cannot read \"missing.ahap\": No such file or directory\n"},
        {"SequenceOfPlay", "play - </dev/null", "vibctl: -: no call in it\n"},
        {"RepeatOfPlay", "play 5 --repeat 0",
         "vibctl: --repeat \"0\" is not an integer from 1 to 1000\n"},
        {"CodeOfRaw", "raw std on",
         "vibctl: raw: CODE \"on\" is not an integer from 0 to 4294967295; usage: vibctl raw "
         "std|ext CODE [HEX]\n"},
        {"BytesOfRaw", "raw ext 5 0102",
         "vibctl: raw: HEX \"0102\" is not eight hexadecimal digits for each 32-bit word; usage: "
         "vibctl raw std|ext CODE [HEX]\n"},
        {"DigitsOfRaw", "raw ext 5 0102030g",
         "vibctl: raw: HEX \"0102030g\" is not eight hexadecimal digits for each 32-bit word; "
         "usage: vibctl raw std|ext CODE [HEX]\n"},
        {"Timeout", "--timeout soon list",
         "vibctl: --timeout \"soon\" is not a number of seconds from 0 to 86400\n"},
        {"OptionOfAnotherCommand", "list --callback",
         "vibctl: list takes no --callback, unlike std, ext\n"},
        {"WordToExplain", "help preform",
         "vibctl: unknown command \"preform\"; there are std, ext, info, dump, raw, play, session, "
         "list, doctor and help\n"},
        {"MoreToExplain", "help std on now",
         "vibctl: help takes fewer words; usage: vibctl help [std|ext [METHOD]]\n"},
        {"MethodToExplain", "help std preform",
         "vibctl: std: unknown method \"preform\"; did you mean perform\n"},
};

INSTANTIATE_TEST_SUITE_P(Program, WrongUsageOf, ::testing::ValuesIn(kWrongUsages),
                         [](const auto& usage) { return usage.param.name; });

TEST(Program, WrongUsageIsAnObjectForPrograms) {
    const CommandResult call = run("--json std on 1.5");
    EXPECT_EQ(call.status, 2);
    EXPECT_EQ(call.err, "");
    EXPECT_EQ(
            call.out,
            R"({"iface":"std","method":"on","exception":null,"status":null,"message":"std on: )"
            R"(TIMEOUT_MS \"1.5\" is not an integer from -2147483648 to 2147483647; usage: vibctl )"
            R"(std on TIMEOUT_MS [--callback]","result":null,"callback":null,"us":0,"name":null,)"
            R"("text":"std on: TIMEOUT_MS \"1.5\" is not an integer from -2147483648 to )"
            R"(2147483647; usage: vibctl std on TIMEOUT_MS [--callback]"})"
            "\n");
    for (const char* arguments : {"--json", "--bogus --json", "foo --json", "list all --json"}) {
        const CommandResult result = run(arguments);
        EXPECT_EQ(result.status, 2) << arguments;
        EXPECT_EQ(result.err, "") << arguments;
        EXPECT_THAT(result.out, StartsWith(R"({"iface":)")) << arguments;
        EXPECT_THAT(result.out, HasSubstr(R"("exception":null,"status":null,"message":")"));
    }
}

TEST(Program, WithoutABinderDeviceSaysSoWithStatus3) {
    if (access("/dev/binder", F_OK) == 0) GTEST_SKIP() << "this machine has a binder device";
    for (const char* arguments :
         {"list", "std on -1", "ext setAmplitude -1", "info", "dump", "raw std 1"}) {
        const CommandResult result = run(arguments);
        EXPECT_EQ(result.status, 3) << arguments;
        EXPECT_EQ(result.out, "") << arguments;
        EXPECT_EQ(result.err,
                  "vibctl: cannot open /dev/binder: No such file or directory; see vibctl doctor\n")
                << arguments;
    }
    const CommandResult json = run("--json std off");
    EXPECT_EQ(json.status, 3);
    EXPECT_EQ(json.err, "");
    EXPECT_EQ(
            json.out,
            R"({"iface":"std","method":"off","exception":-129,"status":-2,"message":"cannot open )"
            R"(/dev/binder: No such file or directory","result":null,"callback":null,"us":0,)"
            R"("name":"EX_TRANSACTION_FAILED","text":"cannot open /dev/binder: No such file or )"
            R"(directory; see vibctl doctor"})"
            "\n");
}

TEST(Program, DoctorWithoutABinderDeviceSaysSoAndGoesOn) {
    if (access("/dev/binder", F_OK) == 0) GTEST_SKIP() << "this machine has a binder device";
    const CommandResult result = run("doctor");
    EXPECT_EQ(result.status, 1);
    EXPECT_THAT(result.out, StartsWith("bad  binder: there is no /dev/binder; next: modprobe "
                                       "binder_linux devices=binder\n"));
    EXPECT_THAT(result.out, HasSubstr("\nskip extension: needs the registered service\n"));
    EXPECT_THAT(result.out, ::testing::EndsWith(" problems; first: binder\n"));
    EXPECT_EQ(result.err, "");
}

}  // namespace
