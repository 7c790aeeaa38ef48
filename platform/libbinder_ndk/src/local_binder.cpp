// SPDX-License-Identifier: Apache-2.0
//
// Objects of this process: their life, and what they answer to a transaction.
#include <unistd.h>

#include <android/binder_ibinder_platform.h>

#include "platform/libbinder_ndk/src/binder.h"
#include "platform/libbinder_ndk/src/call_context.h"
#include "platform/libbinder_ndk/src/log.h"
#include "platform/libbinder_ndk/src/parcel.h"
#include "platform/libbinder_ndk/src/shell_command.h"
#include "platform/libbinder_ndk/src/status.h"
#include "platform/libbinder_ndk/src/token.h"

namespace binder_ndk {

LocalBinder::LocalBinder(const AIBinder_Class* type, void* userData) : mUserData(userData) {
    clazz.store(type, std::memory_order_release);
}

bool LocalBinder::dropStrong() {
    if (mStrong.fetch_sub(1, std::memory_order_acq_rel) != 1) return false;
    clazz.load()->onDestroy(mUserData);
    if (mExtension != nullptr) mExtension->decStrong();
    return true;
}

void LocalBinder::setExtension(AIBinder* extension) {
    extension->incStrong();
    AIBinder* const old = mExtension;
    mExtension = extension;
    if (old != nullptr) old->decStrong();
}

binder_status_t LocalBinder::transact(uint32_t code, const Parcel& request, Parcel* reply,
                                      uint32_t flags) {
    request.setPosition(0);
    if ((flags & TF_CLEAR_BUF) != 0) reply->markSensitive();
    const binder_status_t status = isUserCode(code) ? transactUser(code, request, reply)
                                                    : transactReserved(code, request, reply);
    reply->setPosition(0);
    return status;
}

binder_status_t LocalBinder::transactReserved(uint32_t code, const Parcel& request, Parcel* reply) {
    switch (code) {
        case kPingTransaction:
            return STATUS_OK;
        case kExtensionTransaction:
            return reply->writeStrongBinder(mExtension);
        case kDebugPidTransaction:
            return reply->write(static_cast<int32_t>(getpid()));
        case kInterfaceTransaction:
            return reply->writeString16(clazz.load()->descriptor16);
        case kDumpTransaction:
            return serveDump(this, request);
        case kShellCommandTransaction:
            return serveShellCommand(this, request);
        case kSystemPropertyTransaction:
            return STATUS_OK;
        default:
            return STATUS_UNKNOWN_TRANSACTION;
    }
}

}  // namespace binder_ndk

using namespace binder_ndk;

AIBinder* AIBinder_new(const AIBinder_Class* clazz, void* args) {
    if (clazz == nullptr) {
        logError("AIBinder_new: the class is null");
        return nullptr;
    }
    return new LocalBinder(clazz, clazz->onCreate(args));
}

void* AIBinder_getUserData(AIBinder* binder) {
    const LocalBinder* const local = binder != nullptr ? binder->asLocal() : nullptr;
    return local != nullptr ? local->userData() : nullptr;
}

binder_status_t AIBinder_setExtension(AIBinder* binder, AIBinder* ext) {
    if (binder == nullptr || ext == nullptr) return STATUS_UNEXPECTED_NULL;
    LocalBinder* const local = binder->asLocal();
    if (local == nullptr) return STATUS_INVALID_OPERATION;
    local->setExtension(ext);
    return STATUS_OK;
}

binder_status_t AIBinder_getExtension(AIBinder* binder, AIBinder** outExt) {
    if (outExt != nullptr) *outExt = nullptr;
    if (binder == nullptr || outExt == nullptr) return STATUS_UNEXPECTED_NULL;
    if (const LocalBinder* const local = binder->asLocal(); local != nullptr) {
        AIBinder_incStrong(local->extension());
        *outExt = local->extension();
        return STATUS_OK;
    }
    const Parcel request;
    Parcel reply;
    binder_status_t status = binder->transact(kExtensionTransaction, request, &reply, 0);
    if (status == STATUS_OK) status = reply.readStrongBinder(outExt);
    return knownStatus(status);
}

void AIBinder_setRequestingSid(AIBinder* binder, bool requestingSid) {
    LocalBinder* const local = binder != nullptr ? binder->asLocal() : nullptr;
    if (local == nullptr) fatal("AIBinder_setRequestingSid: not a local binder");
    local->setRequestingSid(requestingSid);
}

uid_t AIBinder_getCallingUid() {
    return CallContext::current().uid;
}

pid_t AIBinder_getCallingPid() {
    const pid_t pid = CallContext::current().pid;
    return pid == CallContext::kOwnPid ? getpid() : pid;
}

const char* AIBinder_getCallingSid() {
    return CallContext::current().sid;
}
