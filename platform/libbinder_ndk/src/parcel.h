// SPDX-License-Identifier: Apache-2.0
//
// The bytes and objects of one request or reply.
//
// A parcel either owns its memory and is written to, or has adopted a buffer the driver filled and
// is read from. What is read may come from anyone: every length is held against what is there
// before anything is allocated or touched.
//
//   data      | token ... | i32 100 | object, 24 bytes | stability | ...
//             0           88        92                 116         120
//
//   offsets   | 92 |                      where the objects are, ascending
//
// Every value is padded with zeros to a multiple of 4 bytes.
//
// Not thread-safe. Reading moves the position of a const parcel, as in the C interface.
#pragma once

#include <linux/android/binder.h>

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>
#include <type_traits>
#include <vector>

#include <android/binder_ibinder.h>
#include <android/binder_status.h>

namespace binder_ndk {

class Parcel {
  public:
    // Gives a buffer back to the driver.
    using ReleaseBuffer = void (*)(const uint8_t* buffer);

    // Sizes and positions stay below this.
    static constexpr size_t kMaxSize = INT32_MAX;

    Parcel() {}  // leaves mInline as it is
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
    void markSensitive() const { mSensitive = true; }

    const uint8_t* data() const { return mData; }
    size_t size() const { return mSize; }
    const binder_size_t* offsets() const { return mAdopted ? mAdoptedOffsets : mOffsets.data(); }
    size_t offsetCount() const { return mAdopted ? mAdoptedOffsetCount : mOffsets.size(); }

    // Where the next read or write happens; may lie past the end, where reads fail.
    size_t position() const { return mPosition; }
    void setPosition(size_t position) const { mPosition = position; }
    size_t available() const { return mPosition < mSize ? mSize - mPosition : 0; }

    // ---- Writing. An object already there may not be overwritten: STATUS_PERMISSION_DENIED. ----

    // Makes room for `length` bytes at the position, zero-pads to 4, and moves past; the caller
    // fills the bytes at `*out` at once.
    binder_status_t reserve(size_t length, uint8_t** out);

    binder_status_t writeBytes(const void* bytes, size_t length);

    // A value of 4 or 8 bytes.
    template <typename T>
    binder_status_t write(T value) {
        static_assert(std::is_arithmetic_v<T> && (sizeof(T) == 4 || sizeof(T) == 8));
        // At the end of what a parcel holds, which is nearly always, there is nothing to look after.
        if (mAdopted || mPosition != mSize || mCapacity - mSize < sizeof value)
            return writeBytes(&value, sizeof value);
        std::memcpy(mData + mSize, &value, sizeof value);
        mPosition = mSize += sizeof value;
        return STATUS_OK;
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

    // False for null and for anything that is not a string. The view ends with the buffer.
    bool readString16(std::u16string_view* text) const;

    // One strong reference for the caller, or null.
    binder_status_t readStrongBinder(AIBinder** binder) const;

    // The descriptor itself, still the parcel's; STATUS_BAD_TYPE when there is none.
    binder_status_t readFileDescriptor(int* fd) const;

  private:
    binder_status_t take(size_t length, const uint8_t** bytes) const {
        if (length > available()) return STATUS_NOT_ENOUGH_DATA;
        const size_t begin = mPosition;
        mPosition += length;
        if (offsetCount() != 0 && touchesObject(begin, mPosition)) return STATUS_PERMISSION_DENIED;
        *bytes = mData + begin;
        return STATUS_OK;
    }
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

    uint8_t* mData = mInline;
    size_t mSize = 0;
    size_t mCapacity = kInlineCapacity;
    mutable size_t mPosition = 0;
    mutable bool mSensitive = false;

    bool mAdopted = false;
    const binder_size_t* mAdoptedOffsets = nullptr;
    size_t mAdoptedOffsetCount = 0;
    ReleaseBuffer mRelease = nullptr;

    // Of a parcel that owns its memory: objects in ascending order, and the reference behind each.
    std::vector<binder_size_t> mOffsets;
    std::vector<AIBinder*> mHeld;

    alignas(8) uint8_t mInline[kInlineCapacity];
};

}  // namespace binder_ndk

// What the C interface hands out: a parcel of its own, or one of a transaction being served, and
// the binder the parcel belongs to (null for AParcel_create).
struct AParcel {
  public:
    explicit AParcel(const AIBinder* binder) : mBinder(binder) {}
    AParcel(const AIBinder* binder, const binder_ndk::Parcel& borrowed)
        // The functions that change a parcel take a non-const AParcel.
        : mBinder(binder), mParcel(const_cast<binder_ndk::Parcel&>(borrowed)) {}

    const AIBinder* binder() const { return mBinder; }
    binder_ndk::Parcel& operator*() { return mParcel; }
    const binder_ndk::Parcel& operator*() const { return mParcel; }
    binder_ndk::Parcel* operator->() { return &mParcel; }
    const binder_ndk::Parcel* operator->() const { return &mParcel; }

  private:
    const AIBinder* const mBinder;
    binder_ndk::Parcel mOwn;
    binder_ndk::Parcel& mParcel = mOwn;
};
