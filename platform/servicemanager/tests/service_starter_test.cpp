// SPDX-License-Identifier: Apache-2.0
//
// Services started on request: one process at a time, and not too often.
#include "platform/servicemanager/service_starter.h"

#include <unistd.h>

#include <string>

#include <android-base/file.h>
#include <gtest/gtest.h>

#include "tests/support/process.h"

namespace servicemanager {
namespace {

using qvx::test::eventually;

class StarterTest : public ::testing::Test {
  protected:
    // A service that notes its start and its end, and ends when it is let go.
    StartCommand service() const {
        const std::string script =
                "echo start >>$0/log; while ! [ -e $0/go ]; do sleep 0.01; done; "
                "echo end >>$0/log";
        return {geteuid(), {"/bin/sh", "-c", script, mDirectory.path}};
    }

    void letGo() const {
        EXPECT_TRUE(android::base::WriteStringToFile("", std::string(mDirectory.path) + "/go"));
    }

    bool hasLogged(const std::string& lines) const {
        std::string log;
        android::base::ReadFileToString(std::string(mDirectory.path) + "/log", &log);
        return log == lines;
    }

    TemporaryDir mDirectory;
};

TEST_F(StarterTest, AServiceThatRunsIsNotStartedAgain) {
    ServiceStarter starter(std::chrono::seconds(0));
    EXPECT_EQ(*starter.start("foo", service()), true);
    EXPECT_TRUE(eventually([&] { return hasLogged("start\n"); }));
    EXPECT_EQ(*starter.start("foo", service()), false);
    EXPECT_EQ(*starter.start("foo", service()), false);
    letGo();
    EXPECT_TRUE(eventually([&] { return hasLogged("start\nend\n"); }));
    EXPECT_TRUE(eventually([&] { return *starter.start("foo", service()); }));
    EXPECT_TRUE(eventually([&] { return hasLogged("start\nend\nstart\nend\n"); }));
}

TEST_F(StarterTest, AServiceThatHasEndedIsNotStartedAgainWithinThePeriod) {
    letGo();
    ServiceStarter starter(std::chrono::hours(1));
    EXPECT_EQ(*starter.start("foo", service()), true);
    EXPECT_TRUE(eventually([&] { return hasLogged("start\nend\n"); }));
    EXPECT_EQ(*starter.start("foo", service()), false);
    EXPECT_EQ(*starter.start("bar", service()), true) << "each name has a period of its own";
    EXPECT_TRUE(eventually([&] { return hasLogged("start\nend\nstart\nend\n"); }));
}

TEST_F(StarterTest, AProgramThatIsNotThereHarmsNobody) {
    ServiceStarter starter;
    EXPECT_EQ(*starter.start("foo", {geteuid(), {"/no/such/program"}}), true);
    EXPECT_EQ(*starter.start("foo", {geteuid(), {"/no/such/program"}}), false);
}

}  // namespace
}  // namespace servicemanager
