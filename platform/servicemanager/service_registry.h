// SPDX-License-Identifier: Apache-2.0
//
// The registry: which service stands under which name, who waits for one, and every rule about who
// may change that. It knows nothing of parcels or the driver.
#pragma once

#include <sys/types.h>

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include <android/binder_status.h>

#include "platform/servicemanager/callback_table.h"
#include "platform/servicemanager/caller.h"

namespace servicemanager {

// What the registry asks of the binder side.
class ObjectHost {
  public:
    virtual ~ObjectHost() = default;

    // False for an object that lives in this process: it needs no death notice.
    virtual bool isRemote(const Object& object) = 0;

    // From now on ServiceRegistry::objectDied() is called when the process of this remote object
    // dies. False when it is dead already. Called once per object.
    virtual bool watch(const Object& object) = 0;

    // Ends watch().
    virtual void unwatch(const Object& object) = 0;

    // Tells callbacks that `service` now stands under `name`, without waiting for them.
    virtual void notifyRegistration(const std::vector<Object>& callbacks, const std::string& name,
                                    const Object& service) = 0;

    // Tells callbacks whether `service`, which stands under `name`, has clients, without waiting
    // for them.
    virtual void notifyClients(const std::vector<Object>& callbacks, const std::string& name,
                               const Object& service, bool hasClients) = 0;

    // How many processes hold this remote object, this one included; nothing when the driver does
    // not say.
    virtual std::optional<uint32_t> countHolders(const Object& object) = 0;
};

// Answer to a request: EX_NONE, or the exception for the caller and the reason for the log.
struct Verdict {
    binder_exception_t exception = EX_NONE;
    std::string reason;

    bool ok() const { return exception == EX_NONE; }
};

// What a caller wants registered.
struct Registration {
    std::string name;
    Object object = nullptr;
    bool requiresDeclaration = false;  // a VINTF-stable object: must stand in a manifest
    bool allowIsolated = false;        // isolated processes may find it
    int32_t dumpPriority = 0;          // bits that listServices() filters by
};

// One line of the debugging overview.
struct ServiceDebugInfo {
    std::string name;
    pid_t pid = 0;
};

// Not thread-safe: the service manager has one thread.
class ServiceRegistry {
  public:
    struct Policy {
        // Says whether a manifest lists the service of this name.
        std::function<bool(const std::string& name)> isDeclared;

        // Says whether this user may register this name. Apps are not asked for.
        std::function<bool(uid_t user, const std::string& name)> mayRegister;
    };

    // `host` must outlive the registry.
    ServiceRegistry(ObjectHost& host, Policy policy);

    // Stores the service, in place of an older one of that name, and tells those who wait for the
    // name. Refuses, in this order: EX_SECURITY for an app, for a name that is not this user's, and
    // for one under which a living service of another user stands; EX_ILLEGAL_ARGUMENT for no
    // object, a bad name, a VINTF-stable object that no manifest declares; EX_ILLEGAL_STATE for a
    // dead one.
    Verdict addService(const Caller& caller, const Registration& registration);

    // The service, or null: unknown, or an isolated caller that it does not allow.
    Object find(const Caller& caller, const std::string& name);

    // The names, in byte order, whose dump priority shares a bit with the argument.
    std::vector<std::string> list(int32_t dumpPriority) const;

    // The callback is told at once when the name is registered already, and at each later
    // registration. EX_ILLEGAL_ARGUMENT for a bad name, EX_NULL_POINTER for no callback,
    // EX_ILLEGAL_STATE for a dead or local one, or when the user has CallbackTable::kMaxPerUser.
    Verdict registerForNotifications(const Caller& caller, const std::string& name,
                                     const Object& callback);

    // EX_ILLEGAL_STATE when this callback, which must not be null, does not wait for this name.
    Verdict unregisterForNotifications(const std::string& name, const Object& callback);

    // From now on checkClients() tells the callback when the service gets its first client and when
    // it loses its last; at once when it has clients. Only the process that registered the service
    // may ask (EX_UNSUPPORTED_OPERATION); EX_ILLEGAL_ARGUMENT for an unknown name or another object
    // than the registered one, EX_ILLEGAL_STATE for a dead or local callback, or one too many.
    Verdict registerClientCallback(const Caller& caller, const std::string& name,
                                   const Object& service, const Object& callback);

    // Takes a lazy service's name away, called by itself and with the service as an argument.
    // EX_UNSUPPORTED_OPERATION for another process than the one that registered it;
    // EX_ILLEGAL_STATE for an unknown name, another object than the registered one, and as long as
    // a client may hold the service: it has been handed out since the last checkClients(), its
    // holders are more than this process, or are not known. Client callbacks stay, for the day it
    // comes again.
    Verdict tryUnregisterService(const Caller& caller, const std::string& name,
                                 const Object& service);

    // Counts the clients of the services with client callbacks, and tells of changes. To be called
    // every few seconds as long as there are such callbacks.
    void checkClients();
    bool hasClientCallbacks() const { return !mClientCallbacks.empty(); }

    // Every service with the process that registered it, in byte order of the names.
    std::vector<ServiceDebugInfo> debugInfo() const;

    // Drops the services and callbacks that are this object. Nobody is told. Returns the names of
    // the services that went.
    std::vector<std::string> objectDied(const AIBinder* object);

  private:
    struct Service {
        Object object;
        bool allowIsolated = false;
        int32_t dumpPriority = 0;
        Caller registrant;
        bool handedOut = false;   // since the last checkClients()
        bool hasClients = false;  // as the client callbacks were told
    };
    using Services = std::map<std::string, Service>;

    bool isHeld(const Object& object) const;
    bool ensureWatched(const Object& object);
    void unwatchUnlessHeld(const Object& object);
    void store(const Caller& caller, const Registration& registration);
    void updateClients(const std::string& name, Service& service);

    ObjectHost& mHost;
    Policy mPolicy;
    Services mServices;
    std::set<std::pair<const AIBinder*, std::string>> mNamesByObject;  // of mServices
    CallbackTable mRegistrationCallbacks;
    CallbackTable mClientCallbacks;
};

}  // namespace servicemanager
