// SPDX-License-Identifier: Apache-2.0
//
// The registry: see service_registry.h.
//
// On a phone SELinux has a say in each of these requests ("add", "find", "list" on the label of the
// name). The kernel this runs on has no SELinux: Policy::mayRegister stands for "add", the other
// checks always pass and do not appear.
#include "platform/servicemanager/service_registry.h"

#include <utility>

#include "platform/servicemanager/service_name.h"

namespace servicemanager {

namespace {

// What the driver counts for a service that only this process holds, while a call with that service
// as an argument is served: the argument holds it as well.
constexpr uint32_t kHoldersDuringItsCall = 2;

Verdict refuse(binder_exception_t exception, std::string reason) {
    return {exception, std::move(reason)};
}

Verdict refuseName() {
    return refuse(EX_ILLEGAL_ARGUMENT, std::string("the name is not ") + kServiceNameForm);
}

Verdict refuseCallback() {
    return refuse(EX_ILLEGAL_STATE, "the callback is local, or its process has died");
}

Verdict refuseOneTooMany() {
    return refuse(EX_ILLEGAL_STATE, "the user has as many callbacks as one may have");
}

}  // namespace

ServiceRegistry::ServiceRegistry(ObjectHost& host, Policy policy)
    : mHost(host), mPolicy(std::move(policy)) {}

Verdict ServiceRegistry::addService(const Caller& caller, const Registration& registration) {
    const std::string& name = registration.name;
    const Object& object = registration.object;
    if (isApp(caller.uid)) return refuse(EX_SECURITY, "apps may not register services");
    if (!mPolicy.mayRegister(caller.uid, name)) {
        return refuse(EX_SECURITY, "no rule lets this user register the name");
    }
    if (const auto old = mServices.find(name);
        old != mServices.end() && old->second.registrant.uid != caller.uid) {
        return refuse(EX_SECURITY, "a living service of another user has the name");
    }
    if (!object) return refuse(EX_ILLEGAL_ARGUMENT, "no binder given");
    if (!isValidServiceName(name)) return refuseName();
    if (registration.requiresDeclaration && !mPolicy.isDeclared(name)) {
        return refuse(EX_ILLEGAL_ARGUMENT, "a VINTF-stable service must be declared in a manifest");
    }
    if (mHost.isRemote(object) && !ensureWatched(object)) {
        return refuse(EX_ILLEGAL_STATE, "its process has died");
    }
    store(caller, registration);
    const std::vector<Object> callbacks = mRegistrationCallbacks.find(name);
    if (callbacks.empty()) return {};
    mServices[name].handedOut = true;
    mHost.notifyRegistration(callbacks, name, object);
    return {};
}

void ServiceRegistry::store(const Caller& caller, const Registration& registration) {
    const std::string& name = registration.name;
    Service& service = mServices[name];
    const Object replaced = std::exchange(service, {.object = registration.object,
                                                    .allowIsolated = registration.allowIsolated,
                                                    .dumpPriority = registration.dumpPriority,
                                                    .registrant = caller})
                                    .object;
    if (replaced) mNamesByObject.erase({replaced.get(), name});
    mNamesByObject.emplace(registration.object.get(), name);
    if (replaced) unwatchUnlessHeld(replaced);
}

Object ServiceRegistry::find(const Caller& caller, const std::string& name) {
    const auto found = mServices.find(name);
    if (found == mServices.end()) return nullptr;
    Service& service = found->second;
    if (isIsolated(caller.uid) && !service.allowIsolated) return nullptr;
    service.handedOut = true;
    return service.object;
}

std::vector<std::string> ServiceRegistry::list(int32_t dumpPriority) const {
    std::vector<std::string> names;
    for (const auto& [name, service] : mServices) {
        if ((service.dumpPriority & dumpPriority) != 0) names.push_back(name);
    }
    return names;
}

Verdict ServiceRegistry::registerForNotifications(const Caller& caller, const std::string& name,
                                                  const Object& callback) {
    if (!isValidServiceName(name)) return refuseName();
    if (!callback) return refuse(EX_NULL_POINTER, "no callback given");
    if (!ensureWatched(callback)) return refuseCallback();
    if (!mRegistrationCallbacks.add(name, callback, caller.uid)) {
        unwatchUnlessHeld(callback);
        return refuseOneTooMany();
    }
    if (const auto found = mServices.find(name); found != mServices.end()) {
        found->second.handedOut = true;
        mHost.notifyRegistration({callback}, name, Object(found->second.object));
    }
    return {};
}

Verdict ServiceRegistry::unregisterForNotifications(const std::string& name,
                                                    const Object& callback) {
    if (!mRegistrationCallbacks.remove(name, callback.get())) {
        return refuse(EX_ILLEGAL_STATE, "the callback does not wait for this name");
    }
    unwatchUnlessHeld(callback);
    return {};
}

Verdict ServiceRegistry::registerClientCallback(const Caller& caller, const std::string& name,
                                                const Object& service, const Object& callback) {
    const auto found = mServices.find(name);
    if (found == mServices.end()) return refuse(EX_ILLEGAL_ARGUMENT, "no such service");
    const Service& registered = found->second;
    if (registered.registrant.pid != caller.pid) {
        return refuse(EX_UNSUPPORTED_OPERATION, "another process registered the service");
    }
    if (registered.object != service) {
        return refuse(EX_ILLEGAL_ARGUMENT, "another binder is registered under this name");
    }
    if (!ensureWatched(callback)) return refuseCallback();
    if (!mClientCallbacks.add(name, callback, caller.uid)) {
        unwatchUnlessHeld(callback);
        return refuseOneTooMany();
    }
    // The first one starts from "no clients", as the service does; later ones join.
    if (registered.hasClients) mHost.notifyClients({callback}, name, service, true);
    return {};
}

Verdict ServiceRegistry::tryUnregisterService(const Caller& caller, const std::string& name,
                                              const Object& service) {
    const auto found = mServices.find(name);
    if (found == mServices.end()) return refuse(EX_ILLEGAL_STATE, "no such service");
    const Service& registered = found->second;
    if (registered.registrant.pid != caller.pid) {
        return refuse(EX_UNSUPPORTED_OPERATION, "another process registered the service");
    }
    if (registered.object != service) {
        return refuse(EX_ILLEGAL_STATE, "another binder is registered under this name");
    }
    const std::optional<uint32_t> holders = mHost.countHolders(service);
    if (registered.handedOut || !holders || *holders > kHoldersDuringItsCall) {
        return refuse(EX_ILLEGAL_STATE, "the service may have clients");
    }
    mNamesByObject.erase({service.get(), name});
    mServices.erase(found);
    unwatchUnlessHeld(service);
    return {};
}

void ServiceRegistry::checkClients() {
    for (const std::string& name : mClientCallbacks.names()) {
        const auto found = mServices.find(name);
        if (found != mServices.end()) updateClients(name, found->second);
    }
}

// A service that was handed out counts as one with clients until the next time: its client may not
// have taken it yet, or may have let go of it already, and the service is to hear of that one too.
void ServiceRegistry::updateClients(const std::string& name, Service& service) {
    const std::optional<uint32_t> holders = mHost.countHolders(service.object);
    if (!holders) return;
    const bool hasClients = std::exchange(service.handedOut, false) || *holders > 1;
    if (hasClients == service.hasClients) return;
    service.hasClients = hasClients;
    // Copies: death notices may come in while calls go out.
    mHost.notifyClients(mClientCallbacks.find(name), name, Object(service.object), hasClients);
}

std::vector<ServiceDebugInfo> ServiceRegistry::debugInfo() const {
    std::vector<ServiceDebugInfo> infos;
    infos.reserve(mServices.size());
    for (const auto& [name, service] : mServices) infos.push_back({name, service.registrant.pid});
    return infos;
}

std::vector<std::string> ServiceRegistry::objectDied(const AIBinder* object) {
    std::vector<std::string> names;
    auto at = mNamesByObject.lower_bound({object, ""});
    while (at != mNamesByObject.end() && at->first == object) {
        names.push_back(at->second);
        mServices.erase(at->second);
        at = mNamesByObject.erase(at);
    }
    mRegistrationCallbacks.removeAll(object);
    mClientCallbacks.removeAll(object);
    return names;
}

bool ServiceRegistry::isHeld(const Object& object) const {
    const auto at = mNamesByObject.lower_bound({object.get(), ""});
    return (at != mNamesByObject.end() && at->first == object.get()) ||
           mRegistrationCallbacks.contains(object.get()) || mClientCallbacks.contains(object.get());
}

// One link per object, however often it is named: a client that registers the same object again
// and again does not make the list of links grow.
bool ServiceRegistry::ensureWatched(const Object& object) {
    return mHost.isRemote(object) && (isHeld(object) || mHost.watch(object));
}

void ServiceRegistry::unwatchUnlessHeld(const Object& object) {
    if (mHost.isRemote(object) && !isHeld(object)) mHost.unwatch(object);
}

}  // namespace servicemanager
