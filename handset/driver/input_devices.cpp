// SPDX-License-Identifier: Apache-2.0
//
// The list of input devices. Every line is as the kernel prints it, the space after the last
// handler included.
#include "handset/driver/input_devices.h"

#include <sys/mount.h>

#include <string_view>
#include <utility>

#include <android-base/strings.h>
#include <fmt/format.h>

namespace handset {
namespace {

using android::base::ErrnoError;
using android::base::Result;

constexpr std::string_view kKeyboard =
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

// EV: synchronisation and force feedback. FF: rumble, periodic, custom waveforms and gain; the
// kernel adds rumble wherever it finds periodic.
constexpr std::string_view kMotor =
        "I: Bus=0006 Vendor=0000 Product=0000 Version=0000\n"
        "N: Name=\"{}\"\n"
        "P: Phys=qvx/input0\n"
        "S: Sysfs=/devices/virtual/input/input{}\n"
        "U: Uniq=\n"
        "H: Handlers=event{} \n"
        "B: PROP=0\n"
        "B: EV=200001\n"
        "B: FF=120030000 0\n"
        "\n";

}  // namespace

std::string inputDevicesText(const Profile& profile, unsigned event, bool plugged) {
    if (profile.inputDevices) {
        return android::base::StringReplace(*profile.inputDevices, "{event}", std::to_string(event),
                                            true);
    }
    std::string text(kKeyboard);
    if (profile.motor && plugged)
        text += fmt::format(kMotor, profile.motor->name, event + 1, event);
    return text;
}

Result<void> InputDeviceList::show() {
    const std::lock_guard lock(mMutex);
    return bind(true);
}

Result<void> InputDeviceList::setPlugged(bool plugged) {
    const std::lock_guard lock(mMutex);
    if (std::exchange(mPlugged, plugged) == plugged) return {};
    if (!plugged) return bind(false);
    if (umount2(kInputDevices, MNT_DETACH) != 0) return ErrnoError() << kInputDevices;
    return {};
}

Result<void> InputDeviceList::bind(bool plugged) {
    return mStaging.bindFile(kInputDevices, inputDevicesText(mProfile, mEvent, plugged), 0, 0444);
}

}  // namespace handset
