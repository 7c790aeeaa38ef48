// SPDX-License-Identifier: Apache-2.0
// Text as JSON, written straight into a buffer: a journal line is made for every call a client
// makes, so nothing here builds a document first.
#pragma once

#include <fmt/format.h>

#include <string_view>

namespace handset {

/// True when `bytes` is well-formed UTF-8 (no surrogates, no overlong forms, at most U+10FFFF).
bool isUtf8(std::string_view bytes);

/// Appends `text`, which must be UTF-8, as a JSON string with its quotes. Control characters are
/// escaped, everything above them stands as it is.
void appendJsonString(fmt::memory_buffer& out, std::string_view text);

/// Appends `bytes` as a JSON string of lower-case hexadecimal digits, two a byte.
void appendHexString(fmt::memory_buffer& out, std::string_view bytes);

}  // namespace handset
