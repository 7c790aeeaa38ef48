// SPDX-License-Identifier: Apache-2.0
//
// A kernel for unit tests that stands in from outside the code: this library defines open, read,
// write, close, ioctl, fopen, nanosleep and their relatives, so that they replace the C library's
// in the test program. Calls on the driver's paths go to the FakeKernel that exists at the
// time; everything else is passed on to the real functions. The code under test is the library that
// ships, unchanged, and its streams are caught as well as its system calls.
//
//     FakeKernel kernel;
//     kernel.addNode("/sys/class/leds/vibrator/state");
//     kernel.addFault({.path = "/sys/class/leds/vibrator/state", .operation = Operation::kWrite,
//                      .error = EIO});
//     ... call the code under test ...
//     EXPECT_THAT(kernel.calls(), ElementsAre(
//             "open /sys/class/leds/vibrator/state O_RDWR",
//             "write /sys/class/leds/vibrator/state \"1\\n\" = EIO",
//             "close /sys/class/leds/vibrator/state"));
//
// The driver's paths are those below /sys/class/, /efs/, /proc/bus/input/ and /dev/input/, and the
// empty one. One that was not added is missing (ENOENT). Destroying the kernel fails the test when
// a descriptor of it is still open.
#pragma once

#include <sys/types.h>
#include <time.h>

#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace fake {

// Access that a node grants, enforced for every user as sysfs does.
enum class Access { kReadWrite, kReadOnly, kWriteOnly };

enum class Operation { kOpen, kRead, kWrite, kIoctl };

// Something that goes wrong, in the words of the virtual handset's profiles. Exactly one of
// `error`, `limit`, `result` and `delay` says what.
struct Fault {
    std::string path;
    Operation operation = Operation::kOpen;
    int error = 0;                       // the call fails with this errno
    std::optional<size_t> limit = {};    // the call transfers at most so many bytes
    std::optional<ssize_t> result = {};  // the call works, and lies about its result
    std::chrono::milliseconds delay{0};  // the call works, after so much real time
    int after = 0;                       // so many calls are spared first
    int times = 1;                       // so many calls are hit; 0: all of them
};

// A device node with a behaviour of its own, such as a motor. Calls come with the kernel locked.
class Device {
  public:
    virtual ~Device() = default;

    // Byte count, or -errno.
    virtual ssize_t write(const void* data, size_t size) = 0;
    // Result, or -errno. `argument` is the call's third, whatever its type.
    virtual int ioctl(unsigned long request, void* argument) = 0;
    // The line under which a call is recorded, without its result; taken before the call is served.
    virtual std::string describeWrite(const void* data, size_t size) const = 0;
    virtual std::string describeIoctl(unsigned long request, void* argument) const = 0;
};

class FakeKernel {
  public:
    // Becomes the kernel of the process; there is one at a time.
    FakeKernel();
    ~FakeKernel();
    FakeKernel(const FakeKernel&) = delete;
    FakeKernel& operator=(const FakeKernel&) = delete;

    // A node with its string; a read gives the string last written to it, from the beginning.
    void addNode(const std::string& path, const std::string& text = "0\n",
                 Access access = Access::kReadWrite);
    void addDevice(const std::string& path, std::shared_ptr<Device> device);
    void removeNode(const std::string& path);
    void addFault(const Fault& fault);

    // The node's string as it stands.
    std::string text(const std::string& path) const;

    // Every call so far, one line each, in order. What did not go as asked ends with " = " and the
    // errno's name or the result:
    //   open PATH O_RDWR          fopen PATH r+
    //   read PATH 7 "500\n"       (size asked, bytes given)
    //   write PATH "500\n"        close PATH        ioctl PATH 0x40044581
    //   sleep 70 ms               (no time passes)
    std::vector<std::string> calls() const;

    // The writes that were taken, as PATH "DATA".
    std::vector<std::string> writes() const;

    // Forgets the calls and writes so far; nodes, faults and descriptors stay.
    void clear();

    // Waits, in real time, until so many calls were made; false after ten seconds.
    bool waitForCalls(size_t count) const;

    // From now on whoever sleeps stays asleep, until this is called with false.
    void holdSleeps(bool hold);

    size_t openDescriptors() const;

    // What the replaced functions do on the driver's paths and descriptors: the real functions'
    // results, with errno set.
    static bool isDriverPath(std::string_view path);
    bool owns(int descriptor) const;
    int open(const char* path, int flags);
    FILE* openStream(const char* path, const char* mode);
    ssize_t read(int descriptor, void* buffer, size_t size);
    ssize_t write(int descriptor, const void* data, size_t size);
    off_t seek(int descriptor, off_t offset, int whence);
    int ioctl(int descriptor, unsigned long request, void* argument);
    // Records the close; the caller closes the real descriptor.
    void forget(int descriptor);
    void sleep(const timespec& duration);

  private:
    struct Node {
        std::string text;
        Access access;
        std::shared_ptr<Device> device;
    };
    struct Description {
        std::string path;
        int flags;
        size_t offset;
    };
    struct Outcome {
        int error = 0;
        std::optional<size_t> limit;
        std::optional<ssize_t> result;
    };

    int openNode(const std::string& path, int flags, const std::string& record);
    ssize_t serveRead(Description& description, void* buffer, size_t size, const Outcome& outcome);
    // What the faults make of a call; with the kernel unlocked while the call is delayed.
    Outcome outcome(Operation operation, const std::string& path);
    void record(std::string line);

    mutable std::mutex mMutex;
    mutable std::condition_variable mCalled;
    std::map<std::string, Node> mNodes;
    std::map<int, Description> mDescriptions;
    std::vector<Fault> mFaults;
    std::vector<std::string> mCalls;
    std::vector<std::string> mWrites;
    bool mSleepsAreHeld = false;
};

// `data` as a C string literal, quotes included: "1\n", "0\0", "\x7f".
std::string quoted(std::string_view data);

}  // namespace fake
