// SPDX-License-Identifier: Apache-2.0
//
// What the kernel module is told of a profile.
#include "handset/driver/kernel_module.h"

#include <gtest/gtest.h>

#include "handset/driver/profile_reader.h"

namespace handset {
namespace {

std::string parametersOf(const char* profile) {
    const auto parameters = moduleParameters(*parseProfile(profile));
    return parameters ? *parameters : "refused: " + parameters.error().message();
}

TEST(ModuleParameters, NameEachNodeWithItsAccessAndItsTextInHexadecimal) {
    EXPECT_EQ(parametersOf(R"({"nodes": {
                  "/sys/class/leds/vibrator/duration": {"mode": "rw", "text": "0\n"},
                  "/sys/class/leds/vibrator/motor_type": {"mode": "rw", "text": "L", "hold": true},
                  "/sys/class/leds/vibrator/num_waves": {"mode": "ro", "hex": "ff"},
                  "/sys/class/leds/vibrator/reset": {"mode": "wo"}}})"),
              "nodes=leds/vibrator/duration:rw:300a,leds/vibrator/motor_type:hold:4c,"
              "leds/vibrator/num_waves:ro:ff,leds/vibrator/reset:wo:");
}

TEST(ModuleParameters, NameTheMotorWhereThereIsOne) {
    EXPECT_EQ(parametersOf(R"({"motor": {"name": "qvx_vibrator_inputff", "effects_max": 3}})"),
              "nodes= motor=qvx_vibrator_inputff effects_max=3");
    EXPECT_EQ(parametersOf("{}"), "nodes=");
}

TEST(ModuleParameters, RefuseWhatTheModuleCannotBe) {
    EXPECT_EQ(parametersOf(R"({"nodes": {"/sys/class/leds/state": {"mode": "rw"}}})"),
              "refused: /sys/class/leds/state: the kernel module makes nodes "
              "/sys/class/CLASS/DEVICE/NAME alone");
    EXPECT_EQ(parametersOf(R"({"nodes": {"/sys/class/leds/vibrator/a,b": {"mode": "rw"}}})"),
              "refused: /sys/class/leds/vibrator/a,b: the kernel module makes nodes "
              "/sys/class/CLASS/DEVICE/NAME alone");
    EXPECT_EQ(parametersOf(R"({"motor": {"event": 7}})"),
              "refused: the kernel chooses the motor's number: leave out \"event\"");
    EXPECT_EQ(parametersOf(R"({"motor": {"name": "a b"}})"),
              "refused: motor \"a b\": the kernel module takes a name of ASCII characters without "
              "spaces, quotes, commas and colons");
    EXPECT_EQ(
            parametersOf(
                    R"({"motor": {}, "faults": [{"node": "motor", "op": "open", "errno": "EIO"}]})"),
            "refused: the kernel module has no faults of motor open; accepted: read and write of a "
            "node, upload and erase of the motor");
}

TEST(ModuleParameters, RefuseATextLongerThanSysfsShows) {
    const std::string beginning = R"({"nodes": {"/sys/class/a/b/c": {"mode": "rw", "text": ")";
    EXPECT_EQ(parametersOf((beginning + std::string(4096, 'x') + "\"}}}").c_str()),
              "refused: /sys/class/a/b/c: a node of the kernel module shows 4095 bytes at most");
}

std::string requestOf(const std::string& fault) {
    const Profile profile =
            *parseProfile(R"({"motor": {}, "nodes": {"/sys/class/a/b/c": {"mode": "rw"}}})");
    const auto request = kernelFaultRequest(*parseFault(fault, profile));
    return request ? *request : "refused: " + request.error().message();
}

TEST(KernelFaults, AreAskedForInPlainWords) {
    EXPECT_EQ(requestOf(R"({"node": "/sys/class/a/b/c", "op": "write", "errno": "ENOSPC",
                            "after": 1, "every": 2, "times": 3})"),
              "fault a/b/c write 28 4294967295 0 0 1 2 3");
    EXPECT_EQ(requestOf(R"({"node": "/sys/class/a/b/c", "op": "read", "short": 4, "delay": 5,
                            "text": "1\n"})"),
              "fault a/b/c read 0 4 5 0 0 1 0 =310a");
    EXPECT_EQ(requestOf(R"({"node": "motor", "op": "erase", "unplug": true})"),
              "fault motor erase 0 4294967295 0 1 0 1 0");
}

TEST(KernelFaults, AreThoseThatADriverIsAskedFor) {
    EXPECT_EQ(requestOf(R"({"node": "/sys/class/a/b/c", "op": "open", "errno": "EIO"})"),
              "refused: the kernel module has no faults of /sys/class/a/b/c open; accepted: read "
              "and write of a node, upload and erase of the motor");
    EXPECT_EQ(requestOf(R"({"node": "motor", "op": "write", "errno": "EIO"})"),
              "refused: the kernel module has no faults of motor write; accepted: read and write "
              "of a node, upload and erase of the motor");
    EXPECT_EQ(requestOf(R"({"node": "/sys/class/a/b/c", "op": "read", "text": ")" +
                        std::string(1501, 'x') + "\"}"),
              "refused: the kernel module shows other contents of 1500 bytes at most");
}

}  // namespace
}  // namespace handset
