// SPDX-License-Identifier: Apache-2.0
//
// The binder side of the client: finding the two interfaces and the list of services without ever
// hanging where there is no service manager, and a callback that can be waited for.
#pragma once

#include <sys/types.h>

#include <chrono>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include <aidl/android/hardware/vibrator/BnVibratorCallback.h>

#include "arguments.h"
#include "methods.h"
#include "outcome.h"

namespace vibctl {

/// Says why binder cannot be used, or nothing: no device to open, or no service manager that
/// answers within a few seconds. To be asked before anything else here.
Problem checkBinder();

/// The two halves of checkBinder(). `device` becomes the one that the binder library will take.
Problem checkDevice(std::string& device);
Problem checkManager();

/// The service behind an interface; null with the reason in `problem`.
std::shared_ptr<IVibrator> connect(IVibrator*, Problem& problem);

/// Found through the binder extension of the standard service; it has no name of its own.
std::shared_ptr<IZelVibrator> connect(IZelVibrator*, Problem& problem);

/// Asks the service manager which services are registered. The result is a list of names.
Outcome listServices();

/// The process that registered the service, or 0: there is no such service, or the service manager
/// does not tell.
pid_t findRegistrant(const std::string& name);

/// A callback that remembers when it was first called.
class CompletionCallback : public aidl::android::hardware::vibrator::BnVibratorCallback {
  public:
    using Clock = std::chrono::steady_clock;

    ndk::ScopedAStatus onComplete() override;

    /// Waits for onComplete(); the time it came, or nothing when `limit` passed.
    std::optional<Clock::time_point> waitFor(std::chrono::milliseconds limit);

  private:
    std::mutex mMutex;
    std::condition_variable mCalled;
    std::optional<Clock::time_point> mWhen;
};

}  // namespace vibctl
