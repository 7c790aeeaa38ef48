// SPDX-License-Identifier: Apache-2.0
//
// How often the library talks to the driver: this program's ioctl takes the place of the C library's.
#include <linux/android/binder.h>
#include <sys/ioctl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cstdarg>

#include <gtest/gtest.h>

#include "platform/libbinder_ndk/tests/guest/test_service.h"

namespace {

int exchanges = 0;

}  // namespace

extern "C" int ioctl(int fd, unsigned long request, ...) noexcept {
    va_list arguments;
    va_start(arguments, request);
    void* const argument = va_arg(arguments, void*);
    va_end(arguments);
    if (request == BINDER_WRITE_READ) ++exchanges;
    return static_cast<int>(syscall(SYS_ioctl, fd, request, argument));
}

namespace binder_test {
namespace {

TEST(Exchanges, ACallIsOneAndTheLastRepliesBufferGoesWithIt) {
    const Process service(kSystem, [](const Process::Ready& ready) { serve("exchanges", ready); });
    inProcess(kRoot, [] {
        const auto binder = find("exchanges");
        EXPECT_EQ(1, echo(binder, 1));
        exchanges = 0;
        for (int i = 0; i < 10; ++i) EXPECT_EQ(i, echo(binder, i));
        EXPECT_EQ(10, exchanges);
        for (int i = 0; i < 10; ++i) EXPECT_EQ(STATUS_OK, AIBinder_ping(binder.get()));
        EXPECT_EQ(20, exchanges);
    });
}

}  // namespace
}  // namespace binder_test
