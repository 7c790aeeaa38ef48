// SPDX-License-Identifier: Apache-2.0
//
// The list of input devices, to the byte.
#include "handset/driver/input_devices.h"

#include <gtest/gtest.h>

namespace handset {
namespace {

constexpr const char* kKeyboardBlock =
        "I: Bus=0011 Vendor=0001 Product=0001 Version=ab41\n"
        "N: Name=\"AT Translated Set 2 keyboard\"\n"
        "P: Phys=isa0060/serio0/input0\n"
        "S: Sysfs=/devices/platform/i8042/serio0/input/input0\n"
        "U: Uniq=\n"
        "H: Handlers=sysrq kbd leds event0 \n"
        "B: PROP=0\n"
        "B: EV=120013\n"
        "B: KEY=402000000 3803078f800d001 feffffdfffefffff fffffffffffffffe\n"
        "B: MSC=10\n"
        "B: LED=7\n"
        "\n";

TEST(InputDevices, WithoutAMotorThereIsAKeyboardOnly) {
    EXPECT_EQ(inputDevicesText(Profile(), 0), kKeyboardBlock);
}

TEST(InputDevices, TheMotorsBlockFollowsTheKeyboards) {
    Profile profile;
    profile.motor.emplace();
    EXPECT_EQ(inputDevicesText(profile, 1), std::string(kKeyboardBlock) +
                                                    "I: Bus=0006 Vendor=0000 Product=0000 "
                                                    "Version=0000\n"
                                                    "N: Name=\"qvx_vibrator_inputff\"\n"
                                                    "P: Phys=qvx/input0\n"
                                                    "S: Sysfs=/devices/virtual/input/input2\n"
                                                    "U: Uniq=\n"
                                                    "H: Handlers=event1 \n"
                                                    "B: PROP=0\n"
                                                    "B: EV=200001\n"
                                                    "B: FF=120030000 0\n"
                                                    "\n");
}

TEST(InputDevices, TheMotorsNameAndNumberAreItsOwn) {
    Profile profile;
    profile.motor.emplace();
    profile.motor->name = "other {} motor";
    const std::string text = inputDevicesText(profile, 7);
    EXPECT_NE(text.find("\nN: Name=\"other {} motor\"\n"), std::string::npos);
    EXPECT_NE(text.find("\nH: Handlers=event7 \n"), std::string::npos);
}

TEST(InputDevices, AProfilesOwnTextReplacesTheList) {
    Profile profile;
    profile.motor.emplace();
    profile.inputDevices = "H: Handlers=event{event} \nno newline {event}";
    EXPECT_EQ(inputDevicesText(profile, 12), "H: Handlers=event12 \nno newline 12");
}

}  // namespace
}  // namespace handset
