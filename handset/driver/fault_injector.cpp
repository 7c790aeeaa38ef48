// SPDX-License-Identifier: Apache-2.0
//
// Counting faults.
#include "handset/driver/fault_injector.h"

#include <cerrno>
#include <utility>

namespace handset {

android::base::Result<void> FaultInjector::add(Fault fault) {
    const std::lock_guard lock(mMutex);
    mRecords.push_back({std::move(fault)});
    return {};
}

void FaultInjector::clear() {
    std::vector<std::string> back;
    {
        const std::lock_guard lock(mMutex);
        mRecords.clear();
        for (const auto& [node, plug] : mPlugs) {
            if (!plug.plugged) back.push_back(node);
        }
    }
    for (const std::string& node : back) plug(node);
}

std::vector<FaultInjector::Record> FaultInjector::list() const {
    const std::lock_guard lock(mMutex);
    return mRecords;
}

FaultAction FaultInjector::next(std::string_view node, FaultOp op, bool continues) {
    return nextOf(node, op, unplugsOf(node), continues);
}

FaultAction FaultInjector::nextOf(std::string_view node, FaultOp op, uint64_t unplugs,
                                  bool continues) {
    FaultAction action;
    bool gone = false;
    {
        const std::lock_guard lock(mMutex);
        const auto plug = mPlugs.find(node);
        if (plug != mPlugs.end() && (!plug->second.plugged || plug->second.unplugs != unplugs)) {
            action.error = ENODEV;
            action.unplug = true;
            return action;
        }
        action = decide(node, op, continues);
        if (action.unplug) gone = setPlugged(node, false);
    }
    if (gone) announce(node, false);
    return action;
}

FaultAction FaultInjector::decide(std::string_view node, FaultOp op, bool continues) {
    FaultAction action;
    bool decided = false;
    for (Record& record : mRecords) {
        const Fault& fault = record.fault;
        if (fault.op != op || fault.node != node) continue;
        if (continues && fault.action.text) continue;
        ++record.seen;
        const bool spent = fault.times != 0 && record.struck == fault.times;
        if (decided || spent || record.seen <= fault.after) continue;
        if ((record.seen - fault.after) % fault.every != 0) continue;
        ++record.struck;
        decided = true;
        action = fault.action;
    }
    if (action.unplug && action.error == 0) action.error = ENODEV;
    return action;
}

void FaultInjector::unplug(std::string_view node) {
    {
        const std::lock_guard lock(mMutex);
        if (!setPlugged(node, false)) return;
    }
    announce(node, false);
}

void FaultInjector::plug(std::string_view node) {
    {
        const std::lock_guard lock(mMutex);
        if (!setPlugged(node, true)) return;
    }
    announce(node, true);
}

// False when it was so already.
bool FaultInjector::setPlugged(std::string_view node, bool plugged) {
    Plug& plug = mPlugs[std::string(node)];
    if (plug.plugged == plugged) return false;
    plug.plugged = plugged;
    if (!plugged) ++plug.unplugs;
    return true;
}

void FaultInjector::announce(std::string_view node, bool plugged) const {
    if (mOnPlug) mOnPlug(node, plugged);
}

bool FaultInjector::isUnplugged(std::string_view node) const {
    const std::lock_guard lock(mMutex);
    const auto plug = mPlugs.find(node);
    return plug != mPlugs.end() && !plug->second.plugged;
}

uint64_t FaultInjector::unplugsOf(std::string_view node) const {
    const std::lock_guard lock(mMutex);
    const auto plug = mPlugs.find(node);
    return plug != mPlugs.end() ? plug->second.unplugs : 0;
}

}  // namespace handset
