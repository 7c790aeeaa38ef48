// SPDX-License-Identifier: Apache-2.0
// A client of the vibrator service that composes and waits to be told that it is over. Its callback
// is served by the process's own binder threads, as any client's is.
#pragma once

#include <aidl/android/hardware/vibrator/BnVibratorCallback.h>
#include <aidl/android/hardware/vibrator/IVibrator.h>
#include <android/binder_manager.h>
#include <android/binder_process.h>
#include <time.h>

#include <chrono>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <optional>
#include <vector>

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
        const std::lock_guard lock(mutex_);
        if (calls_++ == 0) firstMs_ = now;
        called_.notify_all();
        return ndk::ScopedAStatus::ok();
    }

    // Waits for the first call; its time by monotonicMs(), or nothing after five seconds.
    std::optional<double> wait() {
        std::unique_lock lock(mutex_);
        if (!called_.wait_for(lock, std::chrono::seconds(5), [this] { return calls_ != 0; })) {
            return std::nullopt;
        }
        return firstMs_;
    }

    int calls() {
        const std::lock_guard lock(mutex_);
        return calls_;
    }

  private:
    std::mutex mutex_;
    std::condition_variable called_;
    double firstMs_ = 0;
    int calls_ = 0;
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
