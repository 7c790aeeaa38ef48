// SPDX-License-Identifier: Apache-2.0
//
// The driver's nodes and the directories they lie in, by inode number.
#pragma once

#include <sys/types.h>

#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

#include "handset/driver/permission.h"
#include "handset/driver/profile.h"

namespace handset {

// A node while the driver runs. All operations may be called from any thread.
class Node {
  public:
    explicit Node(NodeProfile spec);

    const std::string& path() const { return mSpec.path; }

    // Whether the node has the method, which its permission bits alone do not say.
    bool isReadable() const { return mSpec.access != Access::kWriteOnly; }
    bool isWritable() const { return mSpec.access != Access::kReadOnly; }

    // What a read returns now.
    std::string text() const;

    // Takes a client's write: the whole text from now on, unless the node holds its first one.
    void store(std::string_view text);

    // Changes the text from the driver's side, held or not.
    void setText(std::string_view text);

    Attributes attributes() const;
    void setAttributes(const Attributes& attributes);

  private:
    const NodeProfile mSpec;
    mutable std::mutex mMutex;
    std::string mText;
    Attributes mAttributes;
};

// One name below /sys/class: a directory, or a node where `node` is set.
struct TreeEntry {
    std::string name;
    uint64_t inode = 0;
    uint64_t parent = 0;
    std::map<std::string, uint64_t, std::less<>> children;
    std::unique_ptr<Node> node;
};

// The tree below the mount point. Fixed once built; only the nodes' contents change.
class NodeTree {
  public:
    // `root` is the mount point without a slash at its end; every node's path lies below it.
    NodeTree(std::string_view root, const std::vector<NodeProfile>& nodes);

    // The entry with that number, or null. The root is number 1.
    const TreeEntry* find(uint64_t inode) const;

    // The entry of that name in the directory, or null.
    const TreeEntry* child(uint64_t directory, std::string_view name) const;

    // The node at that path, or null.
    Node* nodeAt(std::string_view path) const;

    // The path of a name in a directory, whether it exists or not.
    std::string pathOf(uint64_t directory, std::string_view name) const;

  private:
    uint64_t addChild(uint64_t directory, std::string_view name);

    std::string mRoot;
    std::vector<TreeEntry> mEntries;
};

}  // namespace handset
