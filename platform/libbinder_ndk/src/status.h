// SPDX-License-Identifier: Apache-2.0
//
// Status codes, exceptions and AStatus; how an outcome opens a reply.
#pragma once

#include <string>

#include <android/binder_status.h>

// An outcome. The exception is kept as it came, also an unknown one: its number shows in the
// description, while getExceptionCode answers EX_TRANSACTION_FAILED.
struct AStatus {
    int32_t exception = EX_NONE;
    // The service's number for EX_SERVICE_SPECIFIC, the transport's for EX_TRANSACTION_FAILED.
    int32_t error = 0;
    std::string message;
};

namespace binder_ndk {

// The exception that stands for a header in front of the status: on the wire only.
inline constexpr int32_t kHasReplyHeader = -128;

class Parcel;

// `status`, or STATUS_UNKNOWN_ERROR, with a warning, for a value that has no name.
binder_status_t knownStatus(int32_t status);

// `exception`, or EX_TRANSACTION_FAILED for a value that has no name.
binder_exception_t knownException(int32_t exception);

// Writes what opens a reply. A transport failure has no bytes: it is returned, to become the status
// of the whole transaction.
binder_status_t writeStatusHeader(Parcel& parcel, const AStatus& status);

// Reads it; `*status` changes only on STATUS_OK.
binder_status_t readStatusHeader(const Parcel& parcel, AStatus* status);

}  // namespace binder_ndk
