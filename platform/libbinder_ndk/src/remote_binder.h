// SPDX-License-Identifier: Apache-2.0
// Proxies. A remote object has one AIBinder in this process as long as anyone here refers to it.
#pragma once

#include <mutex>
#include <string>

#include "binder.h"

namespace binder_ndk {

class RemoteBinder final : public AIBinder {
  public:
    explicit RemoteBinder(uint32_t handle) : handle_(handle) {}

    RemoteBinder* asRemote() override { return this; }

    // STATUS_DEAD_OBJECT without traffic when the object is known dead, STATUS_BAD_TYPE for a user
    // code when its stability does not let the caller call it.
    binder_status_t transact(uint32_t code, const Parcel& request, Parcel* reply,
                             uint32_t flags) override;

    uint32_t handle() const { return handle_; }

    bool isAlive() const { return alive_.load(std::memory_order_relaxed); }
    void markDead() { alive_.store(false, std::memory_order_relaxed); }

    // A notice of its death has come. Guarded by the lock of the death links.
    bool deathReported = false;

    // What the object says its interface is; asked once. Empty when it does not answer.
    std::u16string descriptor();

  protected:
    bool dropStrong() override;

  private:
    ~RemoteBinder() override = default;

    const uint32_t handle_;
    std::atomic<bool> alive_{true};
    std::mutex mutex_;  // guards descriptor_
    std::u16string descriptor_;
};

// The proxy of a handle, made if there is none; one strong reference for the caller. Null only for
// handle 0 when there is no service manager.
AIBinder* strongProxy(uint32_t handle);

}  // namespace binder_ndk
