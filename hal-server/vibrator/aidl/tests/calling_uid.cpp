// SPDX-License-Identifier: Apache-2.0
#include "tests/calling_uid.h"

#include <unistd.h>

#include <utility>

#include <android/binder_ibinder.h>

namespace {

std::optional<uid_t> callingUid;

}  // namespace

CallingUid::CallingUid(uid_t uid) : mBefore(std::exchange(callingUid, uid)) {}

CallingUid::~CallingUid() {
    callingUid = mBefore;
}

extern "C" uid_t AIBinder_getCallingUid() {
    return callingUid.value_or(getuid());
}
