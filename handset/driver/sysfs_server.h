// SPDX-License-Identifier: Apache-2.0
//
// The driver's nodes as files: a FUSE file system that stands in for /sys/class and behaves as
// sysfs does.
//
// - A write is one store: the offset is ignored and the text replaced whole.
// - Reads that follow each other go through one showing of the text (read_session.h).
// - Where no permission bit allows it root too is refused; a node whose bits were changed to allow
//   what it has no method for answers EIO. Nothing can be created or removed.
#pragma once

#include <atomic>
#include <memory>
#include <string_view>

#include <android-base/result.h>
#include <android-base/unique_fd.h>

#include "handset/driver/fault_injector.h"
#include "handset/driver/journal.h"
#include "handset/driver/node_tree.h"
#include "handset/driver/session_loop.h"

namespace handset {

// Where the nodes are mounted.
inline constexpr std::string_view kSysfsRoot = "/sys/class";

class SysfsServer {
  public:
    // Mounts the nodes in the process's mount namespace and serves them on threads of its own.
    // The references outlive the server; `ended` as in SessionLoop.
    static android::base::Result<std::unique_ptr<SysfsServer>> start(const NodeTree& tree,
                                                                     FaultInjector& faults,
                                                                     Journal& journal, int ended);

    // Unmounts the nodes and stops; callers that are kept waiting get EINTR, files still open
    // fail with ENOTCONN from then on.
    ~SysfsServer();

    // Waits until the journal has the close of every file closed so far, a second at most.
    void settle() const;

    SysfsServer(const SysfsServer&) = delete;
    SysfsServer& operator=(const SysfsServer&) = delete;

    // What the request handlers work on.
    struct State;

  private:
    SysfsServer() = default;

    std::unique_ptr<State> mState;
    bool mMounted = false;
    std::unique_ptr<SessionLoop> mLoop;
};

}  // namespace handset
