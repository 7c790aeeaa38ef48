// SPDX-License-Identifier: Apache-2.0
//
// Reading faults: what is accepted, and the line each mistake gets.
#include <cerrno>
#include <string>

#include <gtest/gtest.h>

#include "handset/driver/profile_reader.h"

namespace handset {
namespace {

using android::base::Result;

// A profile with one node, one motor and one fault with these fields.
std::string profileWith(const std::string& fault) {
    return R"({"nodes": {"/sys/class/a/b": {"mode": "rw"}}, "motor": {}, "faults": [)" + fault +
           "]}";
}

std::string refusalOfFault(const std::string& fault) {
    const Result<Profile> profile = parseProfile(profileWith(fault));
    return profile ? std::string() : profile.error().message();
}

Fault acceptedFault(const std::string& fault) {
    const Result<Profile> profile = parseProfile(profileWith(fault));
    EXPECT_TRUE(profile) << profile.error().message();
    return profile ? profile->faults.at(0) : Fault();
}

TEST(ProfileFaults, AnErrorIsGivenByName) {
    const Fault fault =
            acceptedFault(R"({"node": "/sys/class/a/b", "op": "write", "errno": "EIO"})");
    EXPECT_EQ(fault.node, "/sys/class/a/b");
    EXPECT_EQ(fault.op, FaultOp::kWrite);
    EXPECT_EQ(fault.action.error, EIO);
    EXPECT_EQ(fault.action.shortCount, std::nullopt);
    EXPECT_EQ(fault.after, 0U);
    EXPECT_EQ(fault.times, 0U);
}

TEST(ProfileFaults, AShortCountMayBeNothing) {
    EXPECT_EQ(acceptedFault(R"({"node": "/sys/class/a/b", "op": "read", "short": 0})")
                      .action.shortCount,
              0U);
}

TEST(ProfileFaults, ADelayMayComeBeforeAnError) {
    const Fault fault = acceptedFault(
            R"({"node": "motor", "op": "erase", "delay": 250, "errno": "EIO", "after": 1})");
    EXPECT_EQ(fault.action.delay.count(), 250);
    EXPECT_EQ(fault.action.error, EIO);
    EXPECT_EQ(fault.after, 1U);
}

TEST(ProfileFaults, AnUnplugStandsAlone) {
    EXPECT_TRUE(
            acceptedFault(R"({"node": "motor", "op": "upload", "unplug": true})").action.unplug);
}

TEST(ProfileFaults, TheNodeExists) {
    EXPECT_EQ(refusalOfFault(R"({"op": "write", "errno": "EIO"})"),
              "faults[0].node: missing; accepted: a node's path, or motor");
    EXPECT_EQ(refusalOfFault(R"({"node": "/sys/class/a", "op": "write", "errno": "EIO"})"),
              "faults[0].node: the profile has no node \"/sys/class/a\"");
    EXPECT_EQ(parseProfile(R"({"faults": [{"node": "motor", "op": "open", "errno": "EIO"}]})")
                      .error()
                      .message(),
              "faults[0].node: the profile has no motor");
}

TEST(ProfileFaults, TheCallSuitsTheNode) {
    EXPECT_EQ(refusalOfFault(R"({"node": "/sys/class/a/b", "errno": "EIO"})"),
              "faults[0].op: missing; accepted: open, read, write, upload, erase");
    EXPECT_EQ(refusalOfFault(R"({"node": "/sys/class/a/b", "op": "upload", "errno": "EIO"})"),
              "faults[0].op: \"upload\" unknown; accepted: open, read, write");
    EXPECT_EQ(refusalOfFault(R"({"node": "motor", "op": "read", "errno": "EIO"})"),
              "faults[0].op: \"read\" unknown; accepted: open, write, upload, erase");
}

TEST(ProfileFaults, ErrorsAreNames) {
    EXPECT_EQ(refusalOfFault(R"({"node": "/sys/class/a/b", "op": "write", "errno": "EFOO"})"),
              "faults[0].errno: \"EFOO\" unknown; accepted: an error's name, such as EIO, EINTR, "
              "EACCES");
    EXPECT_EQ(refusalOfFault(R"({"node": "/sys/class/a/b", "op": "write", "errno": 5})"),
              "faults[0].errno: a string expected, not a whole number");
}

TEST(ProfileFaults, OnlyATransferCanBeShort) {
    EXPECT_EQ(refusalOfFault(R"({"node": "/sys/class/a/b", "op": "open", "short": 1})"),
              "faults[0].short: only a read or write can be short");
    EXPECT_EQ(refusalOfFault(
                      R"({"node": "/sys/class/a/b", "op": "write", "short": 1, "errno": "EIO"})"),
              "faults[0]: errno and short exclude each other");
    EXPECT_EQ(refusalOfFault(R"({"node": "/sys/class/a/b", "op": "write", "short": -1})"),
              "faults[0].short: a whole number of bytes from 0 to 2147483647 expected, not -1");
}

TEST(ProfileFaults, DelaysAreBounded) {
    EXPECT_EQ(refusalOfFault(R"({"node": "/sys/class/a/b", "op": "write", "delay": 600001})"),
              "faults[0].delay: a whole number of milliseconds from 0 to 600000 expected, not "
              "600001");
}

TEST(ProfileFaults, SomethingGoesWrong) {
    EXPECT_EQ(refusalOfFault(R"({"node": "/sys/class/a/b", "op": "write"})"),
              "faults[0]: nothing goes wrong; give one of errno, short, delay, unplug, text, hex");
    EXPECT_EQ(refusalOfFault(R"({"node": "/sys/class/a/b", "op": "write", "unplug": false})"),
              "faults[0]: nothing goes wrong; give one of errno, short, delay, unplug, text, hex");
}

TEST(ProfileFaults, CountsAreWholeNumbers) {
    EXPECT_EQ(refusalOfFault(
                      R"({"node": "/sys/class/a/b", "op": "write", "errno": "EIO", "times": -1})"),
              "faults[0].times: a whole number of calls from 0 to 4294967295 expected, not -1");
    EXPECT_EQ(refusalOfFault(
                      R"({"node": "/sys/class/a/b", "op": "write", "errno": "EIO", "after": "1"})"),
              "faults[0].after: a whole number of calls from 0 to 4294967295 expected, not \"1\"");
}

TEST(ProfileFaults, UnknownKeysAreRefused) {
    EXPECT_EQ(refusalOfFault(R"({"node": "/sys/class/a/b", "op": "write", "error": "EIO"})"),
              "faults[0]: unknown key \"error\"; accepted: node, op, errno, short, delay, unplug, "
              "text, hex, after, times, every");
    EXPECT_EQ(refusalOfFault(R"("EIO")"), "faults[0]: an object expected, not a string");
}

TEST(ProfileFaults, TheMistakenOneIsCounted) {
    EXPECT_EQ(refusalOfFault(R"({"node": "/sys/class/a/b", "op": "write", "errno": "EIO"},
                         {"node": "/sys/class/a/b", "op": "write", "errno": "EFOO"})"),
              "faults[1].errno: \"EFOO\" unknown; accepted: an error's name, such as EIO, EINTR, "
              "EACCES");
}

TEST(ProfileFaults, AFaultAddedLaterIsHeldAgainstTheProfile) {
    const Profile profile = *parseProfile(profileWith(""));
    const Result<Fault> fault =
            parseFault(R"({"node": "/sys/class/a/b", "op": "open", "errno": "EACCES"})", profile);
    ASSERT_TRUE(fault);
    EXPECT_EQ(fault->action.error, EACCES);
    EXPECT_EQ(parseFault(R"({"node": "/sys/class/x", "op": "open", "errno": "EIO"})", profile)
                      .error()
                      .message(),
              "fault.node: the profile has no node \"/sys/class/x\"");
    EXPECT_EQ(parseFault("{]", profile).error().message(),
              "line 1, column 2: no valid JSON at \"]\"");
}

TEST(ProfileFaults, AReadMayShowOtherContents) {
    const Fault fault =
            acceptedFault(R"({"node": "/sys/class/a/b", "op": "read", "hex": "ff0a", "every": 3})");
    EXPECT_EQ(fault.action.text, "\xff\n");
    EXPECT_EQ(fault.every, 3U);
    EXPECT_EQ(refusalOfFault(R"({"node": "/sys/class/a/b", "op": "write", "text": "1"})"),
              "faults[0]: only a read can show other contents");
    EXPECT_EQ(refusalOfFault(
                      R"({"node": "/sys/class/a/b", "op": "read", "text": "1", "errno": "EIO"})"),
              "faults[0]: errno and other contents exclude each other");
    EXPECT_EQ(refusalOfFault(
                      R"({"node": "/sys/class/a/b", "op": "read", "errno": "EIO", "every": 0})"),
              "faults[0].every: a whole number of calls from 1 to 4294967295 expected, not 0");
}

}  // namespace
}  // namespace handset
