// SPDX-License-Identifier: Apache-2.0
//
// Words of the command line as values: see arguments.h.
#include "arguments.h"

#include <algorithm>
#include <charconv>
#include <system_error>

#include <fmt/format.h>
#include <fmt/ranges.h>

namespace vibctl {

namespace {

// The locale has no say in what a command line means.
constexpr char lower(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

/// The whole word as a number, or nothing. from_chars() does not take the plus sign.
template <typename T>
std::optional<T> numberIn(std::string_view word) {
    if (word.size() > 1 && word[0] == '+' && word[1] != '-') word.remove_prefix(1);
    T value{};
    const char* const end = word.data() + word.size();
    const auto [stop, error] = std::from_chars(word.data(), end, value);
    if (error != std::errc() || stop != end) return std::nullopt;
    return value;
}

}  // namespace

bool equalIgnoringCase(std::string_view left, std::string_view right) {
    return std::equal(left.begin(), left.end(), right.begin(), right.end(),
                      [](char a, char b) { return lower(a) == lower(b); });
}

Problem parseInteger(std::string_view name, std::string_view word, int64_t lowest, int64_t highest,
                     int64_t& value) {
    const std::optional<int64_t> number = numberIn<int64_t>(word);
    if (!number || *number < lowest || *number > highest) {
        return fmt::format("{} {:?} is not an integer from {} to {}", name, word, lowest, highest);
    }
    value = *number;
    return std::nullopt;
}

Problem parseEnumerator(std::string_view name, std::string_view word,
                        std::span<const Enumerator> enumerators, int64_t lowest, int64_t highest,
                        int64_t& value) {
    const auto named = std::find_if(
            enumerators.begin(), enumerators.end(),
            [word](const Enumerator& one) { return equalIgnoringCase(one.name, word); });
    if (named != enumerators.end()) {
        value = named->value;
        return std::nullopt;
    }
    if (!parseInteger(name, word, lowest, highest, value)) return std::nullopt;
    std::vector<std::string_view> names;
    for (const Enumerator& one : enumerators) names.push_back(one.name);
    return fmt::format("{} {:?} is neither a number from {} to {} nor one of {}", name, word,
                       lowest, highest, fmt::join(names, ", "));
}

std::string listEnumerators(std::span<const Enumerator> enumerators) {
    std::string list;
    for (const Enumerator& one : enumerators) {
        list += fmt::format("{}{} {}", list.empty() ? "" : ", ", one.name, one.value);
    }
    return list;
}

std::vector<std::string_view> splitAtCommas(std::string_view text) {
    std::vector<std::string_view> pieces;
    for (size_t comma = text.find(','); comma != std::string_view::npos; comma = text.find(',')) {
        pieces.push_back(text.substr(0, comma));
        text.remove_prefix(comma + 1);
    }
    pieces.push_back(text);
    return pieces;
}

Problem Argument<int32_t>::parse(std::string_view name, std::string_view word, int32_t& value) {
    int64_t number = 0;
    Problem problem = parseInteger(name, word, std::numeric_limits<int32_t>::min(),
                                   std::numeric_limits<int32_t>::max(), number);
    if (!problem) value = static_cast<int32_t>(number);
    return problem;
}

Problem Argument<float>::parse(std::string_view name, std::string_view word, float& value) {
    const std::optional<float> number = numberIn<float>(word);
    if (!number) {
        return fmt::format("{} {:?} is not a number a float can hold (nor nan, inf, -inf)", name,
                           word);
    }
    value = *number;
    return std::nullopt;
}

Problem Argument<bool>::parse(std::string_view name, std::string_view word, bool& value) {
    if (equalIgnoringCase(word, "true") || word == "1") {
        value = true;
    } else if (equalIgnoringCase(word, "false") || word == "0") {
        value = false;
    } else {
        return fmt::format("{} {:?} is neither true nor false", name, word);
    }
    return std::nullopt;
}

Problem checkFieldCount(std::string_view form, std::span<const std::string_view> fields) {
    const size_t wanted = splitAtCommas(form).size();
    if (fields.size() == wanted) return std::nullopt;
    return fmt::format("{} field{} where {} are wanted: {}", fields.size(),
                       fields.size() == 1 ? "" : "s", wanted, form);
}

Problem inPacket(std::string_view packet, Problem problem) {
    if (!problem) return problem;
    return fmt::format("packet {:?}: {}", packet, *problem);
}

}  // namespace vibctl
