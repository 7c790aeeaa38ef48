// SPDX-License-Identifier: Apache-2.0
//
// Opening the binder driver and its ioctls.
#include "platform/libbinder_ndk/src/driver.h"

#include <errno.h>
#include <fcntl.h>
#include <pthread.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <atomic>
#include <cstring>

#include "platform/libbinder_ndk/src/log.h"

namespace binder_ndk {
namespace {

// The second is where the node is when binderfs is mounted but nothing was linked.
constexpr const char* kDevices[] = {"/dev/binder", "/dev/binderfs/binder"};

constexpr int32_t kProtocolVersion = 8;
constexpr uint32_t kInitialMaxThreads = 15;

// Room for received buffers: a megabyte less the guard pages a mapping used to need.
size_t mappingSize() {
    return (size_t{1} << 20) - 2 * static_cast<size_t>(sysconf(_SC_PAGESIZE));
}

std::atomic<bool> forkedCopy{false};
std::atomic<uint32_t> handedOver{0};

int openDevice(const char** name) {
    for (const char* const device : kDevices) {
        *name = device;
        const int fd = open(device, O_RDWR | O_CLOEXEC);
        if (fd >= 0 || errno != ENOENT) return fd;
    }
    *name = kDevices[0];
    return -1;
}

const char* helpForOpen(int error) {
    switch (error) {
        case ENOENT:
        case ENODEV:
        case ENXIO:
            return "the kernel needs binder: load binder_linux, or mount binderfs on /dev/binderfs";
        case EACCES:
        case EPERM:
            return "its mode has to let this user read and write, 0666 on a phone";
        default:
            return "nothing can be served or called without it";
    }
}

}  // namespace

Driver& Driver::instance() {
    // Never destroyed: threads serve on while the process exits.
    static auto* const driver = new Driver;
    return *driver;
}

bool Driver::isForkedCopy() {
    return forkedCopy.load(std::memory_order_relaxed);
}

Driver::Driver() {
    const char* name = nullptr;
    mFd = openDevice(&name);
    if (mFd < 0) {
        const int error = errno;
        fatal("cannot open the binder driver %s: %s; %s", name, std::strerror(error),
              helpForOpen(error));
    }

    binder_version version = {};
    if (ioctl(mFd, BINDER_VERSION, &version) != 0) {
        fatal("%s does not answer as a binder driver: %s; it has to be the kernel's binder node",
              name, std::strerror(errno));
    }
    if (version.protocol_version != kProtocolVersion) {
        fatal("the binder driver %s speaks protocol %d, not %d; a 64-bit kernel's binder is needed",
              name, version.protocol_version, kProtocolVersion);
    }

    // Refusals of these two are harmless.
    setMaxThreads(kInitialMaxThreads);
    uint32_t enable = 1;
    ioctl(mFd, BINDER_ENABLE_ONEWAY_SPAM_DETECTION, &enable);

    void* const mapping =
            mmap(nullptr, mappingSize(), PROT_READ, MAP_PRIVATE | MAP_NORESERVE, mFd, 0);
    if (mapping == MAP_FAILED) {
        fatal("cannot map %zu bytes of the binder driver %s: %s; only the process that opened it "
              "may, "
              "once, with address space left",
              mappingSize(), name, std::strerror(errno));
    }
    pthread_atfork(nullptr, nullptr, [] { forkedCopy.store(true, std::memory_order_relaxed); });
}

int Driver::writeRead(binder_write_read& exchange) const {
    // What one thread hands to the driver another may receive, a new object for instance. The
    // driver puts the two in order, which neither the language nor a sanitizer can know of.
    handedOver.fetch_add(1, std::memory_order_release);
    int error = 0;
    do {
        // The driver notes in `exchange` what it has taken so far.
        error = ioctl(mFd, BINDER_WRITE_READ, &exchange) != 0 ? -errno : 0;
    } while (error == -EINTR);
    handedOver.load(std::memory_order_acquire);
    return error;
}

bool Driver::setMaxThreads(uint32_t count) const {
    if (ioctl(mFd, BINDER_SET_MAX_THREADS, &count) == 0) return true;
    logError("the binder driver refuses %u as the number of threads: %s", count,
             std::strerror(errno));
    return false;
}

int Driver::becomeContextManager() const {
    flat_binder_object object = {};
    // A driver asked for security contexts refuses every request while no module supplies them.
    if (access("/sys/fs/selinux/enforce", F_OK) == 0) {
        object.flags = FLAT_BINDER_FLAG_TXN_SECURITY_CTX;
    }
    if (ioctl(mFd, BINDER_SET_CONTEXT_MGR_EXT, &object) == 0) return 0;
    int32_t unused = 0;
    return ioctl(mFd, BINDER_SET_CONTEXT_MGR, &unused) == 0 ? 0 : -errno;
}

int Driver::countStrongReferences(uint32_t handle, uint32_t* count) const {
    binder_node_info_for_ref info = {};
    info.handle = handle;
    if (ioctl(mFd, BINDER_GET_NODE_INFO_FOR_REF, &info) != 0) return -errno;
    *count = info.strong_count;
    return 0;
}

void Driver::exitThread() const {
    ioctl(mFd, BINDER_THREAD_EXIT, 0);
}

}  // namespace binder_ndk
