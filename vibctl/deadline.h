// SPDX-License-Identifier: Apache-2.0
//
// Work that may never end, with a limit to the time it is waited for.
#pragma once

#include <chrono>
#include <future>
#include <optional>
#include <thread>
#include <type_traits>
#include <utility>

namespace vibctl {

// Runs `work` on a thread of its own; what it returned, or nothing when that took longer than
// `limit`. Then the thread is left behind, so `work` must own all it uses.
template <typename Work>
auto within(std::chrono::milliseconds limit, Work work) {
    using Result = std::invoke_result_t<Work>;
    std::promise<Result> promise;
    std::future<Result> future = promise.get_future();
    std::thread([work = std::move(work), promise = std::move(promise)]() mutable {
        promise.set_value(work());
    }).detach();
    std::optional<Result> result;
    if (future.wait_for(limit) == std::future_status::ready) result = future.get();
    return result;
}

}  // namespace vibctl
