// SPDX-License-Identifier: Apache-2.0
//
// What these headers and the generated code take from the phone's C library and glibc lacks: the
// availability mark of a declaration and the assertion functions with the file first. Not a header
// of the phone; every other header here includes it, so nobody has to.
#pragma once

#include <sys/cdefs.h>

// Marks the API level a function appeared at. Means nothing off the phone.
#ifndef __INTRODUCED_IN
#define __INTRODUCED_IN(api_level)  // NOLINT(bugprone-reserved-identifier)
#endif

#if defined(__cplusplus) && !defined(__BIONIC__)
#include <cstdio>
#include <cstdlib>

// NOLINTBEGIN(bugprone-reserved-identifier): the names are the phone's.

// Reports a failed check on standard error and aborts.
[[noreturn]] inline void __assert2(const char* file, int line, const char* function,
                                   const char* failed_expression) {
    std::fprintf(stderr, "%s:%d: %s: assertion \"%s\" failed\n", file, line, function,
                 failed_expression);
    std::abort();
}

// As above without a function name; overloads glibc's function, whose first argument is the string.

[[noreturn]] inline void __assert(const char* file, int line, const char* failed_expression) {
    std::fprintf(stderr, "%s:%d: assertion \"%s\" failed\n", file, line, failed_expression);
    std::abort();
}

// NOLINTEND(bugprone-reserved-identifier)
#endif
