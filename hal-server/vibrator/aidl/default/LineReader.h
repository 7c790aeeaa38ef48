// SPDX-License-Identifier: Apache-2.0
//
// Reads a text file line by line into a fixed buffer, without allocating.
#pragma once

#include <cstddef>

namespace aidl::android::hardware::vibrator {

class LineReader {
  public:
    // Size of a line buffer, terminator included.
    static constexpr size_t kLineSize = 1024;

    // Reads from `descriptor`, which stays the caller's and must outlive the reader.
    explicit LineReader(int descriptor) : mDescriptor(descriptor) {}
    LineReader(const LineReader&) = delete;
    LineReader& operator=(const LineReader&) = delete;

    // Stores the next line in `line`, line feed included, as a terminated string. A line of more
    // than 1023 characters arrives in pieces of 1023, each as if it were a line; the last line may
    // lack its line feed. False at the end of the file, and for good once a read has failed, when
    // what was read of the line is lost.
    bool next(char (&line)[kLineSize]);

  private:
    bool fill();

    const int mDescriptor;
    char mAhead[1024] = {};
    size_t mPosition = 0;
    size_t mCount = 0;
    bool mFailed = false;
};

}  // namespace aidl::android::hardware::vibrator
