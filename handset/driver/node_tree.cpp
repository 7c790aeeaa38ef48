// SPDX-License-Identifier: Apache-2.0
//
// The driver's nodes and the directories they lie in.
#include "handset/driver/node_tree.h"

#include <algorithm>

namespace handset {
namespace {

constexpr uint64_t kRootInode = 1;

// The platform's system user owns the vibrator's nodes on a phone; init sees to that at boot.

mode_t modeOf(Access access) {
    switch (access) {
        case Access::kReadOnly:
            return 0444;
        case Access::kWriteOnly:
            return 0220;
        case Access::kReadWrite:
            break;
    }
    return 0664;
}

}  // namespace

Node::Node(NodeProfile spec)
    : mSpec(std::move(spec)),
      mText(mSpec.text),
      mAttributes{modeOf(mSpec.access), kSystemUser, kSystemUser} {}

std::string Node::text() const {
    const std::lock_guard lock(mMutex);
    return mText;
}

void Node::store(std::string_view text) {
    if (!mSpec.hold) setText(text);
}

void Node::setText(std::string_view text) {
    const std::lock_guard lock(mMutex);
    mText = text;
}

Attributes Node::attributes() const {
    const std::lock_guard lock(mMutex);
    return mAttributes;
}

void Node::setAttributes(const Attributes& attributes) {
    const std::lock_guard lock(mMutex);
    mAttributes = attributes;
}

NodeTree::NodeTree(std::string_view root, const std::vector<NodeProfile>& nodes) : mRoot(root) {
    mEntries.emplace_back();
    mEntries.back().inode = mEntries.back().parent = kRootInode;
    for (const NodeProfile& spec : nodes) {
        uint64_t at = kRootInode;
        const std::string_view path = std::string_view(spec.path).substr(root.size());
        for (size_t slash = 0; slash < path.size();) {
            const size_t end = std::min(path.find('/', slash + 1), path.size());
            at = addChild(at, path.substr(slash + 1, end - slash - 1));
            slash = end;
        }
        mEntries[at - kRootInode].node = std::make_unique<Node>(spec);
    }
}

uint64_t NodeTree::addChild(uint64_t directory, std::string_view name) {
    if (const TreeEntry* existing = child(directory, name)) return existing->inode;
    TreeEntry entry;
    entry.name = name;
    entry.inode = mEntries.size() + kRootInode;
    entry.parent = directory;
    mEntries[directory - kRootInode].children.emplace(name, entry.inode);
    mEntries.push_back(std::move(entry));
    return mEntries.back().inode;
}

const TreeEntry* NodeTree::find(uint64_t inode) const {
    const uint64_t index = inode - kRootInode;
    return index < mEntries.size() ? &mEntries[index] : nullptr;
}

const TreeEntry* NodeTree::child(uint64_t directory, std::string_view name) const {
    const TreeEntry* entry = find(directory);
    if (entry == nullptr) return nullptr;
    const auto found = entry->children.find(name);
    return found != entry->children.end() ? find(found->second) : nullptr;
}

Node* NodeTree::nodeAt(std::string_view path) const {
    const auto found = std::find_if(mEntries.begin(), mEntries.end(), [&](const TreeEntry& entry) {
        return entry.node && entry.node->path() == path;
    });
    return found != mEntries.end() ? found->node.get() : nullptr;
}

std::string NodeTree::pathOf(uint64_t directory, std::string_view name) const {
    std::string path = "/" + std::string(name);
    for (uint64_t at = directory; at != kRootInode;) {
        const TreeEntry* entry = find(at);
        if (entry == nullptr) break;
        path.insert(0, "/" + entry->name);
        at = entry->parent;
    }
    return mRoot + path;
}

}  // namespace handset
