// SPDX-License-Identifier: Apache-2.0
//
// /dev/input/eventN: choosing N, and giving the node to those who may open it on a phone.
#pragma once

#include <string>

#include <android-base/result.h>

#include "handset/driver/profile.h"

namespace handset {

// "/dev/input/event7".
std::string eventNodePath(unsigned event);

// The number the profile asks for, or else the lowest free one. 0 is not chosen: the list of
// input devices has the keyboard there.
android::base::Result<unsigned> chooseEvent(const MotorProfile& motor);

// The node of a device the kernel has just made: makes it where the kernel did not, and hands it
// to the system user and the input group, mode 0660. The kernel removes what it made; a node made
// here goes away with this object.
class EventNode {
  public:
    EventNode() = default;
    EventNode(const EventNode&) = delete;
    EventNode& operator=(const EventNode&) = delete;
    ~EventNode();

    android::base::Result<void> handOver(unsigned event);

  private:
    std::string mMade;
};

}  // namespace handset
