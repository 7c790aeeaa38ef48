// SPDX-License-Identifier: Apache-2.0
//
// The C library's functions as this program has them.
#include "bench/driver_files.h"

#include <dlfcn.h>
#include <fcntl.h>
#include <linux/input.h>
#include <pthread.h>
#include <sys/ioctl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string_view>

namespace bench {
namespace {

std::vector<pthread_t> startedThreads;

bool isDriverPath(std::string_view path) {
    return path.starts_with("/sys/class/") || path.starts_with("/dev/input/") ||
           path.starts_with("/proc/bus/input/") || path.starts_with("/efs/");
}

template <typename Function>
Function* next(const char* name) {
    return reinterpret_cast<Function*>(dlsym(RTLD_NEXT, name));
}

}  // namespace

void enterPhone(const PhoneFiles& phone, const std::string& directory) {
    for (const auto& [path, text] : phone.files) {
        const std::string file = directory + path;
        std::filesystem::create_directories(std::filesystem::path(file).parent_path());
        std::ofstream(file) << text;
    }
    std::filesystem::create_directories(directory);
    std::filesystem::current_path(directory);
}

void joinThreads() {
    for (const pthread_t thread : startedThreads) pthread_join(thread, nullptr);
    startedThreads.clear();
}

}  // namespace bench

extern "C" {

int open(const char* path, int flags, ...) {
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = (flags & O_CREAT) != 0 ? va_arg(arguments, mode_t) : 0;
    va_end(arguments);
    // Without its first slash a path begins at the working directory.
    return static_cast<int>(syscall(SYS_openat, AT_FDCWD,
                                    bench::isDriverPath(path) ? path + 1 : path, flags, mode));
}

int ioctl(int descriptor, unsigned long request, ...) noexcept {
    va_list arguments;
    va_start(arguments, request);
    void* const argument = va_arg(arguments, void*);
    va_end(arguments);
    const long result = syscall(SYS_ioctl, descriptor, request, argument);
    if (request == EVIOCSFF) {
        static_cast<ff_effect*>(argument)->id = 0;
        return 0;
    }
    return request == EVIOCRMFF ? 0 : static_cast<int>(result);
}

// A thread stays joinable, so that the end of a request's last thread can be waited for.
int pthread_create(pthread_t* thread, const pthread_attr_t* attributes, void* (*routine)(void*),
                   void* argument) noexcept {
    static auto* const create =
            bench::next<int(pthread_t*, const pthread_attr_t*, void* (*)(void*), void*)>(
                    "pthread_create");
    const int error = create(thread, attributes, routine, argument);
    if (error == 0) bench::startedThreads.push_back(*thread);
    return error;
}

int pthread_detach(pthread_t /*thread*/) noexcept {
    return 0;
}

}  // extern "C"
