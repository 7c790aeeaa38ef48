// SPDX-License-Identifier: Apache-2.0
//
// Who calls the service under test. This library defines AIBinder_getCallingUid, which thereby
// comes before the binder library's in the test program. Without a CallingUid it answers as that
// one does outside a transaction: with the process's own user.
#pragma once

#include <sys/types.h>

#include <optional>

// Is the calling user while it exists; the one before it returns with its end.
class CallingUid {
  public:
    explicit CallingUid(uid_t uid);
    ~CallingUid();
    CallingUid(const CallingUid&) = delete;
    CallingUid& operator=(const CallingUid&) = delete;

  private:
    const std::optional<uid_t> mBefore;
};
