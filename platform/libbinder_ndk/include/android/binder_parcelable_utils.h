// SPDX-License-Identifier: Apache-2.0
//
// How stable a parcelable is, and a field that holds a parcelable of any type.
#pragma once

#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <type_traits>

#include <android/binder_auto_utils.h>
#include <android/binder_parcel.h>
#include <android/binder_parcel_utils.h>

namespace ndk {

// Who may rely on the layout of a parcelable.
typedef int32_t parcelable_stability_t;
enum {
    STABILITY_LOCAL,
    STABILITY_VINTF,
};

// Base of parcelables with virtual functions; generated ones have none.
class AParcelable {
  public:
    virtual ~AParcelable() = default;
    virtual binder_status_t writeToParcel(AParcel* parcel) const = 0;
    virtual binder_status_t readFromParcel(const AParcel* parcel) = 0;
};
// Holds a parcelable of a type the interface does not name. One that came over the wire stays in
// its parcel until it is asked for. In the parcel: stability, then the size of what follows (0:
// nothing), the type's name, the parcelable.
class AParcelableHolder {
  public:
    AParcelableHolder() = delete;
    explicit AParcelableHolder(parcelable_stability_t stability) : mStability(stability) {}
    virtual ~AParcelableHolder() = default;

    AParcelableHolder(const AParcelableHolder& other)
        : mParcel(::AParcel_create()), mStability(other.mStability) {
        copyParcel(other);
    }
    AParcelableHolder(AParcelableHolder&& other) noexcept = default;
    AParcelableHolder& operator=(AParcelableHolder&& other) noexcept = default;
    AParcelableHolder& operator=(const AParcelableHolder& other) {
        if (this == &other) return *this;
        mStability = other.mStability;
        mParcel.set(::AParcel_create());
        copyParcel(other);
        return *this;
    }

    binder_status_t writeToParcel(AParcel* parcel) const {
        if (const auto status = ::AParcel_writeInt32(parcel, mStability); status != STATUS_OK)
            return status;
        const int32_t size = ::AParcel_getDataSize(mParcel.get());
        if (const auto status = ::AParcel_writeInt32(parcel, size); status != STATUS_OK)
            return status;
        return ::AParcel_appendFrom(mParcel.get(), parcel, 0, size);
    }

    binder_status_t readFromParcel(const AParcel* parcel) {
        ::AParcel_reset(mParcel.get());

        parcelable_stability_t stability = STABILITY_LOCAL;
        if (const auto status = ::AParcel_readInt32(parcel, &stability); status != STATUS_OK)
            return status;
        if (stability != mStability) return STATUS_BAD_VALUE;

        int32_t size = 0;
        if (const auto status = ::AParcel_readInt32(parcel, &size); status != STATUS_OK)
            return status;
        if (size < 0) return STATUS_BAD_VALUE;
        if (size == 0) return STATUS_OK;

        const int32_t start = ::AParcel_getDataPosition(parcel);
        if (size > INT32_MAX - start) return STATUS_BAD_VALUE;
        if (const auto status = ::AParcel_appendFrom(parcel, mParcel.get(), start, size);
            status != STATUS_OK) {
            return status;
        }
        return ::AParcel_setDataPosition(parcel, start + size);
    }

    // Stores a copy. STATUS_BAD_VALUE when T is less stable than the holder.
    template <typename T>
    binder_status_t setParcelable(const T& parcelable) {
        if (mStability > T::_aidl_stability) return STATUS_BAD_VALUE;
        ::AParcel_reset(mParcel.get());
        if (const auto status =
                    ::AParcel_writeString(mParcel.get(), T::descriptor, length(T::descriptor));
            status != STATUS_OK) {
            return status;
        }
        return parcelable.writeToParcel(mParcel.get());
    }

    // What is stored, or none when it is of another type.
    template <typename T>
    binder_status_t getParcelable(std::optional<T>* parcelable) const {
        parcelable->reset();
        if (::AParcel_getDataSize(mParcel.get()) == 0) return STATUS_OK;
        ::AParcel_setDataPosition(mParcel.get(), 0);
        std::string name;
        if (const auto status = AParcel_readString(mParcel.get(), &name); status != STATUS_OK)
            return status;
        if (name != T::descriptor) return STATUS_BAD_VALUE;
        parcelable->emplace();
        const auto status = (*parcelable)->readFromParcel(mParcel.get());
        if (status != STATUS_OK) parcelable->reset();
        return status;
    }

    // Forgets what is stored.
    void reset() { ::AParcel_reset(mParcel.get()); }

    bool operator!=(const AParcelableHolder& rhs) const { return this != &rhs; }
    bool operator<(const AParcelableHolder& rhs) const { return this < &rhs; }
    bool operator<=(const AParcelableHolder& rhs) const { return this <= &rhs; }
    bool operator==(const AParcelableHolder& rhs) const { return this == &rhs; }
    bool operator>(const AParcelableHolder& rhs) const { return this > &rhs; }
    bool operator>=(const AParcelableHolder& rhs) const { return this >= &rhs; }

  private:
    static int32_t length(const char* text) {
        return static_cast<int32_t>(std::char_traits<char>::length(text));
    }
    void copyParcel(const AParcelableHolder& other) {
        ::AParcel_appendFrom(other.mParcel.get(), mParcel.get(), 0,
                             ::AParcel_getDataSize(other.mParcel.get()));
    }

    ScopedAParcel mParcel{::AParcel_create()};
    parcelable_stability_t mStability;
};

}  // namespace ndk
