// SPDX-License-Identifier: Apache-2.0
//
// The registry: which service stands under which name, who waits for one, and every rule about who
// may change that. It knows nothing of parcels or the driver.
#pragma once

#include <sys/types.h>

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include <android/binder_ibinder.h>
#include <android/binder_status.h>

#include "caller.h"

namespace servicemanager {

/// A strong reference to a binder object. Two references are the same object exactly when their
/// pointers are equal.
using Object = std::shared_ptr<AIBinder>;

/// What the registry asks of the binder side.
class ObjectHost {
  public:
    virtual ~ObjectHost() = default;

    /// False for an object that lives in this process: it needs no death notice.
    virtual bool isRemote(const Object& object) = 0;

    /// From now on ServiceRegistry::objectDied() is called when the process of this remote object
    /// dies. False when it is dead already. Called once per object.
    virtual bool watch(const Object& object) = 0;

    /// Ends watch().
    virtual void unwatch(const Object& object) = 0;

    /// Tells a waiting callback that `service` now stands under `name`, without waiting for it.
    virtual void notifyRegistration(const Object& callback, const std::string& name,
                                    const Object& service) = 0;
};

/// Answer to a request: EX_NONE, or the exception for the caller and the reason for the log.
struct Verdict {
    binder_exception_t exception = EX_NONE;
    std::string reason;

    bool ok() const { return exception == EX_NONE; }
};

/// What a caller wants registered.
struct Registration {
    std::string name;
    Object object = nullptr;
    bool requiresDeclaration = false;  ///< a VINTF-stable object: must stand in a manifest
    bool allowIsolated = false;        ///< isolated processes may find it
    int32_t dumpPriority = 0;          ///< bits that listServices() filters by
};

/// One line of the debugging overview.
struct ServiceDebugInfo {
    std::string name;
    pid_t pid = 0;
};

/// Not thread-safe: the service manager has one thread.
class ServiceRegistry {
  public:
    /// Says whether a manifest lists the service of this name.
    using IsDeclared = std::function<bool(const std::string& name)>;

    /// `host` must outlive the registry.
    ServiceRegistry(ObjectHost& host, IsDeclared isDeclared);

    /// Stores the service, in place of an older one of that name, and tells those who wait for the
    /// name. Refuses, in this order: EX_SECURITY for an app; EX_ILLEGAL_ARGUMENT for no object, a
    /// bad name, a VINTF-stable object that no manifest declares; EX_ILLEGAL_STATE for a dead one.
    Verdict addService(const Caller& caller, const Registration& registration);

    /// The service, or null: unknown, or an isolated caller that it does not allow.
    Object find(const Caller& caller, const std::string& name) const;

    /// The names, in byte order, whose dump priority shares a bit with the argument.
    std::vector<std::string> list(int32_t dumpPriority) const;

    /// The callback is told at once when the name is registered already, and at each later
    /// registration. EX_ILLEGAL_ARGUMENT for a bad name, EX_NULL_POINTER for no callback,
    /// EX_ILLEGAL_STATE for a dead or local one.
    Verdict registerForNotifications(const std::string& name, const Object& callback);

    /// EX_ILLEGAL_STATE when this callback, which must not be null, does not wait for this name.
    Verdict unregisterForNotifications(const std::string& name, const Object& callback);

    /// Accepts a callback that wants to hear whether the service has clients. Only the process that
    /// registered the service may ask (EX_UNSUPPORTED_OPERATION); EX_ILLEGAL_ARGUMENT for an
    /// unknown name or another object than the registered one, EX_ILLEGAL_STATE for a dead or local
    /// callback. The callback is kept, and never called: clients are not counted here.
    Verdict registerClientCallback(const Caller& caller, const std::string& name,
                                   const Object& service, const Object& callback);

    /// Checks the request of a lazy service to leave, and then still answers EX_ILLEGAL_STATE:
    /// where clients are not counted, a service has to be taken for one in use.
    Verdict tryUnregisterService(const Caller& caller, const std::string& name,
                                 const Object& service) const;

    /// Every service with the process that registered it, in byte order of the names.
    std::vector<ServiceDebugInfo> debugInfo() const;

    /// Drops the services and callbacks that are this object. Nobody is told. Returns the names of
    /// the services that went.
    std::vector<std::string> objectDied(const AIBinder* object);

  private:
    struct Service {
        Object object;
        bool allowIsolated;
        int32_t dumpPriority;
        pid_t registrant;
    };
    using Callbacks = std::map<std::string, std::vector<Object>>;

    bool isHeld(const Object& object) const;
    bool ensureWatched(const Object& object);
    void unwatchUnlessHeld(const Object& object);
    const Service* findService(const std::string& name) const;

    ObjectHost& mHost;
    IsDeclared mIsDeclared;
    std::map<std::string, Service> mServices;
    Callbacks mRegistrationCallbacks;
    Callbacks mClientCallbacks;
};

}  // namespace servicemanager
