// SPDX-License-Identifier: Apache-2.0
/*
 * The service manager: where services are registered under a name and found by it. The first call
 * waits for the service manager to be there.
 */
#pragma once

#include <android/binder_ibinder.h>
#include <android/binder_status.h>

__BEGIN_DECLS

/** Registers `binder` under the name `instance`. The service manager's exception (EX_NONE is 0),
 * EX_TRANSACTION_FAILED when it could not be asked, EX_ILLEGAL_ARGUMENT for null. */
__attribute__((warn_unused_result)) binder_exception_t AServiceManager_addService(
        AIBinder* binder, const char* instance) __INTRODUCED_IN(29);

/** The service of that name, one strong reference for the caller; null when there is none now. */
__attribute__((warn_unused_result)) AIBinder* AServiceManager_checkService(const char* instance)
        __INTRODUCED_IN(29);

/** As above, but waits up to five seconds for the service. */
__attribute__((warn_unused_result)) AIBinder* AServiceManager_getService(const char* instance)
        __INTRODUCED_IN(29);

/** As above, but waits without limit; null only when the service manager refuses. */
__attribute__((warn_unused_result)) AIBinder* AServiceManager_waitForService(const char* instance)
        __INTRODUCED_IN(31);

/** True when a manifest of the device declares the instance (`package.IType/name`). */
bool AServiceManager_isDeclared(const char* instance) __INTRODUCED_IN(31);

/** Calls `callback` with each declared instance name of an interface. Null interface or callback
 * aborts. */
void AServiceManager_forEachDeclaredInstance(const char* interface, void* context,
                                             void (*callback)(const char*, void*))
        __INTRODUCED_IN(31);

/** True when the declared instance comes from an updatable package. */
bool AServiceManager_isUpdatableViaApex(const char* instance) __INTRODUCED_IN(31);

/** Registers a service that is not needed all the time. This platform keeps it running: nothing
 * here starts a service on demand. STATUS_UNEXPECTED_NULL for null, STATUS_UNKNOWN_ERROR when the
 * service manager refuses. */
binder_status_t AServiceManager_registerLazyService(AIBinder* binder, const char* instance)
        __INTRODUCED_IN(31);

/** Keeps lazy services running although nobody uses them; they always are here. */
void AServiceManager_forceLazyServicesPersist(bool persist) __INTRODUCED_IN(31);

/** Sets what is asked when lazy services come into use or fall out of it; never called here. */
void AServiceManager_setActiveServicesCallback(bool (*callback)(bool, void*), void* context)
        __INTRODUCED_IN(31);

/** Unregisters the lazy services; false here. */
bool AServiceManager_tryUnregister(void) __INTRODUCED_IN(31);

/** Registers the lazy services again after AServiceManager_tryUnregister. */
void AServiceManager_reRegister(void) __INTRODUCED_IN(31);

__END_DECLS
