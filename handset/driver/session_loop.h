// SPDX-License-Identifier: Apache-2.0
//
// The threads that serve one FUSE or CUSE session.
//
// The library's own loop lets any thread take any request, and the kernel does not wait for the
// release of a file: a close could reach the journal after the open that followed it. This loop
// takes one request at a time from the kernel and serves a release before it takes the next.
#pragma once

#include <atomic>
#include <chrono>
#include <mutex>
#include <thread>
#include <vector>

#include <android-base/unique_fd.h>
#include <fuse_lowlevel.h>

namespace handset {

// Serves a session until it is stopped or its mount is gone.
class SessionLoop {
  public:
    // Attaches the session, which becomes this object's, to `device` (non-blocking) and starts
    // serving. `ended` is an event descriptor that becomes readable when the loop ends by itself.
    SessionLoop(fuse_session* session, android::base::unique_fd device, int ended);

    SessionLoop(const SessionLoop&) = delete;
    SessionLoop& operator=(const SessionLoop&) = delete;

    // Stops serving and waits for the threads; what they are busy with is finished first. Then the
    // session is over.
    ~SessionLoop();

    // Waits until the files closed so far have been released: a close may return before the
    // driver is told of it. Gives up when the loop has ended, and after `timeout`, as callers
    // that are kept waiting may have brought the serving to a halt.
    void settle(std::chrono::milliseconds timeout) const;

  private:
    void addWorker();
    void work();
    bool takeRequest(fuse_buf& buffer);
    bool waitForRequest() const;
    bool isSettled() const;

    fuse_session* mSession;
    int mDevice;
    int mEnded;
    android::base::unique_fd mStop;

    std::mutex mTaking;  // held by the one thread that talks to the kernel
    std::atomic<bool> mReleasing{false};
    std::atomic<int> mIdle{0};
    std::atomic<bool> mFinished{false};

    std::mutex mWorkersMutex;
    std::vector<std::thread> mWorkers;
};

}  // namespace handset
