// SPDX-License-Identifier: Apache-2.0
//
// The library's log lines, all under one tag.
#pragma once

namespace binder_ndk {

// printf-like. errno is left alone.
__attribute__((format(printf, 1, 2))) void logInfo(const char* format, ...);
__attribute__((format(printf, 1, 2))) void logWarning(const char* format, ...);
__attribute__((format(printf, 1, 2))) void logError(const char* format, ...);

// For a state the process cannot go on from: one line, then abort().
[[noreturn]] __attribute__((format(printf, 1, 2))) void fatal(const char* format, ...);

}  // namespace binder_ndk
