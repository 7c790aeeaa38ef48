// SPDX-License-Identifier: Apache-2.0
//
// The standard service on a phone of the LED class, without a binder in between.
#pragma once

#include <memory>

#include <aidl/android/hardware/vibrator/BnVibratorCallback.h>

#include "Vibrator.h"
#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {

class Callback : public BnVibratorCallback {
  public:
    ndk::ScopedAStatus onComplete() override {
        ADD_FAILURE() << "no operation here notifies";
        return ndk::ScopedAStatus::ok();
    }
};

class VibratorTest : public ServiceTest {
  protected:
    VibratorTest() { addLedsClass(); }

    // The service on what was added so far.
    std::shared_ptr<Vibrator> makeVibrator() {
        auto vibrator = ndk::SharedRefBase::make<Vibrator>(makeHwApi());
        kernel.clear();
        log.clear();
        return vibrator;
    }

    // Never asked for anything; its address is all that the service looks at.
    const std::shared_ptr<IVibratorCallback> callback = ndk::SharedRefBase::make<Callback>();
};

inline binder_exception_t exceptionOf(const ndk::ScopedAStatus& status) {
    return status.getExceptionCode();
}

}  // namespace aidl::android::hardware::vibrator
