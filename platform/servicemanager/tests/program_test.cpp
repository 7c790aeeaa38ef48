// SPDX-License-Identifier: Apache-2.0
//
// The program itself on a machine where it cannot serve: one line, and the right exit status.
#include <unistd.h>

#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/command.h"

namespace {

using qvx::test::CommandResult;

// Both of the program's streams are in the result's `out`.
CommandResult run(const std::string& arguments) {
    return qvx::test::runShell(std::string(SERVICEMANAGER_COMMAND) + " " + arguments + " 2>&1");
}

TEST(Program, HelpSucceeds) {
    const CommandResult result = run("--help");
    EXPECT_EQ(result.status, 0);
    EXPECT_THAT(result.out, ::testing::HasSubstr("--root DIR"));
}

TEST(Program, WrongUsageGetsOneLineAndStatus2) {
    EXPECT_EQ(run("--root").status, 2);
    const CommandResult missing = run("--root /no/such/directory");
    EXPECT_EQ(missing.status, 2);
    EXPECT_EQ(missing.out,
              "servicemanager: --root: Directory does not exist: /no/such/directory; usage: "
              "servicemanager [--root DIR] [--rules FILE] [--ready-fd N]\n");
    for (const char* fd : {"-1", "999", "''", "x"}) {
        const CommandResult result = run(std::string("--ready-fd ") + fd);
        EXPECT_EQ(result.status, 2);
        EXPECT_THAT(result.out, ::testing::HasSubstr(" is no open descriptor; usage: ")) << fd;
    }
    const CommandResult lines = run("'a\nb'");
    EXPECT_THAT(lines.out, ::testing::HasSubstr("not expected: a?b; usage: "));
    const CommandResult word = run("now");
    EXPECT_EQ(word.status, 2);
    EXPECT_EQ(word.out,
              "servicemanager: The following argument was not expected: now; usage: "
              "servicemanager [--root DIR] [--rules FILE] [--ready-fd N]\n");
}

TEST(Program, WrongRulesGetOneLineAndStatus2) {
    const CommandResult result = run("--rules /no/such/file");
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.out, "servicemanager: /no/such/file: No such file or directory\n");
    EXPECT_EQ(run("--rules ''").status, 2);
}

TEST(Program, WithoutABinderDeviceSaysSoWithStatus1) {
    if (access("/dev/binder", F_OK) == 0) GTEST_SKIP() << "this machine has a binder device";
    const CommandResult result = run("");
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.out, "servicemanager: cannot open /dev/binder: No such file or directory\n");
}

}  // namespace
