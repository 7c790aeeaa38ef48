// SPDX-License-Identifier: Apache-2.0
// Who made a call: the kernel reports the calling thread, the journal wants its process.
#include "driver/caller.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <unistd.h>

#include <cstdlib>
#include <cstring>

#include "common/unique_fd.h"

namespace handset {

pid_t processOf(pid_t thread) {
    char path[32];
    *fmt::format_to_n(path, sizeof path - 1, "/proc/{}/status", thread).out = '\0';
    const UniqueFd status(open(path, O_RDONLY | O_CLOEXEC));
    if (!status) return thread;
    char text[256];  // the line stands fourth, well within this
    const ssize_t size = read(status.get(), text, sizeof text - 1);
    if (size <= 0) return thread;
    text[size] = '\0';
    const char* line = strstr(text, "\nTgid:");
    return line != nullptr ? static_cast<pid_t>(strtol(line + strlen("\nTgid:"), nullptr, 10))
                           : thread;
}

Opener::Opener(fuse_req_t request)
    : thread_(fuse_req_ctx(request)->pid),
      caller_{processOf(thread_), fuse_req_ctx(request)->uid} {}

Caller Opener::callerOf(fuse_req_t request) const {
    const fuse_ctx* context = fuse_req_ctx(request);
    const pid_t process = context->pid == thread_ ? caller_.pid : processOf(context->pid);
    return {process, context->uid};
}

}  // namespace handset
