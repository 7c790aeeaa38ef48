// SPDX-License-Identifier: Apache-2.0
//
// For parts of the platform only, not for services: becoming the service manager.
#pragma once

#include <android/binder_ibinder.h>

__BEGIN_DECLS

// Makes a local object the one every process reaches as handle 0, for as long as this process
// lives, and takes a strong reference to it. STATUS_OK, STATUS_UNEXPECTED_NULL for null,
// STATUS_INVALID_OPERATION for a proxy, else what the driver says, with a line on the log: -EBUSY
// when there is a manager, -EPERM when an earlier one ran as another user.
binder_status_t ABinderProcess_becomeContextManager(AIBinder* binder);

// True when the object promises VINTF stability, so that a manifest has to declare its name.
bool AIBinder_requiresVintfDeclaration(AIBinder* binder);

// Counts the strong references that the driver holds for a proxy's object: one for each process that
// refers to it, this one included, and for the time of a call one more for each of its arguments that
// is the object. The object's own process does not count. For the context manager alone.
// STATUS_INVALID_OPERATION for a local object, else what the driver says: -EINVAL where it cannot
// count, -EPERM for another process.
binder_status_t AIBinder_countHolders(AIBinder* binder, uint32_t* count);

__END_DECLS
