// SPDX-License-Identifier: Apache-2.0
// The faults in force and how often each has been met.
#pragma once

#include <mutex>
#include <set>
#include <string>
#include <string_view>
#include <vector>

#include "driver/fault_spec.h"

namespace handset {

/// Every fault counts the calls it matches from the moment it was added: it lets `after` of them
/// pass, then applies to `times`. Where several apply to one call, the one added first decides.
/// All operations may be called from any thread.
class FaultBook {
  public:
    void add(FaultSpec fault);

    /// Forgets every fault; what was unplugged is plugged in again.
    void clear();

    /// Counts one call and says what happens to it.
    FaultAction next(std::string_view node, FaultOp op);

    /// True once a fault has unplugged `node`.
    bool isUnplugged(std::string_view node) const;

  private:
    struct Entry {
        FaultSpec fault;
        uint64_t seen = 0;
        uint64_t applied = 0;
    };

    mutable std::mutex mutex_;
    std::vector<Entry> entries_;
    std::set<std::string, std::less<>> unplugged_;
};

}  // namespace handset
