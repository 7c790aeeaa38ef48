// SPDX-License-Identifier: Apache-2.0
//
// Owners for what the C functions hand out: each releases its resource when it goes out of scope.
// Values are taken over on construction and `set`; `get` only looks; `getR` is for out parameters
// and expects the owner to be empty.
#pragma once

#include <assert.h>
#include <unistd.h>

#include <cstddef>
#include <string>
#include <utility>

#include <android/binder_bionic_compat.h>
#include <android/binder_ibinder.h>
#include <android/binder_internal_logging.h>
#include <android/binder_parcel.h>
#include <android/binder_status.h>

namespace ndk {

// A strong reference to a binder, or none.
class SpAIBinder {
  public:
    SpAIBinder() : mBinder(nullptr) {}

    // Takes over a reference the caller holds.
    explicit SpAIBinder(AIBinder* binder) : mBinder(binder) {}

    // No binder; lets functions take and return nullptr.
    SpAIBinder(std::nullptr_t) : SpAIBinder() {}  // NOLINT(google-explicit-constructor)

    // Takes a reference of its own.
    SpAIBinder(const SpAIBinder& other) : mBinder(other.mBinder) { AIBinder_incStrong(mBinder); }

    ~SpAIBinder() { set(nullptr); }

    SpAIBinder& operator=(const SpAIBinder& other) {  // NOLINT(bugprone-unhandled-self-assignment)
        // The new reference is taken before the old one goes: they may be one and the same.
        AIBinder_incStrong(other.mBinder);
        set(other.mBinder);
        return *this;
    }

    // Releases the reference held and takes over the caller's.
    void set(AIBinder* binder) {
        AIBinder* const old = mBinder;
        mBinder = binder;
        if (old != nullptr) AIBinder_decStrong(old);
    }

    AIBinder* get() const { return mBinder; }
    AIBinder** getR() { return &mBinder; }

  private:
    AIBinder* mBinder;
};

inline bool operator==(const SpAIBinder& a, const SpAIBinder& b) {
    return a.get() == b.get();
}
inline bool operator!=(const SpAIBinder& a, const SpAIBinder& b) {
    return a.get() != b.get();
}
inline bool operator<(const SpAIBinder& a, const SpAIBinder& b) {
    return a.get() < b.get();
}
inline bool operator<=(const SpAIBinder& a, const SpAIBinder& b) {
    return a.get() <= b.get();
}
inline bool operator>(const SpAIBinder& a, const SpAIBinder& b) {
    return a.get() > b.get();
}
inline bool operator>=(const SpAIBinder& a, const SpAIBinder& b) {
    return a.get() >= b.get();
}

namespace impl {

// A move-only owner of a T that `Destroy` releases; `DEFAULT` stands for none.
template <typename T, void (*Destroy)(T), T DEFAULT>
class ScopedAResource {
  public:
    ScopedAResource() : mT(DEFAULT) {}
    explicit ScopedAResource(const T& t) : mT(t) {}
    ScopedAResource(const ScopedAResource&) = delete;
    ScopedAResource(ScopedAResource&& other) noexcept : mT(std::exchange(other.mT, DEFAULT)) {}
    ~ScopedAResource() { set(DEFAULT); }

    ScopedAResource& operator=(const ScopedAResource&) = delete;
    ScopedAResource& operator=(ScopedAResource&& other) noexcept {
        if (this != &other) set(std::exchange(other.mT, DEFAULT));
        return *this;
    }

    // Releases what is held and takes over `t`.
    void set(const T& t) {
        const T old = std::exchange(mT, t);
        if (old != DEFAULT) Destroy(old);
    }

    T get() { return mT; }
    const T get() const { return mT; }  // NOLINT(readability-const-return-type)
    T* getR() { return &mT; }

    // Gives up ownership without releasing.
    [[nodiscard]] T release() { return std::exchange(mT, DEFAULT); }

  private:
    T mT;
};

}  // namespace impl

// Owns a parcel.
class ScopedAParcel : public impl::ScopedAResource<AParcel*, AParcel_delete, nullptr> {
  public:
    ScopedAParcel() = default;
    explicit ScopedAParcel(AParcel* parcel) : ScopedAResource(parcel) {}
    ScopedAParcel(ScopedAParcel&&) = default;
    ~ScopedAParcel() = default;
    ScopedAParcel& operator=(ScopedAParcel&&) = default;

    bool operator!=(const ScopedAParcel& rhs) const { return get() != rhs.get(); }
    bool operator<(const ScopedAParcel& rhs) const { return get() < rhs.get(); }
    bool operator<=(const ScopedAParcel& rhs) const { return get() <= rhs.get(); }
    bool operator==(const ScopedAParcel& rhs) const { return get() == rhs.get(); }
    bool operator>(const ScopedAParcel& rhs) const { return get() > rhs.get(); }
    bool operator>=(const ScopedAParcel& rhs) const { return get() >= rhs.get(); }
};

// Owns a status. A default-constructed one holds none; nothing but isOk may be asked of it.
class ScopedAStatus : public impl::ScopedAResource<AStatus*, AStatus_delete, nullptr> {
  public:
    ScopedAStatus() = default;
    explicit ScopedAStatus(AStatus* status) : ScopedAResource(status) {}
    ScopedAStatus(ScopedAStatus&&) = default;
    ~ScopedAStatus() = default;
    ScopedAStatus& operator=(ScopedAStatus&&) = default;

    // As AStatus_isOk; false when empty.
    bool isOk() const { return get() != nullptr && AStatus_isOk(get()); }
    // As AStatus_getExceptionCode.
    binder_exception_t getExceptionCode() const { return AStatus_getExceptionCode(get()); }
    // As AStatus_getServiceSpecificError.
    int32_t getServiceSpecificError() const { return AStatus_getServiceSpecificError(get()); }
    // As AStatus_getStatus.
    binder_status_t getStatus() const { return AStatus_getStatus(get()); }
    // As AStatus_getMessage.
    const char* getMessage() const { return AStatus_getMessage(get()); }
    // As AStatus_getDescription.
    std::string getDescription() const {
        const char* const text = AStatus_getDescription(get());
        std::string description(text);
        AStatus_deleteDescription(text);
        return description;
    }

    // As the AStatus function of the same name.
    static ScopedAStatus ok() { return ScopedAStatus(AStatus_newOk()); }
    static ScopedAStatus fromExceptionCode(binder_exception_t exception) {
        return ScopedAStatus(AStatus_fromExceptionCode(exception));
    }
    static ScopedAStatus fromExceptionCodeWithMessage(binder_exception_t exception,
                                                      const char* message) {
        return ScopedAStatus(AStatus_fromExceptionCodeWithMessage(exception, message));
    }
    static ScopedAStatus fromServiceSpecificError(int32_t serviceSpecific) {
        return ScopedAStatus(AStatus_fromServiceSpecificError(serviceSpecific));
    }
    static ScopedAStatus fromServiceSpecificErrorWithMessage(int32_t serviceSpecific,
                                                             const char* message) {
        return ScopedAStatus(AStatus_fromServiceSpecificErrorWithMessage(serviceSpecific, message));
    }
    static ScopedAStatus fromStatus(binder_status_t status) {
        return ScopedAStatus(AStatus_fromStatus(status));
    }
};

// Owns a death recipient.
class ScopedAIBinder_DeathRecipient
    : public impl::ScopedAResource<AIBinder_DeathRecipient*, AIBinder_DeathRecipient_delete,
                                   nullptr> {
  public:
    ScopedAIBinder_DeathRecipient() = default;
    explicit ScopedAIBinder_DeathRecipient(AIBinder_DeathRecipient* recipient)
        : ScopedAResource(recipient) {}
    ScopedAIBinder_DeathRecipient(ScopedAIBinder_DeathRecipient&&) = default;
    ~ScopedAIBinder_DeathRecipient() = default;
    ScopedAIBinder_DeathRecipient& operator=(ScopedAIBinder_DeathRecipient&&) = default;
};

// Owns a weak reference.
class ScopedAIBinder_Weak
    : public impl::ScopedAResource<AIBinder_Weak*, AIBinder_Weak_delete, nullptr> {
  public:
    ScopedAIBinder_Weak() = default;
    explicit ScopedAIBinder_Weak(AIBinder_Weak* weak) : ScopedAResource(weak) {}
    ScopedAIBinder_Weak(ScopedAIBinder_Weak&&) = default;
    ~ScopedAIBinder_Weak() = default;
    ScopedAIBinder_Weak& operator=(ScopedAIBinder_Weak&&) = default;

    // A strong reference, empty when the object is gone.
    SpAIBinder promote() { return SpAIBinder(AIBinder_Weak_promote(get())); }
};

namespace internal {

// Closes a descriptor; -1 is none. A failure is worth a line: the number was not ours to close.
inline void closeWithError(int fd) {
    if (fd == -1) return;
    if (close(fd) != 0) syslog(LOG_ERR, "could not close descriptor %d: %m", fd);
}

}  // namespace internal

// Owns a file descriptor.
class ScopedFileDescriptor : public impl::ScopedAResource<int, internal::closeWithError, -1> {
  public:
    ScopedFileDescriptor() = default;
    explicit ScopedFileDescriptor(int fd) : ScopedAResource(fd) {}
    ScopedFileDescriptor(ScopedFileDescriptor&&) = default;
    ~ScopedFileDescriptor() = default;
    ScopedFileDescriptor& operator=(ScopedFileDescriptor&&) = default;

    bool operator!=(const ScopedFileDescriptor& rhs) const { return get() != rhs.get(); }
    bool operator<(const ScopedFileDescriptor& rhs) const { return get() < rhs.get(); }
    bool operator<=(const ScopedFileDescriptor& rhs) const { return get() <= rhs.get(); }
    bool operator==(const ScopedFileDescriptor& rhs) const { return get() == rhs.get(); }
    bool operator>(const ScopedFileDescriptor& rhs) const { return get() > rhs.get(); }
    bool operator>=(const ScopedFileDescriptor& rhs) const { return get() >= rhs.get(); }
};

}  // namespace ndk
