// SPDX-License-Identifier: Apache-2.0
//
// /dev/input/eventN.
#include "handset/driver/event_node.h"

#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <fstream>

#include <fmt/format.h>

#include "handset/driver/permission.h"

namespace handset {
namespace {

using android::base::ErrnoError;
using android::base::Error;
using android::base::Result;

constexpr unsigned kEventLimit = 1024;
constexpr gid_t kInputGroup = 1004;

// Makes the node by the number sysfs gives for the device: not every /dev is the kernel's own.
Result<void> makeNode(unsigned event, const std::string& path) {
    std::ifstream file(fmt::format("/sys/devices/virtual/cuse/input!event{}/dev", event));
    unsigned major = 0;
    unsigned minor = 0;
    char colon = 0;
    if (!(file >> major >> colon >> minor)) {
        return Error() << fmt::format("{}: the kernel did not make the device", path);
    }
    if ((mkdir("/dev/input", 0755) != 0 && errno != EEXIST) ||
        mknod(path.c_str(), S_IFCHR | 0600, makedev(major, minor)) != 0) {
        return ErrnoError() << path;
    }
    return {};
}

}  // namespace

std::string eventNodePath(unsigned event) {
    return fmt::format("/dev/input/event{}", event);
}

Result<unsigned> chooseEvent(const MotorProfile& motor) {
    if (motor.event) {
        if (access(eventNodePath(*motor.event).c_str(), F_OK) != 0) return *motor.event;
        return Error() << fmt::format("motor.event: {} exists already",
                                      eventNodePath(*motor.event));
    }
    for (unsigned event = 1; event < kEventLimit; ++event) {
        if (access(eventNodePath(event).c_str(), F_OK) != 0) return event;
    }
    return Error() << "no free number below /dev/input";
}

EventNode::~EventNode() {
    if (!mMade.empty()) unlink(mMade.c_str());
}

Result<void> EventNode::handOver(unsigned event) {
    const std::string path = eventNodePath(event);
    if (access(path.c_str(), F_OK) != 0) {
        if (auto done = makeNode(event, path); !done) return done;
        mMade = path;
    }
    if (chown(path.c_str(), kSystemUser, kInputGroup) != 0 || chmod(path.c_str(), 0660) != 0) {
        return ErrnoError() << path;
    }
    return {};
}

}  // namespace handset
