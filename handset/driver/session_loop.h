// SPDX-License-Identifier: Apache-2.0
// The threads that serve one FUSE or CUSE session.
//
// The library's own loop lets any thread take any request, and the kernel does not wait for the
// release of a file: a close could reach the journal after the open that followed it. This loop
// takes one request at a time from the kernel and serves a release before it takes the next.
#pragma once

#include <fuse_lowlevel.h>

#include <atomic>
#include <chrono>
#include <mutex>
#include <thread>
#include <vector>

#include "common/unique_fd.h"

namespace handset {

/// Serves a session until it is stopped or its mount is gone.
class SessionLoop {
  public:
    /// Starts serving. `session` is attached to `device` (non-blocking) and outlives the loop.
    /// `ended` is an event descriptor that becomes readable when the loop ends by itself.
    SessionLoop(fuse_session* session, int device, int ended);

    SessionLoop(const SessionLoop&) = delete;
    SessionLoop& operator=(const SessionLoop&) = delete;

    /// Stops serving and waits for the threads; what they are busy with is finished first.
    ~SessionLoop();

    /// Waits until the files closed so far have been released: a close may return before the
    /// driver is told of it. Gives up when the loop has ended, and after `patience`, as callers
    /// that are kept waiting may have brought the serving to a halt.
    void settle(std::chrono::milliseconds patience) const;

  private:
    void addWorker();
    void work();
    bool takeRequest(fuse_buf& buffer);
    bool waitForRequest() const;
    bool isSettled() const;

    fuse_session* session_;
    int device_;
    int ended_;
    UniqueFd stop_;

    std::mutex taking_;  ///< held by the one thread that talks to the kernel
    std::atomic<bool> releasing_{false};
    std::atomic<int> idle_{0};
    std::atomic<bool> finished_{false};

    std::mutex workersMutex_;
    std::vector<std::thread> workers_;
};

}  // namespace handset
