// SPDX-License-Identifier: Apache-2.0
//
// Everything the service asks of the kernel, apart from its six long-lived streams, goes through
// the functions below. The one rule about interrupted calls stands here: open, read, write and
// ioctl are repeated while they fail with EINTR, close never is (the descriptor is gone by then).
// Failures are the kernel's own: -1 (or a descriptor that is not open) with errno set. Closing keeps
// errno.
//
// Thread-safe, as the system calls are. Nothing here logs or allocates.
#pragma once

#include <sys/types.h>

#include <cstddef>
#include <optional>

#include <android-base/unique_fd.h>

namespace aidl::android::hardware::vibrator::kernel {

// open(2) with exactly these flags.
::android::base::unique_fd open(const char* path, int flags);

// read(2) and write(2): one successful call, which may transfer less than `size` bytes.
ssize_t read(int descriptor, void* buffer, size_t size);
ssize_t write(int descriptor, const void* data, size_t size);

// ioctl(2) for requests that take a pointer, and for those that take a plain number.
int ioctl(int descriptor, unsigned long request, void* argument);
int ioctl(int descriptor, unsigned long request, int argument);

// Opens the node with these flags, writes `size` bytes in one call and closes it. Empty when the
// node cannot be opened; else what write(2) said, -1 or the count it took.
std::optional<ssize_t> writeOnce(const char* node, int flags, const void* data, size_t size);

}  // namespace aidl::android::hardware::vibrator::kernel
