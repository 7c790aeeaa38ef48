// SPDX-License-Identifier: Apache-2.0
//
// What happens when the service cannot be registered: it ends with the platform's fatal check, so
// that init restarts it and the crash report names the line.
#include <filesystem>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/phone_control.h"

namespace qvx::test {
namespace {

using testing::HasSubstr;

constexpr int kAborted = 128 + 6;  // SIGABRT
constexpr const char* kRefused =
        "main.cpp:45] Check failed: STATUS_OK == AServiceManager_addService(vibBinder.get(), "
        "instance.c_str())";
constexpr const char* kManifestDirectory = "/vendor/etc/vintf/manifest";

TEST(Registration, StandardServiceIsFoundUnderItsDescriptorAndDefault) {
    const Phone phone("leds");
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    const CommandResult list = runCommand({"vibctl", "list"});
    EXPECT_THAT(list.out, HasSubstr("android.hardware.vibrator.IVibrator/default\n"));
    EXPECT_THAT(list.out, testing::Not(HasSubstr("quorvan")));
}

TEST(Registration, ByAnApplicationUserIsRefusedAndAborts) {
    const Phone phone("none", {"--no-service"});
    const CommandResult second = phone.startService("10123");
    EXPECT_EQ(second.status, kAborted);
    EXPECT_THAT(second.err, HasSubstr(kRefused));
}

TEST(Registration, UndeclaredServiceIsRefusedAndAborts) {
    const Phone phone("none", {"--no-service"});
    for (const auto& fragment : std::filesystem::directory_iterator(kManifestDirectory)) {
        std::filesystem::remove(fragment);
    }
    const CommandResult second = phone.startService("1000");
    EXPECT_EQ(second.status, kAborted);
    EXPECT_THAT(second.err, HasSubstr(kRefused));
}

TEST(Registration, DeadServiceIsDropped) {
    const Phone phone("leds");
    const int pid = phone.servicePid();
    ASSERT_GT(pid, 0);
    runCommand({"kill", "-9", std::to_string(pid)});
    const std::string name = "android.hardware.vibrator.IVibrator/default";
    std::string list = name;
    for (int i = 0; i < 50 && list.find(name) != std::string::npos; ++i) {
        list = runCommand({"vibctl", "list"}).out;
    }
    EXPECT_THAT(list, testing::Not(HasSubstr(name)));
    EXPECT_EQ(runCommand({"vibctl", "std", "off"}).status, 3);
}

}  // namespace
}  // namespace qvx::test
