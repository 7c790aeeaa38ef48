// SPDX-License-Identifier: Apache-2.0
//
// Open files by number: what the kernel hands back with every call on one of them.
#pragma once

#include <cstdint>
#include <memory>
#include <mutex>
#include <unordered_map>
#include <utility>

namespace handset {

// Owns one `File` for each file that is open. All operations may be called from any thread.
template <typename File>
class HandleTable {
  public:
    // Takes a file over and returns its number, never 0.
    uint64_t add(std::unique_ptr<File> file) {
        const std::lock_guard lock(mMutex);
        mFiles.emplace(++mLast, std::move(file));
        return mLast;
    }

    // The file with that number; it stays until it is taken away, which the kernel asks for only
    // after every call on it has been answered.
    File& get(uint64_t number) {
        const std::lock_guard lock(mMutex);
        return *mFiles.at(number);
    }

    // Gives the file up.
    std::unique_ptr<File> remove(uint64_t number) {
        const std::lock_guard lock(mMutex);
        auto node = mFiles.extract(number);
        return node ? std::move(node.mapped()) : nullptr;
    }

  private:
    std::mutex mMutex;
    uint64_t mLast = 0;
    std::unordered_map<uint64_t, std::unique_ptr<File>> mFiles;
};

}  // namespace handset
