// SPDX-License-Identifier: Apache-2.0
//
// The fields of a JSON object: see json_fields.h.
#include "vibctl/play/json_fields.h"

#include <algorithm>
#include <memory>

#include <android-base/strings.h>
#include <fmt/format.h>
#include <json/reader.h>

namespace vibctl {

Problem parseJson(const std::string& text, int firstLine, Json::Value& root) {
    Json::CharReaderBuilder builder;
    Json::CharReaderBuilder::strictMode(&builder.settings_);
    builder["collectComments"] = false;
    const std::unique_ptr<Json::CharReader> reader(builder.newCharReader());
    std::string errors;
    if (reader->parse(text.data(), text.data() + text.size(), &root, &errors)) return std::nullopt;
    // "* Line 1, Column 5\n  What is wrong\n..."
    const std::vector<std::string> lines = android::base::Split(errors, "\n");
    int line = 1;
    const size_t at = lines[0].find("Line ");
    if (at != std::string::npos) line = std::atoi(lines[0].c_str() + at + 5);
    return fmt::format("line {}: {}", firstLine + line - 1,
                       android::base::Trim(lines.size() > 1 ? lines[1] : lines[0]));
}

JsonFields::JsonFields(const Json::Value& object, const std::string& text, int firstLine,
                       Problem& problem)
    : mObject(object), mText(text), mFirstLine(firstLine), mProblem(problem) {
    if (!mObject.isObject()) complain(mObject, "an object is accepted");
}

int JsonFields::lineOf(const Json::Value& value) const {
    const auto end =
            mText.begin() + std::min(value.getOffsetStart(), static_cast<ptrdiff_t>(mText.size()));
    return mFirstLine + static_cast<int>(std::count(mText.begin(), end, '\n'));
}

void JsonFields::complain(const Json::Value& where, const std::string& what) {
    if (!mProblem) mProblem = fmt::format("line {}: {}", lineOf(where), what);
}

void JsonFields::expectKeys(const std::vector<std::string>& keys) {
    if (!mObject.isObject()) return;
    for (const std::string& key : mObject.getMemberNames()) {
        if (std::find(keys.begin(), keys.end(), key) != keys.end()) continue;
        complain(mObject[key], fmt::format("unknown key {}; accepted are {}", inQuotes(key),
                                           fmt::join(keys, ", ")));
    }
}

double JsonFields::number(const char* key, double lowest, double highest, double missing) {
    if (!mObject.isObject() || !mObject.isMember(key)) return missing;
    const Json::Value& value = mObject[key];
    if (value.isNumeric() && value.asDouble() >= lowest && value.asDouble() <= highest) {
        return value.asDouble();
    }
    complain(value, fmt::format("{}: a number from {} to {} is accepted", key, lowest, highest));
    return missing;
}

std::string JsonFields::string(const char* key, const std::string& missing) {
    if (!mObject.isObject() || !mObject.isMember(key)) return missing;
    const Json::Value& value = mObject[key];
    if (value.isString()) return value.asString();
    complain(value, fmt::format("{}: a string is accepted", key));
    return missing;
}

std::optional<bool> JsonFields::boolean(const char* key) {
    if (!mObject.isObject() || !mObject.isMember(key)) return std::nullopt;
    const Json::Value& value = mObject[key];
    if (value.isBool()) return value.asBool();
    complain(value, fmt::format("{}: true and false are accepted", key));
    return std::nullopt;
}

const Json::Value& JsonFields::list(const char* key) {
    static const Json::Value kEmpty(Json::arrayValue);
    if (!mObject.isObject() || !mObject.isMember(key)) return kEmpty;
    if (mObject[key].isArray()) return mObject[key];
    complain(mObject[key], fmt::format("{}: a list is accepted", key));
    return kEmpty;
}

}  // namespace vibctl
