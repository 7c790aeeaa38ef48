// SPDX-License-Identifier: Apache-2.0
//
// Sending: the command queue, transactions out of this process, and waiting for their end.
#include "platform/libbinder_ndk/src/thread_state.h"

#include <errno.h>
#include <pthread.h>

#include <cstring>

#include "platform/libbinder_ndk/src/driver.h"
#include "platform/libbinder_ndk/src/kernel.h"
#include "platform/libbinder_ndk/src/log.h"
#include "platform/libbinder_ndk/src/parcel.h"

namespace binder_ndk {
namespace {

// A reply without objects and with no more bytes is worth no system call of its own to be given back:
// it waits for what the thread sends next. One such buffer at most does, so a process that makes calls
// from many threads may hold so much for each of them.
constexpr size_t kSmallReply = 1024;

void freeSmallBuffer(const uint8_t* buffer) {
    ThreadState& thread = ThreadState::self();
    const bool isFirst = !thread.hasQueued();
    thread.queue(BC_FREE_BUFFER, reinterpret_cast<binder_uintptr_t>(buffer));
    if (!isFirst) thread.flushUnlessServing();
}

thread_local ThreadState* threadState = nullptr;

// A pthread key rather than a thread_local destructor: it runs after those, whose objects may still
// drop references, and not for the main thread while static destructors do.
pthread_key_t exitKey() {
    static const pthread_key_t key = [] {
        pthread_key_t created = 0;
        const int error = pthread_key_create(&created, [](void* state) {
            threadState = nullptr;
            delete static_cast<ThreadState*>(state);
        });
        if (error != 0) fatal("no thread key for binder threads: %s", std::strerror(error));
        return created;
    }();
    return key;
}

// Payload of the two death commands; the header's struct is packed, which queue() cannot refer to.
struct HandleCookie {
    uint32_t handle;
    uint32_t cookieLow;
    uint32_t cookieHigh;
};
static_assert(sizeof(HandleCookie) == sizeof(binder_handle_cookie));

HandleCookie handleCookie(uint32_t handle, uint64_t cookie) {
    return {handle, static_cast<uint32_t>(cookie), static_cast<uint32_t>(cookie >> 32)};
}

}  // namespace

ThreadState& ThreadState::self() {
    if (threadState == nullptr) {
        threadState = new ThreadState;
        pthread_setspecific(exitKey(), threadState);
    }
    return *threadState;
}

ThreadState::~ThreadState() {
    if (Driver::isForkedCopy()) return;
    dropReleased();
    flush();
    Driver::instance().exitThread();
}

void ThreadState::flush() {
    // A forked child's references were never the driver's to count.
    if (Driver::isForkedCopy()) mQueued = 0;
    if (mQueued == 0) return;
    if (const binder_status_t status = talk(false); status != STATUS_OK)
        logError("the binder driver refuses commands: %s", std::strerror(-status));
}

void ThreadState::flushUnlessServing() {
    if (!mIsLooper && mServing == 0) flush();
}

binder_status_t ThreadState::talk(bool read) {
    if (Driver::isForkedCopy()) return -EBADF;  // what is queued was the parent's to send
    const bool wantsRead = read && !hasReceived();
    binder_write_read exchange = {};
    // While commands are left only a flush may write: they may ask for answers that come first.
    if (!read || wantsRead) {
        exchange.write_size = mQueued;
        exchange.write_buffer = reinterpret_cast<binder_uintptr_t>(mQueue.data());
    }
    if (wantsRead) {
        exchange.read_size = sizeof mIn;
        exchange.read_buffer = reinterpret_cast<binder_uintptr_t>(mIn);
    }
    if (exchange.write_size == 0 && exchange.read_size == 0) return STATUS_OK;

    const int error = Driver::instance().writeRead(exchange);
    // The driver stops behind a transaction that failed; the rest goes with the next write.
    mQueued -= exchange.write_consumed;
    if (mQueued != 0) std::memmove(mQueue.data(), mQueue.data() + exchange.write_consumed, mQueued);
    if (wantsRead) {
        mReceived = 0;
        mReceivedSize = error == 0 ? exchange.read_consumed : 0;
    }
    return error;
}

void ThreadState::queueTransaction(uint32_t command, uint32_t handle, uint32_t code, uint32_t flags,
                                   const Parcel& data) {
    binder_transaction_data transaction = {};
    transaction.target.handle = handle;
    transaction.code = code;
    transaction.flags = flags;
    transaction.data_size = data.size();
    transaction.offsets_size = data.offsetCount() * sizeof(binder_size_t);
    transaction.data.ptr.buffer = reinterpret_cast<binder_uintptr_t>(data.data());
    transaction.data.ptr.offsets = reinterpret_cast<binder_uintptr_t>(data.offsets());
    queue(command, transaction);
}

void ThreadState::queueStatusReply(binder_status_t status, uint32_t flags) {
    mStatusReply = status;
    binder_transaction_data transaction = {};
    transaction.flags = flags | TF_STATUS_CODE;
    transaction.data_size = sizeof mStatusReply;
    transaction.data.ptr.buffer = reinterpret_cast<binder_uintptr_t>(&mStatusReply);
    queue(BC_REPLY, transaction);
}

binder_status_t ThreadState::transact(uint32_t handle, uint32_t code, const Parcel& request,
                                      Parcel* reply, uint32_t flags) {
    if (Driver::isForkedCopy())
        fatal("binder was opened before this process was forked; only exec makes it usable again");

    queueTransaction(BC_TRANSACTION, handle, code, flags | TF_ACCEPT_FDS, request);
    const binder_status_t status =
            waitFor((flags & TF_ONE_WAY) != 0 ? Until::kSent : Until::kReplied, reply);
    if (!mIsLooper && mServing == 0 && !hasReceived()) dropReleased();
    return status;
}

binder_status_t ThreadState::waitFor(Until until, Parcel* reply) {
    for (;;) {
        if (!hasReceived()) {
            if (const auto status = talk(true); status != STATUS_OK) return status;
            continue;
        }
        const auto command = receive<uint32_t>();
        switch (command) {
            case BR_NOOP:
                break;
            case BR_ONEWAY_SPAM_SUSPECT:
                logError("this process floods another one with oneway calls");
                [[fallthrough]];
            case BR_TRANSACTION_COMPLETE:
            case kTransactionPendingFrozen:
                if (until == Until::kSent) return STATUS_OK;
                break;
            case BR_DEAD_REPLY:
                return STATUS_DEAD_OBJECT;
            case BR_FAILED_REPLY:
            case BR_FROZEN_REPLY:
                return STATUS_FAILED_TRANSACTION;
            case BR_REPLY:
                return acceptReply(reply);
            default:
                if (const auto status = execute(command); status != STATUS_OK) return status;
        }
    }
}

binder_status_t ThreadState::acceptReply(Parcel* reply) {
    const auto transaction = receive<binder_transaction_data>();
    const bool isSmall = transaction.offsets_size == 0 && transaction.data_size <= kSmallReply;
    reply->adopt(reinterpret_cast<const uint8_t*>(transaction.data.ptr.buffer),  // NOLINT
                 transaction.data_size,
                 reinterpret_cast<const binder_size_t*>(transaction.data.ptr.offsets),  // NOLINT
                 transaction.offsets_size / sizeof(binder_size_t),
                 isSmall ? freeSmallBuffer : kernel::freeBuffer);
    if ((transaction.flags & TF_STATUS_CODE) == 0) return STATUS_OK;
    int32_t status = STATUS_UNKNOWN_ERROR;
    reply->read(&status);
    reply->reset();
    return status;
}

namespace kernel {

binder_status_t transact(uint32_t handle, uint32_t code, const Parcel& request, Parcel* reply,
                         uint32_t flags) {
    return ThreadState::self().transact(handle, code, request, reply, flags);
}

void acquire(uint32_t handle) {
    ThreadState& thread = ThreadState::self();
    thread.queue(BC_INCREFS, handle);
    thread.queue(BC_ACQUIRE, handle);
    thread.flush();
}

void release(uint32_t handle) {
    ThreadState& thread = ThreadState::self();
    thread.queue(BC_RELEASE, handle);
    thread.queue(BC_DECREFS, handle);
    thread.flushUnlessServing();
}

void requestDeathNotification(uint32_t handle, uint64_t cookie) {
    ThreadState& thread = ThreadState::self();
    thread.queue(BC_REQUEST_DEATH_NOTIFICATION, handleCookie(handle, cookie));
    thread.flush();
}

void clearDeathNotification(uint32_t handle, uint64_t cookie) {
    ThreadState& thread = ThreadState::self();
    thread.queue(BC_CLEAR_DEATH_NOTIFICATION, handleCookie(handle, cookie));
    thread.flush();
}

void freeBuffer(const uint8_t* buffer) {
    ThreadState& thread = ThreadState::self();
    thread.queue(BC_FREE_BUFFER, reinterpret_cast<binder_uintptr_t>(buffer));
    thread.flushUnlessServing();
}

}  // namespace kernel
}  // namespace binder_ndk
