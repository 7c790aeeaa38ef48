// SPDX-License-Identifier: Apache-2.0
//
// The AParcel functions for strings: UTF-8 for the caller, UTF-16 in the parcel.
#include <android/binder_parcel.h>

#include "platform/libbinder_ndk/src/parcel.h"
#include "platform/libbinder_ndk/src/status.h"
#include "platform/libbinder_ndk/src/utf.h"

using namespace binder_ndk;

binder_status_t AParcel_writeString(AParcel* parcel, const char* string, int32_t length) {
    Parcel& to = **parcel;
    if (string == nullptr)
        return length == -1 ? knownStatus(to.write<int32_t>(-1)) : STATUS_BAD_VALUE;
    if (length < 0) return STATUS_BAD_VALUE;

    const std::string_view utf8(string, static_cast<size_t>(length));
    const ptrdiff_t units = utf16Length(utf8);
    if (units < 0 || units >= INT32_MAX) return STATUS_BAD_VALUE;
    if (const auto status = to.write(static_cast<int32_t>(units)); status != STATUS_OK)
        return knownStatus(status);

    const size_t bytes = static_cast<size_t>(units) * sizeof(char16_t);
    uint8_t* data = nullptr;
    if (to.reserve(bytes + sizeof(char16_t), &data) != STATUS_OK) return STATUS_NO_MEMORY;
    utf8ToUtf16(utf8, data);
    data[bytes] = data[bytes + 1] = 0;
    return STATUS_OK;
}

binder_status_t AParcel_readString(const AParcel* parcel, void* stringData,
                                   AParcel_stringAllocator allocator) {
    std::u16string_view utf16;
    if (!(*parcel)->readString16(&utf16))
        return allocator(stringData, -1, nullptr) ? STATUS_OK : STATUS_UNEXPECTED_NULL;

    const size_t bytes = utf8Length(utf16) + 1;
    if (bytes > Parcel::kMaxSize) return STATUS_BAD_VALUE;
    char* buffer = nullptr;
    if (!allocator(stringData, static_cast<int32_t>(bytes), &buffer) || buffer == nullptr)
        return STATUS_NO_MEMORY;
    utf16ToUtf8(utf16, buffer);
    buffer[bytes - 1] = '\0';
    return STATUS_OK;
}
