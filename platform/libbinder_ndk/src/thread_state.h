// SPDX-License-Identifier: Apache-2.0
//
// One thread's conversation with the driver: commands it has queued, commands it has received.
#pragma once

#include <linux/android/binder.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <vector>

#include <android/binder_status.h>

#include "platform/libbinder_ndk/src/binder.h"

namespace binder_ndk {

// BR_TRANSACTION_PENDING_FROZEN of newer kernels: the transaction waits for a frozen process.
inline constexpr uint32_t kTransactionPendingFrozen = _IO('r', 20);

class ThreadState {
  public:
    // The calling thread's. When the thread ends its queue is sent and the driver told.
    static ThreadState& self();

    ThreadState() = default;
    ~ThreadState();
    ThreadState(const ThreadState&) = delete;
    ThreadState& operator=(const ThreadState&) = delete;

    // See kernel.h.
    binder_status_t transact(uint32_t handle, uint32_t code, const Parcel& request, Parcel* reply,
                             uint32_t flags);

    // Queues a command and its payload, zero bytes of none.
    template <typename... Payload>
    void queue(uint32_t command, const Payload&... payload) {
        uint8_t* to = append(sizeof command + (sizeof payload + ... + 0));
        std::memcpy(to, &command, sizeof command);
        to += sizeof command;
        ((std::memcpy(to, &payload, sizeof payload), to += sizeof payload), ...);
    }

    // Sends what is queued.
    void flush();

    // As above, unless this thread is about to talk to the driver anyway.
    void flushUnlessServing();

    // Whether anything is queued.
    bool hasQueued() const { return mQueued != 0; }

    // Serves until the driver is gone. `isMain`: the thread joined of its own accord, else the
    // driver asked for it.
    void serve(bool isMain);

    // For a process with an event loop: announces the thread; then serves what has arrived.
    void enterPolling();
    binder_status_t handlePolled();

  private:
    // A caller that is called back may call again while this thread waits for it, each time deeper
    // in this thread's stack. More than this at a time is an attack on the stack.
    static constexpr int kMaxNestedCalls = 32;

    // What ends a wait: our transaction was taken, or its reply is there.
    enum class Until { kSent, kReplied };

    // Room for so many bytes at the queue's end, which the caller fills.
    uint8_t* append(size_t length) {
        if (mQueue.size() - mQueued < length) mQueue.resize(2 * (mQueued + length));
        mQueued += length;
        return mQueue.data() + mQueued - length;
    }
    // The next value received. The driver never splits a command; a missing rest reads as zero.
    template <typename T>
    T receive() {
        T value = {};
        if (mReceivedSize - mReceived >= sizeof value)
            std::memcpy(&value, mIn + mReceived, sizeof value);
        mReceived = std::min(mReceivedSize, mReceived + sizeof value);
        return value;
    }
    bool hasReceived() const { return mReceived < mReceivedSize; }

    void queueTransaction(uint32_t command, uint32_t handle, uint32_t code, uint32_t flags,
                          const Parcel& data);
    void queueStatusReply(binder_status_t status, uint32_t flags);

    // Writes the queue and, with `read`, waits for commands unless some are left.
    binder_status_t talk(bool read);
    binder_status_t waitFor(Until until, Parcel* reply);
    binder_status_t acceptReply(Parcel* reply);

    // Carries out a command that may come at any time.
    binder_status_t execute(uint32_t command);
    binder_status_t executeNext();
    binder_status_t skipUnknown(uint32_t command);
    void serveTransaction(const binder_transaction_data& transaction, const char* sid);
    binder_status_t answerRequest(const binder_transaction_data& transaction, const char* sid,
                                  Parcel* reply);
    binder_status_t callTarget(const binder_transaction_data& transaction, const Parcel& request,
                               Parcel* reply);
    binder_status_t refuseNesting();
    void sendReply(binder_status_t status, const Parcel& reply, uint32_t requestFlags);

    // Drops the references the driver gave back; only between read buffers, because user code runs.
    void dropReleased();

    std::vector<uint8_t> mQueue = std::vector<uint8_t>(256);
    size_t mQueued = 0;  // bytes of it that are in use

    // The platform's size. The driver needs no more than 80 bytes for a command of its own.
    alignas(8) uint8_t mIn[256];
    size_t mReceived = 0;
    size_t mReceivedSize = 0;

    // A looper's queue goes with its next read.
    bool mIsLooper = false;
    int mServing = 0;

    // What a status reply points at until the driver has copied it.
    int32_t mStatusReply = 0;

    std::vector<LocalBinder*> mReleasedStrong;
    std::vector<LocalBinder*> mReleasedWeak;
};

}  // namespace binder_ndk
