// SPDX-License-Identifier: Apache-2.0
//
// The library's log lines.
#include "platform/libbinder_ndk/src/log.h"

#include <errno.h>
#include <stdarg.h>

#include <cstdlib>

#include <android/log.h>

namespace binder_ndk {
namespace {

__attribute__((format(printf, 2, 0))) void logLine(android_LogPriority priority, const char* format,
                                                   va_list arguments) {
    const int saved = errno;
    __android_log_vprint(priority, "libbinder_ndk", format, arguments);
    errno = saved;
}

}  // namespace

void logInfo(const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    logLine(ANDROID_LOG_INFO, format, arguments);
    va_end(arguments);
}

void logWarning(const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    logLine(ANDROID_LOG_WARN, format, arguments);
    va_end(arguments);
}

void logError(const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    logLine(ANDROID_LOG_ERROR, format, arguments);
    va_end(arguments);
}

void fatal(const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    logLine(ANDROID_LOG_FATAL, format, arguments);
    va_end(arguments);
    std::abort();
}

}  // namespace binder_ndk
