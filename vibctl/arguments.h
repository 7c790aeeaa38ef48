// SPDX-License-Identifier: Apache-2.0
//
// Words of the command line as values: integers, floats, booleans, enumerators, and packets whose
// fields are joined by commas.
#pragma once

#include <cstdint>
#include <limits>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <type_traits>
#include <vector>

#include <android-base/strings.h>
#include <android/binder_enums.h>

namespace vibctl {

// What is wrong with a piece of the command line, as one line; nothing when all is well.
using Problem = std::optional<std::string>;

// How a value of type T is written. A specialisation has
//
//     static Problem parse(const std::string& name, const std::string& word, T& value);
//     static std::string accepted();    // what parse() takes, for help texts
//
// `name` is the parameter's, for the problem's text. On a problem `value` is left as it was.
template <typename T>
struct Argument;

// A whole number in decimal, with or without sign.
Problem parseInteger(const std::string& name, const std::string& word, int64_t lowest,
                     int64_t highest, int64_t& value);

// One name of an enumeration.
struct Enumerator {
    std::string name;
    int64_t value;
};

// A name in any case, or any number of the backing type whether it has a name or not.
Problem parseEnumerator(const std::string& name, const std::string& word,
                        std::span<const Enumerator> enumerators, int64_t lowest, int64_t highest,
                        int64_t& value);

// "NAME 0, OTHER 1".
std::string listEnumerators(std::span<const Enumerator> enumerators);

// A word as messages show it: in quotes, with everything but printable ASCII escaped.
std::string inQuotes(std::string_view word);

template <>
struct Argument<int32_t> {
    static Problem parse(const std::string& name, const std::string& word, int32_t& value);
    static std::string accepted() { return "an integer"; }
};

// `nan`, `inf` and `-inf` included.
template <>
struct Argument<float> {
    static Problem parse(const std::string& name, const std::string& word, float& value);
    static std::string accepted() { return "a number, nan, inf or -inf"; }
};

template <>
struct Argument<bool> {
    static Problem parse(const std::string& name, const std::string& word, bool& value);
    static std::string accepted() { return "true or false"; }
};

template <>
struct Argument<std::string> {
    static Problem parse(const std::string&, const std::string& word, std::string& value) {
        value = word;
        return std::nullopt;
    }
    static std::string accepted() { return "a string"; }
};

template <typename T>
requires std::is_enum_v<T>
struct Argument<T> {
    using Backing = std::underlying_type_t<T>;

    static std::vector<Enumerator> enumerators() {
        std::vector<Enumerator> all;
        for (const T value : ndk::enum_range<T>()) {
            all.push_back({toString(value), static_cast<Backing>(value)});
        }
        return all;
    }

    static Problem parse(const std::string& name, const std::string& word, T& value) {
        int64_t number = 0;
        Problem problem =
                parseEnumerator(name, word, enumerators(), std::numeric_limits<Backing>::min(),
                                std::numeric_limits<Backing>::max(), number);
        if (!problem) value = static_cast<T>(number);
        return problem;
    }

    static std::string accepted() { return listEnumerators(enumerators()) + ", or any number"; }
};

// Checks that there are as many fields as names.
Problem checkFieldCount(const std::vector<std::string>& names, std::span<const std::string> fields);

// Puts the packet in front of what is wrong with one of its fields.
Problem inPacket(std::string_view packet, Problem problem);

// Parses `fields`, named by a form like "DELAY_MS,PRIMITIVE,SCALE", into `values`.
template <typename... T>
Problem parseFields(const std::string& form, std::span<const std::string> fields, T&... values) {
    const std::vector<std::string> names = android::base::Split(form, ",");
    Problem problem = checkFieldCount(names, fields);
    size_t index = 0;
    const auto parseNext = [&](auto& value) {
        using Value = std::remove_reference_t<decltype(value)>;
        if (!problem) problem = Argument<Value>::parse(names[index], fields[index], value);
        ++index;
    };
    (parseNext(values), ...);
    return problem;
}

// Parses the packet `word`, whose fields are named by `form`, into `values`.
template <typename... T>
Problem parsePacket(const std::string& form, const std::string& word, T&... values) {
    const std::vector<std::string> fields = android::base::Split(word, ",");
    return inPacket(word, parseFields(form, fields, values...));
}

}  // namespace vibctl
