// SPDX-License-Identifier: Apache-2.0
//
// Strict reading of JSON objects.
#include "handset/driver/field_table.h"

#include <algorithm>
#include <cctype>
#include <charconv>
#include <cstddef>
#include <cstdint>
#include <set>

#include <fmt/format.h>

#include "handset/driver/error_names.h"

namespace handset {
namespace {

using android::base::Error;
using android::base::Result;
using android::base::ResultError;
using Type = Accepted::Type;

// The place of a byte in a text, as editors count.
std::string placeOf(std::string_view text, size_t byte) {
    const std::string_view before = text.substr(0, std::min(byte, text.size()));
    const auto line = std::count(before.begin(), before.end(), '\n') + 1;
    const size_t lineStart = before.rfind('\n') + 1;  // npos + 1 is 0: the first line
    return fmt::format("line {}, column {}", line, before.size() - lineStart + 1);
}

// The first byte of the word around a byte: the parser notices a wrong word somewhere inside it.
size_t startOfWord(std::string_view text, size_t byte) {
    const auto isPart = [](char c) { return isalnum(static_cast<unsigned char>(c)) != 0; };
    if (byte >= text.size()) return text.size();
    while (byte > 0 && isPart(text[byte - 1])) --byte;
    return byte;
}

// What stands at a byte, for the end of a message.
std::string excerptAt(std::string_view text, size_t byte) {
    constexpr size_t kLength = 20;
    if (byte >= text.size()) return "the end of the text";
    const std::string_view rest = text.substr(byte, kLength);
    return fmt::format("\"{}\"", rest.substr(0, rest.find('\n')));
}

// Notices a key that an object gives a second time, which the parser itself lets pass.
class RepeatedKeys {
  public:
    bool operator()(int, Json::parse_event_t event, Json& value) {
        switch (event) {
            case Json::parse_event_t::object_start:
                mOpen.emplace_back();
                break;
            case Json::parse_event_t::object_end:
                mOpen.pop_back();
                break;
            case Json::parse_event_t::key:
                if (!mOpen.back().insert(value.get<std::string>()).second && repeated.empty()) {
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
    std::vector<std::set<std::string>> mOpen;
};

std::string placeOfKey(const std::string& where, std::string_view key) {
    return where.empty() ? std::string(key) : fmt::format("{}.{}", where, key);
}

bool isWithin(const Json& value, const Accepted& accepted) {
    return value.is_number_unsigned() && value.get<uint64_t>() >= accepted.least &&
           value.get<uint64_t>() <= accepted.most;
}

std::string_view namesOfErrors() {
    return "an error's name, such as EIO, EINTR, EACCES";
}

// What a string stands for, where not every string is accepted.
Result<void> checkString(const std::string& value, const std::string& place,
                         const Accepted& accepted) {
    switch (accepted.type) {
        case Type::kHex:
            if (decodeHex(value)) return {};
            return Error() << fmt::format("{}: pairs of hexadecimal digits expected, not \"{}\"",
                                          place, value);
        case Type::kName:
            if (std::count(accepted.names.begin(), accepted.names.end(), value) != 0) return {};
            return Error() << fmt::format("{}: \"{}\" unknown; accepted: {}", place, value,
                                          fmt::join(accepted.names, ", "));
        case Type::kErrorName:
            if (errorNumber(value)) return {};
            return Error() << fmt::format("{}: \"{}\" unknown; accepted: {}", place, value,
                                          namesOfErrors());
        default:
            return {};
    }
}

}  // namespace

Result<Json> parseJson(std::string_view text) {
    RepeatedKeys keys;
    try {
        Json document = Json::parse(text.begin(), text.end(), std::ref(keys));
        if (!keys.repeated.empty()) {
            return Error() << fmt::format("the key \"{}\" stands twice in one object",
                                          keys.repeated);
        }
        return document;
    } catch (const Json::parse_error& error) {
        const size_t byte = startOfWord(text, error.byte > 0 ? error.byte - 1 : 0);
        return Error() << fmt::format("{}: no valid JSON at {}", placeOf(text, byte),
                                      excerptAt(text, byte));
    } catch (const Json::exception& error) {
        return Error() << fmt::format("no valid JSON: {}", error.what());
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
            return "a string";
        case Json::value_t::boolean:
            return "a boolean";
        case Json::value_t::number_integer:
        case Json::value_t::number_unsigned:
            return "a whole number";
        case Json::value_t::number_float:
            return "a fraction";
        default:
            return "something else";
    }
}

Result<std::string> decodeHex(std::string_view digits) {
    std::string bytes;
    for (size_t i = 0; i + 1 < digits.size(); i += 2) {
        const char* const end = digits.data() + i + 2;
        uint8_t byte = 0;
        if (std::from_chars(end - 2, end, byte, 16).ptr != end) {
            return Error() << "no hexadecimal digit";
        }
        bytes += static_cast<char>(byte);
    }
    if (digits.size() % 2 != 0) return Error() << "half a byte";
    return bytes;
}

Result<void> checkKeys(const Json& value, const std::string& where,
                       const std::vector<std::string_view>& keys) {
    if (!value.is_object()) {
        return Error() << fmt::format("{}: an object expected, not {}",
                                      where.empty() ? "the whole" : where, kindOf(value));
    }
    for (const auto& [key, unused] : value.items()) {
        if (std::find(keys.begin(), keys.end(), key) != keys.end()) continue;
        return Error() << fmt::format("{}unknown key \"{}\"; accepted: {}",
                                      where.empty() ? "" : where + ": ", key,
                                      fmt::join(keys, ", "));
    }
    return {};
}

Result<void> checkValue(const Json& value, const std::string& where, std::string_view key,
                        const Accepted& accepted) {
    const std::string place = placeOfKey(where, key);
    switch (accepted.type) {
        case Type::kBoolean:
            if (value.is_boolean()) return {};
            return Error() << fmt::format("{}: true or false expected, not {}", place,
                                          kindOf(value));
        case Type::kInteger:
            if (isWithin(value, accepted)) return {};
            return Error() << fmt::format(
                           "{}: a whole number{}{} from {} to {} expected, not {}", place,
                           accepted.unit.empty() ? "" : " of ", accepted.unit, accepted.least,
                           accepted.most,
                           value.is_number() || value.is_string()
                                   ? value.dump(-1, ' ', false, Json::error_handler_t::replace)
                                   : std::string(kindOf(value)));
        default:
            if (value.is_string()) return checkString(value.get<std::string>(), place, accepted);
            return Error() << fmt::format("{}: a string expected, not {}", place, kindOf(value));
    }
}

ResultError missingKey(const std::string& where, std::string_view key, const Accepted& accepted) {
    std::string expected = "a string";
    if (accepted.type == Type::kNode) expected = "a node's path, or motor";
    if (accepted.type == Type::kName) expected = fmt::format("{}", fmt::join(accepted.names, ", "));
    return {fmt::format("{}: missing; accepted: {}", placeOfKey(where, key), expected), 0};
}

}  // namespace handset
