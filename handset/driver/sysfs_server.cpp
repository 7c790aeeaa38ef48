// SPDX-License-Identifier: Apache-2.0
//
// The nodes' file system: mounted, served, unmounted.
#include "handset/driver/sysfs_server.h"

#include <fcntl.h>
#include <sys/mount.h>

#include <string>
#include <utility>

#include <android-base/unique_fd.h>
#include <fmt/format.h>

#include "handset/driver/sysfs_requests.h"

namespace handset {
namespace {

using android::base::ErrnoError;
using android::base::Error;
using android::base::Result;
using android::base::unique_fd;

constexpr std::chrono::seconds kSettleTimeout{1};

void onInit(void*, fuse_conn_info* connection) {
    connection->want |= FUSE_CAP_ATOMIC_O_TRUNC;
    // Requests are wanted in memory, where the loop can look at them.
    connection->want &= ~static_cast<unsigned>(FUSE_CAP_SPLICE_READ);
}

}  // namespace

Result<std::unique_ptr<SysfsServer>> SysfsServer::start(const NodeTree& tree, FaultInjector& faults,
                                                        Journal& journal, int ended) {
    unique_fd device(open("/dev/fuse", O_RDWR | O_CLOEXEC | O_NONBLOCK));
    if (!device.ok()) return ErrnoError() << "/dev/fuse";

    std::unique_ptr<SysfsServer> server(new SysfsServer);
    server->mState = std::unique_ptr<State>(new State{tree, faults, journal});
    const std::string root(kSysfsRoot);
    const std::string options =
            fmt::format("fd={},rootmode=40000,user_id=0,group_id=0,allow_other", device.get());
    if (mount("handset", root.c_str(), "fuse", MS_NOSUID | MS_NODEV | MS_NOEXEC, options.c_str()) !=
        0) {
        return ErrnoError() << "mount on " + root;
    }
    server->mMounted = true;

    char name[] = "handset-driver";
    char* arguments[] = {name, nullptr};
    fuse_args args = FUSE_ARGS_INIT(1, arguments);
    fuse_lowlevel_ops ops{};
    ops.init = onInit;
    addTreeRequests(ops);
    addFileRequests(ops);
    fuse_session* const session = fuse_session_new(&args, &ops, sizeof ops, server->mState.get());
    fuse_opt_free_args(&args);
    if (session == nullptr) return Error() << "no FUSE session";
    server->mLoop = std::make_unique<SessionLoop>(session, std::move(device), ended);
    return server;
}

void SysfsServer::settle() const {
    mLoop->settle(kSettleTimeout);
}

SysfsServer::~SysfsServer() {
    if (mLoop) settle();
    if (mState) mState->stopping = true;
    if (mMounted) umount2(std::string(kSysfsRoot).c_str(), MNT_DETACH);
}

}  // namespace handset
