// SPDX-License-Identifier: Apache-2.0
//
// An input device of the kernel's own that goes while a process holds it open.
#include <fcntl.h>
#include <linux/uinput.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cstdlib>
#include <filesystem>
#include <string>

#include <android-base/unique_fd.h>
#include <gtest/gtest.h>

#include "tests/support/process.h"
#include "vibctl/doctor/processes.h"

namespace vibctl {
namespace {

using android::base::unique_fd;
using qvx::test::eventually;
using qvx::test::Process;

// Made with the object.
class InputDevice {
  public:
    InputDevice() : mMaker(open("/dev/uinput", O_WRONLY | O_CLOEXEC)) {
        uinput_setup setup{};
        setup.name[0] = 'x';
        EXPECT_EQ(ioctl(mMaker.get(), UI_SET_EVBIT, EV_SYN), 0);
        EXPECT_EQ(ioctl(mMaker.get(), UI_DEV_SETUP, &setup), 0);
        EXPECT_EQ(ioctl(mMaker.get(), UI_DEV_CREATE), 0);
    }

    // Whoever else has inherited the descriptor.
    void unplug() const { ioctl(mMaker.get(), UI_DEV_DESTROY); }

    // Its node, "/dev/input/eventN"; empty until it is there.
    std::string node() const {
        std::array<char, 64> name{};
        ioctl(mMaker.get(), UI_GET_SYSNAME(name.size()), name.data());
        const std::string directory = std::string("/sys/devices/virtual/input/") + name.data();
        for (const auto& entry : std::filesystem::directory_iterator(directory)) {
            const std::string event = entry.path().filename();
            if (event.starts_with("event") && access(("/dev/input/" + event).c_str(), F_OK) == 0)
                return "/dev/input/" + event;
        }
        return "";
    }

  private:
    unique_fd mMaker;
};

Process hold(const std::string& node) {
    return Process(qvx::test::kRoot, [node](const Process::Ready& ready) {
        const unique_fd device(open(node.c_str(), O_RDWR | O_CLOEXEC));
        EXPECT_TRUE(device.ok()) << node;
        ready();
        pause();
    });
}

TEST(GoneInputDevice, IsFoundByItsRemovedNode) {
    const InputDevice device;
    ASSERT_TRUE(eventually([&] { return !device.node().empty(); }));
    const std::string node = device.node();
    const Process holder = hold(node);
    EXPECT_EQ(goneInputDevice("/proc", holder.pid()), "");
    device.unplug();
    EXPECT_TRUE(eventually([&] { return goneInputDevice("/proc", holder.pid()) == node; }));
}

// Where nodes are not made by the kernel, the name may stay, or stand again for another device.
TEST(GoneInputDevice, IsFoundWhileItsNodeStays) {
    const InputDevice device;
    ASSERT_TRUE(eventually([&] { return !device.node().empty(); }));
    struct stat made {};
    ASSERT_EQ(stat(device.node().c_str(), &made), 0);
    const std::string own = "/dev/input/stays";
    ASSERT_EQ(mknod(own.c_str(), S_IFCHR | 0600, made.st_rdev), 0);
    const Process holder = hold(own);
    EXPECT_EQ(goneInputDevice("/proc", holder.pid()), "");
    device.unplug();
    EXPECT_TRUE(eventually([&] { return goneInputDevice("/proc", holder.pid()) == own; }));
    unlink(own.c_str());
}

}  // namespace
}  // namespace vibctl
