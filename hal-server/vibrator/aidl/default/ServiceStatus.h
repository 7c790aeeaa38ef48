// SPDX-License-Identifier: Apache-2.0
//
// The binder statuses that both services answer with. None carries a message or a service-specific
// error.
#pragma once

#include <android/binder_auto_utils.h>
#include <android/binder_status.h>

namespace aidl::android::hardware::vibrator {

inline ndk::ScopedAStatus ok() {
    return ndk::ScopedAStatus(AStatus_newOk());
}

inline ndk::ScopedAStatus exception(binder_exception_t code) {
    return ndk::ScopedAStatus(AStatus_fromExceptionCode(code));
}

// For an operation whose arguments were good: what the driver made of it.
inline ndk::ScopedAStatus okOrIllegalState(bool accepted) {
    return accepted ? ok() : exception(EX_ILLEGAL_STATE);
}

}  // namespace aidl::android::hardware::vibrator
