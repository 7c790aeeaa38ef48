// SPDX-License-Identifier: Apache-2.0
//
// The threads of this process that serve binder calls. The first call of any function here opens
// the binder driver; a process that cannot open it says so on the log and aborts.
#pragma once

#include <stdbool.h>
#include <stdint.h>

#include <android/binder_bionic_compat.h>
#include <android/binder_status.h>

__BEGIN_DECLS

// Starts one serving thread; the driver may ask for more, up to the maximum. Later calls do
// nothing.
void ABinderProcess_startThreadPool(void);

// How many threads the driver may ask for beside those that joined by themselves; 15 at first.
// False when the driver refuses. Aborts when the pool was started and the number shrinks.
bool ABinderProcess_setThreadPoolMaxThreadCount(uint32_t numThreads);

// Makes the calling thread serve calls; returns only when the driver is gone.
void ABinderProcess_joinThreadPool(void);

// For a process that serves from its own event loop: `*fd` is readable when
// ABinderProcess_handlePolledCommands has work. The descriptor stays the library's.
binder_status_t ABinderProcess_setupPolling(int* fd) __INTRODUCED_IN(31);

// Serves what is there, then returns.
binder_status_t ABinderProcess_handlePolledCommands(void) __INTRODUCED_IN(31);

__END_DECLS
