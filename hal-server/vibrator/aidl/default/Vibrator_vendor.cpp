// SPDX-License-Identifier: Apache-2.0
//
// The extension service's construction and its caller check.
#define LOG_TAG "QvxVibrator-HAL-AIDL-EXT"

#include "Vibrator_vendor.h"

#include <utility>

#include <android-base/logging.h>
#include <android/binder_ibinder.h>

#include "ServiceStatus.h"

namespace aidl::vendor::quorvan::hardware::vibrator {

Vibrator::Vibrator(std::shared_ptr<core::HwApi> hwApi) : mHwApi(std::move(hwApi)) {
    LOG(INFO) << "V_4_0: Vibrator::Vendor Vibrator()";
}

bool Vibrator::isCallerAllowed(const char* prefix) const {
    const auto uid = static_cast<int>(AIBinder_getCallingUid());
    if (mHwApi->checkClientUID(uid)) return true;
    LOG(INFO) << "V_4_0: " << prefix << "Pemission denied (" << uid << ")";
    return false;
}

ndk::ScopedAStatus Vibrator::refuse(binder_exception_t code, const char* line) {
    LOG(INFO) << line;
    return core::exception(code);
}

binder_status_t Vibrator::dump(int fd, const char** /*args*/, uint32_t /*numArgs*/) {
    const auto uid = static_cast<int>(AIBinder_getCallingUid());
    return mHwApi->dump(uid, fd) ? STATUS_OK : STATUS_PERMISSION_DENIED;
}

}  // namespace aidl::vendor::quorvan::hardware::vibrator
