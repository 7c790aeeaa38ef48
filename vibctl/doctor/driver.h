// SPDX-License-Identifier: Apache-2.0
//
// Which device class a start of the service would choose, and whether its user may open what it
// needs there.
#pragma once

#include <set>
#include <string>
#include <vector>

#include "vibctl/doctor/file_view.h"
#include "vibctl/doctor/finding.h"

namespace vibctl {

enum class DeviceClass { kNone, kLegacy, kLeds, kForceFeedback };

struct Driver {
    DeviceClass deviceClass = DeviceClass::kNone;
    std::string directory;          // of its nodes, with a slash behind it; empty for kNone
    std::set<std::string> open;     // paths of the nodes that the user can open
    std::vector<Finding> findings;  // "device class", and "nodes", one for each that does not open
};

Driver checkDriver(const FileView& view, const User& user);

// One block of /proc/bus/input/devices.
struct InputDevice {
    std::string name;
    std::string handlers;  // without the spaces at its end
};

// The blocks in order; a block without a name is left out.
std::vector<InputDevice> parseInputDevices(const std::string& text);

}  // namespace vibctl
