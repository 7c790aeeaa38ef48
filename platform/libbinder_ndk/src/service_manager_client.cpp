// SPDX-License-Identifier: Apache-2.0
//
// The AServiceManager functions that find and register services: a client of
// android.os.IServiceManager on handle 0.
#include "platform/libbinder_ndk/src/service_manager_client.h"

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include <aidl/android/os/BnServiceCallback.h>
#include <android-base/thread_annotations.h>
#include <android/binder_manager.h>

#include "platform/libbinder_ndk/src/log.h"
#include "platform/libbinder_ndk/src/remote_binder.h"

using aidl::android::os::BnServiceCallback;
using aidl::android::os::IServiceManager;
using ndk::ScopedAStatus;
using ndk::SpAIBinder;

namespace binder_ndk {

using namespace std::chrono_literals;

constexpr auto kManagerRetryInterval = 1000ms;
constexpr auto kServiceRetryInterval = 1000ms;
constexpr auto kServiceTimeout = 5000ms;

IServiceManager& serviceManager() {
    // Never destroyed: threads serve on while the process exits.
    static auto& manager = *new std::shared_ptr<IServiceManager>([] {
        while (!isServiceManagerThere()) {
            logWarning("waiting for the service manager");
            std::this_thread::sleep_for(kManagerRetryInterval);
        }
        return IServiceManager::fromBinder(SpAIBinder(newServiceManagerProxy()));
    }());
    return *manager;
}

bool succeeded(const ScopedAStatus& answer) {
    if (answer.getExceptionCode() == EX_TRANSACTION_FAILED) {
        logError("the service manager cannot be asked: status %d", answer.getStatus());
    } else if (!answer.isOk()) {
        logWarning("the service manager refuses: exception %d, %s", answer.getExceptionCode(),
                   answer.getMessage());
    }
    return answer.isOk();
}

namespace {

// The caller's strong reference.
AIBinder* release(const SpAIBinder& binder) {
    AIBinder_incStrong(binder.get());
    return binder.get();
}

// Waits to be told of a registration.
class RegistrationWaiter : public BnServiceCallback {
  public:
    ScopedAStatus onRegistration(const std::string& /*name*/, const SpAIBinder& service) override {
        const std::lock_guard<std::mutex> lock(mMutex);
        mService = service;
        mRegistered.notify_all();
        return ScopedAStatus::ok();
    }

    // The service, or none after a second.
    SpAIBinder wait() {
        const auto end = std::chrono::steady_clock::now() + kServiceRetryInterval;
        std::unique_lock<std::mutex> lock(mMutex);
        const android::base::ScopedLockAssertion locked(mMutex);
        while (mService.get() == nullptr &&
               mRegistered.wait_until(lock, end) == std::cv_status::no_timeout) {
        }
        return mService;
    }

  private:
    std::mutex mMutex;
    std::condition_variable mRegistered;
    SpAIBinder mService GUARDED_BY(mMutex);
};

}  // namespace
}  // namespace binder_ndk

using namespace binder_ndk;

binder_exception_t AServiceManager_addService(AIBinder* binder, const char* instance) {
    if (binder == nullptr || instance == nullptr) return EX_ILLEGAL_ARGUMENT;
    AIBinder_incStrong(binder);
    const ScopedAStatus answer = serviceManager().addService(
            instance, SpAIBinder(binder), false, IServiceManager::DUMP_FLAG_PRIORITY_DEFAULT);
    succeeded(answer);
    return answer.getExceptionCode();
}

AIBinder* AServiceManager_checkService(const char* instance) {
    SpAIBinder service;
    if (instance == nullptr || !succeeded(serviceManager().checkService(instance, &service)))
        return nullptr;
    return release(service);
}

AIBinder* AServiceManager_getService(const char* instance) {
    if (instance == nullptr) return nullptr;
    const auto start = std::chrono::steady_clock::now();
    for (;;) {
        if (AIBinder* const service = AServiceManager_checkService(instance); service != nullptr)
            return service;
        if (std::chrono::steady_clock::now() - start >= kServiceTimeout) break;
        logInfo("waiting for service '%s'", instance);
        std::this_thread::sleep_for(kServiceRetryInterval);
    }
    logWarning("service '%s' did not start", instance);
    return nullptr;
}

AIBinder* AServiceManager_waitForService(const char* instance) {
    if (instance == nullptr) return nullptr;
    IServiceManager& manager = serviceManager();
    SpAIBinder service;
    if (!succeeded(manager.getService(instance, &service))) return nullptr;
    if (service.get() != nullptr) return release(service);

    const auto waiter = ndk::SharedRefBase::make<RegistrationWaiter>();
    if (!succeeded(manager.registerForNotifications(instance, waiter))) return nullptr;
    while (service.get() == nullptr) {
        service = waiter->wait();
        if (service.get() != nullptr) break;
        logWarning("waited one second for service '%s'", instance);
        // Without a thread to be told on, only asking helps.
        if (!succeeded(manager.getService(instance, &service))) break;
    }
    succeeded(manager.unregisterForNotifications(instance, waiter));
    return release(service);
}

bool AServiceManager_isDeclared(const char* instance) {
    bool declared = false;
    return instance != nullptr && succeeded(serviceManager().isDeclared(instance, &declared)) &&
           declared;
}

void AServiceManager_forEachDeclaredInstance(const char* interface, void* context,
                                             void (*callback)(const char*, void*)) {
    if (interface == nullptr || callback == nullptr)
        fatal("AServiceManager_forEachDeclaredInstance: interface and callback may not be null");
    std::vector<std::string> names;
    if (!succeeded(serviceManager().getDeclaredInstances(interface, &names))) return;
    for (const std::string& name : names) callback(name.c_str(), context);
}

bool AServiceManager_isUpdatableViaApex(const char* instance) {
    std::optional<std::string> package;
    return instance != nullptr &&
           succeeded(serviceManager().updatableViaApex(instance, &package)) && package.has_value();
}
