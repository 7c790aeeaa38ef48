// SPDX-License-Identifier: Apache-2.0
//
// Parcels: the bytes and objects of a request or a reply. Values are written one after the other,
// each rounded up to four bytes, and read back in the same order.
//
// Every function that fails leaves the rest of the parcel in an unspecified but safe state. A read
// past the end gives STATUS_NOT_ENOUGH_DATA; a read of plain data across an object gives
// STATUS_PERMISSION_DENIED. Parcels are not thread-safe.
#pragma once

#include <stdbool.h>
#include <stddef.h>
#include <stdint.h>

#include <android/binder_bionic_compat.h>
#include <android/binder_status.h>
#ifndef __cplusplus
#include <uchar.h>
#endif

struct AIBinder;
typedef struct AIBinder AIBinder;

__BEGIN_DECLS

struct AParcel;
// A request or a reply.
typedef struct AParcel AParcel;

// ---- What the typed readers and writers call back ----
// Allocators make room in the caller's container (`arrayData`, `stringData`: passed through) for
// `length` elements and point `*outBuffer` at the first. Length -1 stands for null and comes with
// no buffer to set; false refuses, which ends the read with STATUS_NO_MEMORY (arrays) or
// STATUS_UNEXPECTED_NULL (a null string).

// Room for `length` bytes of UTF-8, the terminating zero included.
typedef bool (*AParcel_stringAllocator)(void* stringData, int32_t length, char** buffer);
// Makes the container hold `length` strings.
typedef bool (*AParcel_stringArrayAllocator)(void* arrayData, int32_t length);
// As AParcel_stringAllocator, for the string at `index`.
typedef bool (*AParcel_stringArrayElementAllocator)(void* arrayData, size_t index, int32_t length,
                                                    char** buffer);
// The string at `index`, its length in bytes in `*outLength`; null with -1 for a null string.
typedef const char* (*AParcel_stringArrayElementGetter)(const void* arrayData, size_t index,
                                                        int32_t* outLength);
// Writes the parcelable at `index`.
typedef binder_status_t (*AParcel_writeParcelableElement)(AParcel* parcel, const void* arrayData,
                                                          size_t index);
// Makes the container hold `length` parcelables.
typedef bool (*AParcel_parcelableArrayAllocator)(void* arrayData, int32_t length);
// Reads the parcelable at `index`.
typedef binder_status_t (*AParcel_readParcelableElement)(const AParcel* parcel, void* arrayData,
                                                         size_t index);

typedef bool (*AParcel_int32ArrayAllocator)(void* arrayData, int32_t length, int32_t** outBuffer);
typedef bool (*AParcel_uint32ArrayAllocator)(void* arrayData, int32_t length, uint32_t** outBuffer);
typedef bool (*AParcel_int64ArrayAllocator)(void* arrayData, int32_t length, int64_t** outBuffer);
typedef bool (*AParcel_uint64ArrayAllocator)(void* arrayData, int32_t length, uint64_t** outBuffer);
typedef bool (*AParcel_floatArrayAllocator)(void* arrayData, int32_t length, float** outBuffer);
typedef bool (*AParcel_doubleArrayAllocator)(void* arrayData, int32_t length, double** outBuffer);
// Makes the container hold `length` booleans.
typedef bool (*AParcel_boolArrayAllocator)(void* arrayData, int32_t length);
// The boolean at `index`.
typedef bool (*AParcel_boolArrayGetter)(const void* arrayData, size_t index);
// Sets the boolean at `index`.
typedef void (*AParcel_boolArraySetter)(void* arrayData, size_t index, bool value);
typedef bool (*AParcel_charArrayAllocator)(void* arrayData, int32_t length, char16_t** outBuffer);
typedef bool (*AParcel_byteArrayAllocator)(void* arrayData, int32_t length, int8_t** outBuffer);

// ---- The parcel itself ----

// An empty parcel that belongs to no call; the caller deletes it.
AParcel* AParcel_create(void) __INTRODUCED_IN(31);

// Frees a parcel and closes the descriptors in it. Null is allowed.
void AParcel_delete(AParcel* parcel) __INTRODUCED_IN(29);

// Empties a parcel.
binder_status_t AParcel_reset(AParcel* parcel) __INTRODUCED_IN(31);

// Bytes written, or the position when that is larger.
int32_t AParcel_getDataSize(const AParcel* parcel) __INTRODUCED_IN(31);

// Where the next read or write happens, in bytes from the start.
int32_t AParcel_getDataPosition(const AParcel* parcel) __INTRODUCED_IN(29);

// Moves there. Negative: STATUS_BAD_VALUE. Past the end is allowed; reads there fail.
binder_status_t AParcel_setDataPosition(const AParcel* parcel, int32_t position)
        __INTRODUCED_IN(29);

// Appends `size` bytes of `from`, beginning at `start`, with the objects among them: references
// are taken, descriptors duplicated. STATUS_BAD_VALUE for a range outside `from`.
binder_status_t AParcel_appendFrom(const AParcel* from, AParcel* to, int32_t start, int32_t size)
        __INTRODUCED_IN(31);

// ---- Objects and descriptors ----

// Writes a reference to `binder`; null is allowed.
binder_status_t AParcel_writeStrongBinder(AParcel* parcel, AIBinder* binder) __INTRODUCED_IN(29);
// Reads one: a strong reference for the caller, or null. STATUS_BAD_TYPE when there is none.
binder_status_t AParcel_readStrongBinder(const AParcel* parcel, AIBinder** binder)
        __INTRODUCED_IN(29);

// Writes a duplicate of `fd`; -1 travels as null.
binder_status_t AParcel_writeParcelFileDescriptor(AParcel* parcel, int fd) __INTRODUCED_IN(29);
// Reads a duplicate, to be closed by the caller, or -1 for null.
binder_status_t AParcel_readParcelFileDescriptor(const AParcel* parcel, int* fd)
        __INTRODUCED_IN(29);

// ---- The outcome that opens a reply ----

// Writes it. A transport failure is not written but returned.
binder_status_t AParcel_writeStatusHeader(AParcel* parcel, const AStatus* status)
        __INTRODUCED_IN(29);
// Reads it into a new status, to be deleted by the caller; left alone on failure.
binder_status_t AParcel_readStatusHeader(const AParcel* parcel, AStatus** status)
        __INTRODUCED_IN(29);

// ---- Strings: UTF-8 in memory, UTF-16 in the parcel ----

// Writes `length` bytes; null with -1 writes null. STATUS_BAD_VALUE when these disagree or the
// last sequence is cut off.
binder_status_t AParcel_writeString(AParcel* parcel, const char* string, int32_t length)
        __INTRODUCED_IN(29);
// Reads a string. Anything that is not one is taken as null.
binder_status_t AParcel_readString(const AParcel* parcel, void* stringData,
                                   AParcel_stringAllocator allocator) __INTRODUCED_IN(29);
// Writes `length` strings, -1 writes null.
binder_status_t AParcel_writeStringArray(AParcel* parcel, const void* arrayData, int32_t length,
                                         AParcel_stringArrayElementGetter getter)
        __INTRODUCED_IN(29);
// Reads a list of strings.
binder_status_t AParcel_readStringArray(const AParcel* parcel, void* arrayData,
                                        AParcel_stringArrayAllocator allocator,
                                        AParcel_stringArrayElementAllocator elementAllocator)
        __INTRODUCED_IN(29);

// ---- Lists of parcelables ----

// Writes `length` elements, -1 writes null.
binder_status_t AParcel_writeParcelableArray(AParcel* parcel, const void* arrayData, int32_t length,
                                             AParcel_writeParcelableElement elementWriter)
        __INTRODUCED_IN(29);
// Reads a list of elements.
binder_status_t AParcel_readParcelableArray(const AParcel* parcel, void* arrayData,
                                            AParcel_parcelableArrayAllocator allocator,
                                            AParcel_readParcelableElement elementReader)
        __INTRODUCED_IN(29);

// ---- Scalars. Bool, Char and Byte readers store 0 on failure. ----

binder_status_t AParcel_writeInt32(AParcel* parcel, int32_t value) __INTRODUCED_IN(29);
binder_status_t AParcel_writeUint32(AParcel* parcel, uint32_t value) __INTRODUCED_IN(29);
binder_status_t AParcel_writeInt64(AParcel* parcel, int64_t value) __INTRODUCED_IN(29);
binder_status_t AParcel_writeUint64(AParcel* parcel, uint64_t value) __INTRODUCED_IN(29);
binder_status_t AParcel_writeFloat(AParcel* parcel, float value) __INTRODUCED_IN(29);
binder_status_t AParcel_writeDouble(AParcel* parcel, double value) __INTRODUCED_IN(29);
binder_status_t AParcel_writeBool(AParcel* parcel, bool value) __INTRODUCED_IN(29);
binder_status_t AParcel_writeChar(AParcel* parcel, char16_t value) __INTRODUCED_IN(29);
binder_status_t AParcel_writeByte(AParcel* parcel, int8_t value) __INTRODUCED_IN(29);

binder_status_t AParcel_readInt32(const AParcel* parcel, int32_t* value) __INTRODUCED_IN(29);
binder_status_t AParcel_readUint32(const AParcel* parcel, uint32_t* value) __INTRODUCED_IN(29);
binder_status_t AParcel_readInt64(const AParcel* parcel, int64_t* value) __INTRODUCED_IN(29);
binder_status_t AParcel_readUint64(const AParcel* parcel, uint64_t* value) __INTRODUCED_IN(29);
binder_status_t AParcel_readFloat(const AParcel* parcel, float* value) __INTRODUCED_IN(29);
binder_status_t AParcel_readDouble(const AParcel* parcel, double* value) __INTRODUCED_IN(29);
binder_status_t AParcel_readBool(const AParcel* parcel, bool* value) __INTRODUCED_IN(29);
binder_status_t AParcel_readChar(const AParcel* parcel, char16_t* value) __INTRODUCED_IN(29);
binder_status_t AParcel_readByte(const AParcel* parcel, int8_t* value) __INTRODUCED_IN(29);

// ---- Lists of scalars ----
// Writers: null data with length -1 writes null; null with 0 or data with 0 writes an empty list;
// anything else that disagrees gives STATUS_BAD_VALUE.

binder_status_t AParcel_writeInt32Array(AParcel* parcel, const int32_t* arrayData, int32_t length)
        __INTRODUCED_IN(29);
binder_status_t AParcel_writeUint32Array(AParcel* parcel, const uint32_t* arrayData, int32_t length)
        __INTRODUCED_IN(29);
binder_status_t AParcel_writeInt64Array(AParcel* parcel, const int64_t* arrayData, int32_t length)
        __INTRODUCED_IN(29);
binder_status_t AParcel_writeUint64Array(AParcel* parcel, const uint64_t* arrayData, int32_t length)
        __INTRODUCED_IN(29);
binder_status_t AParcel_writeFloatArray(AParcel* parcel, const float* arrayData, int32_t length)
        __INTRODUCED_IN(29);
binder_status_t AParcel_writeDoubleArray(AParcel* parcel, const double* arrayData, int32_t length)
        __INTRODUCED_IN(29);
// Null when `length` is -1.
binder_status_t AParcel_writeBoolArray(AParcel* parcel, const void* arrayData, int32_t length,
                                       AParcel_boolArrayGetter getter) __INTRODUCED_IN(29);
binder_status_t AParcel_writeCharArray(AParcel* parcel, const char16_t* arrayData, int32_t length)
        __INTRODUCED_IN(29);
binder_status_t AParcel_writeByteArray(AParcel* parcel, const int8_t* arrayData, int32_t length)
        __INTRODUCED_IN(29);

binder_status_t AParcel_readInt32Array(const AParcel* parcel, void* arrayData,
                                       AParcel_int32ArrayAllocator allocator) __INTRODUCED_IN(29);
binder_status_t AParcel_readUint32Array(const AParcel* parcel, void* arrayData,
                                        AParcel_uint32ArrayAllocator allocator) __INTRODUCED_IN(29);
binder_status_t AParcel_readInt64Array(const AParcel* parcel, void* arrayData,
                                       AParcel_int64ArrayAllocator allocator) __INTRODUCED_IN(29);
binder_status_t AParcel_readUint64Array(const AParcel* parcel, void* arrayData,
                                        AParcel_uint64ArrayAllocator allocator) __INTRODUCED_IN(29);
binder_status_t AParcel_readFloatArray(const AParcel* parcel, void* arrayData,
                                       AParcel_floatArrayAllocator allocator) __INTRODUCED_IN(29);
binder_status_t AParcel_readDoubleArray(const AParcel* parcel, void* arrayData,
                                        AParcel_doubleArrayAllocator allocator) __INTRODUCED_IN(29);
binder_status_t AParcel_readBoolArray(const AParcel* parcel, void* arrayData,
                                      AParcel_boolArrayAllocator allocator,
                                      AParcel_boolArraySetter setter) __INTRODUCED_IN(29);
binder_status_t AParcel_readCharArray(const AParcel* parcel, void* arrayData,
                                      AParcel_charArrayAllocator allocator) __INTRODUCED_IN(29);
binder_status_t AParcel_readByteArray(const AParcel* parcel, void* arrayData,
                                      AParcel_byteArrayAllocator allocator) __INTRODUCED_IN(29);

__END_DECLS
