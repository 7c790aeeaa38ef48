// SPDX-License-Identifier: Apache-2.0
//
// A string for the driver, put together on the stack.
#pragma once

#include <cstdarg>
#include <cstddef>
#include <cstdio>
#include <string_view>

namespace aidl::android::hardware::vibrator {

// Holds `Size` bytes, terminator included; whoever uses it knows that nothing longer can come.
template <size_t Size>
class TextBuffer {
  public:
    __attribute__((format(printf, 2, 3))) void append(const char* format, ...) {
        va_list arguments;
        va_start(arguments, format);
        mLength += static_cast<size_t>(
                vsnprintf(mText + mLength, sizeof(mText) - mLength, format, arguments));
        va_end(arguments);
    }

    void dropLast() { mText[--mLength] = '\0'; }

    std::string_view get() const { return {mText, mLength}; }

    // The same with its terminating zero byte, which some nodes want as a part of the string.
    std::string_view getTerminated() const { return {mText, mLength + 1}; }

  private:
    char mText[Size] = {};
    size_t mLength = 0;
};

}  // namespace aidl::android::hardware::vibrator
