// SPDX-License-Identifier: Apache-2.0
#include "driver/PacketText.h"

#include <algorithm>
#include <charconv>
#include <cstring>

namespace aidl::android::hardware::vibrator {

PacketText::PacketText(size_t packets) {
    append(static_cast<int32_t>(packets * kPacketValues));
}

void PacketText::append(int32_t value) {
    appendNumber(false, value);
}

void PacketText::appendMarked(int32_t value) {
    appendNumber(true, value);
}

std::string_view PacketText::finish() {
    mText[mLength - 1] = '\n';
    return {mText, mLength};
}

void PacketText::appendNumber(bool marked, int32_t value) {
    char number[16];  // the mark, eleven characters and the space
    char* end = number;
    if (marked) *end++ = '#';
    end = std::to_chars(end, number + sizeof(number), value).ptr;
    *end++ = ' ';
    const size_t length = std::min<size_t>(end - number, kNumberSize - 1);
    memcpy(mText + mLength, number, length);
    mLength += length;
}

}  // namespace aidl::android::hardware::vibrator
