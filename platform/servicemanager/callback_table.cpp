// SPDX-License-Identifier: Apache-2.0
//
// Callbacks that clients have left for a name: see callback_table.h.
#include "platform/servicemanager/callback_table.h"

namespace servicemanager {

bool CallbackTable::add(const std::string& name, const Object& callback, uid_t user) {
    size_t& count = mCounts[user];
    if (count >= kMaxPerUser) return false;
    ++count;
    const uint64_t number = ++mLastNumber;
    mEntries.emplace(Key(name, number), Entry{callback, user});
    mByCallback.emplace(callback.get(), name, number);
    return true;
}

bool CallbackTable::remove(const std::string& name, const AIBinder* callback) {
    auto at = mByCallback.lower_bound({callback, name, 0});
    bool found = false;
    while (at != mByCallback.end() && std::get<0>(*at) == callback && std::get<1>(*at) == name) {
        at = erase(at);
        found = true;
    }
    return found;
}

void CallbackTable::removeAll(const AIBinder* callback) {
    auto at = mByCallback.lower_bound({callback, "", 0});
    while (at != mByCallback.end() && std::get<0>(*at) == callback) at = erase(at);
}

bool CallbackTable::contains(const AIBinder* callback) const {
    const auto at = mByCallback.lower_bound({callback, "", 0});
    return at != mByCallback.end() && std::get<0>(*at) == callback;
}

std::vector<Object> CallbackTable::find(const std::string& name) const {
    std::vector<Object> callbacks;
    for (auto at = mEntries.lower_bound({name, 0}); at != mEntries.end() && at->first.first == name;
         ++at) {
        callbacks.push_back(at->second.callback);
    }
    return callbacks;
}

std::vector<std::string> CallbackTable::names() const {
    std::vector<std::string> names;
    for (const auto& [key, entry] : mEntries) {
        if (names.empty() || names.back() != key.first) names.push_back(key.first);
    }
    return names;
}

CallbackTable::Index::iterator CallbackTable::erase(Index::iterator at) {
    const auto entry = mEntries.find({std::get<1>(*at), std::get<2>(*at)});
    const auto count = mCounts.find(entry->second.user);
    if (--count->second == 0) mCounts.erase(count);
    mEntries.erase(entry);
    return mByCallback.erase(at);
}

}  // namespace servicemanager
