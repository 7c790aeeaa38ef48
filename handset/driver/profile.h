// SPDX-License-Identifier: Apache-2.0
//
// A profile: which phone this is. Its nodes, its plain files, its motor and what goes wrong.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "handset/driver/fault.h"

namespace handset {

// Which methods a node has. As in sysfs, root too is refused what is missing.
enum class Access { kReadWrite, kReadOnly, kWriteOnly };

struct NodeProfile {
    std::string path;  // absolute, below /sys/class/
    Access access = Access::kReadWrite;
    std::string text;   // what a read returns before the first write
    bool hold = false;  // a write is taken and forgotten: reads keep returning `text`
};

struct FileProfile {
    std::string path;  // absolute, not below /proc, /sys or /dev
    std::string text;
};

struct MotorProfile {
    std::string name = "qvx_vibrator_inputff";  // as in the list of input devices
    std::optional<unsigned> event;              // number of /dev/input/eventN; none: next free
    unsigned effectsMax = 16;                   // effects it holds at once, 1 to 96
};

struct Profile {
    std::string description;
    std::vector<NodeProfile> nodes;
    std::vector<FileProfile> files;
    std::optional<MotorProfile> motor;
    // Replaces the list of input devices whole; "{event}" in it stands for the motor's number.
    std::optional<std::string> inputDevices;
    std::vector<Fault> faults;

    // The node at `path`, or null.
    const NodeProfile* findNode(std::string_view path) const;
};

}  // namespace handset
