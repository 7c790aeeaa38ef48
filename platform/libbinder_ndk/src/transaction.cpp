// SPDX-License-Identifier: Apache-2.0
//
// Transactions through the C interface: preparing and sending one, and handing one that came in to
// the class.
#include <memory>

#include <android/binder_ibinder_platform.h>
#include <android/binder_stability.h>

#include "platform/libbinder_ndk/src/binder.h"
#include "platform/libbinder_ndk/src/parcel.h"
#include "platform/libbinder_ndk/src/status.h"
#include "platform/libbinder_ndk/src/token.h"

namespace binder_ndk {

binder_status_t LocalBinder::transactUser(uint32_t code, const Parcel& request, Parcel* reply) {
    const AIBinder_Class* const type = clazz.load(std::memory_order_relaxed);
    if (!checkInterfaceToken(request, type->descriptor16)) return STATUS_BAD_TYPE;
    const AParcel in(this, request);
    AParcel out(this, *reply);
    return knownStatus(type->onTransact(this, code, &in, &out));
}

}  // namespace binder_ndk

using namespace binder_ndk;

binder_status_t AIBinder_prepareTransaction(AIBinder* binder, AParcel** in) {
    if (binder == nullptr || in == nullptr) return STATUS_UNEXPECTED_NULL;
    const AIBinder_Class* const clazz = AIBinder_getClass(binder);
    if (clazz == nullptr) return STATUS_INVALID_OPERATION;
    auto parcel = std::make_unique<AParcel>(binder);
    const binder_status_t status = knownStatus(writeInterfaceToken(**parcel, clazz->descriptor16));
    *in = status == STATUS_OK ? parcel.release() : nullptr;
    return status;
}

binder_status_t AIBinder_transact(AIBinder* binder, transaction_code_t code, AParcel** in,
                                  AParcel** out, binder_flags_t flags) {
    if (in == nullptr) return STATUS_UNEXPECTED_NULL;
    const std::unique_ptr<AParcel> request(*in);
    *in = nullptr;
    if (out != nullptr) *out = nullptr;

    constexpr auto kAllowedFlags = binder_flags_t{FLAG_ONEWAY} | binder_flags_t{FLAG_CLEAR_BUF} |
                                   binder_flags_t{FLAG_PRIVATE_VENDOR};
    if (!isUserCode(code)) return STATUS_UNKNOWN_TRANSACTION;
    if ((flags & ~kAllowedFlags) != 0) return STATUS_BAD_VALUE;
    if (binder == nullptr || request == nullptr || out == nullptr) return STATUS_UNEXPECTED_NULL;
    if (request->binder() != binder) return STATUS_BAD_VALUE;

    auto reply = std::make_unique<AParcel>(binder);
    const binder_status_t status = knownStatus(binder->transact(code, **request, &**reply, flags));
    if (status == STATUS_OK) *out = reply.release();
    return status;
}

binder_status_t AIBinder_ping(AIBinder* binder) {
    if (binder == nullptr) return STATUS_UNEXPECTED_NULL;
    const Parcel request;
    Parcel reply;
    return knownStatus(binder->transact(kPingTransaction, request, &reply, 0));
}
