// SPDX-License-Identifier: Apache-2.0
//
// The C library functions that the test program replaces. Defined in the program itself they come
// before the C library's for every shared library too, which is how the C++ library's streams are
// caught: it opens them with fopen64 and then reads, writes and seeks the descriptor.
#include "tests/interposed_calls.h"

#include <dlfcn.h>
#include <fcntl.h>
#include <sys/ioctl.h>
#include <sys/uio.h>
#include <time.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <string>

#include "tests/fake_kernel.h"

namespace fake {
namespace {

std::atomic<FakeKernel*> activeKernel = nullptr;

// The kernel that answers for this path or descriptor; null: the real one.
FakeKernel* kernelFor(const char* path) {
    FakeKernel* const kernel = activeKernel.load();
    return kernel != nullptr && path != nullptr && FakeKernel::isDriverPath(path) ? kernel
                                                                                  : nullptr;
}

FakeKernel* kernelFor(int descriptor) {
    FakeKernel* const kernel = activeKernel.load();
    return kernel != nullptr && kernel->owns(descriptor) ? kernel : nullptr;
}

// The next definition of the function that calls this: a sanitizer's, or the C library's.
template <typename Function>
Function* next(const char* name) {
    return reinterpret_cast<Function*>(dlsym(RTLD_NEXT, name));
}

int openVia(const char* name, const char* path, int flags, mode_t mode) {
    if (FakeKernel* const kernel = kernelFor(path)) return kernel->open(path, flags);
    return next<int(const char*, int, ...)>(name)(path, flags, mode);
}

FILE* openStreamVia(const char* name, const char* path, const char* mode) {
    if (FakeKernel* const kernel = kernelFor(path)) return kernel->openStream(path, mode);
    return next<FILE*(const char*, const char*)>(name)(path, mode);
}

bool takesMode(int flags) {
    return (flags & O_CREAT) != 0 || (flags & O_TMPFILE) == O_TMPFILE;
}

mode_t modeArgument(int flags, va_list arguments) {
    return takesMode(flags) ? va_arg(arguments, mode_t) : 0;
}

}  // namespace

void setActiveKernel(FakeKernel* kernel) {
    activeKernel = kernel;
}

}  // namespace fake

using fake::FakeKernel;
using fake::kernelFor;
using fake::next;

extern "C" {

int open(const char* path, int flags, ...) {
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = fake::modeArgument(flags, arguments);
    va_end(arguments);
    return fake::openVia("open", path, flags, mode);
}

int open64(const char* path, int flags, ...) {
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = fake::modeArgument(flags, arguments);
    va_end(arguments);
    return fake::openVia("open64", path, flags, mode);
}

int openat(int directory, const char* path, int flags, ...) {
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = fake::modeArgument(flags, arguments);
    va_end(arguments);
    if (FakeKernel* const kernel = kernelFor(path)) return kernel->open(path, flags);
    return next<int(int, const char*, int, ...)>("openat")(directory, path, flags, mode);
}

FILE* fopen(const char* path, const char* mode) {
    return fake::openStreamVia("fopen", path, mode);
}

FILE* fopen64(const char* path, const char* mode) {
    return fake::openStreamVia("fopen64", path, mode);
}

int close(int descriptor) {
    if (FakeKernel* const kernel = kernelFor(descriptor)) kernel->forget(descriptor);
    return next<int(int)>("close")(descriptor);
}

int fclose(FILE* stream) {
    const int descriptor = stream != nullptr ? fileno(stream) : -1;
    if (FakeKernel* const kernel = kernelFor(descriptor)) kernel->forget(descriptor);
    return next<int(FILE*)>("fclose")(stream);
}

ssize_t read(int descriptor, void* buffer, size_t size) {
    if (FakeKernel* const kernel = kernelFor(descriptor)) {
        return kernel->read(descriptor, buffer, size);
    }
    return next<ssize_t(int, void*, size_t)>("read")(descriptor, buffer, size);
}

ssize_t write(int descriptor, const void* data, size_t size) {
    if (FakeKernel* const kernel = kernelFor(descriptor)) {
        return kernel->write(descriptor, data, size);
    }
    return next<ssize_t(int, const void*, size_t)>("write")(descriptor, data, size);
}

ssize_t writev(int descriptor, const iovec* vectors, int count) {
    if (FakeKernel* const kernel = kernelFor(descriptor)) {
        std::string data;
        for (int i = 0; i < count; ++i) {
            data.append(static_cast<const char*>(vectors[i].iov_base), vectors[i].iov_len);
        }
        return kernel->write(descriptor, data.data(), data.size());
    }
    return next<ssize_t(int, const iovec*, int)>("writev")(descriptor, vectors, count);
}

off_t lseek(int descriptor, off_t offset, int whence) noexcept {
    if (FakeKernel* const kernel = kernelFor(descriptor)) {
        return kernel->seek(descriptor, offset, whence);
    }
    return next<off_t(int, off_t, int)>("lseek")(descriptor, offset, whence);
}

off64_t lseek64(int descriptor, off64_t offset, int whence) noexcept {
    if (FakeKernel* const kernel = kernelFor(descriptor)) {
        return kernel->seek(descriptor, offset, whence);
    }
    return next<off64_t(int, off64_t, int)>("lseek64")(descriptor, offset, whence);
}

int ioctl(int descriptor, unsigned long request, ...) noexcept {
    va_list arguments;
    va_start(arguments, request);
    void* const argument = va_arg(arguments, void*);
    va_end(arguments);
    if (FakeKernel* const kernel = kernelFor(descriptor)) {
        return kernel->ioctl(descriptor, request, argument);
    }
    return next<int(int, unsigned long, ...)>("ioctl")(descriptor, request, argument);
}

int nanosleep(const timespec* duration, timespec* remaining) {
    if (FakeKernel* const kernel = fake::activeKernel.load()) {
        kernel->sleep(*duration);
        return 0;
    }
    return next<int(const timespec*, timespec*)>("nanosleep")(duration, remaining);
}

}  // extern "C"
