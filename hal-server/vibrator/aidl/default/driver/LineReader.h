// SPDX-License-Identifier: Apache-2.0
//
// Reads a string file line by line into a fixed buffer, without allocating.
#pragma once

#include <sys/types.h>

#include <cstddef>

#include <android-base/unique_fd.h>

namespace aidl::android::hardware::vibrator {

class LineReader {
  public:
    // Size of a line buffer, terminator included.
    static constexpr size_t kLineSize = 1024;

    // Opens the file read-only.
    explicit LineReader(const char* path);

    // Whether the file was opened and close() was not called.
    bool isOpen() const { return mDescriptor.ok(); }

    // Stores the next line in `line`, newline included, as a terminated string. A line of more
    // than 1023 characters arrives in pieces of 1023, each as if it were a line; the last line may
    // lack its newline. False at the end of the file, and for good once a read has failed, when
    // what was read of the line is lost.
    bool next(char (&line)[kLineSize]);

    // Closes the file ahead of the reader's end.
    void close() { mDescriptor.reset(); }

  private:
    bool fill();

    ::android::base::unique_fd mDescriptor;
    char mAhead[1024] = {};
    ssize_t mPosition = 0;
    ssize_t mCount = 0;  // negative once a read has failed
};

}  // namespace aidl::android::hardware::vibrator
