// SPDX-License-Identifier: Apache-2.0
//
// Who made a call.
#pragma once

#include <sys/types.h>

#include <fuse_lowlevel.h>

namespace handset {

// A caller as the journal names it.
struct Caller {
    pid_t pid = 0;  // process id (thread group), in the driver's process namespace
    uid_t uid = 0;  // file system user id
};

// The process a thread belongs to, or `thread` itself where it has ended already.
pid_t processOf(pid_t thread);

// An open file's first user, kept because the kernel names no caller when it releases a file,
// and because it saves the look-up of the process for every call of the same thread.
class Opener {
  public:
    explicit Opener(fuse_req_t request);

    // Who opened the file.
    const Caller& caller() const { return mCaller; }

    // Who makes the call `request` on that file.
    Caller callerOf(fuse_req_t request) const;

  private:
    pid_t mThread;
    Caller mCaller;
};

}  // namespace handset
