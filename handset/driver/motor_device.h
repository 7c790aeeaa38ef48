// SPDX-License-Identifier: Apache-2.0
//
// The force-feedback motor: a character device in user space (CUSE) that speaks as an evdev device
// does. Effects follow the input core's rules; events are all recorded, also those the core would
// drop before a driver saw them: negative values, ids nobody uploaded.
#pragma once

#include <memory>

#include <android-base/result.h>

#include "handset/driver/event_node.h"
#include "handset/driver/fault_injector.h"
#include "handset/driver/journal.h"
#include "handset/driver/profile.h"
#include "handset/driver/session_loop.h"

namespace handset {

class MotorDevice {
  public:
    // Makes /dev/input/eventN and serves it on threads of its own. The references outlive the
    // motor; `ended` as in SessionLoop.
    static android::base::Result<std::unique_ptr<MotorDevice>> start(const MotorProfile& motor,
                                                                     unsigned event,
                                                                     FaultInjector& faults,
                                                                     Journal& journal, int ended);

    // What the motor held is gone, as when it is unplugged.
    void forgetEffects();

    // Removes the device; files still open fail from then on.
    ~MotorDevice();

    MotorDevice(const MotorDevice&) = delete;
    MotorDevice& operator=(const MotorDevice&) = delete;

    // What the request handlers work on.
    struct State;

  private:
    MotorDevice() = default;

    std::unique_ptr<State> mState;
    EventNode mNode;
    std::unique_ptr<SessionLoop> mLoop;
};

}  // namespace handset
