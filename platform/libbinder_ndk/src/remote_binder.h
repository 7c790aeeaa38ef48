// SPDX-License-Identifier: Apache-2.0
//
// Proxies. A remote object has one AIBinder in this process as long as anyone here refers to it.
#pragma once

#include <mutex>
#include <string>
#include <utility>

#include <android-base/thread_annotations.h>

#include "platform/libbinder_ndk/src/binder.h"

namespace binder_ndk {

class RemoteBinder final : public AIBinder {
  public:
    explicit RemoteBinder(uint32_t handle, std::u16string descriptor = {})
        : mHandle(handle), mDescriptor(std::move(descriptor)) {}

    RemoteBinder* asRemote() override { return this; }

    // STATUS_DEAD_OBJECT without traffic when the object is known dead, STATUS_BAD_TYPE for a user
    // code when its stability does not let the caller call it.
    binder_status_t transact(uint32_t code, const Parcel& request, Parcel* reply,
                             uint32_t flags) override;

    uint32_t handle() const { return mHandle; }

    bool isAlive() const { return mAlive.load(std::memory_order_relaxed); }
    void markDead() { mAlive.store(false, std::memory_order_relaxed); }

    // A notice of its death has come. Guarded by the lock of the death links.
    bool deathReported = false;

    // Of its links to death, 0 while it has none. Guarded by the lock of the death links.
    uint64_t deathCookie = 0;

    // What the object says its interface is; asked once. Empty when it does not answer.
    std::u16string descriptor();

  protected:
    bool dropStrong() override;

  private:
    ~RemoteBinder() override = default;

    const uint32_t mHandle;
    std::atomic<bool> mAlive{true};
    std::mutex mMutex;
    std::u16string mDescriptor GUARDED_BY(mMutex);
};

// The proxy of a handle, made if there is none; one strong reference for the caller. Null only for
// handle 0 when there is no service manager.
AIBinder* strongProxy(uint32_t handle);

// Whether a service manager answers on handle 0.
bool isServiceManagerThere();

// A proxy of the service manager for the library's own calls, to be kept for good; one strong
// reference for the caller. It is none of those that strongProxy gives out, so a program may give
// the one it finds under the name "manager" a class of its own.
AIBinder* newServiceManagerProxy();

}  // namespace binder_ndk
