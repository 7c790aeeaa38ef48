// SPDX-License-Identifier: Apache-2.0
// The driver's nodes and the folders they lie in.
#include "driver/node_tree.h"

#include <algorithm>

namespace handset {
namespace {

constexpr uint64_t kRootInode = 1;

// The platform's system user owns the vibrator's nodes on a phone; init sees to that at boot.
constexpr uid_t kSystemUser = 1000;

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

Node::Node(NodeSpec spec)
    : spec_(std::move(spec)),
      text_(spec_.text),
      attributes_{modeOf(spec_.access), kSystemUser, kSystemUser} {}

std::string Node::text() const {
    const std::lock_guard lock(mutex_);
    return text_;
}

void Node::store(std::string_view text) {
    if (!spec_.hold) setText(text);
}

void Node::setText(std::string_view text) {
    const std::lock_guard lock(mutex_);
    text_ = text;
}

Attributes Node::attributes() const {
    const std::lock_guard lock(mutex_);
    return attributes_;
}

void Node::setAttributes(const Attributes& attributes) {
    const std::lock_guard lock(mutex_);
    attributes_ = attributes;
}

NodeTree::NodeTree(std::string_view root, const std::vector<NodeSpec>& nodes) : root_(root) {
    entries_.emplace_back();
    entries_.back().inode = entries_.back().parent = kRootInode;
    for (const NodeSpec& spec : nodes) {
        uint64_t at = kRootInode;
        const std::string_view path = std::string_view(spec.path).substr(root.size());
        for (size_t slash = 0; slash < path.size();) {
            const size_t end = std::min(path.find('/', slash + 1), path.size());
            at = addChild(at, path.substr(slash + 1, end - slash - 1));
            slash = end;
        }
        entries_[at - kRootInode].node = std::make_unique<Node>(spec);
    }
}

uint64_t NodeTree::addChild(uint64_t folder, std::string_view name) {
    if (const TreeEntry* existing = child(folder, name)) return existing->inode;
    TreeEntry entry;
    entry.name = name;
    entry.inode = entries_.size() + kRootInode;
    entry.parent = folder;
    entries_[folder - kRootInode].children.emplace(name, entry.inode);
    entries_.push_back(std::move(entry));
    return entries_.back().inode;
}

const TreeEntry* NodeTree::find(uint64_t inode) const {
    const uint64_t index = inode - kRootInode;
    return index < entries_.size() ? &entries_[index] : nullptr;
}

const TreeEntry* NodeTree::child(uint64_t folder, std::string_view name) const {
    const TreeEntry* entry = find(folder);
    if (entry == nullptr) return nullptr;
    const auto found = entry->children.find(name);
    return found != entry->children.end() ? find(found->second) : nullptr;
}

Node* NodeTree::nodeAt(std::string_view path) const {
    const auto found = std::find_if(entries_.begin(), entries_.end(), [&](const TreeEntry& entry) {
        return entry.node && entry.node->path() == path;
    });
    return found != entries_.end() ? found->node.get() : nullptr;
}

std::string NodeTree::pathOf(uint64_t folder, std::string_view name) const {
    std::string path = "/" + std::string(name);
    for (uint64_t at = folder; at != kRootInode;) {
        const TreeEntry* entry = find(at);
        if (entry == nullptr) break;
        path.insert(0, "/" + entry->name);
        at = entry->parent;
    }
    return root_ + path;
}

}  // namespace handset
