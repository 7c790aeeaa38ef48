// SPDX-License-Identifier: Apache-2.0
//
// Which names are accepted, and how names are split.
#include "platform/servicemanager/service_name.h"

#include <string>

#include <gtest/gtest.h>

namespace servicemanager {
namespace {

TEST(ServiceName, AcceptsEveryPermittedCharacter) {
    EXPECT_TRUE(isValidServiceName("abcdefghijklmnopqrstuvwxyz"));
    EXPECT_TRUE(isValidServiceName("ABCDEFGHIJKLMNOPQRSTUVWXYZ"));
    EXPECT_TRUE(isValidServiceName("0123456789"));
    EXPECT_TRUE(isValidServiceName("_-./"));
    EXPECT_TRUE(isValidServiceName("android.hardware.vibrator.IVibrator/default"));
}

TEST(ServiceName, RefusesEveryOtherByte) {
    const std::string permitted =
            "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789_-./";
    int refused = 0;
    for (int byte = 0; byte < 256; ++byte) {
        const char character = static_cast<char>(byte);
        if (permitted.find(character) != std::string::npos) continue;
        EXPECT_FALSE(isValidServiceName(std::string("a") + character + "b")) << byte;
        ++refused;
    }
    EXPECT_EQ(refused, 190);
}

TEST(ServiceName, IsOneTo127CharactersLong) {
    EXPECT_FALSE(isValidServiceName(""));
    EXPECT_TRUE(isValidServiceName("a"));
    EXPECT_TRUE(isValidServiceName(std::string(127, 'a')));
    EXPECT_FALSE(isValidServiceName(std::string(128, 'a')));
}

TEST(InstanceName, SplitsAtTheFirstSlashAndTheLastDotBeforeIt) {
    const auto name = parseInstanceName("android.hardware.vibrator.IVibrator/default");
    ASSERT_TRUE(name);
    EXPECT_EQ(name->interface.package, "android.hardware.vibrator");
    EXPECT_EQ(name->interface.name, "IVibrator");
    EXPECT_EQ(name->instance, "default");
}

TEST(InstanceName, KeepsLaterSlashesAndDotsInTheInstance) {
    const auto name = parseInstanceName("a.IFoo/left/x.y");
    ASSERT_TRUE(name);
    EXPECT_EQ(name->interface.package, "a");
    EXPECT_EQ(name->interface.name, "IFoo");
    EXPECT_EQ(name->instance, "left/x.y");
}

TEST(InstanceName, NeedsASlashAndADotBeforeIt) {
    EXPECT_FALSE(parseInstanceName("android.hardware.vibrator.IVibrator"));
    EXPECT_FALSE(parseInstanceName("IVibrator/default"));
    EXPECT_FALSE(parseInstanceName("IVibrator/a.b"));
    EXPECT_FALSE(parseInstanceName("manager"));
    EXPECT_FALSE(parseInstanceName(""));
}

TEST(InterfaceName, SplitsAtTheLastDot) {
    const auto name = parseInterfaceName("a.b.IFoo");
    ASSERT_TRUE(name);
    EXPECT_EQ(name->package, "a.b");
    EXPECT_EQ(name->name, "IFoo");
    EXPECT_FALSE(parseInterfaceName("IFoo"));
}

}  // namespace
}  // namespace servicemanager
