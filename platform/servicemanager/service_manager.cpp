// SPDX-License-Identifier: Apache-2.0
//
// The binder side of the service manager: see service_manager.h.
//
// The stub is written by hand because it has to behave as the C++ backend's does, which the phone's
// own service manager uses: a null where none is allowed is answered with the exception
// EX_NULL_POINTER in an ordinary reply, where generated NDK code would fail the transaction.
#include "platform/servicemanager/service_manager.h"

#include <unistd.h>

#include <cstdio>
#include <utility>

#include <aidl/android/os/BpClientCallback.h>
#include <aidl/android/os/BpServiceCallback.h>
#include <aidl/android/os/IServiceManager.h>
#include <android/binder_parcel_utils.h>
#include <android/binder_status.h>
#include <binder_context_manager.h>
#include <fmt/format.h>

namespace servicemanager {

namespace {

using aidl::android::os::BpClientCallback;
using aidl::android::os::BpServiceCallback;
using aidl::android::os::IClientCallback;
using aidl::android::os::IServiceCallback;
using aidl::android::os::IServiceManager;

// What it registers itself as.
constexpr const char* kOwnName = "manager";

void log(const std::string& line) {
    fmt::print(stderr, "servicemanager: {}\n", line);
}

// A name as the log shows it. It comes from outside, so it may hold anything.
std::string shown(const std::string& name) {
    constexpr size_t kEnough = 200;
    return fmt::format("{:?}", name.substr(0, kEnough));
}

Caller callerOfThisTransaction() {
    return {AIBinder_getCallingPid(), AIBinder_getCallingUid()};
}

// Takes over one strong reference.
Object adopt(AIBinder* binder) {
    return binder == nullptr ? nullptr : Object(binder, AIBinder_decStrong);
}

binder_status_t read(const AParcel* in, std::string* value) {
    return ndk::AParcel_readString(in, value);
}

binder_status_t read(const AParcel* in, bool* value) {
    return AParcel_readBool(in, value);
}

binder_status_t read(const AParcel* in, int32_t* value) {
    return AParcel_readInt32(in, value);
}

// No binder argument of this interface may be null.
binder_status_t read(const AParcel* in, Object* value) {
    AIBinder* binder = nullptr;
    const binder_status_t status = AParcel_readStrongBinder(in, &binder);
    *value = adopt(binder);
    return status == STATUS_OK && binder == nullptr ? STATUS_UNEXPECTED_NULL : status;
}

// Reads the arguments in order, up to the first failure.
template <typename... Value>
binder_status_t readArguments(const AParcel* in, Value*... values) {
    binder_status_t status = STATUS_OK;
    static_cast<void>((((status = read(in, values)) == STATUS_OK) && ...));
    return status;
}

binder_status_t write(AParcel* out, bool value) {
    return AParcel_writeBool(out, value);
}

binder_status_t write(AParcel* out, const Object& value) {
    return AParcel_writeStrongBinder(out, value.get());
}

binder_status_t write(AParcel* out, const std::vector<std::string>& value) {
    return ndk::AParcel_writeVector(out, value);
}

binder_status_t write(AParcel* out, const std::optional<std::string>& value) {
    return ndk::AParcel_writeString(out, value);
}

binder_status_t write(AParcel* out, const std::vector<aidl::android::os::ServiceDebugInfo>& value) {
    return ndk::AParcel_writeVector(out, value);
}

binder_status_t writeException(AParcel* out, binder_exception_t exception) {
    const ndk::ScopedAStatus header = ndk::ScopedAStatus::fromExceptionCode(exception);
    return AParcel_writeStatusHeader(out, header.get());
}

// An ok header and the result.
template <typename Value>
binder_status_t reply(AParcel* out, const Value& value) {
    const binder_status_t status = writeException(out, EX_NONE);
    return status == STATUS_OK ? write(out, value) : status;
}

// What the generated code takes: a reference of its own.
ndk::SpAIBinder binderOf(const Object& object) {
    AIBinder_incStrong(object.get());
    return ndk::SpAIBinder(object.get());
}

// Calls each of the callbacks for a name, which are proxies of this type, without waiting for them;
// one line on the log for all that fail.
template <typename Proxy, typename Method, typename... Value>
void callEach(const std::vector<Object>& callbacks, const std::string& name, Method method,
              const Value&... values) {
    size_t failures = 0;
    binder_status_t last = STATUS_OK;
    for (const Object& callback : callbacks) {
        const auto proxy = ndk::SharedRefBase::make<Proxy>(binderOf(callback));
        const ndk::ScopedAStatus status = ((*proxy).*method)(values...);
        if (status.isOk()) continue;
        ++failures;
        last = status.getStatus();
    }
    if (failures == 0) return;
    log(fmt::format("{} of {} callbacks for {} could not be called: status {}", failures,
                    callbacks.size(), shown(name), last));
}

// The header alone. A refusal is logged here, with the reason that the caller is not told.
binder_status_t replyVerdict(AParcel* out, const char* method, const std::string& name,
                             const Verdict& verdict) {
    if (!verdict.ok()) {
        const Caller caller = callerOfThisTransaction();
        log(fmt::format("{} {} refused to pid {}, uid {}: {}", method, shown(name), caller.pid,
                        caller.uid, verdict.reason));
    }
    return writeException(out, verdict.exception);
}

}  // namespace

// By transaction code, from FIRST_CALL_TRANSACTION.
const ServiceManager::Serve ServiceManager::kMethods[12] = {
        /*  1 getService                 */ &ServiceManager::getService,
        /*  2 checkService               */ &ServiceManager::checkService,
        /*  3 addService                 */ &ServiceManager::addService,
        /*  4 listServices               */ &ServiceManager::listServices,
        /*  5 registerForNotifications   */ &ServiceManager::registerForNotifications,
        /*  6 unregisterForNotifications */ &ServiceManager::unregisterForNotifications,
        /*  7 isDeclared                 */ &ServiceManager::isDeclared,
        /*  8 getDeclaredInstances       */ &ServiceManager::getDeclaredInstances,
        /*  9 updatableViaApex           */ &ServiceManager::updatableViaApex,
        /* 10 registerClientCallback     */ &ServiceManager::registerClientCallback,
        /* 11 tryUnregisterService       */ &ServiceManager::tryUnregisterService,
        /* 12 getServiceDebugInfo        */ &ServiceManager::getServiceDebugInfo,
};

ServiceManager::ServiceManager(const std::filesystem::path& manifestRoot, RegistrationRules rules)
    : mManifests(manifestRoot, log),
      mRules(std::move(rules)),
      mRegistry(*this,
                {.isDeclared =
                         [this](const std::string& name) { return mManifests.isDeclared(name); },
                 .mayRegister =
                         [this](uid_t user, const std::string& name) {
                             return mRules.mayRegister(user, name);
                         }}),
      mDeathRecipient(AIBinder_DeathRecipient_new(onBinderDied)) {
    const AIBinder_Class* clazz = AIBinder_Class_define(
            IServiceManager::descriptor, [](void* self) { return self; }, [](void*) {}, onTransact);
    mBinder = ndk::SpAIBinder(AIBinder_new(clazz, this));

    AIBinder_incStrong(mBinder.get());
    const Caller self{getpid(), geteuid()};
    mRules.allow(kOwnName, self.uid);
    const Verdict verdict = mRegistry.addService(
            self, {.name = kOwnName,
                   .object = adopt(mBinder.get()),
                   .dumpPriority = IServiceManager::DUMP_FLAG_PRIORITY_DEFAULT});
    if (!verdict.ok()) log(fmt::format("cannot register itself: {}", verdict.reason));
}

bool ServiceManager::isRemote(const Object& object) {
    return AIBinder_isRemote(object.get());
}

bool ServiceManager::watch(const Object& object) {
    Watch& watch = mWatches[object.get()];
    watch = {this, object.get()};
    if (AIBinder_linkToDeath(object.get(), mDeathRecipient.get(), &watch) == STATUS_OK) return true;
    mWatches.erase(object.get());
    return false;
}

void ServiceManager::unwatch(const Object& object) {
    const auto watch = mWatches.find(object.get());
    if (watch == mWatches.end()) return;
    // Fails only for a link that has fired, and then there is nothing to undo.
    AIBinder_unlinkToDeath(object.get(), mDeathRecipient.get(), &watch->second);
    mWatches.erase(watch);
}

void ServiceManager::notifyRegistration(const std::vector<Object>& callbacks,
                                        const std::string& name, const Object& service) {
    callEach<BpServiceCallback>(callbacks, name, &BpServiceCallback::onRegistration, name,
                                binderOf(service));
}

void ServiceManager::notifyClients(const std::vector<Object>& callbacks, const std::string& name,
                                   const Object& service, bool hasClients) {
    callEach<BpClientCallback>(callbacks, name, &BpClientCallback::onClients, binderOf(service),
                               hasClients);
}

std::optional<uint32_t> ServiceManager::countHolders(const Object& object) {
    uint32_t count = 0;
    const binder_status_t status = AIBinder_countHolders(object.get(), &count);
    return status == STATUS_OK ? std::optional(count) : std::nullopt;
}

binder_status_t ServiceManager::onTransact(AIBinder* binder, transaction_code_t code,
                                           const AParcel* in, AParcel* out) {
    const size_t index = code - FIRST_CALL_TRANSACTION;
    if (index >= std::size(kMethods)) return STATUS_UNKNOWN_TRANSACTION;
    auto* self = static_cast<ServiceManager*>(AIBinder_getUserData(binder));
    const binder_status_t status = (self->*kMethods[index])(in, out);
    if (status != STATUS_UNEXPECTED_NULL) return status;
    AParcel_reset(out);
    return writeException(out, EX_NULL_POINTER);
}

void ServiceManager::onBinderDied(void* cookie) {
    const Watch watch = *static_cast<Watch*>(cookie);
    watch.manager->mWatches.erase(watch.object);
    for (const std::string& name : watch.manager->mRegistry.objectDied(watch.object)) {
        log(fmt::format("{} is gone: its process has died", shown(name)));
    }
}

// On a phone init starts what its scripts name, here the starter what the rules name.
void ServiceManager::startService(const Caller& caller, const std::string& name) {
    const StartCommand* const command = mRules.commandFor(name);
    if (command == nullptr || isIsolated(caller.uid)) return;
    const auto started = mStarter.start(name, *command);
    if (!started.ok()) {
        log(fmt::format("{} cannot be started: {}", shown(name), started.error().message()));
    } else if (*started) {
        log(fmt::format("{} is started for pid {}, uid {}", shown(name), caller.pid, caller.uid));
    }
}

// Does not wait for a service that it has started: the caller asks again, or is called back.
binder_status_t ServiceManager::getService(const AParcel* in, AParcel* out) {
    std::string name;
    const binder_status_t status = readArguments(in, &name);
    if (status != STATUS_OK) return status;
    const Caller caller = callerOfThisTransaction();
    const Object service = mRegistry.find(caller, name);
    if (!service) startService(caller, name);
    return reply(out, service);
}

binder_status_t ServiceManager::checkService(const AParcel* in, AParcel* out) {
    std::string name;
    const binder_status_t status = readArguments(in, &name);
    if (status != STATUS_OK) return status;
    return reply(out, mRegistry.find(callerOfThisTransaction(), name));
}

binder_status_t ServiceManager::addService(const AParcel* in, AParcel* out) {
    Registration registration;
    const binder_status_t status =
            readArguments(in, &registration.name, &registration.object, &registration.allowIsolated,
                          &registration.dumpPriority);
    if (status != STATUS_OK) return status;
    registration.requiresDeclaration = AIBinder_requiresVintfDeclaration(registration.object.get());
    return replyVerdict(out, "addService", registration.name,
                        mRegistry.addService(callerOfThisTransaction(), registration));
}

binder_status_t ServiceManager::listServices(const AParcel* in, AParcel* out) {
    int32_t dumpPriority = 0;
    const binder_status_t status = readArguments(in, &dumpPriority);
    if (status != STATUS_OK) return status;
    return reply(out, mRegistry.list(dumpPriority));
}

binder_status_t ServiceManager::registerForNotifications(const AParcel* in, AParcel* out) {
    std::string name;
    Object callback;
    const binder_status_t status = readArguments(in, &name, &callback);
    if (status != STATUS_OK) return status;
    // An object of another interface is accepted like any other; it refuses the calls itself. While
    // a call is served nobody is asked which it is: the answer would be the client's to withhold.
    IServiceCallback::fromBinder(binderOf(callback));
    return replyVerdict(
            out, "registerForNotifications", name,
            mRegistry.registerForNotifications(callerOfThisTransaction(), name, callback));
}

binder_status_t ServiceManager::unregisterForNotifications(const AParcel* in, AParcel* out) {
    std::string name;
    Object callback;
    const binder_status_t status = readArguments(in, &name, &callback);
    if (status != STATUS_OK) return status;
    return replyVerdict(out, "unregisterForNotifications", name,
                        mRegistry.unregisterForNotifications(name, callback));
}

binder_status_t ServiceManager::isDeclared(const AParcel* in, AParcel* out) {
    std::string name;
    const binder_status_t status = readArguments(in, &name);
    if (status != STATUS_OK) return status;
    return reply(out, mManifests.isDeclared(name));
}

binder_status_t ServiceManager::getDeclaredInstances(const AParcel* in, AParcel* out) {
    std::string interface;
    const binder_status_t status = readArguments(in, &interface);
    if (status != STATUS_OK) return status;
    return reply(out, mManifests.instancesOf(interface));
}

binder_status_t ServiceManager::updatableViaApex(const AParcel* in, AParcel* out) {
    std::string name;
    const binder_status_t status = readArguments(in, &name);
    if (status != STATUS_OK) return status;
    return reply(out, mManifests.updatableViaApex(name));
}

binder_status_t ServiceManager::registerClientCallback(const AParcel* in, AParcel* out) {
    std::string name;
    Object service;
    Object callback;
    const binder_status_t status = readArguments(in, &name, &service, &callback);
    if (status != STATUS_OK) return status;
    IClientCallback::fromBinder(binderOf(callback));
    return replyVerdict(
            out, "registerClientCallback", name,
            mRegistry.registerClientCallback(callerOfThisTransaction(), name, service, callback));
}

binder_status_t ServiceManager::tryUnregisterService(const AParcel* in, AParcel* out) {
    std::string name;
    Object service;
    const binder_status_t status = readArguments(in, &name, &service);
    if (status != STATUS_OK) return status;
    return replyVerdict(out, "tryUnregisterService", name,
                        mRegistry.tryUnregisterService(callerOfThisTransaction(), name, service));
}

binder_status_t ServiceManager::getServiceDebugInfo(const AParcel*, AParcel* out) {
    std::vector<aidl::android::os::ServiceDebugInfo> infos;
    for (const ServiceDebugInfo& info : mRegistry.debugInfo()) {
        infos.push_back({.name = info.name, .debugPid = info.pid});
    }
    return reply(out, infos);
}

}  // namespace servicemanager
