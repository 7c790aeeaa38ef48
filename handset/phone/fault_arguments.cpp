// SPDX-License-Identifier: Apache-2.0
//
// A fault on the command line.
#include "handset/phone/fault_arguments.h"

#include <algorithm>
#include <cctype>

#include <fmt/format.h>
#include <nlohmann/json.hpp>

namespace handset {
namespace {

using android::base::Error;
using android::base::Result;

bool isNumber(const std::string& text) {
    return !text.empty() && text.size() < 19 &&
           std::all_of(text.begin(), text.end(), [](unsigned char c) { return isdigit(c) != 0; });
}

nlohmann::json valueOf(const std::string& text) {
    if (text == "true") return true;
    if (text == "false") return false;
    if (isNumber(text)) return std::stoull(text);
    if (text.starts_with('-') && isNumber(text.substr(1))) return std::stoll(text);
    return text;
}

}  // namespace

Result<std::string> faultFromArguments(const std::vector<std::string>& words) {
    if (words.size() == 1 && words.front().starts_with("{")) {
        std::string object = words.front();
        std::replace(object.begin(), object.end(), '\n', ' ');  // the request is one line
        return object;
    }
    nlohmann::json object = nlohmann::json::object();
    for (const std::string& word : words) {
        const size_t sign = word.find('=');
        if (sign == std::string::npos || sign == 0) {
            return Error() << fmt::format(
                           "\"{}\": a JSON object, or words like node=PATH op=write "
                           "errno=EIO times=1, expected",
                           word);
        }
        const std::string key = word.substr(0, sign);
        if (object.contains(key)) return Error() << fmt::format("\"{}\" is given twice", key);
        object[key] = valueOf(word.substr(sign + 1));
    }
    return object.dump(-1, ' ', false, nlohmann::json::error_handler_t::replace);
}

}  // namespace handset
