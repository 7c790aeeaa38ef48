// SPDX-License-Identifier: Apache-2.0
//
// Security contexts of callers, and buffers that are cleared after use.
#pragma once

#include <android/binder_ibinder.h>

__BEGIN_DECLS

enum {
    // Have the driver zero the buffers of this call when they are freed.
    FLAG_CLEAR_BUF = 0x20,
};

// Asks for the security context of callers of a local object; before it is first sent.
void AIBinder_setRequestingSid(AIBinder* binder, bool requestingSid) __INTRODUCED_IN(31);

// In a transaction the sender's security context when it was asked for, else null. Valid until the
// transaction ends.
__attribute__((warn_unused_result)) const char* AIBinder_getCallingSid(void) __INTRODUCED_IN(31);

__END_DECLS
