// SPDX-License-Identifier: Apache-2.0
//
// Parcel functions for C++ types. Three layers, lowest first: allocators and accessors that let the
// C functions fill standard containers; strings, binders, descriptors and parcelables; lists.
//
// A reader that fails leaves its target valid but unspecified. "Nullable" forms take std::optional,
// an empty binder or a descriptor of -1; the others answer STATUS_UNEXPECTED_NULL to a null, lists
// STATUS_NO_MEMORY.
#pragma once

#include <cstdint>
#include <limits>
#include <optional>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include <android/binder_auto_utils.h>
#include <android/binder_bionic_compat.h>
#include <android/binder_parcel.h>

namespace ndk {

// ---- Allocators and accessors for the C functions ----

namespace internal {

// Makes `container` hold `length` elements; false when that is negative.
template <typename C>
bool resize(C* container, int32_t length) {
    if (length < 0) return false;
    container->resize(static_cast<size_t>(length));
    return true;
}

// As above for a container that may be null, which -1 makes it.
template <typename C>
bool resizeNullable(std::optional<C>* container, int32_t length) {
    if (length < -1) return false;
    container->reset();
    if (length == -1) return true;
    container->emplace(static_cast<size_t>(length));
    return true;
}

// The length a C function takes for a container.
template <typename C>
int32_t lengthOf(const C& container) {
    return container.size() > static_cast<size_t>(std::numeric_limits<int32_t>::max())
                   ? -2  // refused by every writer
                   : static_cast<int32_t>(container.size());
}

}  // namespace internal

// Fills a std::vector<T>; null is refused.
template <typename T>
bool AParcel_stdVectorAllocator(void* vectorData, int32_t length, T** outBuffer) {
    auto* const vec = static_cast<std::vector<T>*>(vectorData);
    if (!internal::resize(vec, length)) return false;
    *outBuffer = vec->data();
    return true;
}

// Fills a std::optional<std::vector<T>>.
template <typename T>
bool AParcel_nullableStdVectorAllocator(void* vectorData, int32_t length, T** outBuffer) {
    auto* const vec = static_cast<std::optional<std::vector<T>>*>(vectorData);
    if (!internal::resizeNullable(vec, length)) return false;
    if (vec->has_value()) *outBuffer = (*vec)->data();
    return true;
}

// Sizes a std::vector<T> whose elements are read one by one; null is refused.
template <typename T>
bool AParcel_stdVectorExternalAllocator(void* vectorData, int32_t length) {
    return internal::resize(static_cast<std::vector<T>*>(vectorData), length);
}

// As above for a std::optional<std::vector<T>>.
template <typename T>
bool AParcel_nullableStdVectorExternalAllocator(void* vectorData, int32_t length) {
    return internal::resizeNullable(static_cast<std::optional<std::vector<T>>*>(vectorData),
                                    length);
}

// The element at `index` of a std::vector<T>.
template <typename T>
T AParcel_stdVectorGetter(const void* vectorData, size_t index) {
    return (*static_cast<const std::vector<T>*>(vectorData))[index];
}

// As above for a std::optional<std::vector<T>> that is not null.
template <typename T>
T AParcel_nullableStdVectorGetter(const void* vectorData, size_t index) {
    return (**static_cast<const std::optional<std::vector<T>>*>(vectorData))[index];
}

// Sets the element at `index` of a std::vector<T>.
template <typename T>
void AParcel_stdVectorSetter(void* vectorData, size_t index, T value) {
    (*static_cast<std::vector<T>*>(vectorData))[index] = value;
}

// As above for a std::optional<std::vector<T>> that is not null.
template <typename T>
void AParcel_nullableStdVectorSetter(void* vectorData, size_t index, T value) {
    (**static_cast<std::optional<std::vector<T>>*>(vectorData))[index] = value;
}

// Fills a std::string; null is refused. `length` counts the terminating zero.
inline bool AParcel_stdStringAllocator(void* stringData, int32_t length, char** buffer) {
    if (length <= 0) return false;
    auto* const text = static_cast<std::string*>(stringData);
    text->resize(static_cast<size_t>(length) - 1);
    *buffer = text->data();
    return true;
}

// Fills a std::optional<std::string>.
inline bool AParcel_nullableStdStringAllocator(void* stringData, int32_t length, char** buffer) {
    auto* const text = static_cast<std::optional<std::string>*>(stringData);
    if (length <= 0) {
        text->reset();
        return length == -1;
    }
    text->emplace();
    return AParcel_stdStringAllocator(&**text, length, buffer);
}

// Sizes a std::vector<std::string>; null is refused.
inline bool AParcel_stdVectorStringAllocator(void* vectorData, int32_t length) {
    return AParcel_stdVectorExternalAllocator<std::string>(vectorData, length);
}

// Sizes a std::optional<std::vector<std::optional<std::string>>>.
inline bool AParcel_nullableStdVectorStringAllocator(void* vectorData, int32_t length) {
    return AParcel_nullableStdVectorExternalAllocator<std::optional<std::string>>(vectorData,
                                                                                  length);
}

// Fills the string at `index` of a std::vector<std::string>.
inline bool AParcel_stdVectorStringElementAllocator(void* vectorData, size_t index, int32_t length,
                                                    char** buffer) {
    auto* const vec = static_cast<std::vector<std::string>*>(vectorData);
    return AParcel_stdStringAllocator(&(*vec)[index], length, buffer);
}

// Fills the string at `index` of a std::optional<std::vector<std::optional<std::string>>>.
inline bool AParcel_nullableStdVectorStringElementAllocator(void* vectorData, size_t index,
                                                            int32_t length, char** buffer) {
    auto* const vec =
            static_cast<std::optional<std::vector<std::optional<std::string>>>*>(vectorData);
    return AParcel_nullableStdStringAllocator(&(**vec)[index], length, buffer);
}

// The string at `index` of a std::vector<std::string>.
inline const char* AParcel_stdVectorStringElementGetter(const void* vectorData, size_t index,
                                                        int32_t* outLength) {
    const auto& element = (*static_cast<const std::vector<std::string>*>(vectorData))[index];
    *outLength = internal::lengthOf(element);
    return element.c_str();
}

// The string at `index` of a std::optional<std::vector<std::optional<std::string>>>.
inline const char* AParcel_nullableStdVectorStringElementGetter(const void* vectorData,
                                                                size_t index, int32_t* outLength) {
    const auto& element =
            (**static_cast<const std::optional<std::vector<std::optional<std::string>>>*>(
                    vectorData))[index];
    if (!element.has_value()) {
        *outLength = -1;
        return nullptr;
    }
    *outLength = internal::lengthOf(*element);
    return element->c_str();
}

// ---- Strings ----

inline binder_status_t AParcel_writeString(AParcel* parcel, const std::string& str) {
    return ::AParcel_writeString(parcel, str.c_str(), internal::lengthOf(str));
}

inline binder_status_t AParcel_readString(const AParcel* parcel, std::string* str) {
    return ::AParcel_readString(parcel, str, AParcel_stdStringAllocator);
}

inline binder_status_t AParcel_writeString(AParcel* parcel, const std::optional<std::string>& str) {
    if (!str.has_value()) return ::AParcel_writeString(parcel, nullptr, -1);
    return AParcel_writeString(parcel, *str);
}

inline binder_status_t AParcel_readString(const AParcel* parcel, std::optional<std::string>* str) {
    return ::AParcel_readString(parcel, str, AParcel_nullableStdStringAllocator);
}

// ---- Binders ----

inline binder_status_t AParcel_writeNullableStrongBinder(AParcel* parcel,
                                                         const SpAIBinder& binder) {
    return ::AParcel_writeStrongBinder(parcel, binder.get());
}

inline binder_status_t AParcel_readNullableStrongBinder(const AParcel* parcel, SpAIBinder* binder) {
    AIBinder* read = nullptr;
    const binder_status_t status = ::AParcel_readStrongBinder(parcel, &read);
    if (status == STATUS_OK) binder->set(read);
    return status;
}

inline binder_status_t AParcel_writeRequiredStrongBinder(AParcel* parcel,
                                                         const SpAIBinder& binder) {
    if (binder.get() == nullptr) return STATUS_UNEXPECTED_NULL;
    return ::AParcel_writeStrongBinder(parcel, binder.get());
}

inline binder_status_t AParcel_readRequiredStrongBinder(const AParcel* parcel, SpAIBinder* binder) {
    const binder_status_t status = AParcel_readNullableStrongBinder(parcel, binder);
    if (status == STATUS_OK && binder->get() == nullptr) return STATUS_UNEXPECTED_NULL;
    return status;
}

// ---- File descriptors ----

inline binder_status_t AParcel_writeNullableParcelFileDescriptor(AParcel* parcel,
                                                                 const ScopedFileDescriptor& fd) {
    return ::AParcel_writeParcelFileDescriptor(parcel, fd.get());
}

inline binder_status_t AParcel_readNullableParcelFileDescriptor(const AParcel* parcel,
                                                                ScopedFileDescriptor* fd) {
    int read = -1;
    const binder_status_t status = ::AParcel_readParcelFileDescriptor(parcel, &read);
    if (status == STATUS_OK) fd->set(read);
    return status;
}

inline binder_status_t AParcel_writeRequiredParcelFileDescriptor(AParcel* parcel,
                                                                 const ScopedFileDescriptor& fd) {
    if (fd.get() < 0) return STATUS_UNEXPECTED_NULL;
    return ::AParcel_writeParcelFileDescriptor(parcel, fd.get());
}

inline binder_status_t AParcel_readRequiredParcelFileDescriptor(const AParcel* parcel,
                                                                ScopedFileDescriptor* fd) {
    const binder_status_t status = AParcel_readNullableParcelFileDescriptor(parcel, fd);
    if (status == STATUS_OK && fd->get() < 0) return STATUS_UNEXPECTED_NULL;
    return status;
}

// ---- Parcelables: a presence word, then the parcelable itself ----

template <typename P>
binder_status_t AParcel_writeParcelable(AParcel* parcel, const P& p) {
    const binder_status_t status = ::AParcel_writeInt32(parcel, 1);
    return status != STATUS_OK ? status : p.writeToParcel(parcel);
}

template <typename P>
binder_status_t AParcel_readParcelable(const AParcel* parcel, P* p) {
    int32_t present = 0;
    const binder_status_t status = ::AParcel_readInt32(parcel, &present);
    if (status != STATUS_OK) return status;
    return present == 0 ? STATUS_UNEXPECTED_NULL : p->readFromParcel(parcel);
}

template <typename P>
binder_status_t AParcel_writeNullableParcelable(AParcel* parcel, const std::optional<P>& p) {
    return p.has_value() ? AParcel_writeParcelable(parcel, *p) : ::AParcel_writeInt32(parcel, 0);
}

template <typename P>
binder_status_t AParcel_readNullableParcelable(const AParcel* parcel, std::optional<P>* p) {
    int32_t present = 0;
    p->reset();
    const binder_status_t status = ::AParcel_readInt32(parcel, &present);
    if (status != STATUS_OK || present == 0) return status;
    return p->emplace().readFromParcel(parcel);
}

// ---- Lists ----

// Writes the size of a list that the callee fills.
template <typename T>
binder_status_t AParcel_writeVectorSize(AParcel* parcel, const std::vector<T>& vec) {
    const int32_t length = internal::lengthOf(vec);
    return length < 0 ? STATUS_BAD_VALUE : ::AParcel_writeInt32(parcel, length);
}

template <typename T>
binder_status_t AParcel_writeVectorSize(AParcel* parcel, const std::optional<std::vector<T>>& vec) {
    return vec.has_value() ? AParcel_writeVectorSize(parcel, *vec)
                           : ::AParcel_writeInt32(parcel, -1);
}

namespace internal {

// A list of this many elements the caller wants filled: its reply could hold no more.
inline constexpr int32_t kMaxOutListLength = 1 << 20;

}  // namespace internal

// Makes `vec` as large as the caller wants it. A negative size: STATUS_UNEXPECTED_NULL; one no
// reply has room for: STATUS_NO_MEMORY.
template <typename T>
binder_status_t AParcel_resizeVector(const AParcel* parcel, std::vector<T>* vec) {
    int32_t length = 0;
    const binder_status_t status = ::AParcel_readInt32(parcel, &length);
    if (status != STATUS_OK) return status;
    if (length < 0) return STATUS_UNEXPECTED_NULL;
    if (length > internal::kMaxOutListLength) return STATUS_NO_MEMORY;
    vec->resize(static_cast<size_t>(length));
    return STATUS_OK;
}

// As above; -1 gives null.
template <typename T>
binder_status_t AParcel_resizeVector(const AParcel* parcel, std::optional<std::vector<T>>* vec) {
    int32_t length = 0;
    const binder_status_t status = ::AParcel_readInt32(parcel, &length);
    if (status != STATUS_OK) return status;
    if (length < -1) return STATUS_UNEXPECTED_NULL;
    if (length > internal::kMaxOutListLength) return STATUS_NO_MEMORY;
    internal::resizeNullable(vec, length);
    return STATUS_OK;
}

// Numbers, bytes and characters: lists the parcel takes in one piece. There is nothing for lists of
// enumerations: generated code hands them over as lists of their backing type.

namespace internal {

// A list whose elements are a Wire each in the parcel, and its C functions.
template <typename Wire, auto Write, auto Read>
struct PackedAs : std::true_type {
    using WireType = Wire;
    static constexpr auto kWrite = Write;
    static constexpr auto kRead = Read;
};

// How a list of T is packed; false where its elements are written one by one.
template <typename T>
struct Packed : std::false_type {};

// clang-format off
template <> struct Packed<uint8_t>  : PackedAs<int8_t,   AParcel_writeByteArray,   AParcel_readByteArray> {};
template <> struct Packed<char16_t> : PackedAs<char16_t, AParcel_writeCharArray,   AParcel_readCharArray> {};
template <> struct Packed<int32_t>  : PackedAs<int32_t,  AParcel_writeInt32Array,  AParcel_readInt32Array> {};
template <> struct Packed<uint32_t> : PackedAs<uint32_t, AParcel_writeUint32Array, AParcel_readUint32Array> {};
template <> struct Packed<int64_t>  : PackedAs<int64_t,  AParcel_writeInt64Array,  AParcel_readInt64Array> {};
template <> struct Packed<uint64_t> : PackedAs<uint64_t, AParcel_writeUint64Array, AParcel_readUint64Array> {};
template <> struct Packed<float>    : PackedAs<float,    AParcel_writeFloatArray,  AParcel_readFloatArray> {};
template <> struct Packed<double>   : PackedAs<double,   AParcel_writeDoubleArray, AParcel_readDoubleArray> {};
// clang-format on

template <typename T, bool IsPacked = true>
using IfPacked = std::enable_if_t<Packed<T>::value == IsPacked, bool>;

template <typename T>
using WireType = typename Packed<T>::WireType;

template <typename T>
bool packedAllocator(void* vectorData, int32_t length, WireType<T>** outBuffer) {
    T* values = nullptr;
    if (!AParcel_stdVectorAllocator<T>(vectorData, length, &values)) return false;
    *outBuffer = reinterpret_cast<WireType<T>*>(values);
    return true;
}

template <typename T>
bool nullablePackedAllocator(void* vectorData, int32_t length, WireType<T>** outBuffer) {
    T* values = nullptr;
    if (!AParcel_nullableStdVectorAllocator<T>(vectorData, length, &values)) return false;
    *outBuffer = reinterpret_cast<WireType<T>*>(values);
    return true;
}

}  // namespace internal

template <typename T, internal::IfPacked<T> = true>
binder_status_t AParcel_writeVector(AParcel* parcel, const std::vector<T>& vec) {
    const auto* values = reinterpret_cast<const internal::WireType<T>*>(vec.data());
    return internal::Packed<T>::kWrite(parcel, values, internal::lengthOf(vec));
}
template <typename T, internal::IfPacked<T> = true>
binder_status_t AParcel_writeVector(AParcel* parcel, const std::optional<std::vector<T>>& vec) {
    return vec.has_value() ? AParcel_writeVector(parcel, *vec)
                           : internal::Packed<T>::kWrite(parcel, nullptr, -1);
}
template <typename T, internal::IfPacked<T> = true>
binder_status_t AParcel_readVector(const AParcel* parcel, std::vector<T>* vec) {
    return internal::Packed<T>::kRead(parcel, vec, internal::packedAllocator<T>);
}
template <typename T, internal::IfPacked<T> = true>
binder_status_t AParcel_readVector(const AParcel* parcel, std::optional<std::vector<T>>* vec) {
    return internal::Packed<T>::kRead(parcel, vec, internal::nullablePackedAllocator<T>);
}

// Booleans and strings.

inline binder_status_t AParcel_writeVector(AParcel* parcel, const std::vector<bool>& vec) {
    return ::AParcel_writeBoolArray(parcel, &vec, internal::lengthOf(vec),
                                    AParcel_stdVectorGetter<bool>);
}
inline binder_status_t AParcel_writeVector(AParcel* parcel,
                                           const std::optional<std::vector<bool>>& vec) {
    return vec.has_value() ? AParcel_writeVector(parcel, *vec)
                           : ::AParcel_writeBoolArray(parcel, &vec, -1,
                                                      AParcel_nullableStdVectorGetter<bool>);
}
inline binder_status_t AParcel_readVector(const AParcel* parcel, std::vector<bool>* vec) {
    return ::AParcel_readBoolArray(parcel, vec, AParcel_stdVectorExternalAllocator<bool>,
                                   AParcel_stdVectorSetter<bool>);
}
inline binder_status_t AParcel_readVector(const AParcel* parcel,
                                          std::optional<std::vector<bool>>* vec) {
    return ::AParcel_readBoolArray(parcel, vec, AParcel_nullableStdVectorExternalAllocator<bool>,
                                   AParcel_nullableStdVectorSetter<bool>);
}

inline binder_status_t AParcel_writeVector(AParcel* parcel, const std::vector<std::string>& vec) {
    return ::AParcel_writeStringArray(parcel, &vec, internal::lengthOf(vec),
                                      AParcel_stdVectorStringElementGetter);
}
inline binder_status_t AParcel_readVector(const AParcel* parcel, std::vector<std::string>* vec) {
    return ::AParcel_readStringArray(parcel, vec, AParcel_stdVectorStringAllocator,
                                     AParcel_stdVectorStringElementAllocator);
}
inline binder_status_t AParcel_writeVector(
        AParcel* parcel, const std::optional<std::vector<std::optional<std::string>>>& vec) {
    return ::AParcel_writeStringArray(parcel, &vec, vec.has_value() ? internal::lengthOf(*vec) : -1,
                                      AParcel_nullableStdVectorStringElementGetter);
}
inline binder_status_t AParcel_readVector(
        const AParcel* parcel, std::optional<std::vector<std::optional<std::string>>>* vec) {
    return ::AParcel_readStringArray(parcel, vec, AParcel_nullableStdVectorStringAllocator,
                                     AParcel_nullableStdVectorStringElementAllocator);
}

// Parcelables and descriptors.

template <typename P>
binder_status_t AParcel_writeStdVectorParcelableElement(AParcel* parcel, const void* vectorData,
                                                        size_t index) {
    return AParcel_writeParcelable(parcel,
                                   (*static_cast<const std::vector<P>*>(vectorData))[index]);
}
template <typename P>
binder_status_t AParcel_readStdVectorParcelableElement(const AParcel* parcel, void* vectorData,
                                                       size_t index) {
    return AParcel_readParcelable(parcel, &(*static_cast<std::vector<P>*>(vectorData))[index]);
}
template <>
inline binder_status_t AParcel_writeStdVectorParcelableElement<ScopedFileDescriptor>(
        AParcel* parcel, const void* vectorData, size_t index) {
    const auto& vec = *static_cast<const std::vector<ScopedFileDescriptor>*>(vectorData);
    return AParcel_writeRequiredParcelFileDescriptor(parcel, vec[index]);
}
template <>
inline binder_status_t AParcel_readStdVectorParcelableElement<ScopedFileDescriptor>(
        const AParcel* parcel, void* vectorData, size_t index) {
    auto& vec = *static_cast<std::vector<ScopedFileDescriptor>*>(vectorData);
    return AParcel_readRequiredParcelFileDescriptor(parcel, &vec[index]);
}
template <typename P>
binder_status_t AParcel_writeNullableStdVectorParcelableElement(AParcel* parcel,
                                                                const void* vectorData,
                                                                size_t index) {
    const auto& vec = *static_cast<const std::optional<std::vector<std::optional<P>>>*>(vectorData);
    return AParcel_writeNullableParcelable(parcel, (*vec)[index]);
}
template <typename P>
binder_status_t AParcel_readNullableStdVectorParcelableElement(const AParcel* parcel,
                                                               void* vectorData, size_t index) {
    auto& vec = *static_cast<std::optional<std::vector<std::optional<P>>>*>(vectorData);
    return AParcel_readNullableParcelable(parcel, &(*vec)[index]);
}

template <typename P, internal::IfPacked<P, false> = true>
binder_status_t AParcel_writeVector(AParcel* parcel, const std::vector<P>& vec) {
    return ::AParcel_writeParcelableArray(parcel, &vec, internal::lengthOf(vec),
                                          AParcel_writeStdVectorParcelableElement<P>);
}
template <typename P, internal::IfPacked<P, false> = true>
binder_status_t AParcel_readVector(const AParcel* parcel, std::vector<P>* vec) {
    return ::AParcel_readParcelableArray(parcel, vec, AParcel_stdVectorExternalAllocator<P>,
                                         AParcel_readStdVectorParcelableElement<P>);
}
template <typename P>
binder_status_t AParcel_writeVector(AParcel* parcel,
                                    const std::optional<std::vector<std::optional<P>>>& vec) {
    return ::AParcel_writeParcelableArray(parcel, &vec,
                                          vec.has_value() ? internal::lengthOf(*vec) : -1,
                                          AParcel_writeNullableStdVectorParcelableElement<P>);
}
template <typename P>
binder_status_t AParcel_readVector(const AParcel* parcel,
                                   std::optional<std::vector<std::optional<P>>>* vec) {
    return ::AParcel_readParcelableArray(
            parcel, vec, AParcel_nullableStdVectorExternalAllocator<std::optional<P>>,
            AParcel_readNullableStdVectorParcelableElement<P>);
}

}  // namespace ndk
