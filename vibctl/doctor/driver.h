// SPDX-License-Identifier: Apache-2.0
//
// The vibrator driver from outside the service: which device class a start of the service would
// choose, and whether its user may open what it needs there. The rules and the names are written
// down here once more, from the nodes' side, so that a slip in the service shows as a difference.
#pragma once

#include <string>
#include <vector>

#include "doctor/file_view.h"
#include "doctor/finding.h"

namespace vibctl {

/// The findings "device class", "nodes" (one for each node that cannot be opened, else one for all)
/// and "input device".
std::vector<Finding> checkDriver(const FileView& view, const User& user);

/// One block of /proc/bus/input/devices.
struct InputDevice {
    std::string name;
    std::string handlers;  ///< without the blanks at its end
};

/// The blocks in order; a block without a name is left out.
std::vector<InputDevice> parseInputDevices(const std::string& text);

}  // namespace vibctl
