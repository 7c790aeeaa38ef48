// SPDX-License-Identifier: Apache-2.0
//
// The binder side of the service manager: serves android.os.IServiceManager, answers out of the
// registry and the manifests.
#pragma once

#include <filesystem>
#include <memory>
#include <string>
#include <unordered_map>

#include <android/binder_auto_utils.h>
#include <android/binder_ibinder.h>
#include <android/binder_parcel.h>

#include "manifests.h"
#include "service_registry.h"

namespace servicemanager {

/// One per process, for the life of the process. It waits for nobody: all calls it makes to others
/// are oneway, because its one thread serves the whole machine.
class ServiceManager final : public ObjectHost {
  public:
    /// Manifests are looked for below `manifestRoot`. Registers itself under the name `manager`.
    explicit ServiceManager(const std::filesystem::path& manifestRoot);

    ServiceManager(const ServiceManager&) = delete;
    ServiceManager& operator=(const ServiceManager&) = delete;

    /// The object to be put behind handle 0. Owned by this.
    AIBinder* binder() const { return mBinder.get(); }

    bool isRemote(const Object& object) override;
    bool watch(const Object& object) override;
    void unwatch(const Object& object) override;
    void notifyRegistration(const Object& callback, const std::string& name,
                            const Object& service) override;

  private:
    /// Serves one method: reads its arguments from `in`, writes header and result to `out`. The
    /// status STATUS_UNEXPECTED_NULL reaches the caller as EX_NULL_POINTER.
    using Serve = binder_status_t (ServiceManager::*)(const AParcel* in, AParcel* out);

    /// The cookie of a death link.
    struct Watch {
        ServiceManager* manager;
        const AIBinder* object;
    };

    static binder_status_t onTransact(AIBinder* binder, transaction_code_t code, const AParcel* in,
                                      AParcel* out);
    static void onBinderDied(void* cookie);

    binder_status_t find(const AParcel* in, AParcel* out);
    binder_status_t addService(const AParcel* in, AParcel* out);
    binder_status_t listServices(const AParcel* in, AParcel* out);
    binder_status_t registerForNotifications(const AParcel* in, AParcel* out);
    binder_status_t unregisterForNotifications(const AParcel* in, AParcel* out);
    binder_status_t isDeclared(const AParcel* in, AParcel* out);
    binder_status_t getDeclaredInstances(const AParcel* in, AParcel* out);
    binder_status_t updatableViaApex(const AParcel* in, AParcel* out);
    binder_status_t registerClientCallback(const AParcel* in, AParcel* out);
    binder_status_t tryUnregisterService(const AParcel* in, AParcel* out);
    binder_status_t getServiceDebugInfo(const AParcel* in, AParcel* out);

    static const Serve kMethods[12];

    Manifests mManifests;
    ServiceRegistry mRegistry;
    ndk::ScopedAIBinder_DeathRecipient mDeathRecipient;
    std::unordered_map<const AIBinder*, Watch> mWatches;
    ndk::SpAIBinder mBinder;
};

}  // namespace servicemanager
