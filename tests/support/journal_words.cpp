// SPDX-License-Identifier: Apache-2.0
#include "tests/support/journal_words.h"

namespace qvx::test {
namespace {

using nlohmann::json;

std::string leafOf(const json& line) {
    const std::string node = line.value("node", "");
    return node.substr(node.rfind('/') + 1);
}

std::string number(const json& line, const char* key) {
    return std::to_string(line.value(key, -1));
}

std::string request(const json& line) {
    const std::string op = line.value("op", "");
    if (op == "open") return "open " + leafOf(line) + " " + line.value("flags", "");
    if (op == "read") return "read " + leafOf(line) + " " + number(line, "size");
    if (op == "write") return "write " + leafOf(line) + " " + line.value("data", "");
    if (op == "upload") {
        return "upload " + number(line, "length") + " " + line.value("custom_hex", "");
    }
    if (op == "event") return "event " + number(line, "code") + " " + number(line, "value");
    if (op == "erase") return "erase " + number(line, "id");
    return op + " " + leafOf(line);
}

std::string failure(const json& line) {
    for (const char* key : {"result", "error"}) {
        const json result = line.value(key, json());
        if (result.is_string()) return " = " + result.get<std::string>();
    }
    const bool isShort = line.value("op", "") == "write" &&
                         line.value("result", json()) != line.value("data", "").size();
    return isShort ? " = " + number(line, "result") : "";
}

}  // namespace

std::string inWords(const json& line) {
    return request(line) + failure(line);
}

}  // namespace qvx::test
