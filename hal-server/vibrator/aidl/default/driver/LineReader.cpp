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
        if (mPosition >= mCount && (mCount < 0 || !fill())) break;
        const char* const begin = mAhead + mPosition;
        const size_t available = std::min<size_t>(mCount - mPosition, kLineSize - 1 - length);
        const void* const feed = memchr(begin, '\n', available);
        complete = feed != nullptr;
        const size_t taken =
                complete ? static_cast<size_t>(static_cast<const char*>(feed) - begin) + 1
                         : available;
        memcpy(line + length, begin, taken);
        length += taken;
        mPosition += static_cast<ssize_t>(taken);
    }
    line[length] = '\0';
    return length > 0 && mCount >= 0;
}

bool LineReader::fill() {
    mCount = kernel::read(mDescriptor.get(), mAhead, sizeof(mAhead));
    mPosition = 0;
    return mCount > 0;
}

}  // namespace aidl::android::hardware::vibrator
