// SPDX-License-Identifier: Apache-2.0
//
// What the fake kernel does; interposed_calls.cpp leads the calls here.
#include "tests/fake_kernel.h"

#include <fcntl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstring>
#include <utility>

#include <fmt/format.h>
#include <gtest/gtest.h>

#include "tests/interposed_calls.h"
#include "tests/sequence.h"

namespace fake {
namespace {

// A real descriptor that stands for a fake one, so that its number is no other file's and
// fdopen accepts it. Raw, because open() leads back here.
int reserveDescriptor() {
    return static_cast<int>(syscall(SYS_openat, AT_FDCWD, "/dev/null", O_RDWR | O_CLOEXEC));
}

int fail(int error) {
    errno = error;
    return -1;
}

std::string errorName(int error) {
    const char* const name = strerrorname_np(error);
    return name != nullptr ? name : std::to_string(error);
}

std::string flagNames(int flags) {
    static constexpr struct {
        int flag;
        const char* name;
    } kFlags[] = {
            {O_CREAT, "O_CREAT"},       {O_TRUNC, "O_TRUNC"},     {O_APPEND, "O_APPEND"},
            {O_NONBLOCK, "O_NONBLOCK"}, {O_CLOEXEC, "O_CLOEXEC"},
    };
    static constexpr const char* kAccess[] = {"O_RDONLY", "O_WRONLY", "O_RDWR"};
    std::string text = kAccess[flags & O_ACCMODE];
    int rest = flags & ~O_ACCMODE;
    for (const auto& [flag, name] : kFlags) {
        if ((rest & flag) != 0) {
            text += std::string("|") + name;
            rest &= ~flag;
        }
    }
    return rest == 0 ? text : fmt::format("{}|{:#x}", text, rest);
}

bool grants(Access access, int flags) {
    const int wanted = flags & O_ACCMODE;
    return access == Access::kReadWrite || (access == Access::kReadOnly && wanted == O_RDONLY) ||
           (access == Access::kWriteOnly && wanted == O_WRONLY);
}

// In real time: nanosleep(2) is one of the calls that lead back here.
void wait(std::chrono::milliseconds duration) {
    const timespec time = {.tv_sec = duration.count() / 1000,
                           .tv_nsec = duration.count() % 1000 * 1'000'000};
    clock_nanosleep(CLOCK_MONOTONIC, 0, &time, nullptr);
}

// How a call's record ends: nothing when all went as asked.
std::string ending(ssize_t result, ssize_t expected) {
    if (result == expected) return "";
    return " = " + (result < 0 ? errorName(errno) : std::to_string(result));
}

}  // namespace

std::string quoted(std::string_view data) {
    std::string text = "\"";
    for (const char c : data) {
        switch (c) {
            case '\n':
                text += "\\n";
                break;
            case '\t':
                text += "\\t";
                break;
            case '\0':
                text += "\\0";
                break;
            case '"':
            case '\\':
                text += '\\';
                text += c;
                break;
            default:
                if (c >= ' ' && c <= '~') {
                    text += c;
                } else {
                    text += fmt::format("\\x{:02x}", static_cast<unsigned char>(c));
                }
        }
    }
    return text + '"';
}

FakeKernel::FakeKernel() {
    setActiveKernel(this);
}

FakeKernel::~FakeKernel() {
    setActiveKernel(nullptr);
    for (const auto& [descriptor, description] : mDescriptions) {
        ADD_FAILURE() << description.path << " is still open as descriptor " << descriptor;
    }
}

void FakeKernel::addNode(const std::string& path, const std::string& text, Access access) {
    const std::lock_guard lock(mMutex);
    mNodes[path] = {text, access, nullptr};
}

void FakeKernel::addDevice(const std::string& path, std::shared_ptr<Device> device) {
    const std::lock_guard lock(mMutex);
    mNodes[path] = {"", Access::kReadWrite, std::move(device)};
}

void FakeKernel::removeNode(const std::string& path) {
    const std::lock_guard lock(mMutex);
    mNodes.erase(path);
}

void FakeKernel::addFault(const Fault& fault) {
    const std::lock_guard lock(mMutex);
    mFaults.push_back(fault);
}

std::string FakeKernel::text(const std::string& path) const {
    const std::lock_guard lock(mMutex);
    const auto node = mNodes.find(path);
    return node == mNodes.end() ? "" : node->second.text;
}

std::vector<std::string> FakeKernel::calls() const {
    const std::lock_guard lock(mMutex);
    return mCalls;
}

std::vector<std::string> FakeKernel::writes() const {
    const std::lock_guard lock(mMutex);
    return mWrites;
}

void FakeKernel::clear() {
    const std::lock_guard lock(mMutex);
    mCalls.clear();
    mWrites.clear();
}

bool FakeKernel::waitForCalls(size_t count) const {
    std::unique_lock lock(mMutex);
    return mCalled.wait_for(lock, std::chrono::seconds(10), [&] { return mCalls.size() >= count; });
}

size_t FakeKernel::openDescriptors() const {
    const std::lock_guard lock(mMutex);
    return mDescriptions.size();
}

bool FakeKernel::isDriverPath(std::string_view path) {
    static constexpr std::string_view kRoots[] = {"/sys/class/", "/efs/", "/proc/bus/input/",
                                                  "/dev/input/"};
    return path.empty() || std::any_of(std::begin(kRoots), std::end(kRoots),
                                       [&](auto root) { return path.starts_with(root); });
}

bool FakeKernel::owns(int descriptor) const {
    const std::lock_guard lock(mMutex);
    return mDescriptions.count(descriptor) != 0;
}

int FakeKernel::open(const char* path, int flags) {
    const std::lock_guard lock(mMutex);
    return openNode(path, flags, fmt::format("open {} {}", path, flagNames(flags)));
}

FILE* FakeKernel::openStream(const char* path, const char* mode) {
    int flags = strchr(mode, '+') != nullptr ? O_RDWR : mode[0] == 'r' ? O_RDONLY : O_WRONLY;
    int descriptor = -1;
    {
        const std::lock_guard lock(mMutex);
        descriptor = openNode(path, flags, fmt::format("fopen {} {}", path, mode));
    }
    return descriptor < 0 ? nullptr : fdopen(descriptor, mode);
}

int FakeKernel::openNode(const std::string& path, int flags, const std::string& line) {
    const int error = outcome(Operation::kOpen, path).error;
    const auto node = mNodes.find(path);
    int descriptor = -1;
    if (error != 0) {
        fail(error);
    } else if (node == mNodes.end()) {
        fail(ENOENT);
    } else if (!grants(node->second.access, flags)) {
        fail(EACCES);
    } else {
        descriptor = reserveDescriptor();
        mDescriptions[descriptor] = {path, flags, 0};
    }
    record(line + (descriptor < 0 ? " = " + errorName(errno) : ""));
    return descriptor;
}

ssize_t FakeKernel::serveRead(Description& description, void* buffer, size_t size,
                              const Outcome& wanted) {
    if (wanted.error != 0) return fail(wanted.error);
    if ((description.flags & O_ACCMODE) == O_WRONLY) return fail(EBADF);
    const std::string& text = mNodes[description.path].text;
    const size_t begin = std::min(description.offset, text.size());
    const size_t count = text.copy(static_cast<char*>(buffer),
                                   std::min(size, wanted.limit.value_or(size)), begin);
    description.offset = begin + count;
    return static_cast<ssize_t>(count);
}

ssize_t FakeKernel::read(int descriptor, void* buffer, size_t size) {
    const std::lock_guard lock(mMutex);
    Description& description = mDescriptions.at(descriptor);
    const Outcome wanted = outcome(Operation::kRead, description.path);
    const ssize_t count = serveRead(description, buffer, size, wanted);
    const ssize_t result = wanted.result.value_or(count);
    const std::string given =
            count < 0
                    ? ""
                    : " " + quoted({static_cast<const char*>(buffer), static_cast<size_t>(count)});
    record(fmt::format("read {} {}{}{}", description.path, size, given,
                       ending(result, count < 0 ? 0 : count)));
    return result;
}

ssize_t FakeKernel::write(int descriptor, const void* data, size_t size) {
    const std::lock_guard lock(mMutex);
    Description& description = mDescriptions.at(descriptor);
    Node& node = mNodes[description.path];
    const std::string_view bytes(static_cast<const char*>(data), size);
    const std::string line = node.device != nullptr
                                     ? node.device->describeWrite(data, size)
                                     : fmt::format("write {} {}", description.path, quoted(bytes));
    const Outcome wanted = outcome(Operation::kWrite, description.path);
    ssize_t result = 0;
    if (wanted.error != 0) {
        result = fail(wanted.error);
    } else if ((description.flags & O_ACCMODE) == O_RDONLY) {
        result = fail(EBADF);
    } else if (node.device != nullptr) {
        result = node.device->write(data, size);
        if (result < 0) result = fail(static_cast<int>(-result));
        result = wanted.result.value_or(result);
    } else {
        const std::string_view taken = bytes.substr(0, std::min(size, wanted.limit.value_or(size)));
        node.text = taken;
        description.offset += taken.size();
        mWrites.push_back(fmt::format("{} {}", description.path, quoted(taken)));
        result = wanted.result.value_or(static_cast<ssize_t>(taken.size()));
    }
    record(line + ending(result, static_cast<ssize_t>(size)));
    return result;
}

off_t FakeKernel::seek(int descriptor, off_t offset, int whence) {
    const std::lock_guard lock(mMutex);
    Description& description = mDescriptions.at(descriptor);
    const auto current = static_cast<off_t>(description.offset);
    const off_t base = whence == SEEK_CUR ? current : 0;
    if (whence == SEEK_END || base + offset < 0) return fail(EINVAL);
    description.offset = static_cast<size_t>(base + offset);
    return base + offset;
}

int FakeKernel::ioctl(int descriptor, unsigned long request, void* argument) {
    const std::lock_guard lock(mMutex);
    const std::string path = mDescriptions.at(descriptor).path;
    Device* const device = mNodes[path].device.get();
    const std::string line = device != nullptr ? device->describeIoctl(request, argument)
                                               : fmt::format("ioctl {} {:#x}", path, request);
    const Outcome wanted = outcome(Operation::kIoctl, path);
    int result = wanted.error != 0   ? -wanted.error
                 : device != nullptr ? device->ioctl(request, argument)
                                     : -ENOTTY;
    if (result < 0) result = fail(-result);
    record(line + ending(result, 0));
    return result;
}

void FakeKernel::forget(int descriptor) {
    const std::lock_guard lock(mMutex);
    record("close " + mDescriptions.at(descriptor).path);
    mDescriptions.erase(descriptor);
}

void FakeKernel::sleep(const timespec& duration) {
    std::unique_lock lock(mMutex);
    record(fmt::format("sleep {} ms", duration.tv_sec * 1000 + duration.tv_nsec / 1000000));
    mCalled.wait(lock, [this] { return !mSleepsAreHeld; });
}

void FakeKernel::holdSleeps(bool hold) {
    const std::lock_guard lock(mMutex);
    mSleepsAreHeld = hold;
    mCalled.notify_all();
}

FakeKernel::Outcome FakeKernel::outcome(Operation operation, const std::string& path) {
    for (Fault& fault : mFaults) {
        if (fault.operation != operation || fault.path != path || fault.times < 0) continue;
        if (fault.after > 0) {
            --fault.after;
            continue;
        }
        if (fault.times == 1) {
            fault.times = -1;  // used up
        } else if (fault.times > 1) {
            --fault.times;
        }
        const Outcome outcome = {fault.error, fault.limit, fault.result};
        if (const std::chrono::milliseconds delay = fault.delay; delay.count() != 0) {
            mMutex.unlock();
            wait(delay);
            mMutex.lock();
        }
        return outcome;
    }
    return {};
}

void FakeKernel::record(std::string line) {
    const int error = errno;
    sequence::note(line);
    mCalls.push_back(std::move(line));
    mCalled.notify_all();
    errno = error;
}

}  // namespace fake
