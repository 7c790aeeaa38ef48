// SPDX-License-Identifier: Apache-2.0
//
// Everything the service asks of the kernel, apart from its six long-lived streams, goes through
// the functions below. The one rule about interrupted calls stands here: open, read, write and
// ioctl are repeated while they fail with EINTR, close never is (the descriptor is gone by then).
// Failures are the kernel's own: -1 (or a FileDescriptor that is not open) with errno set.
//
// Thread-safe, as the system calls are. Nothing here logs or allocates.
#pragma once

#include <sys/types.h>

#include <cstddef>
#include <optional>
#include <string>

namespace aidl::android::hardware::vibrator::kernel {

// Owns one descriptor and closes it.
class FileDescriptor {
  public:
    FileDescriptor() = default;
    explicit FileDescriptor(int number) : mNumber(number) {}
    FileDescriptor(FileDescriptor&& other) noexcept : mNumber(other.release()) {}
    FileDescriptor& operator=(FileDescriptor&& other) noexcept {
        reset(other.release());
        return *this;
    }
    ~FileDescriptor() { reset(); }

    bool isOpen() const { return mNumber >= 0; }

    // The number, still owned by this object; -1 when not open.
    int get() const { return mNumber; }

    // Hands the number to the caller, who closes it from now on.
    int release();

    // Closes what is held, if anything, and takes over `number`.
    void reset(int number = -1);

  private:
    int mNumber = -1;
};

// open(2) with exactly these flags.
FileDescriptor open(const char* path, int flags);

// read(2) and write(2): one successful call, which may transfer less than `size` bytes.
ssize_t read(int descriptor, void* buffer, size_t size);
ssize_t write(int descriptor, const void* data, size_t size);

// close(2). Its result says nothing that the service could act on; errno is kept.
void close(int descriptor);

// ioctl(2) for requests that take a pointer, and for those that take a plain number.
int ioctl(int descriptor, unsigned long request, void* argument);
int ioctl(int descriptor, unsigned long request, int argument);

// Opens the node read-write, writes `size` bytes in one call and closes it. Empty when the node
// cannot be opened; else what write(2) said, -1 or the count it took.
std::optional<ssize_t> writeOnce(const std::string& node, const void* data, size_t size);

}  // namespace aidl::android::hardware::vibrator::kernel
