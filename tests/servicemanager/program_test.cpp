// SPDX-License-Identifier: Apache-2.0
//
// The program itself on a machine where it cannot serve: one line, and the right exit status.
#include <sys/wait.h>

#include <array>
#include <cstdio>
#include <string>

#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace {

struct Execution {
    int status;
    std::string output;  ///< of both streams
};

Execution run(const std::string& arguments) {
    const std::string command = std::string(SERVICEMANAGER_COMMAND) + " " + arguments + " 2>&1";
    Execution result{};
    FILE* pipe = popen(command.c_str(), "r");
    std::array<char, 4096> buffer{};
    for (size_t count = 0; (count = fread(buffer.data(), 1, buffer.size(), pipe)) > 0;) {
        result.output.append(buffer.data(), count);
    }
    const int status = pclose(pipe);
    result.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    return result;
}

TEST(Program, HelpSucceeds) {
    const Execution result = run("--help");
    EXPECT_EQ(result.status, 0);
    EXPECT_THAT(result.output, ::testing::HasSubstr("--root DIR"));
}

TEST(Program, WrongUsageGetsOneLineAndStatus2) {
    EXPECT_EQ(run("--root").status, 2);
    const Execution folder = run("--root /no/such/folder");
    EXPECT_EQ(folder.status, 2);
    EXPECT_EQ(folder.output,
              "servicemanager: --root: Directory does not exist: /no/such/folder; usage: "
              "servicemanager [--root DIR] [--ready-fd N]\n");
    const Execution word = run("now");
    EXPECT_EQ(word.status, 2);
    EXPECT_EQ(word.output,
              "servicemanager: The following argument was not expected: now; usage: "
              "servicemanager [--root DIR] [--ready-fd N]\n");
}

TEST(Program, WithoutABinderDeviceSaysSoWithStatus1) {
    if (access("/dev/binder", F_OK) == 0) GTEST_SKIP() << "this machine has a binder device";
    const Execution result = run("");
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.output,
              "servicemanager: cannot open /dev/binder: No such file or directory\n");
}

}  // namespace
