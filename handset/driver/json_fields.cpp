// SPDX-License-Identifier: Apache-2.0
// Strict reading of JSON.
#include "driver/json_fields.h"

#include <fmt/format.h>

#include <algorithm>
#include <cctype>
#include <cstddef>
#include <set>

namespace handset {
namespace {

/// The place of a byte in a text, as editors count.
std::string placeOf(std::string_view text, size_t byte) {
    const std::string_view before = text.substr(0, std::min(byte, text.size()));
    const auto line = std::count(before.begin(), before.end(), '\n') + 1;
    const size_t lineStart = before.rfind('\n') + 1;  // npos + 1 is 0: the first line
    return fmt::format("line {}, column {}", line, before.size() - lineStart + 1);
}

/// The first byte of the word around a byte: the parser notices a wrong word somewhere inside it.
size_t startOfWord(std::string_view text, size_t byte) {
    const auto isPart = [](char c) { return isalnum(static_cast<unsigned char>(c)) != 0; };
    if (byte >= text.size()) return text.size();
    while (byte > 0 && isPart(text[byte - 1])) --byte;
    return byte;
}

/// What stands at a byte, for the end of a message.
std::string excerptAt(std::string_view text, size_t byte) {
    constexpr size_t kLength = 20;
    if (byte >= text.size()) return "the end of the text";
    const std::string_view rest = text.substr(byte, kLength);
    return fmt::format("\"{}\"", rest.substr(0, rest.find('\n')));
}

/// Notices a key that an object gives a second time, which the parser itself lets pass.
class RepeatedKeys {
  public:
    bool operator()(int, Json::parse_event_t event, Json& value) {
        switch (event) {
            case Json::parse_event_t::object_start:
                open_.emplace_back();
                break;
            case Json::parse_event_t::object_end:
                open_.pop_back();
                break;
            case Json::parse_event_t::key:
                if (!open_.back().insert(value.get<std::string>()).second && repeated.empty()) {
                    repeated = value.get<std::string>();
                }
                break;
            default:
                break;
        }
        return true;
    }

    std::string repeated;

  private:
    std::vector<std::set<std::string>> open_;
};

std::string placeOfKey(const std::string& where, std::string_view key) {
    return where.empty() ? std::string(key) : fmt::format("{}.{}", where, key);
}

Error wrongKind(const std::string& where, std::string_view key, std::string_view expected,
                const Json& value) {
    return Error{fmt::format("{}: {} expected, not {}", placeOfKey(where, key), expected,
                             kindOf(value))};
}

int hexDigit(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    return -1;
}

std::optional<std::string> decodeHex(std::string_view digits) {
    if (digits.size() % 2 != 0) return std::nullopt;
    std::string bytes;
    for (size_t i = 0; i < digits.size(); i += 2) {
        const int high = hexDigit(digits[i]);
        const int low = hexDigit(digits[i + 1]);
        if (high < 0 || low < 0) return std::nullopt;
        bytes += static_cast<char>(high << 4 | low);
    }
    return bytes;
}

}  // namespace

Result<Json> parseJson(std::string_view text) {
    RepeatedKeys keys;
    try {
        Json document = Json::parse(text.begin(), text.end(), std::ref(keys));
        if (!keys.repeated.empty()) {
            return Error{fmt::format("the key \"{}\" stands twice in one object", keys.repeated)};
        }
        return document;
    } catch (const Json::parse_error& error) {
        const size_t byte = startOfWord(text, error.byte > 0 ? error.byte - 1 : 0);
        return Error{
                fmt::format("{}: no valid JSON at {}", placeOf(text, byte), excerptAt(text, byte))};
    } catch (const Json::exception& error) {
        return Error{fmt::format("no valid JSON: {}", error.what())};
    }
}

std::string_view kindOf(const Json& value) {
    switch (value.type()) {
        case Json::value_t::null:
            return "null";
        case Json::value_t::object:
            return "an object";
        case Json::value_t::array:
            return "an array";
        case Json::value_t::string:
            return "a text";
        case Json::value_t::boolean:
            return "a truth value";
        case Json::value_t::number_integer:
        case Json::value_t::number_unsigned:
            return "a whole number";
        case Json::value_t::number_float:
            return "a fraction";
        default:
            return "something else";
    }
}

std::string joinNames(const std::vector<std::string_view>& names) {
    return fmt::format("{}", fmt::join(names, ", "));
}

Failure checkObject(const Json& value, const std::string& where,
                    const std::vector<std::string_view>& keys) {
    if (!value.is_object()) {
        return Error{fmt::format("{}: an object expected, not {}",
                                 where.empty() ? "the whole" : where, kindOf(value))};
    }
    for (const auto& [key, unused] : value.items()) {
        if (std::find(keys.begin(), keys.end(), key) != keys.end()) continue;
        return Error{fmt::format("{}unknown key \"{}\"; accepted: {}",
                                 where.empty() ? "" : where + ": ", key, joinNames(keys))};
    }
    return std::nullopt;
}

Failure readText(const Json& object, const std::string& where, const char* key, std::string& out) {
    const auto field = object.find(key);
    if (field == object.end()) return std::nullopt;
    if (!field->is_string()) return wrongKind(where, key, "a text", *field);
    out = field->get<std::string>();
    return std::nullopt;
}

Failure readTruth(const Json& object, const std::string& where, const char* key, bool& out) {
    const auto field = object.find(key);
    if (field == object.end()) return std::nullopt;
    if (!field->is_boolean()) return wrongKind(where, key, "true or false", *field);
    out = field->get<bool>();
    return std::nullopt;
}

Failure readNumber(const Json& object, const std::string& where, const char* key, uint64_t least,
                   uint64_t most, uint64_t& out) {
    const auto field = object.find(key);
    if (field == object.end()) return std::nullopt;
    const bool natural = field->is_number_unsigned();
    if (!natural || field->get<uint64_t>() < least || field->get<uint64_t>() > most) {
        return Error{fmt::format("{}: a whole number from {} to {} expected, not {}",
                                 placeOfKey(where, key), least, most,
                                 field->is_number() ? field->dump() : kindOf(*field))};
    }
    out = field->get<uint64_t>();
    return std::nullopt;
}

Failure readBytes(const Json& object, const std::string& where, std::string& out) {
    if (object.contains("text") && object.contains("hex")) {
        return Error{fmt::format("{}: text and hex exclude each other", where)};
    }
    if (auto failure = readText(object, where, "text", out)) return failure;
    std::string digits;
    if (auto failure = readText(object, where, "hex", digits)) return failure;
    if (!object.contains("hex")) return std::nullopt;
    const std::optional<std::string> bytes = decodeHex(digits);
    if (!bytes) {
        return Error{fmt::format("{}.hex: pairs of hexadecimal digits expected, not \"{}\"", where,
                                 digits)};
    }
    out = *bytes;
    return std::nullopt;
}

}  // namespace handset
