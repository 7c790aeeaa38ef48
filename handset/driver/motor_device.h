// SPDX-License-Identifier: Apache-2.0
// The force-feedback motor: a character device in user space (CUSE) that speaks as an evdev device
// does. Effects follow the input core's rules; events are all recorded, also those the core would
// drop before a driver saw them: negative values, ids nobody uploaded.
#pragma once

#include <memory>

#include "driver/event_node.h"
#include "driver/fault_book.h"
#include "driver/journal.h"
#include "driver/profile.h"
#include "driver/result.h"
#include "driver/session_loop.h"

struct fuse_session;

namespace handset {

class MotorDevice {
  public:
    /// Makes /dev/input/eventN and serves it on threads of its own. The references outlive the
    /// motor; `ended` as in SessionLoop.
    static Result<std::unique_ptr<MotorDevice>> start(const MotorSpec& motor, unsigned event,
                                                      FaultBook& faults, Journal& journal,
                                                      int ended);

    /// Removes the device; files still open fail from then on.
    ~MotorDevice();

    MotorDevice(const MotorDevice&) = delete;
    MotorDevice& operator=(const MotorDevice&) = delete;

    /// What the request handlers work on.
    struct State;

  private:
    MotorDevice() = default;

    std::unique_ptr<State> state_;
    fuse_session* session_ = nullptr;
    EventNode node_;
    std::unique_ptr<SessionLoop> loop_;
};

}  // namespace handset
