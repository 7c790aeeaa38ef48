// SPDX-License-Identifier: Apache-2.0
//
// Shell commands to a binder object, as `cmd NAME ARGS...` sends them.
#pragma once

#include <android/binder_ibinder.h>

__BEGIN_DECLS

// Carries out a shell command; `argv` holds `argc` strings, the descriptors stay the caller's. The
// result is reported to the shell. Only root and the shell user get this far.
typedef binder_status_t (*AIBinder_handleShellCommand)(AIBinder* binder, int in, int out, int err,
                                                       const char** argv, uint32_t argc);

// Sets the function for shell commands; before the first object is made. Aborts on a null class.

void AIBinder_Class_setHandleShellCommand(AIBinder_Class* clazz,
                                          AIBinder_handleShellCommand handleShellCommand)
        __INTRODUCED_IN(30);

__END_DECLS
