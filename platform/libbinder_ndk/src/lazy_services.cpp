// SPDX-License-Identifier: Apache-2.0
//
// The AServiceManager functions for services that run only while they are used: the service manager
// says when the clients come and go, and a process none of whose services has any takes them out of
// the service manager and ends.
#include <cstdlib>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include <aidl/android/os/BnClientCallback.h>
#include <android-base/thread_annotations.h>
#include <android/binder_manager.h>

#include "platform/libbinder_ndk/src/log.h"
#include "platform/libbinder_ndk/src/service_manager_client.h"

using aidl::android::os::BnClientCallback;
using aidl::android::os::IServiceManager;
using ndk::ScopedAStatus;
using ndk::SpAIBinder;

namespace binder_ndk {
namespace {

using ActiveServicesCallback = bool (*)(bool hasClients, void* context);

// One service; told of its clients.
struct LazyService : BnClientCallback {
    LazyService(std::string serviceName, const SpAIBinder& serviceObject)
        : name(std::move(serviceName)), object(serviceObject) {}

    ScopedAStatus onClients(const SpAIBinder& registered, bool hasClients) override;

    const std::string name;
    const SpAIBinder object;
    // Guarded by the lock of LazyServices.
    bool registered = false;
    bool hasClients = false;
};

// Those of this process.
class LazyServices {
  public:
    static LazyServices& instance() {
        static auto* const services = new LazyServices;  // outlives static destruction
        return *services;
    }

    bool add(const std::shared_ptr<LazyService>& service) {
        const std::lock_guard<std::mutex> lock(mMutex);
        if (!enroll(*service)) return false;
        const auto callback = std::static_pointer_cast<aidl::android::os::IClientCallback>(service);
        if (!succeeded(serviceManager().registerClientCallback(service->name, service->object,
                                                               callback))) {
            return false;
        }
        mServices.push_back(service);
        return true;
    }

    void clientsChanged(LazyService* service, bool hasClients) {
        ActiveServicesCallback callback = nullptr;
        void* context = nullptr;
        bool inUse = false;
        {
            const std::lock_guard<std::mutex> lock(mMutex);
            service->hasClients = hasClients;
            inUse = isInUse();
            if (std::exchange(mWasInUse, inUse) != inUse) {
                callback = mCallback;
                context = mContext;
            }
        }
        // Without the lock: the program may unregister its services in there.
        if (callback != nullptr && callback(inUse, context)) return;
        if (!inUse) endIfUnused();
    }

    void setPersist(bool persist) {
        {
            const std::lock_guard<std::mutex> lock(mMutex);
            mPersist = persist;
            // Nobody who never had a client is taken down by this.
            if (persist || mServices.empty()) return;
        }
        endIfUnused();
    }

    void setCallback(ActiveServicesCallback callback, void* context) {
        const std::lock_guard<std::mutex> lock(mMutex);
        mCallback = callback;
        mContext = context;
    }

    // True when every service is out of the service manager.
    bool unregister() {
        const std::lock_guard<std::mutex> lock(mMutex);
        for (const auto& service : mServices) {
            if (!service->registered) continue;
            if (!succeeded(serviceManager().tryUnregisterService(service->name, service->object)))
                return false;
            service->registered = false;
        }
        return true;
    }

    void registerAgain() {
        const std::lock_guard<std::mutex> lock(mMutex);
        for (const auto& service : mServices) {
            if (!service->registered && !enroll(*service))
                logError("service '%s' is not registered again", service->name.c_str());
        }
    }

  private:
    static bool enroll(LazyService& service) {
        service.registered = succeeded(serviceManager().addService(
                service.name, service.object, false, IServiceManager::DUMP_FLAG_PRIORITY_DEFAULT));
        return service.registered;
    }

    bool isInUse() const REQUIRES(mMutex) {
        for (const auto& service : mServices)
            if (service->hasClients) return true;
        return false;
    }

    void endIfUnused() {
        {
            const std::lock_guard<std::mutex> lock(mMutex);
            if (mPersist || isInUse()) return;
        }
        if (unregister()) {
            logInfo("no service of this process has a client left; it ends");
            std::exit(EXIT_SUCCESS);
        }
        registerAgain();
    }

    std::mutex mMutex;
    std::vector<std::shared_ptr<LazyService>> mServices GUARDED_BY(mMutex);
    bool mWasInUse GUARDED_BY(mMutex) = false;
    bool mPersist GUARDED_BY(mMutex) = false;
    ActiveServicesCallback mCallback GUARDED_BY(mMutex) = nullptr;
    void* mContext GUARDED_BY(mMutex) = nullptr;
};

ScopedAStatus LazyService::onClients(const SpAIBinder& /*registered*/, bool clients) {
    LazyServices::instance().clientsChanged(this, clients);
    return ScopedAStatus::ok();
}

}  // namespace
}  // namespace binder_ndk

using namespace binder_ndk;

binder_status_t AServiceManager_registerLazyService(AIBinder* binder, const char* instance) {
    if (binder == nullptr || instance == nullptr) return STATUS_UNEXPECTED_NULL;
    AIBinder_incStrong(binder);
    const auto service = ndk::SharedRefBase::make<LazyService>(instance, SpAIBinder(binder));
    return LazyServices::instance().add(service) ? STATUS_OK : STATUS_UNKNOWN_ERROR;
}

void AServiceManager_forceLazyServicesPersist(bool persist) {
    LazyServices::instance().setPersist(persist);
}

void AServiceManager_setActiveServicesCallback(bool (*callback)(bool, void*), void* context) {
    LazyServices::instance().setCallback(callback, context);
}

bool AServiceManager_tryUnregister() {
    return LazyServices::instance().unregister();
}

void AServiceManager_reRegister() {
    LazyServices::instance().registerAgain();
}
