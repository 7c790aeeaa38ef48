// SPDX-License-Identifier: Apache-2.0
//
// What the library asks of the driver, as plain functions. Everything above works with these alone;
// thread_state.cpp carries them out on the calling thread. The first one to be called opens the
// driver.
#pragma once

#include <cstdint>

#include <android/binder_status.h>

namespace binder_ndk {

class Parcel;

namespace kernel {

// Sends a transaction and, unless TF_ONE_WAY is set, waits for the reply, serving calls into this
// process meanwhile. `reply` adopts the received buffer.
binder_status_t transact(uint32_t handle, uint32_t code, const Parcel& request, Parcel* reply,
                         uint32_t flags);

// Queues a reference to a handle that is just held by a buffer, and sends it on its way at once:
// the buffer may be freed by another thread.
void acquire(uint32_t handle);

// Queues the release of the reference.
void release(uint32_t handle);

// Asks for the death notice of a handle, or takes that back; sent at once.
void requestDeathNotification(uint32_t handle, uint64_t cookie);
void clearDeathNotification(uint32_t handle, uint64_t cookie);

// Queues the return of a received buffer. The shape of Parcel::ReleaseBuffer.
void freeBuffer(const uint8_t* buffer);

}  // namespace kernel
}  // namespace binder_ndk
