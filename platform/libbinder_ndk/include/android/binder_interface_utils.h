// SPDX-License-Identifier: Apache-2.0
//
// What generated C++ interfaces are built on. ICInterface is any interface, BnCInterface a local
// implementation, BpCInterface a proxy:
//
//     service object <-- shared_ptr -- AIBinder (local)      the binder keeps the object alive,
//            '- - - - - - weak - - - - - - ^                 the object does not keep its binder
#pragma once

#include <assert.h>

#include <android/binder_auto_utils.h>
#include <android/binder_bionic_compat.h>
#include <android/binder_ibinder.h>

#if defined(__has_include) && __has_include(<android/binder_shell.h>)
#include <android/binder_shell.h>
#define HAS_BINDER_SHELL_COMMAND
#endif

#include <cstdlib>
#include <memory>
#include <mutex>
#include <utility>

namespace ndk {

// An object owned by a shared_ptr that it can hand out itself. Made with make() only.
class SharedRefBase {
  public:
    SharedRefBase() = default;
    SharedRefBase(const SharedRefBase&) = delete;
    SharedRefBase& operator=(const SharedRefBase&) = delete;

    virtual ~SharedRefBase() {
        // Nobody ever owned it: it stood on the stack, or two owners are about to free it.
        std::call_once(mOwned, [] { __assert(__FILE__, __LINE__, "SharedRefBase: never owned"); });
    }

    // The owner. The first call makes it from `this`.
    std::shared_ptr<SharedRefBase> ref() {
        std::shared_ptr<SharedRefBase> first;
        std::call_once(mOwned, [&] {
            first.reset(this);
            mThis = first;
        });
        return first != nullptr ? first : mThis.lock();
    }

    // The owner as one of CHILD, which the object must be.
    template <typename CHILD>
    std::shared_ptr<CHILD> ref() {
        return std::static_pointer_cast<CHILD>(ref());
    }

    // A new T and its owner.
    template <class T, class... Args>
    static std::shared_ptr<T> make(Args&&... args) {
        T* const object = new T(std::forward<Args>(args)...);
        // The owner made here deletes it, which the analyzer does not follow.
        return object->template ref<T>();  // NOLINT(clang-analyzer-unix.Malloc)
    }

    static void operator delete(void* memory) { std::free(memory); }

#if !defined(__ANDROID_API__) || __ANDROID_API__ >= 30
  private:
#endif
    static void* operator new(size_t size) {
        void* const memory = std::malloc(size);
        if (memory == nullptr) std::abort();
        return memory;
    }

  private:
    std::once_flag mOwned;
    std::weak_ptr<SharedRefBase> mThis;
};

// An interface: the functions every local implementation and every proxy has.
class ICInterface : public SharedRefBase {
  public:
    ICInterface() = default;
    ~ICInterface() override = default;

    // The implementation behind a local binder whose class came from defineClass; null for null
    // and for a proxy. The class is not checked.
    static inline std::shared_ptr<ICInterface> asInterface(AIBinder* binder);

    // The binder of this object; never empty.
    virtual SpAIBinder asBinder() = 0;

    // True when this is a proxy.
    virtual bool isRemote() = 0;

    // Reports to `fd`, which stays the caller's; `args` holds `numArgs` strings.
    virtual inline binder_status_t dump(int fd, const char** args, uint32_t numArgs);

#ifdef HAS_BINDER_SHELL_COMMAND
    // Carries out a shell command; the descriptors stay the caller's.
    virtual inline binder_status_t handleShellCommand(int in, int out, int err, const char** argv,
                                                      uint32_t argc);
#endif

    // A class whose objects are made with an ICInterface* as argument and forward dump and shell
    // commands to it.
    static inline AIBinder_Class* defineClass(const char* interfaceDescriptor,
                                              AIBinder_Class_onTransact onTransact);

  private:
    // The user data of such a binder: it keeps the implementation alive.
    struct UserData {
        std::shared_ptr<ICInterface> interface;

        static ICInterface& of(AIBinder* binder) {
            return *static_cast<UserData*>(AIBinder_getUserData(binder))->interface;
        }
        static void* onCreate(void* args) {
            return new UserData{static_cast<ICInterface*>(args)->ref<ICInterface>()};
        }
        static void onDestroy(void* userData) { delete static_cast<UserData*>(userData); }
        static binder_status_t onDump(AIBinder* binder, int fd, const char** args,
                                      uint32_t numArgs) {
            return of(binder).dump(fd, args, numArgs);
        }
#ifdef HAS_BINDER_SHELL_COMMAND
        static binder_status_t onShell(AIBinder* binder, int in, int out, int err,
                                       const char** argv, uint32_t argc) {
            return of(binder).handleShellCommand(in, out, err, argv, argc);
        }
#endif
    };
};

// A local implementation of INTERFACE.
template <typename INTERFACE>
class BnCInterface : public INTERFACE {
  public:
    BnCInterface() = default;
    ~BnCInterface() override = default;

    // The binder of this object. When all references to it went away meanwhile, it is a new one.

    SpAIBinder asBinder() override;

    bool isRemote() override { return false; }

  protected:
    // A new binder for this object.
    virtual SpAIBinder createBinder() = 0;

  private:
    std::mutex mMutex;  // guards mWeakBinder
    ScopedAIBinder_Weak mWeakBinder;
};

// A proxy of INTERFACE.
template <typename INTERFACE>
class BpCInterface : public INTERFACE {
  public:
    explicit BpCInterface(const SpAIBinder& binder) : mBinder(binder) {}
    ~BpCInterface() override = default;

    SpAIBinder asBinder() override { return mBinder; }

    bool isRemote() override { return AIBinder_isRemote(mBinder.get()); }

    binder_status_t dump(int fd, const char** args, uint32_t numArgs) override {
        return AIBinder_dump(asBinder().get(), fd, args, numArgs);
    }

  private:
    SpAIBinder mBinder;
};

// Definitions.

std::shared_ptr<ICInterface> ICInterface::asInterface(AIBinder* binder) {
    auto* const data = static_cast<UserData*>(AIBinder_getUserData(binder));
    return data != nullptr ? data->interface : nullptr;
}

binder_status_t ICInterface::dump(int /*fd*/, const char** /*args*/, uint32_t /*numArgs*/) {
    return STATUS_OK;
}

#ifdef HAS_BINDER_SHELL_COMMAND
binder_status_t ICInterface::handleShellCommand(int /*in*/, int /*out*/, int /*err*/,
                                                const char** /*argv*/, uint32_t /*argc*/) {
    return STATUS_OK;
}
#endif

AIBinder_Class* ICInterface::defineClass(const char* interfaceDescriptor,
                                         AIBinder_Class_onTransact onTransact) {
    AIBinder_Class* const clazz = AIBinder_Class_define(interfaceDescriptor, UserData::onCreate,
                                                        UserData::onDestroy, onTransact);
    if (clazz == nullptr) return nullptr;
    AIBinder_Class_setOnDump(clazz, UserData::onDump);
#ifdef HAS_BINDER_SHELL_COMMAND
    AIBinder_Class_setHandleShellCommand(clazz, UserData::onShell);
#endif
    return clazz;
}

template <typename INTERFACE>
SpAIBinder BnCInterface<INTERFACE>::asBinder() {
    const std::lock_guard<std::mutex> lock(mMutex);
    SpAIBinder binder = mWeakBinder.promote();
    if (binder.get() == nullptr) {
        binder = createBinder();
        mWeakBinder.set(AIBinder_Weak_new(binder.get()));
    }
    return binder;
}

}  // namespace ndk
