// SPDX-License-Identifier: Apache-2.0
// Strict reading of JSON: each helper either fills its output or returns the line that says which
// place is wrong and what is accepted there.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <nlohmann/json.hpp>
#include <string>
#include <string_view>
#include <vector>

#include "driver/result.h"

namespace handset {

using Json = nlohmann::json;

/// Parses a whole text; an object that gives a key twice is refused. An error names line and
/// column.
Result<Json> parseJson(std::string_view text);

/// "an object", "a text", ...: what a value is, for messages.
std::string_view kindOf(const Json& value);

/// A list for messages: "a, b, c".
std::string joinNames(const std::vector<std::string_view>& names);

/// Fails unless `value` is an object with no key outside `keys`. `where` names the place.
Failure checkObject(const Json& value, const std::string& where,
                    const std::vector<std::string_view>& keys);

/// Reads a text, a truth value or a whole number within [`least`, `most`] from a key of an object.
/// A key that is absent leaves `out` as it is.
Failure readText(const Json& object, const std::string& where, const char* key, std::string& out);
Failure readTruth(const Json& object, const std::string& where, const char* key, bool& out);
Failure readNumber(const Json& object, const std::string& where, const char* key, uint64_t least,
                   uint64_t most, uint64_t& out);

/// Reads the bytes of an object: its "text", or its "hex" of two digits a byte. Both is an error,
/// none leaves `out` as it is.
Failure readBytes(const Json& object, const std::string& where, std::string& out);

}  // namespace handset
