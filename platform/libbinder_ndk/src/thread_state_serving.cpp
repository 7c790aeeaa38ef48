// SPDX-License-Identifier: Apache-2.0
//
// Receiving: transactions into this process, references the driver takes and gives back, notices.
#include <errno.h>

#include <cstring>
#include <mutex>

#include "platform/libbinder_ndk/src/call_context.h"
#include "platform/libbinder_ndk/src/context_manager.h"
#include "platform/libbinder_ndk/src/death.h"
#include "platform/libbinder_ndk/src/driver.h"
#include "platform/libbinder_ndk/src/kernel.h"
#include "platform/libbinder_ndk/src/log.h"
#include "platform/libbinder_ndk/src/parcel.h"
#include "platform/libbinder_ndk/src/process.h"
#include "platform/libbinder_ndk/src/thread_state.h"

namespace binder_ndk {

binder_status_t ThreadState::execute(uint32_t command) {
    switch (command) {
        case BR_NOOP:
        case BR_OK:
            return STATUS_OK;
        case BR_ERROR:
            return receive<int32_t>();
        case BR_TRANSACTION:
            serveTransaction(receive<binder_transaction_data>(), nullptr);
            return STATUS_OK;
        case BR_TRANSACTION_SEC_CTX: {
            const auto received = receive<binder_transaction_data_secctx>();
            serveTransaction(received.transaction_data,
                             reinterpret_cast<const char*>(received.secctx));  // NOLINT
            return STATUS_OK;
        }
        case BR_INCREFS: {
            const auto object = receive<binder_ptr_cookie>();
            LocalBinder::fromCookie(object.cookie)->incWeak();
            queue(BC_INCREFS_DONE, object);
            return STATUS_OK;
        }
        case BR_ACQUIRE: {
            // The parcel that is being sent still refers to the object.
            const auto object = receive<binder_ptr_cookie>();
            LocalBinder::fromCookie(object.cookie)->incStrong();
            queue(BC_ACQUIRE_DONE, object);
            return STATUS_OK;
        }
        case BR_RELEASE:
            mReleasedStrong.push_back(LocalBinder::fromCookie(receive<binder_ptr_cookie>().cookie));
            return STATUS_OK;
        case BR_DECREFS:
            mReleasedWeak.push_back(LocalBinder::fromCookie(receive<binder_ptr_cookie>().cookie));
            return STATUS_OK;
        case BR_DEAD_BINDER: {
            const auto cookie = receive<binder_uintptr_t>();
            handleDeathNotice(cookie);
            queue(BC_DEAD_BINDER_DONE, cookie);
            return STATUS_OK;
        }
        case BR_CLEAR_DEATH_NOTIFICATION_DONE:
            // Cookies are never used again, so nothing had to be kept for this.
            receive<binder_uintptr_t>();
            return STATUS_OK;
        case BR_SPAWN_LOOPER:
            spawnRequestedThread();
            return STATUS_OK;
        case BR_FINISHED:
            return STATUS_TIMED_OUT;
        default:
            return skipUnknown(command);
    }
}

// A command's number says how long its payload is.
binder_status_t ThreadState::skipUnknown(uint32_t command) {
    logError("the binder driver sent the unknown command 0x%x", command);
    mReceived = std::min(mReceivedSize, mReceived + _IOC_SIZE(command));
    return STATUS_UNKNOWN_ERROR;
}

void ThreadState::serveTransaction(const binder_transaction_data& transaction, const char* sid) {
    ++mServing;
    {
        Parcel reply;
        const binder_status_t status = answerRequest(transaction, sid, &reply);
        if ((transaction.flags & TF_ONE_WAY) == 0) {
            sendReply(status, reply, transaction.flags);
        } else if (status != STATUS_OK) {
            logWarning("a oneway call of code %u failed with status %d", transaction.code, status);
        }
    }
    --mServing;
}

binder_status_t ThreadState::answerRequest(const binder_transaction_data& transaction,
                                           const char* sid, Parcel* reply) {
    // Outlives the identity, which refers to it, but not this function: given back in front of the
    // reply, so that a client with its answer finds room for another request as large.
    Parcel request;
    request.adopt(reinterpret_cast<const uint8_t*>(transaction.data.ptr.buffer),  // NOLINT
                  transaction.data_size,
                  reinterpret_cast<const binder_size_t*>(transaction.data.ptr.offsets),  // NOLINT
                  transaction.offsets_size / sizeof(binder_size_t), kernel::freeBuffer);

    CallContext& context = CallContext::current();
    const CallContext saved = context;
    // The driver says pid 0 for a oneway call.
    context = {transaction.sender_pid, transaction.sender_euid, sid, 0, transaction.flags};
    const binder_status_t status =
            mServing <= kMaxNestedCalls ? callTarget(transaction, request, reply) : refuseNesting();
    context = saved;
    return status;
}

binder_status_t ThreadState::refuseNesting() {
    static std::once_flag said;
    const CallContext& context = CallContext::current();
    std::call_once(said, [&] {
        logError(
                "process %d of user %u nests calls more than %d deep; this one and all like it are "
                "refused",
                context.pid, context.uid, kMaxNestedCalls);
    });
    return STATUS_FAILED_TRANSACTION;
}

binder_status_t ThreadState::callTarget(const binder_transaction_data& transaction,
                                        const Parcel& request, Parcel* reply) {
    if (transaction.target.ptr == 0) {
        AIBinder* const manager = contextManagerObject();
        if (manager == nullptr) return STATUS_UNKNOWN_TRANSACTION;
        return manager->transact(transaction.code, request, reply, transaction.flags);
    }
    // The driver's weak reference keeps the memory; the object itself may be on its way out.
    LocalBinder* const target = LocalBinder::fromCookie(transaction.cookie);
    if (!target->attemptIncStrong()) return STATUS_UNKNOWN_TRANSACTION;
    const binder_status_t status =
            target->transact(transaction.code, request, reply, transaction.flags);
    target->decStrong();
    return status;
}

void ThreadState::sendReply(binder_status_t status, const Parcel& reply, uint32_t requestFlags) {
    const uint32_t flags = requestFlags & TF_CLEAR_BUF;
    if (status < 0) {
        queueStatusReply(status, flags);
    } else {
        queueTransaction(BC_REPLY, 0, 0, flags, reply);
    }
    // The reply has to stay until the driver has copied it and referred to the objects in it.
    if (const auto sent = waitFor(Until::kSent, nullptr); sent != STATUS_OK)
        logWarning("a reply was not taken: status %d", sent);
}

void ThreadState::dropReleased() {
    // What runs here may release more.
    while (!mReleasedStrong.empty() || !mReleasedWeak.empty()) {
        std::vector<LocalBinder*> strong;
        std::vector<LocalBinder*> weak;
        strong.swap(mReleasedStrong);
        weak.swap(mReleasedWeak);
        for (LocalBinder* const binder : strong) binder->decStrong();
        for (LocalBinder* const binder : weak) binder->decWeak();
    }
}

binder_status_t ThreadState::executeNext() {
    if (const auto status = talk(true); status != STATUS_OK) return status;
    if (!hasReceived()) return STATUS_OK;
    return execute(receive<uint32_t>());
}

void ThreadState::serve(bool isMain) {
    mIsLooper = true;
    queue(isMain ? BC_ENTER_LOOPER : BC_REGISTER_LOOPER);
    for (;;) {
        if (!hasReceived()) dropReleased();
        const binder_status_t status = executeNext();
        if (status == -ECONNREFUSED || status == -EBADF) break;
        if (status == STATUS_TIMED_OUT && !isMain) break;
        if (status < 0 && status != STATUS_TIMED_OUT) {
            fatal("a thread cannot go on serving: the binder driver answers %d (%s)", status,
                  std::strerror(-status));
        }
    }
    queue(BC_EXIT_LOOPER);
    flush();
    mIsLooper = false;
}

void ThreadState::enterPolling() {
    mIsLooper = true;
    queue(BC_ENTER_LOOPER);
    flush();
}

binder_status_t ThreadState::handlePolled() {
    binder_status_t status = STATUS_OK;
    do {
        status = executeNext();
    } while (hasReceived());
    dropReleased();
    flush();
    return status;
}

}  // namespace binder_ndk
