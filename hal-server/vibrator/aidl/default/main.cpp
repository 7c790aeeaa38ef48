// SPDX-License-Identifier: Apache-2.0
//
// The vibrator service's process: one hardware layer, the standard service registered by name, and
// the vendor's extension attached to it.
//
// The two checks below stand at lines 42 and 45, each on one line: a failing check names its line
// and expression in the crash report, and reports are grouped by that text across releases. Keep
// them there when you edit this file.
//
// The main thread is the only binder thread: the pool gets no extra ones, so requests to both
// interfaces are served one at a time.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <cstdlib>
#include <memory>
#include <string>

#include <android-base/logging.h>
#include <android/binder_ibinder.h>
#include <android/binder_manager.h>
#include <android/binder_process.h>

#include "HwApi.h"
#include "Vibrator.h"
#include "Vibrator_vendor.h"

using aidl::android::hardware::vibrator::HwApi;
using aidl::android::hardware::vibrator::Vibrator;
using ExtensionVibrator = aidl::vendor::quorvan::hardware::vibrator::Vibrator;

int main() {
    ABinderProcess_setThreadPoolMaxThreadCount(0);

    // Probes the driver, before there is anything to call.
    const auto hwApi = std::make_shared<HwApi>();

    const auto vib = ndk::SharedRefBase::make<Vibrator>(hwApi);
    const ndk::SpAIBinder vibBinder = vib->asBinder();

    // Clients find the extension through the standard service's binder alone.
    const auto cvib = ndk::SharedRefBase::make<ExtensionVibrator>(hwApi);
    CHECK(STATUS_OK == AIBinder_setExtension(vibBinder.get(), cvib->asBinder().get()));

    const std::string instance = std::string(Vibrator::descriptor) + "/default";
    CHECK(STATUS_OK == AServiceManager_addService(vibBinder.get(), instance.c_str()));

    ABinderProcess_joinThreadPool();
    return EXIT_FAILURE;  // the pool is not meant to end
}
