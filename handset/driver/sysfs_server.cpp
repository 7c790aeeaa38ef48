// SPDX-License-Identifier: Apache-2.0
//
// The driver's nodes as files: the request handlers and the mount.
#include "handset/driver/sysfs_server.h"

#include <fcntl.h>
#include <sys/mount.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <ctime>
#include <mutex>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include <android-base/thread_annotations.h>
#include <android-base/unique_fd.h>
#include <fmt/format.h>
#include <fuse_lowlevel.h>

#include "handset/driver/caller.h"
#include "handset/driver/handle_table.h"
#include "handset/driver/open_flags.h"
#include "handset/driver/printable.h"
#include "handset/driver/read_session.h"
#include "handset/driver/request_delay.h"

namespace handset {
namespace {

using android::base::ErrnoError;
using android::base::Error;
using android::base::Result;
using android::base::unique_fd;

// Names and attributes change only through this driver, so the kernel may keep them.
constexpr double kForever = 86400.0;

// What sysfs reports for every attribute, whatever its text.
constexpr off_t kNodeSize = 4096;

constexpr mode_t kDirectoryMode = 0755;

constexpr std::chrono::seconds kSettleTimeout{1};

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

}  // namespace

struct SysfsServer::State {
    const NodeTree& tree;
    FaultInjector& faults;
    Journal& journal;
    std::atomic<bool> stopping{false};
    HandleTable<OpenNode> files{};
    time_t started = time(nullptr);
};

namespace {

using State = SysfsServer::State;

State& stateOf(fuse_req_t request) {
    return *static_cast<State*>(fuse_req_userdata(request));
}

Credentials credentialsOf(fuse_req_t request) {
    const fuse_ctx* context = fuse_req_ctx(request);
    Credentials credentials{context->uid, context->gid, std::vector<gid_t>(64)};
    const int count = fuse_req_getgroups(request, static_cast<int>(credentials.groups.size()),
                                         credentials.groups.data());
    credentials.groups.resize(std::clamp<size_t>(count < 0 ? 0 : count, 0, 64));
    return credentials;
}

bool callerIsGranted(fuse_req_t request, const Node& node, unsigned wanted) {
    const Attributes attributes = node.attributes();
    const fuse_ctx* context = fuse_req_ctx(request);
    // The groups cost a look into /proc; owner and root do not need them.
    if (context->uid == 0 || context->uid == attributes.uid) {
        return grants(attributes, {context->uid, context->gid, {}}, wanted);
    }
    return grants(attributes, credentialsOf(request), wanted);
}

// As sysfs has it, even root needs at least one permission bit for what it wants. The bits are all
// that counts: without the method a read or write fails later.
bool isOpenable(const Node& node, unsigned wanted) {
    const mode_t mode = node.attributes().mode;
    return ((wanted & kMayRead) == 0 || (mode & 0444) != 0) &&
           ((wanted & kMayWrite) == 0 || (mode & 0222) != 0);
}

struct stat statOf(const State& state, const TreeEntry& entry) {
    struct stat attributes {};
    attributes.st_ino = entry.inode;
    attributes.st_atime = attributes.st_mtime = attributes.st_ctime = state.started;
    if (!entry.node) {
        attributes.st_mode = S_IFDIR | kDirectoryMode;
        attributes.st_nlink = 2;
        return attributes;
    }
    const Attributes own = entry.node->attributes();
    attributes.st_mode = S_IFREG | own.mode;
    attributes.st_nlink = 1;
    attributes.st_uid = own.uid;
    attributes.st_gid = own.gid;
    attributes.st_size = kNodeSize;
    return attributes;
}

void onInit(void*, fuse_conn_info* connection) {
    connection->want |= FUSE_CAP_ATOMIC_O_TRUNC;
    // Requests are wanted in memory, where the loop can look at them.
    connection->want &= ~static_cast<unsigned>(FUSE_CAP_SPLICE_READ);
}

void onLookup(fuse_req_t request, fuse_ino_t parent, const char* name) {
    const State& state = stateOf(request);
    const TreeEntry* entry = state.tree.child(parent, name);
    if (entry == nullptr) {
        fuse_reply_err(request, ENOENT);
        return;
    }
    fuse_entry_param reply{};
    reply.ino = entry->inode;
    reply.attr = statOf(state, *entry);
    reply.attr_timeout = reply.entry_timeout = kForever;
    fuse_reply_entry(request, &reply);
}

void onGetattr(fuse_req_t request, fuse_ino_t inode, fuse_file_info*) {
    const State& state = stateOf(request);
    const TreeEntry* entry = state.tree.find(inode);
    if (entry == nullptr) {
        fuse_reply_err(request, ENOENT);
        return;
    }
    const struct stat attributes = statOf(state, *entry);
    fuse_reply_attr(request, &attributes, kForever);
}

// The error a change of attributes meets, or 0. A new size changes nothing and is let pass.
int setattrError(fuse_req_t request, const Node& node, int toSet, bool open) {
    const uid_t uid = fuse_req_ctx(request)->uid;
    if ((toSet & (FUSE_SET_ATTR_UID | FUSE_SET_ATTR_GID)) != 0 && uid != 0) return EPERM;
    if ((toSet & FUSE_SET_ATTR_MODE) != 0 && uid != 0 && uid != node.attributes().uid) {
        return EPERM;
    }
    if ((toSet & FUSE_SET_ATTR_SIZE) != 0 && !open && !callerIsGranted(request, node, kMayWrite)) {
        return EACCES;
    }
    return 0;
}

void onSetattr(fuse_req_t request, fuse_ino_t inode, struct stat* wanted, int toSet,
               fuse_file_info* file) {
    const State& state = stateOf(request);
    const TreeEntry* entry = state.tree.find(inode);
    const int error = entry == nullptr ? ENOENT
                      : !entry->node   ? EPERM
                                     : setattrError(request, *entry->node, toSet, file != nullptr);
    if (error != 0) {
        fuse_reply_err(request, error);
        return;
    }
    Attributes attributes = entry->node->attributes();
    if ((toSet & FUSE_SET_ATTR_MODE) != 0) attributes.mode = wanted->st_mode & 0777;
    if ((toSet & FUSE_SET_ATTR_UID) != 0) attributes.uid = wanted->st_uid;
    if ((toSet & FUSE_SET_ATTR_GID) != 0) attributes.gid = wanted->st_gid;
    entry->node->setAttributes(attributes);
    const struct stat reply = statOf(state, *entry);
    fuse_reply_attr(request, &reply, kForever);
}

void onAccess(fuse_req_t request, fuse_ino_t inode, int mask) {
    const TreeEntry* entry = stateOf(request).tree.find(inode);
    const bool granted = entry != nullptr &&
                         (entry->node ? (mask & X_OK) == 0 && callerIsGranted(request, *entry->node,
                                                                              mask & (R_OK | W_OK))
                                      : (mask & W_OK) == 0 || fuse_req_ctx(request)->uid == 0);
    fuse_reply_err(request, granted ? 0 : EACCES);
}

void onReaddir(fuse_req_t request, fuse_ino_t inode, size_t size, off_t offset, fuse_file_info*) {
    const TreeEntry* directory = stateOf(request).tree.find(inode);
    if (directory == nullptr) {
        fuse_reply_err(request, ENOENT);
        return;
    }
    std::vector<std::pair<std::string_view, uint64_t>> names{{".", directory->inode},
                                                             {"..", directory->parent}};
    names.insert(names.end(), directory->children.begin(), directory->children.end());
    std::vector<char> listing(size);
    size_t used = 0;
    for (size_t i = static_cast<size_t>(offset); i < names.size(); ++i) {
        const TreeEntry* entry = stateOf(request).tree.find(names[i].second);
        const struct stat attributes = statOf(stateOf(request), *entry);
        const size_t needed = fuse_add_direntry(request, listing.data() + used, size - used,
                                                std::string(names[i].first).c_str(), &attributes,
                                                static_cast<off_t>(i) + 1);
        if (needed > size - used) break;
        used += needed;
    }
    fuse_reply_buf(request, listing.data(), used);
}

JournalFields openLine(const std::string& path, int flags, int error) {
    return {{"op", "open"},
            {"node", path},
            {"flags", openFlagsText(flags)},
            {"error", resultOf(-error)}};
}

// Meets the fault that is due: its error, or EINTR where its delay was cut short, or 0.
int meetFault(fuse_req_t request, const State& state, const FaultAction& fault) {
    return delayRequest(request, fault.delay, state.stopping) ? fault.error : EINTR;
}

void onOpen(fuse_req_t request, fuse_ino_t inode, fuse_file_info* info) {
    State& state = stateOf(request);
    const TreeEntry* entry = state.tree.find(inode);
    if (entry == nullptr || !entry->node) {
        fuse_reply_err(request, entry == nullptr ? ENOENT : EISDIR);
        return;
    }
    Node& node = *entry->node;
    const Opener opener(request);
    const auto arrival = std::chrono::steady_clock::now();
    FaultAction fault;
    int error = EACCES;
    const uint64_t unplugs = state.faults.unplugsOf(node.path());
    if (isOpenable(node, wantedBy(info->flags)) &&
        callerIsGranted(request, node, neededBy(info->flags))) {
        fault = state.faults.next(node.path(), FaultOp::kOpen);
        error = meetFault(request, state, fault);
    }
    state.journal.record(opener.caller(), openLine(node.path(), info->flags, error),
                         {fault, arrival});
    if (error != 0) {
        fuse_reply_err(request, error);
        return;
    }
    info->fh = state.files.add(std::make_unique<OpenNode>(node, opener, unplugs));
    info->direct_io = 1;
    // A caller killed while it waited never releases what it did not get.
    if (fuse_reply_open(request, info) == -ENOENT) state.files.remove(info->fh);
}

void onRead(fuse_req_t request, fuse_ino_t, size_t size, off_t offset, fuse_file_info* info) {
    State& state = stateOf(request);
    OpenNode& file = state.files.get(info->fh);
    const auto arrival = std::chrono::steady_clock::now();
    const auto at = static_cast<size_t>(offset);
    const FaultAction fault = state.faults.nextOf(file.node.path(), FaultOp::kRead, file.unplugs,
                                                  file.continuesAt(at));
    int error = meetFault(request, state, fault);
    if (!file.node.isReadable()) error = EIO;

    std::string part;
    if (error == 0) {
        const std::lock_guard lock(file.mutex);
        part = file.session.read(at, std::min(size, fault.shortCount.value_or(size)),
                                 [&] { return fault.text ? *fault.text : file.node.text(); });
    }
    state.journal.record(
            file.opener.callerOf(request),
            {{"op", "read"},
             {"node", file.node.path()},
             {"size", size},
             {"result", resultOf(error != 0 ? -error : static_cast<int64_t>(part.size()))}},
            {fault, arrival});
    if (error != 0) {
        fuse_reply_err(request, error);
    } else {
        fuse_reply_buf(request, part.data(), part.size());
    }
}

void onWrite(fuse_req_t request, fuse_ino_t, const char* data, size_t size, off_t,
             fuse_file_info* info) {
    State& state = stateOf(request);
    OpenNode& file = state.files.get(info->fh);
    const auto arrival = std::chrono::steady_clock::now();
    const FaultAction fault = state.faults.nextOf(file.node.path(), FaultOp::kWrite, file.unplugs);
    int error = meetFault(request, state, fault);
    if (!file.node.isWritable()) error = EIO;
    const std::string_view bytes(data, size);
    const std::string_view taken = bytes.substr(0, fault.shortCount.value_or(size));

    if (error == 0) file.node.store(taken);
    JournalFields line{{"op", "write"}, {"node", file.node.path()}};
    putBytes(line, "data", "hex", bytes);
    line["result"] = resultOf(error != 0 ? -error : static_cast<int64_t>(taken.size()));
    state.journal.record(file.opener.callerOf(request), std::move(line), {fault, arrival});
    if (error != 0) {
        fuse_reply_err(request, error);
    } else {
        fuse_reply_write(request, taken.size());
    }
}

void onRelease(fuse_req_t request, fuse_ino_t, fuse_file_info* info) {
    State& state = stateOf(request);
    if (const std::unique_ptr<OpenNode> file = state.files.remove(info->fh)) {
        state.journal.record(file->opener.caller(), {{"op", "close"}, {"node", file->node.path()}});
    }
    fuse_reply_err(request, 0);
}

// An open with O_CREAT of a name that does not exist.
void onCreate(fuse_req_t request, fuse_ino_t parent, const char* name, mode_t,
              fuse_file_info* info) {
    State& state = stateOf(request);
    state.journal.record(Opener(request).caller(),
                         openLine(state.tree.pathOf(parent, name), info->flags | O_CREAT, EACCES));
    fuse_reply_err(request, EACCES);
}

// A plain file is created rather than made, and there is no way to create one.
void onMknod(fuse_req_t request, fuse_ino_t, const char*, mode_t mode, dev_t) {
    const bool mayTry = S_ISREG(mode) || fuse_req_ctx(request)->uid != 0;
    fuse_reply_err(request, mayTry ? EACCES : EPERM);
}

// The kernel lets nobody link to what they neither own nor may read and write
// (fs.protected_hardlinks), and asks that before it looks at the directory.
void onLink(fuse_req_t request, fuse_ino_t inode, fuse_ino_t, const char*) {
    const TreeEntry* entry = stateOf(request).tree.find(inode);
    const uid_t uid = fuse_req_ctx(request)->uid;
    const bool mayLink = entry != nullptr && entry->node &&
                         (uid == entry->node->attributes().uid ||
                          callerIsGranted(request, *entry->node, kMayRead | kMayWrite));
    fuse_reply_err(request, uid != 0 && mayLink ? EACCES : EPERM);
}

// Folders and nodes come and go with the device, not by a user's hand.
void refuseChange(fuse_req_t request) {
    fuse_reply_err(request, fuse_req_ctx(request)->uid == 0 ? EPERM : EACCES);
}

fuse_lowlevel_ops operations() {
    fuse_lowlevel_ops ops{};
    ops.init = onInit;
    ops.lookup = onLookup;
    ops.getattr = onGetattr;
    ops.setattr = onSetattr;
    ops.access = onAccess;
    ops.readdir = onReaddir;
    ops.open = onOpen;
    ops.read = onRead;
    ops.write = onWrite;
    ops.release = onRelease;
    ops.create = onCreate;
    ops.mknod = onMknod;
    ops.link = onLink;
    ops.mkdir = [](auto request, auto...) { refuseChange(request); };
    ops.unlink = [](auto request, auto...) { refuseChange(request); };
    ops.rmdir = [](auto request, auto...) { refuseChange(request); };
    ops.rename = [](auto request, auto...) { refuseChange(request); };
    ops.symlink = [](auto request, auto...) { refuseChange(request); };
    return ops;
}

}  // namespace

Result<std::unique_ptr<SysfsServer>> SysfsServer::start(const NodeTree& tree, FaultInjector& faults,
                                                        Journal& journal, int ended) {
    unique_fd device(open("/dev/fuse", O_RDWR | O_CLOEXEC | O_NONBLOCK));
    if (!device.ok()) return ErrnoError() << "/dev/fuse";

    std::unique_ptr<SysfsServer> server(new SysfsServer);
    server->mState = std::unique_ptr<State>(new State{tree, faults, journal});
    char name[] = "handset-driver";
    char* arguments[] = {name, nullptr};
    fuse_args args = FUSE_ARGS_INIT(1, arguments);
    const fuse_lowlevel_ops ops = operations();
    server->mSession = fuse_session_new(&args, &ops, sizeof ops, server->mState.get());
    fuse_opt_free_args(&args);
    if (server->mSession == nullptr) return Error() << "no FUSE session";

    const std::string root(kSysfsRoot);
    const std::string options =
            fmt::format("fd={},rootmode=40000,user_id=0,group_id=0,allow_other", device.get());
    if (mount("handset", root.c_str(), "fuse", MS_NOSUID | MS_NODEV | MS_NOEXEC, options.c_str()) !=
        0) {
        return ErrnoError() << "mount on " + root;
    }
    server->mMounted = true;
    const int fd = device.release();  // the session closes it
    fuse_session_mount(server->mSession, fmt::format("/dev/fd/{}", fd).c_str());
    server->mLoop = std::make_unique<SessionLoop>(server->mSession, fd, ended);
    return server;
}

void SysfsServer::settle() const {
    mLoop->settle(kSettleTimeout);
}

SysfsServer::~SysfsServer() {
    if (mLoop) settle();
    if (mState) mState->stopping = true;
    if (mMounted) umount2(std::string(kSysfsRoot).c_str(), MNT_DETACH);
    mLoop.reset();
    if (mSession != nullptr) fuse_session_destroy(mSession);
}

}  // namespace handset
