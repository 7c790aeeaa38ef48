// SPDX-License-Identifier: Apache-2.0
//
// Callbacks that clients have left for a name.
#pragma once

#include <sys/types.h>

#include <cstdint>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include <android/binder_ibinder.h>

namespace servicemanager {

// A strong reference to a binder object. Two references are the same object exactly when their
// pointers are equal.
using Object = std::shared_ptr<AIBinder>;

// Each operation costs a logarithm of all there is, for each entry that it touches. Not thread-safe.
class CallbackTable {
  public:
    // How many entries one user may have.
    static constexpr size_t kMaxPerUser = 1000;

    // Adds an entry, also one that is there already. False, and nothing is added, when the user has
    // as many as allowed.
    bool add(const std::string& name, const Object& callback, uid_t user);

    // Removes every entry of this name and callback; false when there was none.
    bool remove(const std::string& name, const AIBinder* callback);

    // Removes every entry of this callback.
    void removeAll(const AIBinder* callback);

    bool contains(const AIBinder* callback) const;

    // The callbacks of a name, in the order in which they were added.
    std::vector<Object> find(const std::string& name) const;

    // The names that have callbacks, in byte order.
    std::vector<std::string> names() const;

    bool empty() const { return mEntries.empty(); }

  private:
    struct Entry {
        Object callback;
        uid_t user;
    };
    // A name, and the entry's running number.
    using Key = std::pair<std::string, uint64_t>;
    using Index = std::set<std::tuple<const AIBinder*, std::string, uint64_t>>;

    Index::iterator erase(Index::iterator at);

    uint64_t mLastNumber = 0;
    std::map<Key, Entry> mEntries;
    Index mByCallback;
    std::map<uid_t, size_t> mCounts;
};

}  // namespace servicemanager
