// SPDX-License-Identifier: Apache-2.0
//
// Keeping a caller waiting.
#include "handset/driver/request_delay.h"

#include <algorithm>
#include <cerrno>
#include <condition_variable>
#include <mutex>

namespace handset {
namespace {

using Clock = std::chrono::steady_clock;

// How long a stopping driver may take to notice.
constexpr std::chrono::milliseconds kSlice{50};

struct Interruption {
    std::mutex mutex;
    std::condition_variable changed;
    bool happened = false;
};

void onInterrupt(fuse_req_t, void* data) {
    auto* interruption = static_cast<Interruption*>(data);
    const std::lock_guard lock(interruption->mutex);
    interruption->happened = true;
    interruption->changed.notify_all();
}

}  // namespace

bool delayRequest(fuse_req_t request, std::chrono::milliseconds delay,
                  const std::atomic<bool>& stopping) {
    if (delay.count() == 0) return true;
    const Clock::time_point end = Clock::now() + delay;
    Interruption interruption;
    fuse_req_interrupt_func(request, onInterrupt, &interruption);
    bool happened = false;
    {
        std::unique_lock lock(interruption.mutex);
        while (!interruption.happened && !stopping && Clock::now() < end) {
            interruption.changed.wait_until(lock, std::min(end, Clock::now() + kSlice));
        }
        happened = interruption.happened || stopping;
    }
    // After this no callback runs any more. Not under the mutex: the callback takes it while the
    // library holds its own.
    fuse_req_interrupt_func(request, nullptr, nullptr);
    return !happened;
}

int meetFault(fuse_req_t request, const FaultAction& fault, const std::atomic<bool>& stopping) {
    return delayRequest(request, fault.delay, stopping) ? fault.error : EINTR;
}

}  // namespace handset
