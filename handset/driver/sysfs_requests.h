// SPDX-License-Identifier: Apache-2.0
//
// The requests that reach the nodes' file system, by subject, and what their handlers share.
// sysfs_server.h mounts the file system and serves it.
#pragma once

#include <atomic>
#include <ctime>
#include <mutex>

#include <android-base/thread_annotations.h>
#include <fuse_lowlevel.h>

#include "handset/driver/caller.h"
#include "handset/driver/handle_table.h"
#include "handset/driver/read_session.h"
#include "handset/driver/sysfs_server.h"

namespace handset {

// One open file of a node.
struct OpenNode {
    OpenNode(Node& opened, Opener by, uint64_t unplugsBefore)
        : node(opened), opener(by), unplugs(unplugsBefore) {}

    Node& node;
    const Opener opener;
    const uint64_t unplugs;
    std::mutex mutex;
    ReadSession session GUARDED_BY(mutex);

    bool continuesAt(size_t offset) {
        const std::lock_guard lock(mutex);
        return session.continuesAt(offset);
    }
};

struct SysfsServer::State {
    const NodeTree& tree;
    FaultInjector& faults;
    Journal& journal;
    std::atomic<bool> stopping{false};
    HandleTable<OpenNode> files{};
    time_t started = time(nullptr);
};

// The state of the server that the request came to.
SysfsServer::State& stateOf(fuse_req_t request);

// Whether the node's permission bits give the caller what is wanted (kMayRead, kMayWrite).
bool callerIsGranted(fuse_req_t request, const Node& node, unsigned wanted);

// Names, attributes, listings, and the refusal of every change to them.
void addTreeRequests(fuse_lowlevel_ops& ops);

// Open, read, write and release of a node.
void addFileRequests(fuse_lowlevel_ops& ops);

}  // namespace handset
