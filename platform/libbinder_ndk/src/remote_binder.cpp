// SPDX-License-Identifier: Apache-2.0
//
// Proxies and the table that keeps them unique.
#include "platform/libbinder_ndk/src/remote_binder.h"

#include <unordered_map>

#include <android/binder_stability.h>

#include "platform/libbinder_ndk/src/death.h"
#include "platform/libbinder_ndk/src/kernel.h"
#include "platform/libbinder_ndk/src/parcel.h"
#include "platform/libbinder_ndk/src/stability.h"

namespace binder_ndk {
namespace {

// The proxy of each handle. An entry's proxy always has a strong reference: the last one is dropped
// under the lock, together with the entry, so a proxy that is found can be referred to without
// asking whether it is on its way out. Handles are also acquired and released under the lock: a
// number the driver gives out anew is never mixed up with its former life.
struct ProxyTable {
    std::mutex mutex;
    std::unordered_map<uint32_t, RemoteBinder*> proxies GUARDED_BY(mutex);

    // Never destroyed: threads serve on while the process exits.
    static ProxyTable& instance() {
        static auto* const table = new ProxyTable;
        return *table;
    }

    // One strong reference, or null.
    RemoteBinder* find(uint32_t handle) const REQUIRES(mutex) {
        const auto entry = proxies.find(handle);
        if (entry == proxies.end()) return nullptr;
        entry->second->incStrong();
        return entry->second;
    }
};

}  // namespace

bool isServiceManagerThere() {
    const Parcel request;
    Parcel reply;
    return kernel::transact(0, kPingTransaction, request, &reply, 0) != STATUS_DEAD_OBJECT;
}

// The driver needs no reference to handle 0 for calls to it.
AIBinder* newServiceManagerProxy() {
    auto* const proxy = new RemoteBinder(0, u"android.os.IServiceManager");
    markServiceManagerStability(proxy);
    return proxy;
}

AIBinder* strongProxy(uint32_t handle) {
    ProxyTable& table = ProxyTable::instance();
    if (handle == 0) {
        {
            const std::lock_guard<std::mutex> lock(table.mutex);
            if (RemoteBinder* const proxy = table.find(handle)) return proxy;
        }
        // The driver refuses a reference to handle 0 while nobody is behind it. Asked without the
        // lock: the thread may have to serve calls while it waits.
        if (!isServiceManagerThere()) return nullptr;
    }
    const std::lock_guard<std::mutex> lock(table.mutex);
    if (RemoteBinder* const proxy = table.find(handle)) return proxy;
    auto* const proxy = new RemoteBinder(handle);
    table.proxies.emplace(handle, proxy);
    kernel::acquire(handle);
    return proxy;
}

bool RemoteBinder::dropStrong() {
    ProxyTable& table = ProxyTable::instance();
    const std::lock_guard<std::mutex> lock(table.mutex);
    if (mStrong.fetch_sub(1, std::memory_order_acq_rel) != 1) return false;
    table.proxies.erase(mHandle);
    forgetDeathLinks(this);
    kernel::release(mHandle);
    return true;
}

binder_status_t RemoteBinder::transact(uint32_t code, const Parcel& request, Parcel* reply,
                                       uint32_t flags) {
    if (!isAlive()) return STATUS_DEAD_OBJECT;
    if (isUserCode(code) && !mayCall(this, flags)) return STATUS_BAD_TYPE;
    const binder_status_t status = kernel::transact(
            mHandle, code, request, reply, flags & ~static_cast<uint32_t>(FLAG_PRIVATE_VENDOR));
    if (status == STATUS_DEAD_OBJECT) markDead();
    return status;
}

std::u16string RemoteBinder::descriptor() {
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        if (!mDescriptor.empty()) return mDescriptor;
    }
    const Parcel request;
    Parcel reply;
    std::u16string_view answer;
    if (transact(kInterfaceTransaction, request, &reply, 0) != STATUS_OK) return {};
    reply.setPosition(0);
    if (!reply.readString16(&answer)) return {};
    const std::lock_guard<std::mutex> lock(mMutex);
    if (mDescriptor.empty()) mDescriptor = answer;
    return mDescriptor;
}

}  // namespace binder_ndk
