// SPDX-License-Identifier: Apache-2.0
//
// The nodes' files: opened, read, written and closed, with the faults and the journal.
#include <fcntl.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <memory>
#include <string>
#include <utility>

#include "handset/driver/printable.h"
#include "handset/driver/request_delay.h"
#include "handset/driver/sysfs_requests.h"

namespace handset {
namespace {

using State = SysfsServer::State;

// As sysfs has it, even root needs at least one permission bit for what it wants. The bits are all
// that counts: without the method a read or write fails later.
bool isOpenable(const Node& node, unsigned wanted) {
    const mode_t mode = node.attributes().mode;
    return ((wanted & kMayRead) == 0 || (mode & 0444) != 0) &&
           ((wanted & kMayWrite) == 0 || (mode & 0222) != 0);
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
        error = meetFault(request, fault, state.stopping);
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
    int error = meetFault(request, fault, state.stopping);
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
    int error = meetFault(request, fault, state.stopping);
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

}  // namespace

void addFileRequests(fuse_lowlevel_ops& ops) {
    ops.open = onOpen;
    ops.read = onRead;
    ops.write = onWrite;
    ops.release = onRelease;
    ops.create = onCreate;
}

}  // namespace handset
