// SPDX-License-Identifier: Apache-2.0
//
// The status header: the first thing in the reply of every generated method.
//
//   exception i32 | message String16, never null | stack trace size i32 = 0 | more for two
//   exceptions
//
// A success is the first word alone. A reply from Java may start with a header of its own, -128 and
// a size, before a success.
#include <string_view>

#include "platform/libbinder_ndk/src/parcel.h"
#include "platform/libbinder_ndk/src/status.h"
#include "platform/libbinder_ndk/src/utf.h"

namespace binder_ndk {
namespace {

// Skips a block whose size word counts itself from `start` or only what follows it.
binder_status_t skipBlock(const Parcel& parcel, bool sizeCountsItself) {
    const size_t start = parcel.position();
    int32_t size = 0;
    if (const auto status = parcel.read(&size); status != STATUS_OK) return status;
    const size_t from = sizeCountsItself ? start : parcel.position();
    if (size < 0 || static_cast<size_t>(size) > parcel.size() - from) return STATUS_UNKNOWN_ERROR;
    parcel.setPosition(from + static_cast<size_t>(size));
    return STATUS_OK;
}

}  // namespace

binder_status_t writeStatusHeader(Parcel& parcel, const AStatus& status) {
    if (status.exception == EX_TRANSACTION_FAILED) return status.error;

    if (const auto result = parcel.write(status.exception); result != STATUS_OK) return result;
    if (status.exception == EX_NONE) return STATUS_OK;

    const std::u16string message = utf8ToUtf16Lossy(status.message);
    if (const auto result = parcel.writeString16(message); result != STATUS_OK) return result;
    if (const auto result = parcel.write<int32_t>(0); result != STATUS_OK) return result;
    if (status.exception == EX_SERVICE_SPECIFIC) return parcel.write(status.error);
    if (status.exception == EX_PARCELABLE) return parcel.write<int32_t>(0);
    return STATUS_OK;
}

binder_status_t readStatusHeader(const Parcel& parcel, AStatus* status) {
    AStatus read;
    if (const auto result = parcel.read(&read.exception); result != STATUS_OK) return result;

    if (read.exception == kHasReplyHeader) {
        if (const auto result = skipBlock(parcel, true); result != STATUS_OK) return result;
        read.exception = EX_NONE;
    }
    if (read.exception == EX_NONE) {
        *status = std::move(read);
        return STATUS_OK;
    }

    std::u16string_view message;
    if (!parcel.readString16(&message)) return STATUS_UNEXPECTED_NULL;
    read.message = utf16ToUtf8(message);
    if (const auto result = skipBlock(parcel, false); result != STATUS_OK) return result;
    if (read.exception == EX_SERVICE_SPECIFIC) {
        if (const auto result = parcel.read(&read.error); result != STATUS_OK) return result;
    } else if (read.exception == EX_PARCELABLE) {
        if (const auto result = skipBlock(parcel, true); result != STATUS_OK) return result;
    }
    *status = std::move(read);
    return STATUS_OK;
}

}  // namespace binder_ndk
