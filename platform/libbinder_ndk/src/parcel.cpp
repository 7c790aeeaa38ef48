// SPDX-License-Identifier: Apache-2.0
// A parcel's memory and its plain data. Objects are in parcel_objects.cpp.
#include "parcel.h"

#include <algorithm>
#include <cstdlib>

#include "log.h"

namespace binder_ndk {
namespace {

constexpr size_t roundUp(size_t length) {
    return (length + 3) & ~size_t{3};
}

}  // namespace

Parcel::~Parcel() {
    adopted_ ? releaseAdopted() : releaseOwned();
}

void Parcel::reset() {
    adopted_ ? releaseAdopted() : releaseOwned();
    clear();
}

void Parcel::clear() {
    data_ = inline_;
    size_ = 0;
    capacity_ = kInlineCapacity;
    position_ = 0;
    adopted_ = false;
    adoptedOffsets_ = nullptr;
    adoptedOffsetCount_ = 0;
    release_ = nullptr;
    offsets_.clear();
    held_.clear();
}

void Parcel::releaseOwned() {
    for (AIBinder* const binder : held_)
        if (binder != nullptr) AIBinder_decStrong(binder);
    closeDescriptors();
    if (sensitive_) explicit_bzero(data_, size_);
    if (data_ != inline_) std::free(data_);
}

void Parcel::releaseAdopted() {
    closeDescriptors();
    release_(data_);
}

binder_status_t Parcel::grow(size_t needed) {
    if (needed <= capacity_) return STATUS_OK;
    const size_t capacity = std::min(kMaxSize + 1, std::max(needed, capacity_ * 2));
    auto* const memory = static_cast<uint8_t*>(std::malloc(capacity));
    if (memory == nullptr) return STATUS_NO_MEMORY;
    std::memcpy(memory, data_, size_);
    if (sensitive_) explicit_bzero(data_, size_);
    if (data_ != inline_) std::free(data_);
    data_ = memory;
    capacity_ = capacity;
    return STATUS_OK;
}

void Parcel::adoptFrom(Parcel& other) {
    reset();
    data_ = other.data_;
    size_ = other.size_;
    capacity_ = other.size_;
    adopted_ = true;
    adoptedOffsets_ = other.adoptedOffsets_;
    adoptedOffsetCount_ = other.adoptedOffsetCount_;
    release_ = other.release_;

    other.clear();
}

// A received buffer is mapped read-only: a parcel that is written to after all gets its own memory.
binder_status_t Parcel::makeOwned() {
    const size_t position = position_;
    Parcel received;
    received.adoptFrom(*this);
    const binder_status_t status = append(received, 0, received.size_);
    position_ = position;
    return status;
}

binder_status_t Parcel::reserve(size_t length, uint8_t** out) {
    if (adopted_) {
        if (const auto status = makeOwned(); status != STATUS_OK) return status;
    }
    if (length > kMaxSize || position_ > kMaxSize) return STATUS_BAD_VALUE;
    const size_t end = position_ + roundUp(length);
    if (end > kMaxSize) return STATUS_BAD_VALUE;
    if (touchesObject(position_, end)) return STATUS_PERMISSION_DENIED;
    if (const auto status = grow(end); status != STATUS_OK) return status;

    // Nothing of the process's memory may travel: neither a gap nor padding is left as it was.
    if (position_ > size_) std::memset(data_ + size_, 0, position_ - size_);
    std::memset(data_ + position_ + length, 0, end - position_ - length);
    *out = data_ + position_;
    position_ = end;
    size_ = std::max(size_, end);
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

binder_status_t Parcel::take(size_t length, const uint8_t** bytes) const {
    if (length > available()) return STATUS_NOT_ENOUGH_DATA;
    const size_t begin = position_;
    position_ += length;
    if (touchesObject(begin, position_)) return STATUS_PERMISSION_DENIED;
    *bytes = data_ + begin;
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
        logWarning("a text of %d units has no terminator", units);
        return false;
    }
    *text = {static_cast<const char16_t*>(static_cast<const void*>(begin)),
             static_cast<size_t>(units)};
    return true;
}

}  // namespace binder_ndk
