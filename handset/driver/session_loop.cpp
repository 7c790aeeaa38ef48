// SPDX-License-Identifier: Apache-2.0
//
// The threads that serve one FUSE or CUSE session.
#include "handset/driver/session_loop.h"

#include <linux/fuse.h>
#include <poll.h>
#include <sys/eventfd.h>

#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <utility>

#include <fmt/format.h>

namespace handset {
namespace {

using android::base::unique_fd;

// As many calls can be kept waiting at once before the driver stops listening, to interruptions
// among others.
constexpr size_t kMostWorkers = 64;

constexpr std::chrono::milliseconds kSettlePause{1};

bool isRelease(const fuse_buf& buffer) {
    fuse_in_header header;
    if (buffer.size < sizeof header) return false;
    memcpy(&header, buffer.mem, sizeof header);
    return header.opcode == FUSE_RELEASE;
}

void signalEvent(int event) {
    eventfd_write(event, 1);
}

}  // namespace

SessionLoop::SessionLoop(fuse_session* session, unique_fd device, int ended)
    : mSession(session),
      mDevice(device.release()),  // the session closes it
      mEnded(ended),
      mStop(eventfd(0, EFD_CLOEXEC)) {
    fuse_session_mount(mSession, fmt::format("/dev/fd/{}", mDevice).c_str());
    addWorker();
}

SessionLoop::~SessionLoop() {
    mFinished = true;
    fuse_session_exit(mSession);
    signalEvent(mStop.get());
    while (true) {
        std::vector<std::thread> workers;
        {
            const std::lock_guard lock(mWorkersMutex);
            workers.swap(mWorkers);
        }
        if (workers.empty()) break;
        for (std::thread& worker : workers) worker.join();
    }
    fuse_session_destroy(mSession);
}

void SessionLoop::addWorker() {
    const std::lock_guard lock(mWorkersMutex);
    if (mWorkers.size() == kMostWorkers) return;
    ++mIdle;
    mWorkers.emplace_back([this] { work(); });
}

void SessionLoop::work() {
    fuse_buf buffer{};
    while (takeRequest(buffer)) {
        fuse_session_process_buf(mSession, &buffer);
        ++mIdle;
    }
    free(buffer.mem);
}

// Takes the next request that may be served beside others. False when the session is over.
bool SessionLoop::takeRequest(fuse_buf& buffer) {
    const std::lock_guard lock(mTaking);
    while (waitForRequest()) {
        mReleasing = true;  // before the request leaves the kernel's queue; see isSettled
        const int size = fuse_session_receive_buf(mSession, &buffer);
        const bool release = size > 0 && isRelease(buffer);
        if (release) fuse_session_process_buf(mSession, &buffer);
        mReleasing = false;
        if (size == -EAGAIN || size == -EINTR) continue;
        if (size <= 0) break;
        if (release) continue;
        if (--mIdle == 0) addWorker();
        return true;
    }
    if (!mFinished.exchange(true)) signalEvent(mEnded);
    return false;
}

bool SessionLoop::waitForRequest() const {
    pollfd polled[] = {{mDevice, POLLIN, 0}, {mStop.get(), POLLIN, 0}};
    while (poll(polled, std::size(polled), -1) < 0) {
        if (errno != EINTR) return false;
    }
    return polled[1].revents == 0 && !fuse_session_exited(mSession);
}

void SessionLoop::settle(std::chrono::milliseconds timeout) const {
    const auto end = std::chrono::steady_clock::now() + timeout;
    while (!mFinished && !isSettled() && std::chrono::steady_clock::now() < end) {
        std::this_thread::sleep_for(kSettlePause);
    }
}

// A release is in the kernel's queue, or being served, or done: the queue is looked at first, as
// what has left it unserved has set the mark before it left.
bool SessionLoop::isSettled() const {
    pollfd queue{mDevice, POLLIN, 0};
    return poll(&queue, 1, 0) == 0 && !mReleasing;
}

}  // namespace handset
