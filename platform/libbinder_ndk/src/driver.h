// SPDX-License-Identifier: Apache-2.0
//
// The open binder driver: its descriptor and the mapping it puts received buffers into.
#pragma once

#include <linux/android/binder.h>

#include <cstdint>

namespace binder_ndk {

class Driver {
  public:
    // Opens the driver on the first call. A process that cannot talk to it gets one line on the log
    // that says which file, why, and what would help, and aborts.
    static Driver& instance();

    // True in a child forked after the driver was opened: the mapping is not there and the
    // descriptor belongs to the parent. Such a process cannot use binder unless it calls exec.
    static bool isForkedCopy();

    // The descriptor, for polling.
    int fd() const { return mFd; }

    // BINDER_WRITE_READ, repeated while a signal interrupts it. 0 or a negative errno; the counts
    // in `exchange` are right in both cases.
    int writeRead(binder_write_read& exchange) const;

    // BINDER_SET_MAX_THREADS. False when the driver refuses.
    bool setMaxThreads(uint32_t count) const;

    // BINDER_SET_CONTEXT_MGR_EXT, or without EXT for older drivers. 0 or a negative errno.
    int becomeContextManager() const;

    // BINDER_GET_NODE_INFO_FOR_REF. 0 or a negative errno.
    int countStrongReferences(uint32_t handle, uint32_t* count) const;

    // BINDER_THREAD_EXIT: the driver forgets the calling thread.
    void exitThread() const;

  private:
    Driver();

    int mFd = -1;
};

}  // namespace binder_ndk
