// SPDX-License-Identifier: Apache-2.0
//
// The faults in force and how often each has struck, and what is unplugged.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

#include <android-base/result.h>
#include <android-base/thread_annotations.h>

#include "handset/driver/fault.h"

namespace handset {

// Every fault counts the calls it matches from the moment it was added. Where several strike one
// call, the one added first decides. All operations may be called from any thread.
class FaultInjector {
  public:
    FaultInjector() = default;
    virtual ~FaultInjector() = default;
    FaultInjector(const FaultInjector&) = delete;
    FaultInjector& operator=(const FaultInjector&) = delete;

    // A fault with what has become of it.
    struct Record {
        Fault fault;
        uint64_t seen = 0;    // calls that matched
        uint64_t struck = 0;  // calls it decided
    };

    // Called, without a lock, whenever a node or the motor has been unplugged or plugged in again.
    using OnPlug = std::function<void(std::string_view node, bool plugged)>;
    void setOnPlug(OnPlug onPlug) { mOnPlug = std::move(onPlug); }

    // An error where the driver cannot have the fault; this one has them all.
    virtual android::base::Result<void> add(Fault fault);

    // Forgets every fault; what was unplugged is plugged in again.
    virtual void clear();

    // The faults in the order in which they were added.
    virtual std::vector<Record> list() const;

    // Counts one call and says what happens to it. `unplugs` is what unplugsOf() said when the file
    // was opened: a file of a device that has gone since stays dead when another one comes. A read
    // that goes on where the last one ended (`continues`) shows nothing new, so faults of contents
    // leave it alone.
    FaultAction next(std::string_view node, FaultOp op, bool continues = false);
    FaultAction nextOf(std::string_view node, FaultOp op, uint64_t unplugs, bool continues = false);

    // Takes a node or the motor away, or brings it back.
    virtual void unplug(std::string_view node);
    virtual void plug(std::string_view node);

    // True once a fault or unplug() has taken `node` away.
    bool isUnplugged(std::string_view node) const;

    // How often `node` has been unplugged.
    uint64_t unplugsOf(std::string_view node) const;

  private:
    struct Plug {
        bool plugged = true;
        uint64_t unplugs = 0;
    };

    FaultAction decide(std::string_view node, FaultOp op, bool continues) REQUIRES(mMutex);
    bool setPlugged(std::string_view node, bool plugged) REQUIRES(mMutex);
    void announce(std::string_view node, bool plugged) const;

    mutable std::mutex mMutex;
    std::vector<Record> mRecords GUARDED_BY(mMutex);
    std::map<std::string, Plug, std::less<>> mPlugs GUARDED_BY(mMutex);
    OnPlug mOnPlug;
};

}  // namespace handset
