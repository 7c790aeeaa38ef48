// SPDX-License-Identifier: Apache-2.0
//
// What the driver's nodes say, whether the service understands it, and which features result.
#pragma once

#include <vector>

#include "vibctl/doctor/driver.h"
#include "vibctl/doctor/file_view.h"
#include "vibctl/doctor/finding.h"

namespace vibctl {

// The findings "motor type" (where the class has such a node), "feature words", "intensities",
// "node names" and "calibration", as far as there is something to say, and at last "features".
// Reads only nodes that the service reads; none for a driver without a class.
std::vector<Finding> checkContents(const FileView& view, const Driver& driver);

}  // namespace vibctl
