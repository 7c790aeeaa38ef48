// SPDX-License-Identifier: Apache-2.0
//
// The C library's heap functions, replaced by ones that count. A sanitizer brings a heap of its
// own, which tells of every block through hooks; it is left in place.
#include "tests/allocation_counter.h"

#include <cerrno>
#include <cstdlib>

#if defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
#define QVX_SANITIZER_HEAP
#endif
#elif defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define QVX_SANITIZER_HEAP
#endif

namespace {

// Plain numbers: thread-local objects that need a constructor would need the heap themselves.
thread_local size_t taken = 0;
thread_local size_t givenBack = 0;

}  // namespace

AllocationCounter::AllocationCounter() : mTaken(::taken), mGivenBack(::givenBack) {}

size_t AllocationCounter::taken() const {
    return ::taken - mTaken;
}

ptrdiff_t AllocationCounter::held() const {
    return static_cast<ptrdiff_t>(taken()) - static_cast<ptrdiff_t>(::givenBack - mGivenBack);
}

#ifdef QVX_SANITIZER_HEAP

// The sanitizers' own interface; GCC brings the function without its header.
extern "C" int __sanitizer_install_malloc_and_free_hooks(
        void (*onTaken)(const volatile void* block, size_t size),
        void (*onGivenBack)(const volatile void* block));

namespace {

void onTaken(const volatile void* /*block*/, size_t /*size*/) {
    ++taken;
}

void onGivenBack(const volatile void* block) {
    if (block != nullptr) ++givenBack;
}

[[maybe_unused]] const int installed =
        __sanitizer_install_malloc_and_free_hooks(onTaken, onGivenBack);

}  // namespace

#else

extern "C" {

// What the C library's own functions are called besides.
void* __libc_malloc(size_t size);
void* __libc_calloc(size_t count, size_t size);
void* __libc_realloc(void* block, size_t size);
void* __libc_memalign(size_t alignment, size_t size);
void __libc_free(void* block);

void* malloc(size_t size) {
    ++taken;
    return __libc_malloc(size);
}

void* calloc(size_t count, size_t size) {
    ++taken;
    return __libc_calloc(count, size);
}

void* realloc(void* block, size_t size) {
    if (block == nullptr || size != 0) ++taken;
    if (block != nullptr) ++givenBack;
    return __libc_realloc(block, size);
}

void* memalign(size_t alignment, size_t size) {
    ++taken;
    return __libc_memalign(alignment, size);
}

void* aligned_alloc(size_t alignment, size_t size) {
    return memalign(alignment, size);
}

int posix_memalign(void** block, size_t alignment, size_t size) {
    void* const fresh = memalign(alignment, size);
    if (fresh == nullptr) return ENOMEM;
    *block = fresh;
    return 0;
}

void free(void* block) {
    if (block != nullptr) ++givenBack;
    __libc_free(block);
}

}  // extern "C"

#endif
