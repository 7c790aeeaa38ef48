// SPDX-License-Identifier: Apache-2.0
//
// Bytes that somebody else wrote, made fit for a message, a terminal or JSON.
#pragma once

#include <string>
#include <string_view>

#include <nlohmann/json.hpp>

namespace handset {

// The string kept to one line that any terminal can show: control characters become "?", and so do
// all bytes outside ASCII where it is not UTF-8.
std::string printable(std::string text);

// Puts `bytes` into an object: as a string under `key` where they are UTF-8, otherwise under
// `hexKey` as lower-case hexadecimal digits, two a byte.
void putBytes(nlohmann::ordered_json& object, const char* key, const char* hexKey,
              std::string_view bytes);

// Lower-case hexadecimal digits, two a byte: "00ff0a".
std::string hexOf(std::string_view bytes);

}  // namespace handset
