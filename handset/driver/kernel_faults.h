// SPDX-License-Identifier: Apache-2.0
//
// The faults of the kernel module. It decides which call a fault strikes; here are its faults as
// they were given, and what has become of them.
#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <utility>
#include <vector>

#include <android-base/result.h>

#include "handset/driver/fault_injector.h"

namespace handset {

// The request that gives the module a fault. An error for one that a kernel driver cannot have: of
// a call it is not told of, or of contents longer than it is given in one piece.
android::base::Result<std::string> kernelFaultRequest(const Fault& fault);

class KernelFaults : public FaultInjector {
  public:
    // Once the module is loaded. `drain` has every call the module has reported so far recorded.
    explicit KernelFaults(std::function<void()> drain) : mDrain(std::move(drain)) {}

    android::base::Result<void> add(Fault fault) override;
    void clear() override;
    std::vector<Record> list() const override;
    void unplug(std::string_view node) override;
    void plug(std::string_view node) override;

    void drain() { mDrain(); }

    // What the module did to a call: the action of its fault `number`, counted from 1 in the order
    // of adding; 0 stands for a call of what is unplugged. Takes notice of what that unplugged.
    FaultAction struck(size_t number);

  private:
    std::function<void()> mDrain;
};

}  // namespace handset
