// SPDX-License-Identifier: Apache-2.0
//
// The registry: see service_registry.h.
//
// On a phone SELinux has a say in each of these requests ("add", "find", "list" on the label of the
// name). The kernel this runs on has no SELinux, so those checks always pass and do not appear.
#include "service_registry.h"

#include <algorithm>
#include <utility>

#include "service_name.h"

namespace servicemanager {

namespace {

Verdict refuse(binder_exception_t exception, const char* reason) {
    return {exception, reason};
}

bool contains(const std::vector<Object>& objects, const AIBinder* object) {
    return std::any_of(objects.begin(), objects.end(),
                       [object](const Object& one) { return one.get() == object; });
}

/// Takes the object out of every list, and the names with nobody left out of the map.
void eraseObject(std::map<std::string, std::vector<Object>>& callbacks, const AIBinder* object) {
    for (auto entry = callbacks.begin(); entry != callbacks.end();) {
        auto& objects = entry->second;
        objects.erase(std::remove_if(objects.begin(), objects.end(),
                                     [object](const Object& one) { return one.get() == object; }),
                      objects.end());
        entry = objects.empty() ? callbacks.erase(entry) : std::next(entry);
    }
}

}  // namespace

ServiceRegistry::ServiceRegistry(ObjectHost& host, IsDeclared isDeclared)
    : mHost(host), mIsDeclared(std::move(isDeclared)) {}

Verdict ServiceRegistry::addService(const Caller& caller, const Registration& registration) {
    const auto& [name, object, requiresDeclaration, allowIsolated, dumpPriority] = registration;
    if (isApp(caller.uid)) return refuse(EX_SECURITY, "apps may not register services");
    if (!object) return refuse(EX_ILLEGAL_ARGUMENT, "no binder given");
    if (!isValidServiceName(name)) {
        return refuse(EX_ILLEGAL_ARGUMENT, "the name is not 1 to 127 of a-z A-Z 0-9 _ - . /");
    }
    if (requiresDeclaration && !mIsDeclared(name)) {
        return refuse(EX_ILLEGAL_ARGUMENT, "a VINTF-stable service must be declared in a manifest");
    }
    if (mHost.isRemote(object) && !ensureWatched(object)) {
        return refuse(EX_ILLEGAL_STATE, "its process has died");
    }

    Service& service = mServices[name];
    const Object replaced = std::exchange(service.object, object);
    service.allowIsolated = allowIsolated;
    service.dumpPriority = dumpPriority;
    service.registrant = caller.pid;
    if (replaced) unwatchUnlessHeld(replaced);

    if (const auto waiting = mRegistrationCallbacks.find(name);
        waiting != mRegistrationCallbacks.end()) {
        // A copy: death notices may come in while a call goes out, and shorten the list.
        const std::vector<Object> callbacks = waiting->second;
        for (const Object& callback : callbacks) mHost.notifyRegistration(callback, name, object);
    }
    return {};
}

Object ServiceRegistry::find(const Caller& caller, const std::string& name) const {
    const Service* service = findService(name);
    if (service == nullptr) return nullptr;
    if (isIsolated(caller.uid) && !service->allowIsolated) return nullptr;
    return service->object;
}

std::vector<std::string> ServiceRegistry::list(int32_t dumpPriority) const {
    std::vector<std::string> names;
    for (const auto& [name, service] : mServices) {
        if ((service.dumpPriority & dumpPriority) != 0) names.push_back(name);
    }
    return names;
}

Verdict ServiceRegistry::registerForNotifications(const std::string& name, const Object& callback) {
    if (!isValidServiceName(name)) {
        return refuse(EX_ILLEGAL_ARGUMENT, "the name is not 1 to 127 of a-z A-Z 0-9 _ - . /");
    }
    if (!callback) return refuse(EX_NULL_POINTER, "no callback given");
    if (!ensureWatched(callback))
        return refuse(EX_ILLEGAL_STATE, "the callback is local, or its process has died");
    mRegistrationCallbacks[name].push_back(callback);
    if (const Service* service = findService(name)) {
        mHost.notifyRegistration(callback, name, Object(service->object));
    }
    return {};
}

Verdict ServiceRegistry::unregisterForNotifications(const std::string& name,
                                                    const Object& callback) {
    const auto waiting = mRegistrationCallbacks.find(name);
    if (waiting == mRegistrationCallbacks.end() || !contains(waiting->second, callback.get())) {
        return refuse(EX_ILLEGAL_STATE, "the callback does not wait for this name");
    }
    auto& callbacks = waiting->second;
    callbacks.erase(std::remove(callbacks.begin(), callbacks.end(), callback), callbacks.end());
    if (callbacks.empty()) mRegistrationCallbacks.erase(waiting);
    unwatchUnlessHeld(callback);
    return {};
}

Verdict ServiceRegistry::registerClientCallback(const Caller& caller, const std::string& name,
                                                const Object& service, const Object& callback) {
    const Service* registered = findService(name);
    if (registered == nullptr) return refuse(EX_ILLEGAL_ARGUMENT, "no such service");
    if (registered->registrant != caller.pid) {
        return refuse(EX_UNSUPPORTED_OPERATION, "another process registered the service");
    }
    if (registered->object != service) {
        return refuse(EX_ILLEGAL_ARGUMENT, "another binder is registered under this name");
    }
    if (!ensureWatched(callback))
        return refuse(EX_ILLEGAL_STATE, "the callback is local, or its process has died");
    mClientCallbacks[name].push_back(callback);
    return {};
}

Verdict ServiceRegistry::tryUnregisterService(const Caller& caller, const std::string& name,
                                              const Object& service) const {
    const Service* registered = findService(name);
    if (registered == nullptr) return refuse(EX_ILLEGAL_STATE, "no such service");
    if (registered->registrant != caller.pid) {
        return refuse(EX_UNSUPPORTED_OPERATION, "another process registered the service");
    }
    if (registered->object != service) {
        return refuse(EX_ILLEGAL_STATE, "another binder is registered under this name");
    }
    return refuse(EX_ILLEGAL_STATE, "the service may have clients");
}

std::vector<ServiceDebugInfo> ServiceRegistry::debugInfo() const {
    std::vector<ServiceDebugInfo> infos;
    infos.reserve(mServices.size());
    for (const auto& [name, service] : mServices) infos.push_back({name, service.registrant});
    return infos;
}

std::vector<std::string> ServiceRegistry::objectDied(const AIBinder* object) {
    std::vector<std::string> names;
    for (auto entry = mServices.begin(); entry != mServices.end();) {
        if (entry->second.object.get() != object) {
            ++entry;
            continue;
        }
        names.push_back(entry->first);
        entry = mServices.erase(entry);
    }
    eraseObject(mRegistrationCallbacks, object);
    eraseObject(mClientCallbacks, object);
    return names;
}

bool ServiceRegistry::isHeld(const Object& object) const {
    const auto holds = [&object](const auto& entry) {
        return contains(entry.second, object.get());
    };
    return std::any_of(mServices.begin(), mServices.end(),
                       [&object](const auto& entry) { return entry.second.object == object; }) ||
           std::any_of(mRegistrationCallbacks.begin(), mRegistrationCallbacks.end(), holds) ||
           std::any_of(mClientCallbacks.begin(), mClientCallbacks.end(), holds);
}

/// One link per object, however often it is named: a client that registers the same object again
/// and again does not make the list of links grow.
bool ServiceRegistry::ensureWatched(const Object& object) {
    return mHost.isRemote(object) && (isHeld(object) || mHost.watch(object));
}

void ServiceRegistry::unwatchUnlessHeld(const Object& object) {
    if (mHost.isRemote(object) && !isHeld(object)) mHost.unwatch(object);
}

const ServiceRegistry::Service* ServiceRegistry::findService(const std::string& name) const {
    const auto entry = mServices.find(name);
    return entry == mServices.end() ? nullptr : &entry->second;
}

}  // namespace servicemanager
