// SPDX-License-Identifier: Apache-2.0
#include "force_feedback_journal.h"

namespace qvx::test {
namespace {

using nlohmann::json;

std::string numberOf(const json& line, const char* key) {
    return std::to_string(line.value(key, -1));
}

std::string inShort(const json& line) {
    const std::string op = line.value("op", "");
    if (op == "open") return "open " + line.value("flags", "");
    if (op == "upload")
        return "upload " + numberOf(line, "length") + " " + line.value("custom_hex", "");
    if (op == "erase") return "erase " + numberOf(line, "id");
    if (op == "event") return "event " + numberOf(line, "code") + " " + numberOf(line, "value");
    return op;
}

std::string failureOf(const json& line) {
    for (const char* key : {"result", "error"}) {
        if (line.contains(key) && line[key].is_string()) {
            return " = " + line[key].get<std::string>();
        }
    }
    return "";
}

}  // namespace

std::vector<json> motorLines(const Phone& phone) {
    std::vector<json> lines;
    for (json line : phone.journal()) {
        if (line.value("node", "") != "motor") continue;
        for (const char* key : {"n", "us", "pid"}) line.erase(key);
        lines.push_back(line);
    }
    return lines;
}

std::vector<std::string> motorRequests(const Phone& phone) {
    std::vector<std::string> requests;
    for (const json& line : motorLines(phone)) requests.push_back(inShort(line) + failureOf(line));
    return requests;
}

}  // namespace qvx::test
