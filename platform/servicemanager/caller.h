// SPDX-License-Identifier: Apache-2.0
//
// Who is calling, and what follows from the caller's user id.
#pragma once

#include <sys/types.h>

namespace servicemanager {

// The sender of the transaction being served, as the binder driver reports it.
struct Caller {
    pid_t pid = 0;  // 0 in a oneway transaction: the driver does not tell
    uid_t uid = 0;
};

// A user id is the number of an Android user times this, plus the id of the app or system part.
inline constexpr uid_t kUidsPerUser = 100000;

inline constexpr uid_t kFirstApp = 10000;

// True for the uid of an installed app. Everything from 10000 on counts, `nobody` included.
constexpr bool isApp(uid_t uid) {
    return uid % kUidsPerUser >= kFirstApp;
}

// True for an isolated process: an app's sandbox that sees only services that allow it.
constexpr bool isIsolated(uid_t uid) {
    return uid % kUidsPerUser >= 90000;
}

}  // namespace servicemanager
