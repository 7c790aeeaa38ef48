// SPDX-License-Identifier: Apache-2.0
// Asking the service manager whether it knows a service.
//
// This talks to /dev/binder by itself, with nothing of the platform's library in between: the tool
// that starts that library's first users must not depend on their health.
#pragma once

#include <string_view>

#include "common/unique_fd.h"

namespace handset {

/// One connection to the binder driver. A question waits for the manager's answer, for ever if it
/// takes for ever: ask from a process that can be killed.
class BinderProbe {
  public:
    /// Opens /dev/binder; isOpen() says whether that worked.
    BinderProbe();
    ~BinderProbe();
    BinderProbe(const BinderProbe&) = delete;
    BinderProbe& operator=(const BinderProbe&) = delete;

    bool isOpen() const { return area_ != nullptr; }

    /// True when the service manager has a service of that name (ASCII).
    bool isRegistered(std::string_view name);

  private:
    enum class Answer { kNone, kPlain, kWithObject };

    Answer ask(unsigned code, std::string_view parcel);
    void giveBack(unsigned long long buffer);

    UniqueFd device_;
    void* area_ = nullptr;
};

}  // namespace handset
