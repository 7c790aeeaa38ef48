// SPDX-License-Identifier: Apache-2.0
//
// A parcel's memory and its plain data. Objects are in parcel_objects.cpp.
#include "platform/libbinder_ndk/src/parcel.h"

#include <algorithm>
#include <cstdlib>

#include "platform/libbinder_ndk/src/log.h"

namespace binder_ndk {
namespace {

constexpr size_t roundUp(size_t length) {
    return (length + 3) & ~size_t{3};
}

}  // namespace

Parcel::~Parcel() {
    mAdopted ? releaseAdopted() : releaseOwned();
}

void Parcel::reset() {
    mAdopted ? releaseAdopted() : releaseOwned();
    clear();
}

void Parcel::clear() {
    mData = mInline;
    mSize = 0;
    mCapacity = kInlineCapacity;
    mPosition = 0;
    mAdopted = false;
    mAdoptedOffsets = nullptr;
    mAdoptedOffsetCount = 0;
    mRelease = nullptr;
    mOffsets.clear();
    mHeld.clear();
}

void Parcel::releaseOwned() {
    for (AIBinder* const binder : mHeld)
        if (binder != nullptr) AIBinder_decStrong(binder);
    if (!mOffsets.empty()) closeDescriptors();
    if (mSensitive) explicit_bzero(mData, mSize);
    if (mData != mInline) std::free(mData);
}

void Parcel::releaseAdopted() {
    if (mAdoptedOffsetCount != 0) closeDescriptors();
    mRelease(mData);
}

binder_status_t Parcel::grow(size_t needed) {
    if (needed <= mCapacity) return STATUS_OK;
    const size_t capacity = std::min(kMaxSize + 1, std::max(needed, mCapacity * 2));
    auto* const memory = static_cast<uint8_t*>(std::malloc(capacity));
    if (memory == nullptr) return STATUS_NO_MEMORY;
    std::memcpy(memory, mData, mSize);
    if (mSensitive) explicit_bzero(mData, mSize);
    if (mData != mInline) std::free(mData);
    mData = memory;
    mCapacity = capacity;
    return STATUS_OK;
}

void Parcel::adoptFrom(Parcel& other) {
    reset();
    mData = other.mData;
    mSize = other.mSize;
    mCapacity = other.mSize;
    mAdopted = true;
    mAdoptedOffsets = other.mAdoptedOffsets;
    mAdoptedOffsetCount = other.mAdoptedOffsetCount;
    mRelease = other.mRelease;

    other.clear();
}

// A received buffer is mapped read-only: a parcel that is written to after all gets its own memory.
binder_status_t Parcel::makeOwned() {
    const size_t position = mPosition;
    Parcel received;
    received.adoptFrom(*this);
    const binder_status_t status = append(received, 0, received.mSize);
    mPosition = position;
    return status;
}

binder_status_t Parcel::reserve(size_t length, uint8_t** out) {
    if (mAdopted) {
        if (const auto status = makeOwned(); status != STATUS_OK) return status;
    }
    if (length > kMaxSize || mPosition > kMaxSize) return STATUS_BAD_VALUE;
    const size_t end = mPosition + roundUp(length);
    if (end > kMaxSize) return STATUS_BAD_VALUE;
    if (offsetCount() != 0 && touchesObject(mPosition, end)) return STATUS_PERMISSION_DENIED;
    if (const auto status = grow(end); status != STATUS_OK) return status;

    // Nothing of the process's memory may travel: neither a gap nor padding is left as it was.
    if (mPosition > mSize) std::memset(mData + mSize, 0, mPosition - mSize);
    for (size_t at = mPosition + length; at < end; ++at) mData[at] = 0;
    *out = mData + mPosition;
    mPosition = end;
    mSize = std::max(mSize, end);
    return STATUS_OK;
}

binder_status_t Parcel::writeBytes(const void* bytes, size_t length) {
    uint8_t* to = nullptr;
    const binder_status_t status = reserve(length, &to);
    if (status == STATUS_OK && length != 0) std::memcpy(to, bytes, length);
    return status;
}

binder_status_t Parcel::writeString16(std::u16string_view text) {
    if (text.size() >= kMaxSize / sizeof(char16_t)) return STATUS_BAD_VALUE;
    if (const auto status = write(static_cast<int32_t>(text.size())); status != STATUS_OK)
        return status;
    uint8_t* to = nullptr;
    const size_t bytes = text.size() * sizeof(char16_t);
    if (const auto status = reserve(bytes + sizeof(char16_t), &to); status != STATUS_OK)
        return status;
    if (bytes != 0) std::memcpy(to, text.data(), bytes);
    std::memset(to + bytes, 0, sizeof(char16_t));
    return STATUS_OK;
}

const uint8_t* Parcel::readInPlace(size_t length) const {
    const uint8_t* bytes = nullptr;
    if (length > kMaxSize || take(roundUp(length), &bytes) != STATUS_OK) return nullptr;
    return bytes;
}

bool Parcel::readString16(std::u16string_view* text) const {
    int32_t units = 0;
    if (read(&units) != STATUS_OK || units < 0 || units == INT32_MAX) return false;
    const size_t bytes = static_cast<size_t>(units) * sizeof(char16_t);
    const uint8_t* const begin = readInPlace(bytes + sizeof(char16_t));
    if (begin == nullptr || reinterpret_cast<uintptr_t>(begin) % alignof(char16_t) != 0)
        return false;
    if (begin[bytes] != 0 || begin[bytes + 1] != 0) {
        logWarning("a string of %d units has no terminator", units);
        return false;
    }
    *text = {static_cast<const char16_t*>(static_cast<const void*>(begin)),
             static_cast<size_t>(units)};
    return true;
}

}  // namespace binder_ndk
