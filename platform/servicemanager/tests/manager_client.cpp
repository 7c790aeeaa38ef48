// SPDX-License-Identifier: Apache-2.0
//
// A client of the service manager: see manager_client.h.
#include "platform/servicemanager/tests/manager_client.h"

#include <android/binder_manager.h>
#include <android/binder_parcel_utils.h>
#include <android/binder_process.h>
#include <android/binder_stability.h>
#include <gtest/gtest.h>

namespace client {

namespace {

using Write = std::function<binder_status_t(AParcel*)>;
using Read = std::function<binder_status_t(const AParcel*)>;

const AIBinder_Class* plainClass(const char* descriptor) {
    return AIBinder_Class_define(
            descriptor, [](void*) -> void* { return nullptr; }, [](void*) {},
            [](AIBinder*, transaction_code_t, const AParcel*, AParcel*) -> binder_status_t {
                return STATUS_UNKNOWN_TRANSACTION;
            });
}

const AIBinder_Class* managerClass() {
    static const AIBinder_Class* const clazz = plainClass("android.os.IServiceManager");
    return clazz;
}

const AIBinder_Class* objectClass() {
    static const AIBinder_Class* const clazz = plainClass("test.IObject");
    return clazz;
}

binder_status_t onRegistration(AIBinder* binder, transaction_code_t code, const AParcel* in,
                               AParcel*) {
    auto* callback = static_cast<RegistrationCallback*>(AIBinder_getUserData(binder));
    if (code != FIRST_CALL_TRANSACTION) return STATUS_UNKNOWN_TRANSACTION;
    binder_status_t status = ndk::AParcel_readString(in, &callback->name);
    if (status != STATUS_OK) return status;
    ndk::SpAIBinder service;
    status = AParcel_readStrongBinder(in, service.getR());
    callback->service = service;
    ++callback->calls;
    return status;
}

const AIBinder_Class* registrationCallbackClass() {
    static const AIBinder_Class* const clazz = AIBinder_Class_define(
            "android.os.IServiceCallback", [](void* self) { return self; }, [](void*) {},
            onRegistration);
    return clazz;
}

binder_status_t onClients(AIBinder* binder, transaction_code_t code, const AParcel* in, AParcel*) {
    if (code != FIRST_CALL_TRANSACTION) return STATUS_UNKNOWN_TRANSACTION;
    ndk::SpAIBinder service;
    binder_status_t status = AParcel_readStrongBinder(in, service.getR());
    bool hasClients = false;
    if (status == STATUS_OK) status = AParcel_readBool(in, &hasClients);
    if (status != STATUS_OK) return status;
    static_cast<ClientCallback*>(AIBinder_getUserData(binder))->onClients(hasClients);
    return STATUS_OK;
}

const AIBinder_Class* clientCallbackClass() {
    static const AIBinder_Class* const clazz = AIBinder_Class_define(
            "android.os.IClientCallback", [](void* self) { return self; }, [](void*) {}, onClients);
    return clazz;
}

int32_t call(Code code, const Write& write, const Read& read = nullptr) {
    const ndk::SpAIBinder binder = manager();
    ndk::ScopedAParcel in;
    ndk::ScopedAParcel out;
    EXPECT_EQ(AIBinder_prepareTransaction(binder.get(), in.getR()), STATUS_OK);
    if (write) {
        EXPECT_EQ(write(in.get()), STATUS_OK);
    }
    if (AIBinder_transact(binder.get(), code, in.getR(), out.getR(), 0) != STATUS_OK) {
        return EX_TRANSACTION_FAILED;
    }
    ndk::ScopedAStatus header;
    EXPECT_EQ(AParcel_readStatusHeader(out.get(), header.getR()), STATUS_OK);
    if (header.isOk() && read) {
        EXPECT_EQ(read(out.get()), STATUS_OK);
    }
    EXPECT_EQ(AParcel_getDataPosition(out.get()), AParcel_getDataSize(out.get()))
            << "the reply has more than its result";
    return header.getExceptionCode();
}

Write text(const std::string& value) {
    return [&value](AParcel* in) { return ndk::AParcel_writeString(in, value); };
}

Write textAndBinder(const std::string& value, const ndk::SpAIBinder& binder) {
    return [&value, &binder](AParcel* in) {
        const binder_status_t status = ndk::AParcel_writeString(in, value);
        return status == STATUS_OK ? AParcel_writeStrongBinder(in, binder.get()) : status;
    };
}

binder_status_t readDebugInfo(const AParcel* out, DebugInfo& info) {
    int32_t present = 0;
    int32_t size = 0;
    binder_status_t status = AParcel_readInt32(out, &present);
    EXPECT_EQ(present, 1);
    const int32_t start = AParcel_getDataPosition(out);
    if (status == STATUS_OK) status = AParcel_readInt32(out, &size);
    if (status == STATUS_OK) status = ndk::AParcel_readString(out, &info.name);
    if (status == STATUS_OK) status = AParcel_readInt32(out, &info.pid);
    EXPECT_EQ(AParcel_getDataPosition(out) - start, size);
    return status;
}

}  // namespace

ndk::SpAIBinder makeObject() {
    return ndk::SpAIBinder(AIBinder_new(objectClass(), nullptr));
}

ndk::SpAIBinder makeVintfObject() {
    const ndk::SpAIBinder object = makeObject();
    AIBinder_markVintfStability(object.get());
    return object;
}

RegistrationCallback::RegistrationCallback()
    : binder(AIBinder_new(registrationCallbackClass(), this)) {
    ABinderProcess_startThreadPool();
}

ClientCallback::ClientCallback(std::function<void(bool)> function)
    : onClients(std::move(function)), binder(AIBinder_new(clientCallbackClass(), this)) {
    ABinderProcess_startThreadPool();
}

ndk::SpAIBinder manager() {
    ndk::SpAIBinder binder(AServiceManager_checkService("manager"));
    EXPECT_TRUE(AIBinder_associateClass(binder.get(), managerClass()));
    return binder;
}

int32_t find(Code code, const std::string& name, ndk::SpAIBinder& service) {
    return call(code, text(name), [&service](const AParcel* out) {
        AIBinder* binder = nullptr;
        const binder_status_t status = AParcel_readStrongBinder(out, &binder);
        service.set(binder);
        return status;
    });
}

int32_t add(const std::string& name, const ndk::SpAIBinder& service, bool allowIsolated,
            int32_t dumpPriority) {
    return call(kAddService, [&](AParcel* in) {
        binder_status_t status = textAndBinder(name, service)(in);
        if (status == STATUS_OK) status = AParcel_writeBool(in, allowIsolated);
        return status == STATUS_OK ? AParcel_writeInt32(in, dumpPriority) : status;
    });
}

int32_t list(int32_t dumpPriority, std::vector<std::string>& names) {
    return call(
            kListServices,
            [dumpPriority](AParcel* in) { return AParcel_writeInt32(in, dumpPriority); },
            [&names](const AParcel* out) { return ndk::AParcel_readVector(out, &names); });
}

int32_t notify(Code code, const std::string& name, const ndk::SpAIBinder& callback) {
    return call(code, textAndBinder(name, callback));
}

int32_t isDeclared(const std::string& name, bool& declared) {
    return call(kIsDeclared, text(name),
                [&declared](const AParcel* out) { return AParcel_readBool(out, &declared); });
}

int32_t getDeclaredInstances(const std::string& interface, std::vector<std::string>& instances) {
    return call(kGetDeclaredInstances, text(interface), [&instances](const AParcel* out) {
        return ndk::AParcel_readVector(out, &instances);
    });
}

int32_t updatableViaApex(const std::string& name, std::optional<std::string>& apex) {
    return call(kUpdatableViaApex, text(name),
                [&apex](const AParcel* out) { return ndk::AParcel_readString(out, &apex); });
}

int32_t registerClientCallback(const std::string& name, const ndk::SpAIBinder& service,
                               const ndk::SpAIBinder& callback) {
    return call(kRegisterClientCallback, [&](AParcel* in) {
        const binder_status_t status = textAndBinder(name, service)(in);
        return status == STATUS_OK ? AParcel_writeStrongBinder(in, callback.get()) : status;
    });
}

int32_t tryUnregister(const std::string& name, const ndk::SpAIBinder& service) {
    return call(kTryUnregisterService, textAndBinder(name, service));
}

int32_t debugInfo(std::vector<DebugInfo>& infos) {
    return call(kGetServiceDebugInfo, nullptr, [&infos](const AParcel* out) {
        int32_t count = 0;
        binder_status_t status = AParcel_readInt32(out, &count);
        for (int32_t i = 0; i < count && status == STATUS_OK; ++i) {
            status = readDebugInfo(out, infos.emplace_back());
        }
        return status;
    });
}

}  // namespace client
