// SPDX-License-Identifier: Apache-2.0
//
// UTF-8 and UTF-16.
#include "platform/libbinder_ndk/src/utf.h"

#include <cstring>

namespace binder_ndk {
namespace {

constexpr char32_t kFirstSupplementary = 0x10000;

// Bytes of a sequence by the high half of its lead byte.
constexpr uint8_t kSequenceLength[16] = {1, 1, 1, 1, 1, 1, 1, 1,  // ASCII
                                         1, 1, 1, 1,              // stray continuation bytes
                                         2, 2, 3, 4};
// Bits of the lead byte that belong to the code point, by sequence length.
constexpr uint8_t kLeadBits[5] = {0, 0xff, 0x1f, 0x0f, 0x07};

size_t sequenceLength(char lead) {
    return kSequenceLength[static_cast<uint8_t>(lead) >> 4];
}

char32_t decode(std::string_view sequence) {
    char32_t code = static_cast<uint8_t>(sequence[0]) & kLeadBits[sequence.size()];
    for (const char byte : sequence.substr(1))
        code = (code << 6) | (static_cast<uint8_t>(byte) & 0x3fU);
    return code;
}

// The length of `utf8` without a sequence that is cut off at its end.
size_t wholeLength(std::string_view utf8) {
    size_t at = 0;
    while (at < utf8.size() && sequenceLength(utf8[at]) <= utf8.size() - at)
        at += sequenceLength(utf8[at]);
    return at;
}

bool isHighSurrogate(char32_t unit) {
    return (unit & 0xfffffc00) == 0xd800;
}
bool isLowSurrogate(char32_t unit) {
    return (unit & 0xfffffc00) == 0xdc00;
}

// How much of the beginning is ASCII, which is nearly every string as a whole: a word at a time, where
// decoding goes character by character. At most a word less than all of it.
template <typename Unit>
size_t asciiLength(std::basic_string_view<Unit> text) {
    static_assert(sizeof(Unit) <= 2);
    constexpr uint64_t kOther = sizeof(Unit) == 1 ? 0x8080808080808080 : 0xff80ff80ff80ff80;
    constexpr size_t kUnits = sizeof(uint64_t) / sizeof(Unit);
    size_t length = 0;
    for (; text.size() - length >= kUnits; length += kUnits) {
        uint64_t word = 0;
        std::memcpy(&word, text.data() + length, sizeof word);
        if ((word & kOther) != 0) break;
    }
    return length;
}

// Calls `visit` with each code point; surrogates without a partner are left out.
template <typename Visitor>
void forEachCodePoint(std::u16string_view utf16, Visitor visit) {
    for (size_t at = 0; at < utf16.size(); ++at) {
        const char32_t unit = utf16[at];
        if (isHighSurrogate(unit) && at + 1 < utf16.size() && isLowSurrogate(utf16[at + 1])) {
            ++at;
            visit(kFirstSupplementary + ((unit - 0xd800) << 10) + (utf16[at] - 0xdc00U));
        } else if (!isHighSurrogate(unit) && !isLowSurrogate(unit)) {
            visit(unit);
        }
    }
}

size_t encodedLength(char32_t code) {
    return code < 0x80 ? 1 : code < 0x800 ? 2 : code < kFirstSupplementary ? 3 : 4;
}

}  // namespace

ptrdiff_t utf16Length(std::string_view utf8) {
    const size_t ascii = asciiLength(utf8);
    utf8.remove_prefix(ascii);
    if (wholeLength(utf8) != utf8.size()) return -1;
    auto units = static_cast<ptrdiff_t>(ascii);
    for (size_t at = 0; at < utf8.size();) {
        const size_t length = sequenceLength(utf8[at]);
        units += decode(utf8.substr(at, length)) < kFirstSupplementary ? 1 : 2;
        at += length;
    }
    return units;
}

void utf8ToUtf16(std::string_view utf8, uint8_t* to) {
    const auto put = [&to](char32_t unit) {
        const char16_t narrow = static_cast<char16_t>(unit);
        std::memcpy(to, &narrow, sizeof narrow);
        to += sizeof narrow;
    };
    const size_t ascii = asciiLength(utf8);
    for (size_t at = 0; at < ascii; ++at) put(static_cast<uint8_t>(utf8[at]));
    utf8.remove_prefix(ascii);
    for (size_t at = 0; at < utf8.size();) {
        const size_t length = sequenceLength(utf8[at]);
        const char32_t code = decode(utf8.substr(at, length));
        if (code < kFirstSupplementary) {
            put(code);
        } else {
            put(0xd800 + ((code - kFirstSupplementary) >> 10));
            put(0xdc00 + ((code - kFirstSupplementary) & 0x3ff));
        }
        at += length;
    }
}

std::u16string utf8ToUtf16Lossy(std::string_view utf8) {
    const std::string_view whole = utf8.substr(0, wholeLength(utf8));
    std::u16string text(static_cast<size_t>(utf16Length(whole)), u'\0');
    utf8ToUtf16(whole, reinterpret_cast<uint8_t*>(text.data()));
    return text;
}

size_t utf8Length(std::u16string_view utf16) {
    size_t bytes = asciiLength(utf16);
    utf16.remove_prefix(bytes);
    forEachCodePoint(utf16, [&](char32_t code) { bytes += encodedLength(code); });
    return bytes;
}

void utf16ToUtf8(std::u16string_view utf16, char* to) {
    const size_t ascii = asciiLength(utf16);
    for (size_t at = 0; at < ascii; ++at) *to++ = static_cast<char>(utf16[at]);
    utf16.remove_prefix(ascii);
    static constexpr char32_t kLeadMarks[] = {0, 0, 0xc0, 0xe0, 0xf0};
    forEachCodePoint(utf16, [&to](char32_t code) {
        const size_t length = encodedLength(code);
        for (size_t at = length; at-- > 1;) {
            to[at] = static_cast<char>(0x80 | (code & 0x3f));
            code >>= 6;
        }
        to[0] = static_cast<char>(kLeadMarks[length] | code);
        to += length;
    });
}

std::string utf16ToUtf8(std::u16string_view utf16) {
    std::string text(utf8Length(utf16), '\0');
    utf16ToUtf8(utf16, text.data());
    return text;
}

}  // namespace binder_ndk
