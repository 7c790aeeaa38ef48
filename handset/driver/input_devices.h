// SPDX-License-Identifier: Apache-2.0
// The list of input devices, as /proc/bus/input/devices shows it on this phone.
#pragma once

#include <optional>
#include <string>

#include "driver/profile.h"

namespace handset {

/// The list's text: a keyboard, then the motor where the profile has one, each in the kernel's own
/// layout; or the profile's own text with "{event}" filled in. `event` is the number of the
/// motor's /dev/input/eventN.
std::string inputDevicesText(const Profile& profile, unsigned event);

}  // namespace handset
