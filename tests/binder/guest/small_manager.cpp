// SPDX-License-Identifier: Apache-2.0
// A service manager of a few lines.
#include "small_manager.h"

#include <android/binder_auto_utils.h>
#include <android/binder_ibinder_platform.h>
#include <android/binder_parcel_utils.h>
#include <android/binder_process.h>
#include <binder_context_manager.h>
#include <errno.h>
#include <gtest/gtest.h>

#include <map>
#include <string>
#include <vector>

namespace binder_test {
namespace {

struct Registry {
    std::map<std::string, ndk::SpAIBinder> services;
    std::multimap<std::string, ndk::SpAIBinder> waiting;
};

binder_status_t writeOk(AParcel* out) {
    const auto ok = ndk::ScopedAStatus::ok();
    return AParcel_writeStatusHeader(out, ok.get());
}

binder_status_t lookUp(const Registry& registry, const AParcel* in, AParcel* out) {
    std::string name;
    if (const auto status = ndk::AParcel_readString(in, &name); status != STATUS_OK) return status;
    const auto found = registry.services.find(name);
    if (const auto status = writeOk(out); status != STATUS_OK) return status;
    return AParcel_writeStrongBinder(
            out, found != registry.services.end() ? found->second.get() : nullptr);
}

void notify(AIBinder* callback, const std::string& name, AIBinder* service) {
    static const AIBinder_Class* const clazz = AIBinder_Class_define(
            "android.os.IServiceCallback", [](void* args) { return args; }, [](void*) {},
            [](AIBinder*, transaction_code_t, const AParcel*, AParcel*) -> binder_status_t {
                return STATUS_UNKNOWN_TRANSACTION;
            });
    AParcel* in = nullptr;
    AParcel* out = nullptr;
    if (!AIBinder_assumeClass(callback, clazz)) return;
    if (AIBinder_prepareTransaction(callback, &in) != STATUS_OK) return;
    ndk::AParcel_writeString(in, name);
    AParcel_writeStrongBinder(in, service);
    AIBinder_transact(callback, FIRST_CALL_TRANSACTION, &in, &out, FLAG_ONEWAY);
    AParcel_delete(out);
}

binder_status_t addService(Registry* registry, const AParcel* in, AParcel* out) {
    std::string name;
    ndk::SpAIBinder service;
    bool allowIsolated = true;
    int32_t priority = 0;
    if (const auto status = ndk::AParcel_readString(in, &name); status != STATUS_OK) return status;
    if (const auto status = AParcel_readStrongBinder(in, service.getR()); status != STATUS_OK)
        return status;
    if (const auto status = AParcel_readBool(in, &allowIsolated); status != STATUS_OK)
        return status;
    if (const auto status = AParcel_readInt32(in, &priority); status != STATUS_OK) return status;
    if (allowIsolated || priority != 8) {
        const auto refusal = ndk::ScopedAStatus::fromExceptionCode(EX_ILLEGAL_ARGUMENT);
        return AParcel_writeStatusHeader(out, refusal.get());
    }
    registry->services[name] = service;
    const auto [first, last] = registry->waiting.equal_range(name);
    for (auto waiter = first; waiter != last; ++waiter)
        notify(waiter->second.get(), name, service.get());
    return writeOk(out);
}

binder_status_t onTransact(AIBinder* binder, transaction_code_t code, const AParcel* in,
                           AParcel* out) {
    auto* const registry = static_cast<Registry*>(AIBinder_getUserData(binder));
    switch (code) {
        case 1:
        case 2:
            return lookUp(*registry, in, out);
        case 3:
            return addService(registry, in, out);
        case 5: {
            std::string name;
            ndk::SpAIBinder callback;
            if (const auto status = ndk::AParcel_readString(in, &name); status != STATUS_OK)
                return status;
            if (const auto status = AParcel_readStrongBinder(in, callback.getR());
                status != STATUS_OK) {
                return status;
            }
            registry->waiting.emplace(name, callback);
            return writeOk(out);
        }
        case 6:
            return writeOk(out);
        default:
            return STATUS_UNKNOWN_TRANSACTION;
    }
}

}  // namespace

void serveSmallManager(const std::function<void()>& ready) {
    const AIBinder_Class* const clazz = AIBinder_Class_define(
            "android.os.IServiceManager", [](void*) -> void* { return new Registry; },
            [](void* registry) { delete static_cast<Registry*>(registry); }, onTransact);
    const ndk::SpAIBinder manager(AIBinder_new(clazz, nullptr));
    ABinderProcess_setThreadPoolMaxThreadCount(0);
    ASSERT_EQ(STATUS_OK, ABinderProcess_becomeContextManager(manager.get()));
    EXPECT_EQ(-EBUSY, ABinderProcess_becomeContextManager(manager.get()));
    ready();
    ABinderProcess_joinThreadPool();
}

}  // namespace binder_test
