// SPDX-License-Identifier: Apache-2.0
#include "PacketText.h"

#include <algorithm>
#include <cstdarg>
#include <cstdio>

namespace aidl::android::hardware::vibrator {

PacketText::PacketText(size_t packets) {
    append(static_cast<int32_t>(packets * kPacketValues));
}

void PacketText::append(int32_t value) {
    appendNumber("%d ", value);
}

void PacketText::appendMarked(int32_t value) {
    appendNumber("#%d ", value);
}

std::string_view PacketText::finish() {
    mText[mLength - 1] = '\n';
    return {mText, mLength};
}

void PacketText::appendNumber(const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    const int length = vsnprintf(mText + mLength, kNumberSize, format, arguments);
    va_end(arguments);
    mLength += std::min(static_cast<size_t>(length), kNumberSize - 1);
}

}  // namespace aidl::android::hardware::vibrator
