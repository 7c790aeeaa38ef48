// SPDX-License-Identifier: Apache-2.0
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include "standard/CompletionWorker.h"

#include <chrono>
#include <system_error>
#include <thread>

#include <android-base/logging.h>

namespace aidl::android::hardware::vibrator {

bool startCompletionWorker(const CompletionTexts& texts, int64_t totalMs,
                           const std::shared_ptr<IVibratorCallback>& callback) {
    try {
        std::thread([texts, totalMs, callback] {
            LOG(INFO) << texts.start;
            if (totalMs > 0) std::this_thread::sleep_for(std::chrono::milliseconds(totalMs));
            if (callback == nullptr) return;
            LOG(INFO) << texts.notify;
            callback->onComplete();
        }).detach();
    } catch (const std::system_error&) {
        return false;
    }
    return true;
}

}  // namespace aidl::android::hardware::vibrator
