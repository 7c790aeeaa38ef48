// SPDX-License-Identifier: Apache-2.0
//
// The ABinderProcess functions and the pool of serving threads.
#include "platform/libbinder_ndk/src/process.h"

#include <sys/prctl.h>
#include <unistd.h>

#include <atomic>
#include <cstdio>
#include <mutex>
#include <thread>

#include <android-base/thread_annotations.h>
#include <android/binder_process.h>

#include "platform/libbinder_ndk/src/driver.h"
#include "platform/libbinder_ndk/src/log.h"
#include "platform/libbinder_ndk/src/thread_state.h"

namespace binder_ndk {
namespace {

struct Pool {
    std::mutex mutex;
    bool started GUARDED_BY(mutex) = false;
    // What the driver is told when it is opened.
    uint32_t maxThreads GUARDED_BY(mutex) = 15;
    std::atomic<unsigned> lastNumber{0};

    static Pool& instance() {
        static auto* const pool = new Pool;  // outlives static destruction
        return *pool;
    }
};

void nameThisThread() {
    char name[16];  // what the kernel keeps
    const unsigned number = ++Pool::instance().lastNumber;
    std::snprintf(name, sizeof name, "Binder:%d_%X", getpid(), number);
    prctl(PR_SET_NAME, name);
}

void startThread(bool isMain) {
    std::thread([isMain] {
        nameThisThread();
        ThreadState::self().serve(isMain);
    }).detach();
}

}  // namespace

void spawnRequestedThread() {
    Pool& pool = Pool::instance();
    const std::lock_guard<std::mutex> lock(pool.mutex);
    if (pool.started) startThread(false);
}

}  // namespace binder_ndk

using namespace binder_ndk;

void ABinderProcess_startThreadPool() {
    Driver::instance();
    Pool& pool = Pool::instance();
    const std::lock_guard<std::mutex> lock(pool.mutex);
    if (pool.started) return;
    pool.started = true;
    startThread(true);
    nameThisThread();
}

bool ABinderProcess_setThreadPoolMaxThreadCount(uint32_t numThreads) {
    const Driver& driver = Driver::instance();
    Pool& pool = Pool::instance();
    const std::lock_guard<std::mutex> lock(pool.mutex);
    if (pool.started && numThreads < pool.maxThreads) {
        fatal("the thread pool has started and cannot shrink from %u to %u threads",
              pool.maxThreads, numThreads);
    }
    if (!driver.setMaxThreads(numThreads)) return false;
    pool.maxThreads = numThreads;
    return true;
}

void ABinderProcess_joinThreadPool() {
    ThreadState::self().serve(true);
}

binder_status_t ABinderProcess_setupPolling(int* fd) {
    ThreadState::self().enterPolling();
    *fd = Driver::instance().fd();
    return STATUS_OK;
}

binder_status_t ABinderProcess_handlePolledCommands() {
    return ThreadState::self().handlePolled();
}
