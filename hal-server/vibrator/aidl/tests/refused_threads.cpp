// SPDX-License-Identifier: Apache-2.0
//
// pthread_create as the test program has it. The C++ library's std::thread leads here too.
#include "tests/refused_threads.h"

#include <dlfcn.h>
#include <pthread.h>

#include <atomic>
#include <cerrno>

namespace fake {
namespace {

std::atomic<bool> refuse = false;
std::atomic<size_t> refused = 0;

}  // namespace

RefusedThreads::RefusedThreads() {
    refused = 0;
    refuse = true;
}

RefusedThreads::~RefusedThreads() {
    refuse = false;
}

size_t RefusedThreads::count() const {
    return refused;
}

}  // namespace fake

extern "C" int pthread_create(pthread_t* thread, const pthread_attr_t* attributes,
                              void* (*routine)(void*), void* argument) noexcept {
    if (fake::refuse) {
        ++fake::refused;
        return EAGAIN;
    }
    // The next definition: a sanitizer's, or the C library's.
    using Create = int(pthread_t*, const pthread_attr_t*, void* (*)(void*), void*);
    const auto next = reinterpret_cast<Create*>(dlsym(RTLD_NEXT, "pthread_create"));
    return next(thread, attributes, routine, argument);
}
