// SPDX-License-Identifier: Apache-2.0
//
// The service's system calls and their EINTR rule.
#include "SystemCalls.h"

#include <fcntl.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cerrno>
#include <utility>

namespace aidl::android::hardware::vibrator::kernel {
namespace {

template <typename Call>
auto repeatWhileInterrupted(Call call) {
    auto result = call();
    while (result == -1 && errno == EINTR) {
        result = call();
    }
    return result;
}

}  // namespace

int FileDescriptor::release() {
    return std::exchange(mNumber, -1);
}

void FileDescriptor::reset(int number) {
    if (isOpen()) close(mNumber);
    mNumber = number;
}

FileDescriptor open(const char* path, int flags) {
    // No O_CLOEXEC: the driver is to see exactly the access it is asked for, and nothing is
    // executed.
    return FileDescriptor(repeatWhileInterrupted([&] { return ::open(path, flags); }));
}

ssize_t read(int descriptor, void* buffer, size_t size) {
    return repeatWhileInterrupted([&] { return ::read(descriptor, buffer, size); });
}

ssize_t write(int descriptor, const void* data, size_t size) {
    return repeatWhileInterrupted([&] { return ::write(descriptor, data, size); });
}

void close(int descriptor) {
    const int error = errno;
    ::close(descriptor);
    errno = error;
}

int ioctl(int descriptor, unsigned long request, void* argument) {
    return repeatWhileInterrupted([&] { return ::ioctl(descriptor, request, argument); });
}

int ioctl(int descriptor, unsigned long request, int argument) {
    return repeatWhileInterrupted([&] { return ::ioctl(descriptor, request, argument); });
}

std::optional<ssize_t> writeOnce(const std::string& node, const void* data, size_t size) {
    const FileDescriptor descriptor = open(node.c_str(), O_RDWR);
    if (!descriptor.isOpen()) return std::nullopt;
    return write(descriptor.get(), data, size);
}

}  // namespace aidl::android::hardware::vibrator::kernel
