// SPDX-License-Identifier: Apache-2.0
//
// Reading a profile: what is accepted, and the line each mistake gets.
#include <string>
#include <string_view>

#include <gtest/gtest.h>

#include "handset/driver/profile_reader.h"
#include "handset/driver/tests/test_files.h"

namespace handset {
namespace {

using android::base::Result;

// The line a profile is refused with; "" where it is accepted.
std::string refusal(std::string_view text) {
    const Result<Profile> profile = parseProfile(text);
    return profile ? std::string() : profile.error().message();
}

Profile accepted(std::string_view text) {
    Result<Profile> profile = parseProfile(text);
    EXPECT_TRUE(profile) << profile.error().message();
    return profile ? std::move(*profile) : Profile();
}

TEST(Profile, NothingAtAllIsADeviceWithoutVibrator) {
    const Profile profile = accepted("{}");
    EXPECT_TRUE(profile.nodes.empty());
    EXPECT_TRUE(profile.files.empty());
    EXPECT_TRUE(profile.faults.empty());
    EXPECT_FALSE(profile.motor);
    EXPECT_FALSE(profile.inputDevices);
}

TEST(Profile, EveryFieldIsRead) {
    const Profile profile = accepted(R"({
      "description": "a phone",
      "nodes": { "/sys/class/leds/vibrator/state": {"mode": "rw", "text": "0\n"},
                 "/sys/class/leds/vibrator/kind": {"mode": "ro", "hex": "4142fF", "hold": true},
                 "/sys/class/leds/vibrator/trigger": {"mode": "wo"} },
      "files": { "/efs/FactoryApp/vibrator_calibration": "137\n",
                 "/efs/blob": {"hex": "00"} },
      "motor": { "name": "motor", "event": 7, "effects_max": 4 },
      "input_devices": "N: {event}\n",
      "faults": [ {"node": "motor", "op": "upload", "errno": "ENOSPC", "after": 2, "times": 3} ]
    })");
    EXPECT_EQ(profile.description, "a phone");
    ASSERT_EQ(profile.nodes.size(), 3U);
    const NodeProfile* kind = profile.findNode("/sys/class/leds/vibrator/kind");
    ASSERT_NE(kind, nullptr);
    EXPECT_EQ(kind->access, Access::kReadOnly);
    EXPECT_EQ(kind->text, "AB\xff");
    EXPECT_TRUE(kind->hold);
    const NodeProfile* state = profile.findNode("/sys/class/leds/vibrator/state");
    ASSERT_NE(state, nullptr);
    EXPECT_EQ(state->access, Access::kReadWrite);
    EXPECT_EQ(state->text, "0\n");
    EXPECT_FALSE(state->hold);
    EXPECT_EQ(profile.findNode("/sys/class/leds/vibrator/trigger")->access, Access::kWriteOnly);
    EXPECT_EQ(profile.findNode("/sys/class/leds/vibrator"), nullptr);
    ASSERT_EQ(profile.files.size(), 2U);
    EXPECT_EQ(profile.files[0].path, "/efs/FactoryApp/vibrator_calibration");
    EXPECT_EQ(profile.files[0].text, "137\n");
    EXPECT_EQ(profile.files[1].text, std::string(1, '\0'));
    ASSERT_TRUE(profile.motor);
    EXPECT_EQ(profile.motor->name, "motor");
    EXPECT_EQ(profile.motor->event, 7U);
    EXPECT_EQ(profile.motor->effectsMax, 4U);
    EXPECT_EQ(profile.inputDevices, "N: {event}\n");
    ASSERT_EQ(profile.faults.size(), 1U);
    EXPECT_EQ(profile.faults[0].node, "motor");
    EXPECT_EQ(profile.faults[0].op, FaultOp::kUpload);
    EXPECT_EQ(profile.faults[0].action.error, 28);
    EXPECT_EQ(profile.faults[0].after, 2U);
    EXPECT_EQ(profile.faults[0].times, 3U);
}

TEST(Profile, AMotorHasItsDefaults) {
    const Profile profile = accepted(R"({"motor": {}})");
    ASSERT_TRUE(profile.motor);
    EXPECT_EQ(profile.motor->name, "qvx_vibrator_inputff");
    EXPECT_EQ(profile.motor->event, std::nullopt);
    EXPECT_EQ(profile.motor->effectsMax, 16U);
}

TEST(Profile, NullStandsForAbsent) {
    const Profile profile = accepted(
            R"({"nodes": null, "files": null, "motor": null, "input_devices": null,
                "faults": null})");
    EXPECT_FALSE(profile.motor);
    EXPECT_FALSE(profile.inputDevices);
}

TEST(Profile, BadJsonNamesLineAndColumn) {
    EXPECT_EQ(refusal(""), "line 1, column 1: no valid JSON at the end of the text");
    EXPECT_EQ(refusal("{\n  \"nodes\": {\n    bad\n"),
              "line 3, column 5: no valid JSON at \"bad\"");
    EXPECT_EQ(refusal("{\n  nodes\n}"), "line 2, column 3: no valid JSON at \"nodes\"");
    EXPECT_EQ(refusal("{\"nodes\": nul}"), "line 1, column 11: no valid JSON at \"nul}\"");
    EXPECT_EQ(refusal("{\"description\": \"\xff\"}"),
              "line 1, column 18: no valid JSON at \"?\"}\"");
    EXPECT_EQ(refusal("{} x"), "line 1, column 4: no valid JSON at \"x\"");
}

TEST(Profile, ARepeatedKeyIsRefused) {
    EXPECT_EQ(refusal(R"({"nodes": {"/sys/class/a/b": {"mode": "rw", "mode": "ro"}}})"),
              "the key \"mode\" stands twice in one object");
    EXPECT_EQ(refusal(R"({"nodes": {}, "nodes": {}})"),
              "the key \"nodes\" stands twice in one object");
}

TEST(Profile, UnknownKeysAreRefusedWithWhatIsAccepted) {
    EXPECT_EQ(refusal(R"({"node": {}})"),
              "unknown key \"node\"; accepted: description, nodes, files, motor, input_devices, "
              "faults");
    EXPECT_EQ(refusal(R"({"nodes": {"/sys/class/a/b": {"mode": "rw", "txt": "1"}}})"),
              "nodes[\"/sys/class/a/b\"]: unknown key \"txt\"; accepted: mode, text, hex, hold");
    EXPECT_EQ(refusal(R"({"files": {"/efs/a": {"mode": "rw"}}})"),
              "files[\"/efs/a\"]: unknown key \"mode\"; accepted: text, hex");
    EXPECT_EQ(refusal(R"({"motor": {"events": 1}})"),
              "motor: unknown key \"events\"; accepted: name, event, effects_max");
}

TEST(Profile, WrongKindsAreNamed) {
    EXPECT_EQ(refusal("[]"), "the whole: an object expected, not an array");
    EXPECT_EQ(refusal(R"({"description": 1})"),
              "description: a string expected, not a whole number");
    EXPECT_EQ(refusal(R"({"nodes": []})"), "nodes: an object expected, not an array");
    EXPECT_EQ(refusal(R"({"nodes": {"/sys/class/a/b": "0"}})"),
              "nodes[\"/sys/class/a/b\"]: an object expected, not a string");
    EXPECT_EQ(refusal(R"({"nodes": {"/sys/class/a/b": {"mode": "rw", "text": 0}}})"),
              "nodes[\"/sys/class/a/b\"].text: a string expected, not a whole number");
    EXPECT_EQ(refusal(R"({"nodes": {"/sys/class/a/b": {"mode": "rw", "hold": "yes"}}})"),
              "nodes[\"/sys/class/a/b\"].hold: true or false expected, not a string");
    EXPECT_EQ(refusal(R"({"files": 1.5})"), "files: an object expected, not a fraction");
    EXPECT_EQ(
            refusal(R"({"files": {"/efs/a": true}})"),
            "files[\"/efs/a\"]: a string, or an object with text or hex, expected, not a boolean");
    EXPECT_EQ(refusal(R"({"motor": true})"), "motor: an object expected, not a boolean");
    EXPECT_EQ(refusal(R"({"input_devices": {}})"),
              "input_devices: a string or null expected, not an object");
    EXPECT_EQ(refusal(R"({"faults": {}})"), "faults: an array expected, not an object");
}

TEST(Profile, WhatIsQuotedStaysOnTheLine) {
    EXPECT_EQ(refusal(R"({"nodes": {"/sys/class/a\nb": 3}})"),
              R"(nodes["/sys/class/a?b"]: an object expected, not a whole number)");
}

TEST(Profile, ModesAreThree) {
    EXPECT_EQ(refusal(R"({"nodes": {"/sys/class/a/b": {"mode": "rx"}}})"),
              "nodes[\"/sys/class/a/b\"].mode: \"rx\" unknown; accepted: rw, ro, wo");
    EXPECT_EQ(refusal(R"({"nodes": {"/sys/class/a/b": {"text": "1"}}})"),
              "nodes[\"/sys/class/a/b\"].mode: missing; accepted: rw, ro, wo");
}

TEST(Profile, TextAndHexExcludeEachOther) {
    EXPECT_EQ(refusal(R"({"nodes": {"/sys/class/a/b": {"mode": "rw", "text": "", "hex": ""}}})"),
              "nodes[\"/sys/class/a/b\"]: text and hex exclude each other");
}

TEST(Profile, HexIsPairsOfDigits) {
    EXPECT_EQ(refusal(R"({"nodes": {"/sys/class/a/b": {"mode": "rw", "hex": "abc"}}})"),
              "nodes[\"/sys/class/a/b\"].hex: pairs of hexadecimal digits expected, not \"abc\"");
    EXPECT_EQ(refusal(R"({"nodes": {"/sys/class/a/b": {"mode": "rw", "hex": "0g"}}})"),
              "nodes[\"/sys/class/a/b\"].hex: pairs of hexadecimal digits expected, not \"0g\"");
}

TEST(Profile, NodesLieBelowSysClass) {
    EXPECT_EQ(refusal(R"({"nodes": {"/sys/kernel/a": {"mode": "rw"}}})"),
              "nodes[\"/sys/kernel/a\"]: nodes lie below /sys/class/; plain files go under "
              "\"files\"");
    EXPECT_EQ(refusal(R"({"nodes": {"/sys/classes/a": {"mode": "rw"}}})"),
              "nodes[\"/sys/classes/a\"]: nodes lie below /sys/class/; plain files go under "
              "\"files\"");
}

TEST(Profile, PathsAreSpelledPlainly) {
    for (const char* path : {"", "/", "sys/class/a", "/sys/class/a/", "/sys/class//a",
                             "/sys/class/./a", "/sys/class/../a"}) {
        EXPECT_EQ(refusal(std::string(R"({"nodes": {")") + path + R"(": {"mode": "rw"}}})"),
                  std::string("nodes[\"") + path +
                          "\"]: an absolute path without empty, \".\" or \"..\" parts expected");
    }
}

TEST(Profile, AFileIsNoDirectory) {
    EXPECT_EQ(refusal(R"({"nodes": {"/sys/class/a": {"mode": "rw"},
                                    "/sys/class/a/b": {"mode": "rw"}}})"),
              "nodes: \"/sys/class/a\" is a file, so \"/sys/class/a/b\" cannot lie below it");
    EXPECT_EQ(refusal(R"({"files": {"/efs": "", "/efs/a": ""}})"),
              "files: \"/efs\" is a file, so \"/efs/a\" cannot lie below it");
}

TEST(Profile, PlainFilesStayOutOfTheKernelsDirectories) {
    EXPECT_EQ(refusal(R"({"files": {"/proc/a": ""}})"),
              "files[\"/proc/a\"]: plain files do not lie below /proc");
    EXPECT_EQ(refusal(R"({"files": {"/sys/class/a": ""}})"),
              "files[\"/sys/class/a\"]: plain files do not lie below /sys");
    EXPECT_EQ(refusal(R"({"files": {"/dev": ""}})"),
              "files[\"/dev\"]: plain files do not lie below /dev");
}

TEST(Profile, TheMotorsNumbersAreBounded) {
    EXPECT_EQ(refusal(R"({"motor": {"event": 1024}})"),
              "motor.event: a whole number from 0 to 1023 expected, not 1024");
    EXPECT_EQ(refusal(R"({"motor": {"event": -1}})"),
              "motor.event: a whole number from 0 to 1023 expected, not -1");
    EXPECT_EQ(refusal(R"({"motor": {"event": "1"}})"),
              "motor.event: a whole number from 0 to 1023 expected, not \"1\"");
    EXPECT_EQ(refusal(R"({"motor": {"effects_max": 0}})"),
              "motor.effects_max: a whole number from 1 to 96 expected, not 0");
    EXPECT_EQ(refusal(R"({"motor": {"effects_max": 97}})"),
              "motor.effects_max: a whole number from 1 to 96 expected, not 97");
    EXPECT_EQ(refusal(R"({"motor": {"effects_max": 1.5}})"),
              "motor.effects_max: a whole number from 1 to 96 expected, not 1.5");
}

TEST(Profile, TheMotorsNameIsOneLine) {
    EXPECT_EQ(refusal(R"({"motor": {"name": ""}})"), "motor.name: a string of one line expected");
    EXPECT_EQ(refusal(R"({"motor": {"name": "a\nb"}})"),
              "motor.name: a string of one line expected");
}

TEST(Profile, AnEventMarkNeedsAMotor) {
    EXPECT_EQ(refusal(R"({"input_devices": "event{event}"})"),
              "input_devices: {event} needs a motor, and the profile has none");
    EXPECT_EQ(refusal(R"({"input_devices": "event7"})"), "");
}

TEST(Profile, AFileThatCannotBeReadIsNamed) {
    EXPECT_EQ(readProfile("/tmp/no-such-profile.json").error().message(),
              "/tmp/no-such-profile.json: No such file or directory");
    EXPECT_EQ(readProfile("/tmp").error().message(), "/tmp: Is a directory");
    EXPECT_EQ(readProfile("/dev/zero").error().message(), "/dev/zero: larger than 1 MiB");
}

TEST(Profile, AMistakeInAFileNamesTheFile) {
    const TemporaryDir directory;
    std::ofstream(fileIn(directory, "p.json")) << "{\"nodes\": 1}";
    EXPECT_EQ(readProfile(fileIn(directory, "p.json")).error().message(),
              fileIn(directory, "p.json") + ": nodes: an object expected, not a whole number");
}

class BuiltInProfile : public testing::TestWithParam<const char*> {};

TEST_P(BuiltInProfile, IsAccepted) {
    const Result<Profile> profile =
            readProfile(std::string(QVX_PROFILE_DIRECTORY "/") + GetParam() + ".json");
    ASSERT_TRUE(profile) << profile.error().message();
    EXPECT_FALSE(profile->description.empty());
    EXPECT_TRUE(profile->faults.empty());
}

INSTANTIATE_TEST_SUITE_P(Profiles, BuiltInProfile, testing::Values("legacy", "leds", "ff", "none"),
                         [](const auto& tested) { return std::string(tested.param); });

}  // namespace
}  // namespace handset
