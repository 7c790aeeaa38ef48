// SPDX-License-Identifier: Apache-2.0
//
// Which users a file of rules lets register, and what is said about a file that is wrong.
#include "platform/servicemanager/registration_rules.h"

#include <string>
#include <vector>

#include <android-base/file.h>
#include <gtest/gtest.h>

namespace servicemanager {
namespace {

constexpr const char* kVibratorInstance = "android.hardware.vibrator.IVibrator/default";

class RulesTest : public ::testing::Test {
  protected:
    android::base::Result<RegistrationRules> load(const std::string& content) {
        EXPECT_TRUE(android::base::WriteStringToFile(content, mFile.path));
        return RegistrationRules::load(mFile.path);
    }

    // What loading says, from behind the file's name.
    std::string errorOf(const std::string& content) {
        const auto rules = load(content);
        if (rules.ok()) return "no error";
        const std::string error = rules.error().message();
        EXPECT_EQ(error.substr(0, std::string(mFile.path).size()), mFile.path);
        return error.substr(std::string(mFile.path).size());
    }

    TemporaryFile mFile;
};

TEST_F(RulesTest, WithoutARuleRootAloneRegisters) {
    const RegistrationRules rules;
    EXPECT_TRUE(rules.mayRegister(0, kVibratorInstance));
    EXPECT_FALSE(rules.mayRegister(1000, kVibratorInstance));
}

TEST_F(RulesTest, ARuleIsForOneUserAndOneName) {
    const auto rules = load("android.hardware.vibrator.IVibrator/default 1000\n");
    ASSERT_TRUE(rules.ok());
    EXPECT_TRUE(rules->mayRegister(1000, kVibratorInstance));
    EXPECT_TRUE(rules->mayRegister(0, kVibratorInstance));
    EXPECT_FALSE(rules->mayRegister(1001, kVibratorInstance));
    EXPECT_FALSE(rules->mayRegister(1000, "android.hardware.vibrator.IVibrator/defaul"));
    EXPECT_FALSE(rules->mayRegister(1000, "android.hardware.vibrator.IVibrator/default2"));
}

TEST_F(RulesTest, CommentsSpacesAndSeveralUsersOfANameAreFine) {
    const auto rules = load("# who\n\n \t foo\t1000  # the system\nfoo daemon\r\nbar 2000");
    ASSERT_TRUE(rules.ok());
    EXPECT_TRUE(rules->mayRegister(1000, "foo"));
    EXPECT_TRUE(rules->mayRegister(1, "foo")) << "Debian's daemon";
    EXPECT_TRUE(rules->mayRegister(2000, "bar"));
    EXPECT_FALSE(rules->mayRegister(2000, "foo"));
}

TEST_F(RulesTest, AnErrorNamesTheLineAndWhatIsAccepted) {
    EXPECT_EQ(errorOf("# x\nfoo\n"), ": line 2: a rule is NAME USER [PROGRAM ARGUMENT...]");
    EXPECT_EQ(errorOf("foo 1 2\n"), ": line 1: \"2\" is no program: a path from / on");
    EXPECT_EQ(errorOf("foo 1 /bin/a\nfoo 2 /bin/b\n"),
              ": line 2: \"foo\" has a program already: one for each name");
    EXPECT_EQ(errorOf("foo 1\nb@r 1\n"),
              ": line 2: \"b@r\" is no service's name: 1 to 127 of a-z A-Z 0-9 _ - . /");
    EXPECT_EQ(errorOf("foo no-such-user\n"),
              ": line 1: no user \"no-such-user\": a user's name or number");
    EXPECT_EQ(errorOf("foo -1\n"), ": line 1: no user \"-1\": a user's name or number");
    EXPECT_EQ(errorOf("foo 10000\n"),
              ": line 1: user 10000 is an app, which may not register: numbers below 10000");
}

TEST_F(RulesTest, AProgramIsForOneName) {
    const auto rules = load("foo 1000 /bin/serve -x  y # what\nfoo 2000\nbar 1000\n");
    ASSERT_TRUE(rules.ok());
    EXPECT_TRUE(rules->mayRegister(1000, "foo"));
    const StartCommand* const command = rules->commandFor("foo");
    ASSERT_NE(command, nullptr);
    EXPECT_EQ(command->user, 1000u);
    EXPECT_EQ(command->words, (std::vector<std::string>{"/bin/serve", "-x", "y"}));
    EXPECT_EQ(rules->commandFor("bar"), nullptr);
}

TEST_F(RulesTest, AFileThatCannotBeReadIsAnError) {
    const auto rules = RegistrationRules::load("/no/such/file");
    ASSERT_FALSE(rules.ok());
    EXPECT_EQ(rules.error().message(), "/no/such/file: No such file or directory");
}

}  // namespace
}  // namespace servicemanager
