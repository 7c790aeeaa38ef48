// SPDX-License-Identifier: Apache-2.0
//
// Strict reading of JSON objects by tables of their keys: a table says what each key's value may be
// and where it goes. Whatever is not as the table has it gets one line that names the place, what
// stands there and what is accepted.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include <android-base/result.h>
#include <nlohmann/json.hpp>

namespace handset {

using Json = nlohmann::json;

// What a key's value may be.
struct Accepted {
    enum class Type { kString, kNode, kHex, kBoolean, kInteger, kName, kErrorName };

    Type type = Type::kString;
    uint64_t least = 0;  // of an integer
    uint64_t most = 0;
    std::string_view unit{};                // of an integer: "milliseconds"
    std::vector<std::string_view> names{};  // the strings that a name may be

    static Accepted string() { return {}; }
    static Accepted node() { return {Type::kNode}; }
    static Accepted hex() { return {Type::kHex}; }
    static Accepted boolean() { return {Type::kBoolean}; }
    static Accepted integer(uint64_t from, uint64_t to, std::string_view unit = {}) {
        return {Type::kInteger, from, to, unit};
    }
    static Accepted name(std::vector<std::string_view> names) {
        return {Type::kName, 0, 0, {}, std::move(names)};
    }
    static Accepted errorName() { return {Type::kErrorName}; }
};

// One key of an object.
template <typename Object>
struct Field {
    std::string_view key;
    Accepted accepted;
    void (*set)(Object& object, const Json& value);  // the value is as accepted
    bool required = false;
};

// Parses a whole document; an object that gives a key twice is refused. An error names line and
// column.
android::base::Result<Json> parseJson(std::string_view text);

// "an object", "a string", ...: what a value is, for messages.
std::string_view kindOf(const Json& value);

// The bytes that pairs of hexadecimal digits stand for; anything else is an error.
android::base::Result<std::string> decodeHex(std::string_view digits);

// Fails unless `value` is an object with no key outside `keys`. `where` names the place.
android::base::Result<void> checkKeys(const Json& value, const std::string& where,
                                      const std::vector<std::string_view>& keys);

// Fails unless the value of a key is as accepted.
android::base::Result<void> checkValue(const Json& value, const std::string& where,
                                       std::string_view key, const Accepted& accepted);

// The line for a key that has to be there.
android::base::ResultError missingKey(const std::string& where, std::string_view key,
                                      const Accepted& accepted);

// Reads an object by its table; a key that is absent leaves `object` as it is.
template <typename Object>
android::base::Result<void> readFields(const Json& value, const std::string& where,
                                       const std::vector<Field<Object>>& table, Object& object) {
    std::vector<std::string_view> keys;
    keys.reserve(table.size());
    for (const Field<Object>& field : table) keys.push_back(field.key);
    if (auto done = checkKeys(value, where, keys); !done) return done;
    for (const Field<Object>& field : table) {
        const auto found = value.find(field.key);
        if (found == value.end()) {
            if (field.required) return missingKey(where, field.key, field.accepted);
            continue;
        }
        if (auto done = checkValue(*found, where, field.key, field.accepted); !done) return done;
        field.set(object, *found);
    }
    return {};
}

}  // namespace handset
