// SPDX-License-Identifier: Apache-2.0
//
// A client of the vibrator service that composes and waits to be told that it is over. Its callback
// is served by the process's own binder threads, as any client's is.
#pragma once

#include <time.h>

#include <atomic>
#include <chrono>
#include <memory>
#include <optional>
#include <semaphore>
#include <vector>

#include <aidl/android/hardware/vibrator/BnVibratorCallback.h>
#include <aidl/android/hardware/vibrator/IVibrator.h>
#include <android/binder_manager.h>
#include <android/binder_process.h>

namespace qvx::test {

using aidl::android::hardware::vibrator::CompositeEffect;
using aidl::android::hardware::vibrator::CompositePrimitive;
using aidl::android::hardware::vibrator::IVibrator;

// CLOCK_MONOTONIC in milliseconds.
inline double monotonicMs() {
    timespec now = {};
    clock_gettime(CLOCK_MONOTONIC, &now);
    return static_cast<double>(now.tv_sec) * 1e3 + static_cast<double>(now.tv_nsec) / 1e6;
}

// Remembers when it was first called, and how often.
class Notification : public aidl::android::hardware::vibrator::BnVibratorCallback {
  public:
    ndk::ScopedAStatus onComplete() override {
        const double now = monotonicMs();
        if (mCalls++ == 0) {
            mFirstMs = now;
            mCalled.release();
        }
        return ndk::ScopedAStatus::ok();
    }

    // Waits, once, for the first call; its time by monotonicMs(), or nothing after five seconds.
    std::optional<double> wait() {
        if (!mCalled.try_acquire_for(std::chrono::seconds(5))) return std::nullopt;
        return mFirstMs;
    }

    int calls() const { return mCalls; }

  private:
    std::binary_semaphore mCalled{0};
    std::atomic<int> mCalls = 0;
    double mFirstMs = 0;  // written before mCalled is released
};

// The service, with a thread of this process ready to serve callbacks; null when it is not
// registered.
inline std::shared_ptr<IVibrator> connectForCallbacks() {
    ABinderProcess_startThreadPool();
    return IVibrator::fromBinder(ndk::SpAIBinder(
            AServiceManager_checkService("android.hardware.vibrator.IVibrator/default")));
}

// One click at full scale after a pause: as long as the pause and 20 ms more.
inline std::vector<CompositeEffect> clickAfter(int32_t delayMs) {
    CompositeEffect click;
    click.delayMs = delayMs;
    click.primitive = CompositePrimitive::CLICK;
    click.scale = 1.0F;
    return {click};
}

// A composition as its client saw it, by monotonicMs().
struct Composed {
    double called;
    double returned;
    double notified;
};

// Nothing when the call was refused or no notification came.
inline std::optional<Composed> composeAndWait(IVibrator& vibrator,
                                              const std::vector<CompositeEffect>& composition) {
    const auto notification = ndk::SharedRefBase::make<Notification>();
    const double called = monotonicMs();
    if (!vibrator.compose(composition, notification).isOk()) return std::nullopt;
    const double returned = monotonicMs();
    const std::optional<double> notified = notification->wait();
    if (!notified) return std::nullopt;
    return Composed{called, returned, *notified};
}

}  // namespace qvx::test
