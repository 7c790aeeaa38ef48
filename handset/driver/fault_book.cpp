// SPDX-License-Identifier: Apache-2.0
// Counting faults.
#include "driver/fault_book.h"

#include <cerrno>
#include <utility>

namespace handset {

void FaultBook::add(FaultSpec fault) {
    const std::lock_guard lock(mutex_);
    entries_.push_back({std::move(fault)});
}

void FaultBook::clear() {
    const std::lock_guard lock(mutex_);
    entries_.clear();
    unplugged_.clear();
}

FaultAction FaultBook::next(std::string_view node, FaultOp op) {
    const std::lock_guard lock(mutex_);
    FaultAction gone;
    gone.error = ENODEV;
    if (unplugged_.contains(node)) return gone;

    FaultAction action;
    bool decided = false;
    for (Entry& entry : entries_) {
        if (entry.fault.op != op || entry.fault.node != node) continue;
        ++entry.seen;
        const bool spent = entry.fault.times != 0 && entry.applied == entry.fault.times;
        if (decided || spent || entry.seen <= entry.fault.after) continue;
        ++entry.applied;
        decided = true;
        action = entry.fault.action;
    }
    if (action.unplug) {
        unplugged_.emplace(node);
        if (action.error == 0) action.error = ENODEV;
    }
    return action;
}

bool FaultBook::isUnplugged(std::string_view node) const {
    const std::lock_guard lock(mutex_);
    return unplugged_.contains(node);
}

}  // namespace handset
