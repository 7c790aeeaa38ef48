// SPDX-License-Identifier: Apache-2.0
//
// The service's system calls and their EINTR rule.
#include "driver/SystemCalls.h"

#include <fcntl.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cerrno>

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

::android::base::unique_fd open(const char* path, int flags) {
    // No O_CLOEXEC: the driver is to see exactly the access it is asked for, and nothing is
    // executed. The mode counts for nothing without O_CREAT; with it the call is open(2) itself in a
    // fortified build too.
    return ::android::base::unique_fd(
            repeatWhileInterrupted([&] { return ::open(path, flags, 0); }));
}

ssize_t read(int descriptor, void* buffer, size_t size) {
    return repeatWhileInterrupted([&] { return ::read(descriptor, buffer, size); });
}

ssize_t write(int descriptor, const void* data, size_t size) {
    return repeatWhileInterrupted([&] { return ::write(descriptor, data, size); });
}

int ioctl(int descriptor, unsigned long request, void* argument) {
    return repeatWhileInterrupted([&] { return ::ioctl(descriptor, request, argument); });
}

int ioctl(int descriptor, unsigned long request, int argument) {
    return repeatWhileInterrupted([&] { return ::ioctl(descriptor, request, argument); });
}

std::optional<ssize_t> writeOnce(const char* node, int flags, const void* data, size_t size) {
    const ::android::base::unique_fd descriptor = open(node, flags);
    if (!descriptor.ok()) return std::nullopt;
    return write(descriptor.get(), data, size);
}

}  // namespace aidl::android::hardware::vibrator::kernel
