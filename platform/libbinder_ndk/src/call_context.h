// SPDX-License-Identifier: Apache-2.0
//
// Who is calling: what a thread knows about the transaction it serves.
#pragma once

#include <sys/types.h>
#include <unistd.h>

#include <cstdint>

namespace binder_ndk {

struct CallContext {
    static constexpr pid_t kOwnPid = -1;

    // The sender's; outside a transaction this process's, which changes in a forked child.
    pid_t pid = kOwnPid;
    uid_t uid = getuid();
    // The sender's security context, in the request's buffer; null when it is not known.
    const char* sid = nullptr;
    // The caller's strict-mode policy, handed on with calls made on its behalf. Means nothing here.
    uint32_t strictModePolicy = 0;
    // TF_ flags of the transaction.
    uint32_t flags = 0;

    // Whether the thread serves a call.
    bool isServing() const { return pid != kOwnPid; }

    // The calling thread's.
    static CallContext& current() {
        thread_local CallContext context;
        return context;
    }
};

}  // namespace binder_ndk
