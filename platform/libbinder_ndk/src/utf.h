// SPDX-License-Identifier: Apache-2.0
//
// UTF-8 in memory, UTF-16 in parcels.
//
// The conversions are as tolerant as the platform's: a lead byte alone decides how many bytes are
// taken, their high bits are not checked, and a stray continuation byte stands for itself. What one
// side writes, the other reads alike.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace binder_ndk {

// Units needed, or -1 when the last sequence is cut off.
ptrdiff_t utf16Length(std::string_view utf8);

// Writes utf16Length(utf8) units, which must not be negative. `to` need only be byte-aligned.
void utf8ToUtf16(std::string_view utf8, uint8_t* to);

// As above; a sequence cut off at the end is dropped.
std::u16string utf8ToUtf16Lossy(std::string_view utf8);

// Bytes needed. Surrogates without a partner need none.
size_t utf8Length(std::u16string_view utf16);

// Writes utf8Length(utf16) bytes.
void utf16ToUtf8(std::u16string_view utf16, char* to);
std::string utf16ToUtf8(std::u16string_view utf16);

}  // namespace binder_ndk
