// SPDX-License-Identifier: Apache-2.0
//
// The AParcel functions for lists.
//
// A count that came over the wire is only an announcement. For packed lists it is held against the
// bytes that are left before anything is allocated. In other lists every element takes a word at
// least, so no more elements than words are left are allocated, and one more: when the count was a
// lie, that one is where reading fails, with the status it would have failed with anyway.
#include <algorithm>
#include <cstring>

#include <android/binder_parcel.h>

#include "platform/libbinder_ndk/src/parcel.h"
#include "platform/libbinder_ndk/src/status.h"

using namespace binder_ndk;

namespace {

// True when data and length of a list agree: null has length -1, or 0 for an empty list.
bool lengthFits(const void* array, int32_t length) {
    return array == nullptr ? length == -1 || length == 0 : length >= 0;
}

template <typename T>
binder_status_t writePacked(Parcel& parcel, const T* array, int32_t length) {
    if (!lengthFits(array, length)) return STATUS_BAD_VALUE;
    const size_t bytes = length > 0 ? static_cast<size_t>(length) * sizeof(T) : 0;
    if (bytes > Parcel::kMaxSize) return STATUS_NO_MEMORY;
    if (const auto status = parcel.write(length); status != STATUS_OK) return knownStatus(status);
    if (length <= 0) return STATUS_OK;
    return parcel.writeBytes(array, bytes) == STATUS_OK ? STATUS_OK : STATUS_NO_MEMORY;
}

binder_status_t readLength(const Parcel& parcel, int32_t* length) {
    if (const auto status = parcel.read(length); status != STATUS_OK) return knownStatus(status);
    return *length < -1 ? STATUS_BAD_VALUE : STATUS_OK;
}

template <typename T>
binder_status_t readPacked(const Parcel& parcel, void* arrayData,
                           bool (*allocator)(void*, int32_t, T**)) {
    int32_t length = 0;
    if (const auto status = readLength(parcel, &length); status != STATUS_OK) return status;
    const size_t bytes = length > 0 ? static_cast<size_t>(length) * sizeof(T) : 0;
    if (bytes > parcel.available()) return STATUS_NO_MEMORY;

    T* array = nullptr;
    if (!allocator(arrayData, length, &array)) return STATUS_NO_MEMORY;
    if (length <= 0) return STATUS_OK;
    const uint8_t* const data = parcel.readInPlace(bytes);
    if (array == nullptr || data == nullptr) return STATUS_NO_MEMORY;
    std::memcpy(array, data, bytes);
    return STATUS_OK;
}

// What may be allocated of a list of elements that are read one by one.
int32_t credibleLength(const Parcel& parcel, int32_t length) {
    const size_t most = parcel.available() / sizeof(int32_t) + 1;
    return static_cast<int32_t>(std::min<size_t>(static_cast<size_t>(std::max(length, 0)), most));
}

// Reads a list whose elements are read one by one: `allocate(length)`, then `readElement(index)`.
template <typename Allocate, typename ReadElement>
binder_status_t readElements(const Parcel& parcel, Allocate allocate, ReadElement readElement) {
    int32_t length = 0;
    if (const auto status = readLength(parcel, &length); status != STATUS_OK) return status;
    const int32_t credible = credibleLength(parcel, length);
    if (!allocate(length < 0 ? length : credible)) return STATUS_NO_MEMORY;
    for (int32_t i = 0; i < credible; ++i) {
        if (const auto status = readElement(static_cast<size_t>(i)); status != STATUS_OK)
            return knownStatus(status);
    }
    // Only a list whose elements may be missing comes here with an incredible count.
    return credible < length ? STATUS_NOT_ENOUGH_DATA : STATUS_OK;
}

// Writes a count and the elements; a list without memory of its own is null when its length says
// so.
template <typename WriteElement>
binder_status_t writeElements(AParcel* parcel, int32_t length, WriteElement writeElement) {
    if (length < -1) return STATUS_BAD_VALUE;
    if (const auto status = AParcel_writeInt32(parcel, length); status != STATUS_OK) return status;
    for (int32_t i = 0; i < length; ++i) {
        if (const auto status = writeElement(static_cast<size_t>(i)); status != STATUS_OK)
            return status;
    }
    return STATUS_OK;
}

}  // namespace

// ---- Packed lists ----

binder_status_t AParcel_writeInt32Array(AParcel* parcel, const int32_t* arrayData, int32_t length) {
    return writePacked(**parcel, arrayData, length);
}

binder_status_t AParcel_writeUint32Array(AParcel* parcel, const uint32_t* arrayData,
                                         int32_t length) {
    return writePacked(**parcel, arrayData, length);
}

binder_status_t AParcel_writeInt64Array(AParcel* parcel, const int64_t* arrayData, int32_t length) {
    return writePacked(**parcel, arrayData, length);
}

binder_status_t AParcel_writeUint64Array(AParcel* parcel, const uint64_t* arrayData,
                                         int32_t length) {
    return writePacked(**parcel, arrayData, length);
}

binder_status_t AParcel_writeFloatArray(AParcel* parcel, const float* arrayData, int32_t length) {
    return writePacked(**parcel, arrayData, length);
}

binder_status_t AParcel_writeDoubleArray(AParcel* parcel, const double* arrayData, int32_t length) {
    return writePacked(**parcel, arrayData, length);
}

binder_status_t AParcel_writeByteArray(AParcel* parcel, const int8_t* arrayData, int32_t length) {
    return writePacked(**parcel, arrayData, length);
}

binder_status_t AParcel_readInt32Array(const AParcel* parcel, void* arrayData,
                                       AParcel_int32ArrayAllocator allocator) {
    return readPacked(**parcel, arrayData, allocator);
}

binder_status_t AParcel_readUint32Array(const AParcel* parcel, void* arrayData,
                                        AParcel_uint32ArrayAllocator allocator) {
    return readPacked(**parcel, arrayData, allocator);
}

binder_status_t AParcel_readInt64Array(const AParcel* parcel, void* arrayData,
                                       AParcel_int64ArrayAllocator allocator) {
    return readPacked(**parcel, arrayData, allocator);
}

binder_status_t AParcel_readUint64Array(const AParcel* parcel, void* arrayData,
                                        AParcel_uint64ArrayAllocator allocator) {
    return readPacked(**parcel, arrayData, allocator);
}

binder_status_t AParcel_readFloatArray(const AParcel* parcel, void* arrayData,
                                       AParcel_floatArrayAllocator allocator) {
    return readPacked(**parcel, arrayData, allocator);
}

binder_status_t AParcel_readDoubleArray(const AParcel* parcel, void* arrayData,
                                        AParcel_doubleArrayAllocator allocator) {
    return readPacked(**parcel, arrayData, allocator);
}

binder_status_t AParcel_readByteArray(const AParcel* parcel, void* arrayData,
                                      AParcel_byteArrayAllocator allocator) {
    return readPacked(**parcel, arrayData, allocator);
}

// ---- Lists of booleans and characters: a word for each ----

binder_status_t AParcel_writeBoolArray(AParcel* parcel, const void* arrayData, int32_t length,
                                       AParcel_boolArrayGetter getter) {
    return writeElements(parcel, length, [&](size_t index) {
        return AParcel_writeBool(parcel, getter(arrayData, index));
    });
}

binder_status_t AParcel_readBoolArray(const AParcel* parcel, void* arrayData,
                                      AParcel_boolArrayAllocator allocator,
                                      AParcel_boolArraySetter setter) {
    return readElements(
            **parcel, [&](int32_t length) { return allocator(arrayData, length); },
            [&](size_t index) {
                bool value = false;
                const binder_status_t status = AParcel_readBool(parcel, &value);
                if (status == STATUS_OK) setter(arrayData, index, value);
                return status;
            });
}

binder_status_t AParcel_writeCharArray(AParcel* parcel, const char16_t* arrayData, int32_t length) {
    if (!lengthFits(arrayData, length)) return STATUS_BAD_VALUE;
    return writeElements(parcel, length,
                         [&](size_t index) { return AParcel_writeChar(parcel, arrayData[index]); });
}

binder_status_t AParcel_readCharArray(const AParcel* parcel, void* arrayData,
                                      AParcel_charArrayAllocator allocator) {
    char16_t* array = nullptr;
    return readElements(
            **parcel,
            [&](int32_t length) {
                return allocator(arrayData, length, &array) && (length <= 0 || array != nullptr);
            },
            [&](size_t index) { return AParcel_readChar(parcel, &array[index]); });
}

// ---- Lists of parcelables and strings ----

binder_status_t AParcel_writeParcelableArray(AParcel* parcel, const void* arrayData, int32_t length,
                                             AParcel_writeParcelableElement elementWriter) {
    return writeElements(parcel, length,
                         [&](size_t index) { return elementWriter(parcel, arrayData, index); });
}

binder_status_t AParcel_readParcelableArray(const AParcel* parcel, void* arrayData,
                                            AParcel_parcelableArrayAllocator allocator,
                                            AParcel_readParcelableElement elementReader) {
    return readElements(
            **parcel, [&](int32_t length) { return allocator(arrayData, length); },
            [&](size_t index) { return elementReader(parcel, arrayData, index); });
}

binder_status_t AParcel_writeStringArray(AParcel* parcel, const void* arrayData, int32_t length,
                                         AParcel_stringArrayElementGetter getter) {
    return writeElements(parcel, length, [&](size_t index) {
        int32_t textLength = 0;
        const char* const text = getter(arrayData, index, &textLength);
        return AParcel_writeString(parcel, text, textLength);
    });
}

binder_status_t AParcel_readStringArray(const AParcel* parcel, void* arrayData,
                                        AParcel_stringArrayAllocator allocator,
                                        AParcel_stringArrayElementAllocator elementAllocator) {
    struct Element {
        void* arrayData;
        size_t index;
        AParcel_stringArrayElementAllocator allocator;
    };
    return readElements(
            **parcel, [&](int32_t length) { return allocator(arrayData, length); },
            [&](size_t index) {
                Element element{arrayData, index, elementAllocator};
                return AParcel_readString(
                        parcel, &element, [](void* data, int32_t length, char** buffer) {
                            const auto& self = *static_cast<Element*>(data);
                            return self.allocator(self.arrayData, self.index, length, buffer);
                        });
            });
}
