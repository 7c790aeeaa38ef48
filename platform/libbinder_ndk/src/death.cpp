// SPDX-License-Identifier: Apache-2.0
//
// Death links. The driver is asked once for each proxy with links, under a cookie that is never
// used again, so a notice that was already on its way when its request was taken back is
// recognised.
#include "platform/libbinder_ndk/src/death.h"

#include <algorithm>
#include <atomic>
#include <map>
#include <memory>
#include <mutex>
#include <vector>

#include <android-base/thread_annotations.h>

#include "platform/libbinder_ndk/src/kernel.h"
#include "platform/libbinder_ndk/src/log.h"
#include "platform/libbinder_ndk/src/remote_binder.h"

// Shared with the notice that is being delivered while the recipient is deleted.
struct AIBinder_DeathRecipient {
    struct State {
        AIBinder_DeathRecipient_onBinderDied onBinderDied;
        std::atomic<bool> deleted{false};
    };
    std::shared_ptr<State> state;
};

namespace binder_ndk {
namespace {

struct Link {
    std::shared_ptr<AIBinder_DeathRecipient::State> recipient;
    void* cookie;
};

// A proxy with links. While it is listed its handle is held: the driver may be told about it.
struct Watch {
    RemoteBinder* proxy;
    std::vector<Link> links;
};

// The requests to the driver are made under the lock, in the order of the changes they stand for.
class Registry {
  public:
    static Registry& instance() {
        static auto* const registry = new Registry;  // outlives static destruction
        return *registry;
    }

    binder_status_t link(RemoteBinder* proxy, Link link) {
        const std::lock_guard<std::mutex> lock(mMutex);
        // Only a delivered notice refuses links: a proxy that merely failed still gets its notice.
        if (proxy->deathReported) return STATUS_DEAD_OBJECT;
        const auto watch = find(proxy);
        if (watch != mWatches.end()) {
            watch->second.links.push_back(std::move(link));
            return STATUS_OK;
        }
        const uint64_t cookie = ++mLastCookie;
        mWatches[cookie] = {proxy, {std::move(link)}};
        proxy->deathCookie = cookie;
        kernel::requestDeathNotification(proxy->handle(), cookie);
        return STATUS_OK;
    }

    binder_status_t unlink(RemoteBinder* proxy, const AIBinder_DeathRecipient::State* recipient,
                           const void* cookie) {
        const std::lock_guard<std::mutex> lock(mMutex);
        const auto watch = find(proxy);
        if (watch == mWatches.end()) return STATUS_NAME_NOT_FOUND;
        auto& links = watch->second.links;
        const auto newest = std::find_if(links.rbegin(), links.rend(), [&](const Link& link) {
            return link.recipient.get() == recipient && link.cookie == cookie;
        });
        if (newest == links.rend()) return STATUS_NAME_NOT_FOUND;
        links.erase(std::next(newest).base());
        if (links.empty()) drop(watch);
        return STATUS_OK;
    }

    void forget(RemoteBinder* proxy) {
        const std::lock_guard<std::mutex> lock(mMutex);
        const auto watch = find(proxy);
        if (watch != mWatches.end()) drop(watch);
    }

    void forget(const AIBinder_DeathRecipient::State* recipient) {
        const std::lock_guard<std::mutex> lock(mMutex);
        for (auto watch = mWatches.begin(); watch != mWatches.end();) {
            auto& links = watch->second.links;
            links.erase(std::remove_if(links.begin(), links.end(),
                                       [&](const Link& link) {
                                           return link.recipient.get() == recipient;
                                       }),
                        links.end());
            watch = links.empty() ? drop(watch) : std::next(watch);
        }
    }

    // The links to fire for a notice.
    std::vector<Link> takeDead(uint64_t cookie) {
        const std::lock_guard<std::mutex> lock(mMutex);
        const auto watch = mWatches.find(cookie);
        if (watch == mWatches.end()) return {};
        watch->second.proxy->markDead();
        watch->second.proxy->deathReported = true;
        std::vector<Link> links = std::move(watch->second.links);
        drop(watch);
        return links;
    }

  private:
    using Watches = std::map<uint64_t, Watch>;

    Watches::iterator find(const RemoteBinder* proxy) REQUIRES(mMutex) {
        return mWatches.find(proxy->deathCookie);
    }

    Watches::iterator drop(Watches::iterator watch) REQUIRES(mMutex) {
        kernel::clearDeathNotification(watch->second.proxy->handle(), watch->first);
        watch->second.proxy->deathCookie = 0;
        return mWatches.erase(watch);
    }

    std::mutex mMutex;
    uint64_t mLastCookie GUARDED_BY(mMutex) = 0;
    Watches mWatches GUARDED_BY(mMutex);  // by the driver's cookie
};

}  // namespace

void forgetDeathLinks(RemoteBinder* proxy) {
    Registry::instance().forget(proxy);
}

void handleDeathNotice(uint64_t cookie) {
    for (const Link& link : Registry::instance().takeDead(cookie))
        if (!link.recipient->deleted) link.recipient->onBinderDied(link.cookie);
}

}  // namespace binder_ndk

using namespace binder_ndk;

AIBinder_DeathRecipient* AIBinder_DeathRecipient_new(
        AIBinder_DeathRecipient_onBinderDied onBinderDied) {
    if (onBinderDied == nullptr) {
        logError("AIBinder_DeathRecipient_new: the function is null");
        return nullptr;
    }
    auto state = std::make_shared<AIBinder_DeathRecipient::State>();
    state->onBinderDied = onBinderDied;
    return new AIBinder_DeathRecipient{std::move(state)};
}

void AIBinder_DeathRecipient_delete(AIBinder_DeathRecipient* recipient) {
    if (recipient == nullptr) return;
    recipient->state->deleted = true;
    Registry::instance().forget(recipient->state.get());
    delete recipient;
}

binder_status_t AIBinder_linkToDeath(AIBinder* binder, AIBinder_DeathRecipient* recipient,
                                     void* cookie) {
    if (binder == nullptr || recipient == nullptr) return STATUS_UNEXPECTED_NULL;
    RemoteBinder* const proxy = binder->asRemote();
    if (proxy == nullptr) return STATUS_INVALID_OPERATION;
    return Registry::instance().link(proxy, {recipient->state, cookie});
}

binder_status_t AIBinder_unlinkToDeath(AIBinder* binder, AIBinder_DeathRecipient* recipient,
                                       void* cookie) {
    if (binder == nullptr || recipient == nullptr) return STATUS_UNEXPECTED_NULL;
    RemoteBinder* const proxy = binder->asRemote();
    if (proxy == nullptr) return STATUS_NAME_NOT_FOUND;
    return Registry::instance().unlink(proxy, recipient->state.get(), cookie);
}
