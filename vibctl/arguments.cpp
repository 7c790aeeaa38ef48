// SPDX-License-Identifier: Apache-2.0
//
// Words of the command line as values: see arguments.h.
#include "vibctl/arguments.h"

#include <algorithm>
#include <charconv>
#include <system_error>

#include <android-base/parsedouble.h>
#include <fmt/format.h>
#include <json/writer.h>

namespace vibctl {

namespace {

std::optional<int64_t> integerIn(std::string_view word) {
    // from_chars() does not take the plus sign.
    if (word.size() > 1 && word[0] == '+' && word[1] != '-') word.remove_prefix(1);
    int64_t value = 0;
    const char* const end = word.data() + word.size();
    const auto [stop, error] = std::from_chars(word.data(), end, value);
    if (error != std::errc() || stop != end) return std::nullopt;
    return value;
}

std::optional<float> floatIn(const std::string& word) {
    // strtof() would skip a space in front, and takes hexadecimal numbers.
    if (word.find_first_of(" \t\r\n\v\fxX") != std::string::npos) return std::nullopt;
    constexpr float kInfinity = std::numeric_limits<float>::infinity();
    float value = 0;
    if (!android::base::ParseFloat(word, &value, -kInfinity, kInfinity)) return std::nullopt;
    return value;
}

}  // namespace

std::string inQuotes(std::string_view word) {
    Json::StreamWriterBuilder oneLine;
    oneLine["indentation"] = "";
    return Json::writeString(oneLine, std::string(word));
}

Problem parseInteger(const std::string& name, const std::string& word, int64_t lowest,
                     int64_t highest, int64_t& value) {
    const std::optional<int64_t> number = integerIn(word);
    if (!number || *number < lowest || *number > highest) {
        return fmt::format("{} {} is not an integer from {} to {}", name, inQuotes(word), lowest,
                           highest);
    }
    value = *number;
    return std::nullopt;
}

Problem parseEnumerator(const std::string& name, const std::string& word,
                        std::span<const Enumerator> enumerators, int64_t lowest, int64_t highest,
                        int64_t& value) {
    const auto named =
            std::find_if(enumerators.begin(), enumerators.end(), [word](const Enumerator& one) {
                return android::base::EqualsIgnoreCase(one.name, word);
            });
    if (named != enumerators.end()) {
        value = named->value;
        return std::nullopt;
    }
    if (!parseInteger(name, word, lowest, highest, value)) return std::nullopt;
    std::vector<std::string_view> names;
    for (const Enumerator& one : enumerators) names.push_back(one.name);
    return fmt::format("{} {} is neither a number from {} to {} nor one of {}", name,
                       inQuotes(word), lowest, highest, fmt::join(names, ", "));
}

std::string listEnumerators(std::span<const Enumerator> enumerators) {
    std::string list;
    for (const Enumerator& one : enumerators) {
        list += fmt::format("{}{} {}", list.empty() ? "" : ", ", one.name, one.value);
    }
    return list;
}

Problem Argument<int32_t>::parse(const std::string& name, const std::string& word, int32_t& value) {
    int64_t number = 0;
    Problem problem = parseInteger(name, word, std::numeric_limits<int32_t>::min(),
                                   std::numeric_limits<int32_t>::max(), number);
    if (!problem) value = static_cast<int32_t>(number);
    return problem;
}

Problem Argument<float>::parse(const std::string& name, const std::string& word, float& value) {
    const std::optional<float> number = floatIn(word);
    if (!number) {
        return fmt::format("{} {} is not a number a float can hold (nor nan, inf, -inf)", name,
                           inQuotes(word));
    }
    value = *number;
    return std::nullopt;
}

Problem Argument<bool>::parse(const std::string& name, const std::string& word, bool& value) {
    if (android::base::EqualsIgnoreCase(word, "true") || word == "1") {
        value = true;
    } else if (android::base::EqualsIgnoreCase(word, "false") || word == "0") {
        value = false;
    } else {
        return fmt::format("{} {} is neither true nor false", name, inQuotes(word));
    }
    return std::nullopt;
}

Problem checkFieldCount(const std::vector<std::string>& names,
                        std::span<const std::string> fields) {
    if (fields.size() == names.size()) return std::nullopt;
    return fmt::format("{} field{} where {} are wanted: {}", fields.size(),
                       fields.size() == 1 ? "" : "s", names.size(), fmt::join(names, ","));
}

Problem inPacket(std::string_view packet, Problem problem) {
    if (!problem) return problem;
    return fmt::format("packet {}: {}", inQuotes(packet), *problem);
}

}  // namespace vibctl
