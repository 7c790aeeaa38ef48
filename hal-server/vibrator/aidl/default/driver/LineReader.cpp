// SPDX-License-Identifier: Apache-2.0
//
// Line reading over the service's own system calls.
#include "driver/LineReader.h"

#include <fcntl.h>

#include <algorithm>
#include <cstring>

#include "driver/SystemCalls.h"

namespace aidl::android::hardware::vibrator {

LineReader::LineReader(const char* path) : mDescriptor(kernel::open(path, O_RDONLY)) {}

bool LineReader::next(char (&line)[kLineSize]) {
    size_t length = 0;
    bool complete = false;
    while (!complete && length < kLineSize - 1) {
        if (mPosition == mCount && (mFailed || !fill())) break;
        const char* const begin = mAhead + mPosition;
        const size_t available = std::min(mCount - mPosition, kLineSize - 1 - length);
        const void* const feed = memchr(begin, '\n', available);
        complete = feed != nullptr;
        const size_t taken =
                complete ? static_cast<size_t>(static_cast<const char*>(feed) - begin) + 1
                         : available;
        memcpy(line + length, begin, taken);
        length += taken;
        mPosition += taken;
    }
    line[length] = '\0';
    return length > 0 && !mFailed;
}

bool LineReader::fill() {
    const ssize_t count = kernel::read(mDescriptor.get(), mAhead, sizeof(mAhead));
    mFailed = count < 0;
    mPosition = 0;
    mCount = count > 0 ? static_cast<size_t>(count) : 0;
    return mCount > 0;
}

}  // namespace aidl::android::hardware::vibrator
