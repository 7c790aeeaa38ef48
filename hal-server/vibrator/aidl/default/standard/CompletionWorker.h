// SPDX-License-Identifier: Apache-2.0
//
// Tells a client that its composition is over.
#pragma once

#include <cstdint>
#include <memory>

#include <aidl/android/hardware/vibrator/IVibratorCallback.h>

namespace aidl::android::hardware::vibrator {

// The two lines a worker logs: when it starts, and before it calls the client.
struct CompletionTexts {
    const char* start;
    const char* notify;
};

// Starts a thread that sleeps `totalMs` (not at all when that is negative), calls onComplete() of
// `callback` unless that is null, and ends. The thread owns all it uses; nothing cancels it, and
// that the client died meanwhile does not matter. False when no thread can be had.
bool startCompletionWorker(const CompletionTexts& texts, int64_t totalMs,
                           const std::shared_ptr<IVibratorCallback>& callback);

}  // namespace aidl::android::hardware::vibrator
