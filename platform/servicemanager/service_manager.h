// SPDX-License-Identifier: Apache-2.0
//
// The binder side of the service manager: serves android.os.IServiceManager, answers out of the
// registry, the rules and the manifests.
#pragma once

#include <filesystem>
#include <optional>
#include <string>
#include <unordered_map>
#include <vector>

#include <android/binder_auto_utils.h>
#include <android/binder_ibinder.h>
#include <android/binder_parcel.h>

#include "platform/servicemanager/manifests.h"
#include "platform/servicemanager/registration_rules.h"
#include "platform/servicemanager/service_registry.h"
#include "platform/servicemanager/service_starter.h"

namespace servicemanager {

// One per process, for the life of the process. It waits for nobody: all calls it makes to others
// are oneway, because its one thread serves the whole machine.
class ServiceManager final : public ObjectHost {
  public:
    // Manifests are looked for below `manifestRoot`. Registers itself under the name `manager`.
    ServiceManager(const std::filesystem::path& manifestRoot, RegistrationRules rules);

    ServiceManager(const ServiceManager&) = delete;
    ServiceManager& operator=(const ServiceManager&) = delete;

    // The object to be put behind handle 0. Owned by this.
    AIBinder* binder() const { return mBinder.get(); }

    // See ServiceRegistry.
    void checkClients() { mRegistry.checkClients(); }
    bool hasClientCallbacks() const { return mRegistry.hasClientCallbacks(); }

    bool isRemote(const Object& object) override;
    bool watch(const Object& object) override;
    void unwatch(const Object& object) override;
    void notifyRegistration(const std::vector<Object>& callbacks, const std::string& name,
                            const Object& service) override;
    void notifyClients(const std::vector<Object>& callbacks, const std::string& name,
                       const Object& service, bool hasClients) override;
    std::optional<uint32_t> countHolders(const Object& object) override;

  private:
    // Serves one method: reads its arguments from `in`, writes header and result to `out`. The
    // status STATUS_UNEXPECTED_NULL reaches the caller as EX_NULL_POINTER.
    using Serve = binder_status_t (ServiceManager::*)(const AParcel* in, AParcel* out);

    // The cookie of a death link.
    struct Watch {
        ServiceManager* manager;
        const AIBinder* object;
    };

    static binder_status_t onTransact(AIBinder* binder, transaction_code_t code, const AParcel* in,
                                      AParcel* out);
    static void onBinderDied(void* cookie);

    binder_status_t getService(const AParcel* in, AParcel* out);
    binder_status_t checkService(const AParcel* in, AParcel* out);
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

    void startService(const Caller& caller, const std::string& name);

    static const Serve kMethods[12];

    Manifests mManifests;
    RegistrationRules mRules;
    ServiceRegistry mRegistry;
    ServiceStarter mStarter;
    ndk::ScopedAIBinder_DeathRecipient mDeathRecipient;
    std::unordered_map<const AIBinder*, Watch> mWatches;
    ndk::SpAIBinder mBinder;
};

}  // namespace servicemanager
