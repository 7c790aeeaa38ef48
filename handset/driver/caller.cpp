// SPDX-License-Identifier: Apache-2.0
//
// Who made a call: the kernel reports the calling thread, the journal wants its process.
#include "handset/driver/caller.h"

#include <fcntl.h>
#include <unistd.h>

#include <cstdlib>
#include <cstring>

#include <android-base/unique_fd.h>
#include <fmt/format.h>

namespace handset {

using android::base::unique_fd;

pid_t processOf(pid_t thread) {
    char path[32];
    *fmt::format_to_n(path, sizeof path - 1, "/proc/{}/status", thread).out = '\0';
    const unique_fd status(open(path, O_RDONLY | O_CLOEXEC));
    if (!status.ok()) return thread;
    char text[256];  // the line stands fourth, well within this
    const ssize_t size = read(status.get(), text, sizeof text - 1);
    if (size <= 0) return thread;
    text[size] = '\0';
    const char* line = strstr(text, "\nTgid:");
    return line != nullptr ? static_cast<pid_t>(strtol(line + strlen("\nTgid:"), nullptr, 10))
                           : thread;
}

Opener::Opener(fuse_req_t request)
    : mThread(fuse_req_ctx(request)->pid),
      mCaller{processOf(mThread), fuse_req_ctx(request)->uid} {}

Caller Opener::callerOf(fuse_req_t request) const {
    const fuse_ctx* context = fuse_req_ctx(request);
    const pid_t process = context->pid == mThread ? mCaller.pid : processOf(context->pid);
    return {process, context->uid};
}

}  // namespace handset
