// SPDX-License-Identifier: Apache-2.0
// Text as JSON.
#include "driver/json_text.h"

#include <cstddef>
#include <cstdint>

namespace handset {
namespace {

constexpr char kHexDigits[] = "0123456789abcdef";

/// The length of the sequence `lead` opens and the smallest code point it may stand for.
struct Sequence {
    size_t length;
    uint32_t smallest;
};

Sequence sequenceOf(uint8_t lead) {
    if (lead < 0x80) return {1, 0};
    if ((lead & 0xe0) == 0xc0) return {2, 0x80};
    if ((lead & 0xf0) == 0xe0) return {3, 0x800};
    if ((lead & 0xf8) == 0xf0) return {4, 0x10000};
    return {0, 0};
}

bool isCharacter(uint32_t code) {
    return code <= 0x10ffff && (code < 0xd800 || code > 0xdfff);
}

void appendText(fmt::memory_buffer& out, std::string_view text) {
    out.append(text.data(), text.data() + text.size());
}

}  // namespace

bool isUtf8(std::string_view bytes) {
    for (size_t at = 0; at < bytes.size();) {
        const uint8_t lead = static_cast<uint8_t>(bytes[at]);
        const Sequence sequence = sequenceOf(lead);
        if (sequence.length == 0 || sequence.length > bytes.size() - at) return false;
        uint32_t code = sequence.length == 1 ? lead : lead & (0x7fU >> sequence.length);
        for (size_t i = 1; i < sequence.length; ++i) {
            const uint8_t next = static_cast<uint8_t>(bytes[at + i]);
            if ((next & 0xc0) != 0x80) return false;
            code = code << 6 | (next & 0x3fU);
        }
        if (code < sequence.smallest || !isCharacter(code)) return false;
        at += sequence.length;
    }
    return true;
}

void appendJsonString(fmt::memory_buffer& out, std::string_view text) {
    out.push_back('"');
    for (const char c : text) {
        switch (c) {
            case '"':
                appendText(out, "\\\"");
                break;
            case '\\':
                appendText(out, "\\\\");
                break;
            case '\n':
                appendText(out, "\\n");
                break;
            case '\r':
                appendText(out, "\\r");
                break;
            case '\t':
                appendText(out, "\\t");
                break;
            default:
                if (static_cast<uint8_t>(c) >= 0x20) {
                    out.push_back(c);
                } else {
                    appendText(out, "\\u00");
                    out.push_back(kHexDigits[static_cast<uint8_t>(c) >> 4]);
                    out.push_back(kHexDigits[c & 0xf]);
                }
        }
    }
    out.push_back('"');
}

void appendHexString(fmt::memory_buffer& out, std::string_view bytes) {
    out.push_back('"');
    for (const char c : bytes) {
        out.push_back(kHexDigits[static_cast<uint8_t>(c) >> 4]);
        out.push_back(kHexDigits[c & 0xf]);
    }
    out.push_back('"');
}

}  // namespace handset
