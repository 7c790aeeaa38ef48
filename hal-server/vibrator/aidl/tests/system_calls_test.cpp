// SPDX-License-Identifier: Apache-2.0
//
// The system calls' rules: interrupted calls are repeated, other failures are not, and a descriptor
// is closed exactly once.
#include <fcntl.h>
#include <linux/input.h>

#include <cerrno>
#include <memory>
#include <utility>

#include <android-base/unique_fd.h>

#include "driver/SystemCalls.h"
#include "tests/fake_motor.h"
#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator::kernel {
namespace {

using ::android::base::unique_fd;
using fake::Operation;
using ::testing::ElementsAre;

constexpr char kNode[] = "/sys/class/test/node";
constexpr char kMotor[] = "/dev/input/event3";

class SystemCalls : public ServiceTest {};

TEST_F(SystemCalls, OpenIsRepeatedWhileInterrupted) {
    kernel.addNode(kNode);
    kernel.addFault({.path = kNode, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    EXPECT_TRUE(kernel::open(kNode, O_WRONLY).ok());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/test/node O_WRONLY = EINTR",
                            "open /sys/class/test/node O_WRONLY = EINTR",
                            "open /sys/class/test/node O_WRONLY", "close /sys/class/test/node"));
}

TEST_F(SystemCalls, FailedOpenIsNotRepeatedAndLeavesErrno) {
    kernel.addNode(kNode);
    kernel.addFault({.path = kNode, .operation = Operation::kOpen, .error = EAGAIN});
    const unique_fd descriptor = kernel::open(kNode, O_RDWR);
    EXPECT_FALSE(descriptor.ok());
    EXPECT_EQ(descriptor.get(), -1);
    EXPECT_EQ(errno, EAGAIN);
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/test/node O_RDWR = EAGAIN"));
}

TEST_F(SystemCalls, ReadAndWriteAreRepeatedWhileInterruptedOnly) {
    kernel.addNode(kNode, "abc");
    kernel.addFault({.path = kNode, .operation = Operation::kRead, .error = EINTR});
    kernel.addFault({.path = kNode, .operation = Operation::kWrite, .error = EINTR});
    kernel.addFault({.path = kNode, .operation = Operation::kWrite, .limit = 1});
    char buffer[8];
    {
        const unique_fd descriptor = kernel::open(kNode, O_RDWR);
        EXPECT_EQ(kernel::read(descriptor.get(), buffer, sizeof(buffer)), 3);
        EXPECT_EQ(kernel::write(descriptor.get(), "12", 2), 1);
    }
    EXPECT_THAT(
            kernel.calls(),
            ElementsAre("open /sys/class/test/node O_RDWR", "read /sys/class/test/node 8 = EINTR",
                        "read /sys/class/test/node 8 \"abc\"",
                        "write /sys/class/test/node \"12\" = EINTR",
                        "write /sys/class/test/node \"12\" = 1", "close /sys/class/test/node"));
}

TEST_F(SystemCalls, IoctlIsRepeatedWhileInterrupted) {
    kernel.addDevice(kMotor, std::make_shared<fake::FakeMotor>());
    kernel.addFault({.path = kMotor, .operation = Operation::kIoctl, .error = EINTR, .times = 2});
    ff_effect effect = {};
    effect.id = -1;
    const unique_fd descriptor = kernel::open(kMotor, O_RDWR);
    EXPECT_EQ(kernel::ioctl(descriptor.get(), EVIOCSFF, &effect), 0);
    EXPECT_EQ(kernel::ioctl(descriptor.get(), EVIOCRMFF, effect.id), 0);
    EXPECT_EQ(kernel::ioctl(descriptor.get(), EVIOCRMFF, effect.id), -1);
    EXPECT_EQ(errno, EINVAL);
}

TEST_F(SystemCalls, DescriptorIsClosedOnceByItsLastOwner) {
    kernel.addNode(kNode);
    {
        unique_fd first = kernel::open(kNode, O_RDONLY);
        unique_fd second = std::move(first);
        EXPECT_TRUE(second.ok());
        second = kernel::open(kNode, O_WRONLY);
        second.reset();
        EXPECT_FALSE(second.ok());
        EXPECT_EQ(kernel.openDescriptors(), 0U);
    }
    EXPECT_THAT(
            kernel.calls(),
            ElementsAre("open /sys/class/test/node O_RDONLY", "open /sys/class/test/node O_WRONLY",
                        "close /sys/class/test/node", "close /sys/class/test/node"));
}

TEST_F(SystemCalls, ClosingKeepsErrno) {
    kernel.addNode(kNode);
    {
        const unique_fd descriptor = kernel::open(kNode, O_RDONLY);
        errno = ENOSPC;
    }
    EXPECT_EQ(errno, ENOSPC);
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator::kernel
