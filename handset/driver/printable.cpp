// SPDX-License-Identifier: Apache-2.0
//
// Bytes that somebody else wrote.
#include "handset/driver/printable.h"

#include <algorithm>
#include <cstdint>

#include <fmt/format.h>

namespace handset {
namespace {

// Well-formed UTF-8, as the JSON library sees it: it refuses to write anything else.
bool isUtf8(std::string_view bytes) {
    const auto isAscii = [](char c) { return static_cast<signed char>(c) >= 0; };
    if (std::all_of(bytes.begin(), bytes.end(), isAscii)) return true;
    try {
        (void)nlohmann::json(bytes).dump();
        return true;
    } catch (const nlohmann::json::type_error&) {
        return false;
    }
}

}  // namespace

std::string printable(std::string text) {
    const unsigned char last = isUtf8(text) ? 0xff : 0x7e;
    std::replace_if(
            text.begin(), text.end(),
            [last](unsigned char c) { return c < 0x20 || c == 0x7f || c > last; }, '?');
    return text;
}

void putBytes(nlohmann::ordered_json& object, const char* key, const char* hexKey,
              std::string_view bytes) {
    if (isUtf8(bytes)) {
        object[key] = bytes;
    } else {
        object[hexKey] = hexOf(bytes);
    }
}

std::string hexOf(std::string_view bytes) {
    std::string digits;
    digits.reserve(2 * bytes.size());
    for (const char c : bytes) {
        constexpr std::string_view kDigits = "0123456789abcdef";
        digits += kDigits[static_cast<uint8_t>(c) >> 4];
        digits += kDigits[static_cast<uint8_t>(c) & 0xf];
    }
    return digits;
}

}  // namespace handset
