// SPDX-License-Identifier: Apache-2.0
//
// The tree of directories and nodes: looked up, listed, its attributes read and changed.
#include <fcntl.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <string>
#include <utility>
#include <vector>

#include "handset/driver/sysfs_requests.h"

namespace handset {
namespace {

using State = SysfsServer::State;

// Names and attributes change only through this driver, so the kernel may keep them.
constexpr double kForever = 86400.0;

// What sysfs reports for every attribute, whatever its text.
constexpr off_t kNodeSize = 4096;

constexpr mode_t kSysfsDirectoryMode = 0755;

Credentials credentialsOf(fuse_req_t request) {
    const fuse_ctx* context = fuse_req_ctx(request);
    Credentials credentials{context->uid, context->gid, std::vector<gid_t>(64)};
    const int count = fuse_req_getgroups(request, static_cast<int>(credentials.groups.size()),
                                         credentials.groups.data());
    credentials.groups.resize(std::clamp<size_t>(count < 0 ? 0 : count, 0, 64));
    return credentials;
}

struct stat statOf(const State& state, const TreeEntry& entry) {
    struct stat attributes {};
    attributes.st_ino = entry.inode;
    attributes.st_atime = attributes.st_mtime = attributes.st_ctime = state.started;
    if (!entry.node) {
        attributes.st_mode = S_IFDIR | kSysfsDirectoryMode;
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

// Directories and nodes come and go with the device, not by a user's hand.
void refuseChange(fuse_req_t request) {
    fuse_reply_err(request, fuse_req_ctx(request)->uid == 0 ? EPERM : EACCES);
}

}  // namespace

SysfsServer::State& stateOf(fuse_req_t request) {
    return *static_cast<SysfsServer::State*>(fuse_req_userdata(request));
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

void addTreeRequests(fuse_lowlevel_ops& ops) {
    ops.lookup = onLookup;
    ops.getattr = onGetattr;
    ops.setattr = onSetattr;
    ops.access = onAccess;
    ops.readdir = onReaddir;
    ops.mknod = onMknod;
    ops.link = onLink;
    ops.mkdir = [](auto request, auto...) { refuseChange(request); };
    ops.unlink = [](auto request, auto...) { refuseChange(request); };
    ops.rmdir = [](auto request, auto...) { refuseChange(request); };
    ops.rename = [](auto request, auto...) { refuseChange(request); };
    ops.symlink = [](auto request, auto...) { refuseChange(request); };
}

}  // namespace handset
