// SPDX-License-Identifier: Apache-2.0
//
// A client of the service manager: see manager_client.h.
#include "platform/servicemanager/tests/manager_client.h"

#include <aidl/android/os/BpClientCallback.h>
#include <aidl/android/os/BpServiceCallback.h>
#include <android/binder_manager.h>
#include <android/binder_process.h>
#include <android/binder_stability.h>
#include <gtest/gtest.h>

namespace client {

using aidl::android::os::BpClientCallback;
using aidl::android::os::BpServiceCallback;
using aidl::android::os::IClientCallback;
using aidl::android::os::IServiceCallback;

ndk::SpAIBinder makeObject() {
    static const AIBinder_Class* const clazz = AIBinder_Class_define(
            "test.IObject", [](void*) -> void* { return nullptr; }, [](void*) {},
            [](AIBinder*, transaction_code_t, const AParcel*, AParcel*) -> binder_status_t {
                return STATUS_UNKNOWN_TRANSACTION;
            });
    return ndk::SpAIBinder(AIBinder_new(clazz, nullptr));
}

ndk::SpAIBinder makeVintfObject() {
    const ndk::SpAIBinder object = makeObject();
    AIBinder_markVintfStability(object.get());
    return object;
}

RegistrationCallback::RegistrationCallback() {
    ABinderProcess_startThreadPool();
}

ScopedAStatus RegistrationCallback::onRegistration(const std::string& to,
                                                   const ndk::SpAIBinder& object) {
    name = to;
    service = object;
    ++calls;
    return ScopedAStatus::ok();
}

ClientCallback::ClientCallback(std::function<void(bool)> function)
    : mFunction(std::move(function)) {
    ABinderProcess_startThreadPool();
}

ScopedAStatus ClientCallback::onClients(const ndk::SpAIBinder& /*service*/, bool hasClients) {
    mFunction(hasClients);
    return ScopedAStatus::ok();
}

std::shared_ptr<IServiceCallback> asServiceCallback(ndk::SpAIBinder object) {
    return ndk::SharedRefBase::make<BpServiceCallback>(std::move(object));
}

std::shared_ptr<IClientCallback> asClientCallback(ndk::SpAIBinder object) {
    return ndk::SharedRefBase::make<BpClientCallback>(std::move(object));
}

std::shared_ptr<IServiceManager> manager() {
    auto found =
            IServiceManager::fromBinder(ndk::SpAIBinder(AServiceManager_checkService("manager")));
    EXPECT_NE(found, nullptr);
    return found;
}

int32_t add(const std::string& name, const ndk::SpAIBinder& service, bool allowIsolated,
            int32_t dumpPriority) {
    return ask(&IServiceManager::addService, name, service, allowIsolated, dumpPriority);
}

}  // namespace client
