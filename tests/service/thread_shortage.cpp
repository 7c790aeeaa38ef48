// SPDX-License-Identifier: Apache-2.0
#include "thread_shortage.h"

#include <dlfcn.h>
#include <pthread.h>

#include <atomic>
#include <cerrno>

namespace imitated {
namespace {

std::atomic<bool> isShort = false;

}  // namespace

ThreadShortage::ThreadShortage() {
    isShort = true;
}

ThreadShortage::~ThreadShortage() {
    isShort = false;
}

}  // namespace imitated

extern "C" int pthread_create(pthread_t* thread, const pthread_attr_t* attributes,
                              void* (*routine)(void*), void* argument) noexcept {
    if (imitated::isShort) return EAGAIN;
    using Function = int(pthread_t*, const pthread_attr_t*, void* (*)(void*), void*);
    // A sanitizer's, or the C library's.
    static auto* const next = reinterpret_cast<Function*>(dlsym(RTLD_NEXT, "pthread_create"));
    return next(thread, attributes, routine, argument);
}
