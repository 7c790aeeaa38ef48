// SPDX-License-Identifier: Apache-2.0
// The bytes and objects of one request or reply.
//
// A parcel either owns its memory and is written to, or has adopted a buffer the driver filled and
// is read from. What is read may come from anyone: every length is held against what is there
// before anything is allocated or touched.
//
//   data     | token | 100 | object, 24 bytes | stability | ...      rounded up to 4 bytes, zero
//   padded offsets  | 92 |                                                  where the objects are,
//   ascending
//
// Not thread-safe. Reading moves the position of a const parcel, as in the C interface.
#pragma once

#include <android/binder_ibinder.h>
#include <android/binder_status.h>
#include <linux/android/binder.h>

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>
#include <type_traits>
#include <vector>

namespace binder_ndk {

class Parcel {
  public:
    // Gives a buffer back to the driver.
    using ReleaseBuffer = void (*)(const uint8_t* buffer);

    // Sizes and positions stay below this.
    static constexpr size_t kMaxSize = INT32_MAX;

    Parcel() {}  // leaves inline_ as it is
    ~Parcel();
    Parcel(const Parcel&) = delete;
    Parcel& operator=(const Parcel&) = delete;

    // Takes over a received buffer; `release` is called once, when the parcel is done with it. An
    // object list that is out of order, out of bounds or names an unknown kind of object is
    // dropped: the parcel then has no objects, but descriptors in it are still closed.
    void adopt(const uint8_t* data, size_t size, const binder_size_t* offsets, size_t offsetCount,
               ReleaseBuffer release);

    // Takes over a buffer another parcel has adopted; that one is empty afterwards.
    void adoptFrom(Parcel& other);

    // Releases everything; the parcel is empty and owns its memory again.
    void reset();

    // Zero the memory before it is freed.
    void markSensitive() const { sensitive_ = true; }

    const uint8_t* data() const { return data_; }
    size_t size() const { return size_; }
    const binder_size_t* offsets() const { return adopted_ ? adoptedOffsets_ : offsets_.data(); }
    size_t offsetCount() const { return adopted_ ? adoptedOffsetCount_ : offsets_.size(); }

    // Where the next read or write happens; may lie past the end, where reads fail.
    size_t position() const { return position_; }
    void setPosition(size_t position) const { position_ = position; }
    size_t available() const { return position_ < size_ ? size_ - position_ : 0; }

    // ---- Writing. An object already there may not be overwritten: STATUS_PERMISSION_DENIED. ----

    // Makes room for `length` bytes at the position, zero-pads to 4, and moves past; the caller
    // fills the bytes at `*out` at once.
    binder_status_t reserve(size_t length, uint8_t** out);

    binder_status_t writeBytes(const void* bytes, size_t length);

    // A value of 4 or 8 bytes.
    template <typename T>
    binder_status_t write(T value) {
        static_assert(std::is_arithmetic_v<T> && (sizeof(T) == 4 || sizeof(T) == 8));
        return writeBytes(&value, sizeof value);
    }

    // Count, units, a zero unit.
    binder_status_t writeString16(std::u16string_view text);

    // A null or a reference to `binder`, then its stability.
    binder_status_t writeStrongBinder(AIBinder* binder);

    // `fd` itself; with `owned` the parcel closes it. On failure it stays the caller's.
    binder_status_t writeFileDescriptor(int fd, bool owned);

    // `length` bytes of `from` from `start` on, with the objects that lie wholly among them.
    binder_status_t append(const Parcel& from, size_t start, size_t length);

    // ---- Reading ----

    // A value of 4 or 8 bytes. On failure `*value` is left alone.
    template <typename T>
    binder_status_t read(T* value) const {
        static_assert(std::is_arithmetic_v<T> && (sizeof(T) == 4 || sizeof(T) == 8));
        const uint8_t* bytes = nullptr;
        const binder_status_t status = take(sizeof *value, &bytes);
        if (status == STATUS_OK) std::memcpy(value, bytes, sizeof *value);
        return status;
    }

    // `length` bytes and their padding, in place; null when they are not there or not plain data.
    const uint8_t* readInPlace(size_t length) const;

    // False for null and for anything that is not a text. The view ends with the buffer.
    bool readString16(std::u16string_view* text) const;

    // One strong reference for the caller, or null.
    binder_status_t readStrongBinder(AIBinder** binder) const;

    // The descriptor itself, still the parcel's; STATUS_BAD_TYPE when there is none.
    binder_status_t readFileDescriptor(int* fd) const;

  private:
    binder_status_t take(size_t length, const uint8_t** bytes) const;
    bool touchesObject(size_t begin, size_t end) const;
    bool isObjectAt(size_t offset) const;
    flat_binder_object objectAt(size_t offset) const;

    // Reads an object's bytes at the position; false when the data ends before.
    bool takeObject(flat_binder_object* object, size_t* offset) const;

    // `held` is the reference behind a binder object, null for a descriptor.
    binder_status_t writeObject(const flat_binder_object& object, AIBinder* held);
    void listObject(size_t offset, AIBinder* held);

    // Takes what a copied object stands for: a reference or a duplicate of the descriptor.
    binder_status_t acquireCopy(const Parcel& from, size_t fromOffset, flat_binder_object* object,
                                AIBinder** held) const;

    bool adoptOffsets(const binder_size_t* offsets, size_t count);
    binder_status_t grow(size_t needed);
    binder_status_t makeOwned();
    void closeDescriptors() const;
    void clear();
    void releaseOwned();
    void releaseAdopted();

    // Calls fit in here as a rule; larger ones move to the heap.
    static constexpr size_t kInlineCapacity = 320;

    uint8_t* data_ = inline_;
    size_t size_ = 0;
    size_t capacity_ = kInlineCapacity;
    mutable size_t position_ = 0;
    mutable bool sensitive_ = false;

    bool adopted_ = false;
    const binder_size_t* adoptedOffsets_ = nullptr;
    size_t adoptedOffsetCount_ = 0;
    ReleaseBuffer release_ = nullptr;

    // Of a parcel that owns its memory: objects in ascending order, and the reference behind each.
    std::vector<binder_size_t> offsets_;
    std::vector<AIBinder*> held_;

    alignas(8) uint8_t inline_[kInlineCapacity];
};

}  // namespace binder_ndk

// What the C interface hands out: a parcel of its own, or one of a transaction being served, and
// the binder the parcel belongs to (null for AParcel_create).
struct AParcel {
  public:
    explicit AParcel(const AIBinder* binder) : binder_(binder) {}
    AParcel(const AIBinder* binder, const binder_ndk::Parcel& borrowed)
        // The functions that change a parcel take a non-const AParcel.
        : binder_(binder), parcel_(const_cast<binder_ndk::Parcel&>(borrowed)) {}

    const AIBinder* binder() const { return binder_; }
    binder_ndk::Parcel& operator*() { return parcel_; }
    const binder_ndk::Parcel& operator*() const { return parcel_; }
    binder_ndk::Parcel* operator->() { return &parcel_; }
    const binder_ndk::Parcel* operator->() const { return &parcel_; }

  private:
    const AIBinder* const binder_;
    binder_ndk::Parcel own_;
    binder_ndk::Parcel& parcel_ = own_;
};
