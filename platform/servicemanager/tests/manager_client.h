// SPDX-License-Identifier: Apache-2.0
//
// A client of the service manager that can make every call of its interface, also those that the
// public functions do not offer. For use in a process of its own.
#pragma once

#include <atomic>
#include <functional>
#include <memory>
#include <string>
#include <utility>

#include <aidl/android/os/BnClientCallback.h>
#include <aidl/android/os/BnServiceCallback.h>
#include <aidl/android/os/IServiceManager.h>
#include <aidl/android/os/ServiceDebugInfo.h>
#include <android/binder_auto_utils.h>

namespace client {

using aidl::android::os::IServiceManager;
using aidl::android::os::ServiceDebugInfo;
using ndk::ScopedAStatus;

// A local object that does nothing.
ndk::SpAIBinder makeObject();

// The same with VINTF stability.
ndk::SpAIBinder makeVintfObject();

// Counts its calls, and keeps what came last. Calls are served by the thread pool, which this
// starts.
class RegistrationCallback : public aidl::android::os::BnServiceCallback {
  public:
    RegistrationCallback();

    ScopedAStatus onRegistration(const std::string& to, const ndk::SpAIBinder& object) override;

    std::atomic<int> calls{0};
    std::string name;
    ndk::SpAIBinder service;
};

// Served by the thread pool, which this starts.
class ClientCallback : public aidl::android::os::BnClientCallback {
  public:
    explicit ClientCallback(std::function<void(bool hasClients)> function);

    ScopedAStatus onClients(const ndk::SpAIBinder& service, bool hasClients) override;

  private:
    const std::function<void(bool hasClients)> mFunction;
};

// The object as a callback, of whatever interface it is.
std::shared_ptr<aidl::android::os::IServiceCallback> asServiceCallback(ndk::SpAIBinder object);
std::shared_ptr<aidl::android::os::IClientCallback> asClientCallback(ndk::SpAIBinder object);

// The manager's own object, as it stands under its name.
std::shared_ptr<IServiceManager> manager();

// Calls a method of the manager's; the reply's exception code, EX_TRANSACTION_FAILED for a call
// that failed.
template <typename Method, typename... Arguments>
int32_t ask(Method method, Arguments&&... arguments) {
    return (manager().get()->*method)(std::forward<Arguments>(arguments)...).getExceptionCode();
}

int32_t add(const std::string& name, const ndk::SpAIBinder& service, bool allowIsolated = false,
            int32_t dumpPriority = IServiceManager::DUMP_FLAG_PRIORITY_DEFAULT);

}  // namespace client
