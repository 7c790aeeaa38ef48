// SPDX-License-Identifier: Apache-2.0
//
// The service manager: where services are registered under a name and found by it. The first call
// waits for the service manager to be there.
#pragma once

#include <android/binder_ibinder.h>
#include <android/binder_status.h>

__BEGIN_DECLS

// Registers `binder` under the name `instance`. The service manager's exception (EX_NONE is 0),
// EX_TRANSACTION_FAILED when it could not be asked, EX_ILLEGAL_ARGUMENT for null.
__attribute__((warn_unused_result)) binder_exception_t AServiceManager_addService(
        AIBinder* binder, const char* instance) __INTRODUCED_IN(29);

// The service of that name, one strong reference for the caller; null when there is none now.
__attribute__((warn_unused_result)) AIBinder* AServiceManager_checkService(const char* instance)
        __INTRODUCED_IN(29);

// As above, but waits up to five seconds for the service.
__attribute__((warn_unused_result)) AIBinder* AServiceManager_getService(const char* instance)
        __INTRODUCED_IN(29);

// As above, but waits without limit; null only when the service manager refuses.
__attribute__((warn_unused_result)) AIBinder* AServiceManager_waitForService(const char* instance)
        __INTRODUCED_IN(31);

// True when a manifest of the device declares the instance (`package.IType/name`).
bool AServiceManager_isDeclared(const char* instance) __INTRODUCED_IN(31);

// Calls `callback` with each declared instance name of an interface. Null interface or callback
// aborts.
void AServiceManager_forEachDeclaredInstance(const char* interface, void* context,
                                             void (*callback)(const char*, void*))
        __INTRODUCED_IN(31);

// True when the declared instance comes from an updatable package.
bool AServiceManager_isUpdatableViaApex(const char* instance) __INTRODUCED_IN(31);

// Registers a service that runs only while it is used: once every service of the process that was
// registered so has had clients and lost them, the process unregisters them and ends with status 0.
// STATUS_UNEXPECTED_NULL for null, STATUS_UNKNOWN_ERROR when the service manager refuses.
binder_status_t AServiceManager_registerLazyService(AIBinder* binder, const char* instance)
        __INTRODUCED_IN(31);

// While `persist` is true the process goes on although nobody uses its services; false ends it at
// once when that is so already.
void AServiceManager_forceLazyServicesPersist(bool persist) __INTRODUCED_IN(31);

// Sets what is asked, with `context`, when the process's lazy services come into use (true) or fall
// out of it (false). It returns true to say that it has seen to everything, with the two functions
// below, and false to leave the end of the process to the library.
void AServiceManager_setActiveServicesCallback(bool (*callback)(bool, void*), void* context)
        __INTRODUCED_IN(31);

// Takes the lazy services out of the service manager; false when one has clients.
bool AServiceManager_tryUnregister(void) __INTRODUCED_IN(31);

// Registers those again that AServiceManager_tryUnregister took out.
void AServiceManager_reRegister(void) __INTRODUCED_IN(31);

__END_DECLS
