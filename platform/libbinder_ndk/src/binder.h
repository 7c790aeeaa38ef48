// SPDX-License-Identifier: Apache-2.0
//
// Binder objects: what AIBinder is, and the local kind.
//
// An object's memory has two counts. Strong references keep it working; when the last one goes, a
// local object destroys its user data and a proxy gives its handle back. Weak references, and all
// strong ones together as one, keep the memory, so that an address stays unique and can be asked
// whether the object still works.
#pragma once

#include <atomic>
#include <cstdint>
#include <string>

#include <android/binder_ibinder.h>
#include <android/binder_shell.h>

namespace binder_ndk {
class LocalBinder;
class RemoteBinder;
class Parcel;
}  // namespace binder_ndk

struct AIBinder_Class {
    std::string descriptor;
    std::u16string descriptor16;
    AIBinder_Class_onCreate onCreate;
    AIBinder_Class_onDestroy onDestroy;
    AIBinder_Class_onTransact onTransact;
    AIBinder_onDump onDump = nullptr;
    AIBinder_handleShellCommand handleShellCommand = nullptr;
    // The class defined before this one.
    AIBinder_Class* previous = nullptr;
};

struct AIBinder {
  public:
    AIBinder(const AIBinder&) = delete;
    AIBinder& operator=(const AIBinder&) = delete;

    virtual binder_ndk::LocalBinder* asLocal() { return nullptr; }
    virtual binder_ndk::RemoteBinder* asRemote() { return nullptr; }

    // Carries out a transaction: by a function call or over the driver. `flags` are TF_ flags;
    // `reply` is written to (local) or adopts the driver's buffer.
    virtual binder_status_t transact(uint32_t code, const binder_ndk::Parcel& request,
                                     binder_ndk::Parcel* reply, uint32_t flags) = 0;

    void incStrong() { mStrong.fetch_add(1, std::memory_order_relaxed); }
    void decStrong();
    // Takes a strong reference if there still is one.
    bool attemptIncStrong();
    void incWeak() { mWeak.fetch_add(1, std::memory_order_relaxed); }
    void decWeak();
    int32_t strongCount() const { return mStrong.load(std::memory_order_relaxed); }

    // Set for good when a local object is made or a proxy is associated.
    std::atomic<const AIBinder_Class*> clazz{nullptr};

    // The stability word, 0 until it is known. See stability.h.
    std::atomic<uint32_t> stability{0};

  protected:
    // Starts with one strong reference.
    AIBinder() = default;
    virtual ~AIBinder() = default;

    // Drops a reference that may be the last; true when it was, the object's insides then being
    // gone.
    virtual bool dropStrong() = 0;

    std::atomic<int32_t> mStrong{1};

  private:
    std::atomic<int32_t> mWeak{1};
};

// A reference that keeps the memory.
struct AIBinder_Weak {
    AIBinder* binder;
};

namespace binder_ndk {

// An object of this process.
class LocalBinder final : public AIBinder {
  public:
    // The class's onCreate has made `userData`.
    LocalBinder(const AIBinder_Class* clazz, void* userData);

    LocalBinder* asLocal() override { return this; }
    binder_status_t transact(uint32_t code, const Parcel& request, Parcel* reply,
                             uint32_t flags) override;

    void* userData() const { return mUserData; }

    // A strong reference is taken. No lock: attached before the object is shared.
    void setExtension(AIBinder* extension);
    AIBinder* extension() const { return mExtension; }

    void setRequestingSid(bool requesting) { mRequestingSid = requesting; }
    bool requestingSid() const { return mRequestingSid; }

    // What stands for this object in the driver: a key, unique while anyone refers to the object,
    // and the object's own address.
    uint64_t key() const { return reinterpret_cast<uint64_t>(&mStrong); }
    uint64_t cookie() const { return reinterpret_cast<uint64_t>(this); }

    // The object behind a cookie of the driver's, which only ever hands back what it was given.
    static LocalBinder* fromCookie(uint64_t cookie) {
        return reinterpret_cast<LocalBinder*>(cookie);  // NOLINT(performance-no-int-to-ptr)
    }

  protected:
    bool dropStrong() override;

  private:
    ~LocalBinder() override = default;

    binder_status_t transactUser(uint32_t code, const Parcel& request, Parcel* reply);
    binder_status_t transactReserved(uint32_t code, const Parcel& request, Parcel* reply);

    void* const mUserData;
    AIBinder* mExtension = nullptr;
    bool mRequestingSid = false;
};

// Codes with a meaning of their own. They carry no interface token.
inline constexpr uint32_t kPingTransaction = 0x5f504e47;            // _PNG
inline constexpr uint32_t kExtensionTransaction = 0x5f455854;       // _EXT
inline constexpr uint32_t kDebugPidTransaction = 0x5f504944;        // _PID
inline constexpr uint32_t kInterfaceTransaction = 0x5f4e5446;       // _NTF
inline constexpr uint32_t kDumpTransaction = 0x5f444d50;            // _DMP
inline constexpr uint32_t kShellCommandTransaction = 0x5f434d44;    // _CMD
inline constexpr uint32_t kSystemPropertyTransaction = 0x5f535052;  // _SPR

inline constexpr bool isUserCode(uint32_t code) {
    return code >= FIRST_CALL_TRANSACTION && code <= LAST_CALL_TRANSACTION;
}

}  // namespace binder_ndk
