// SPDX-License-Identifier: Apache-2.0
#include "extension_calls.h"

#include <algorithm>
#include <sstream>

namespace qvx::test {
namespace {

using nlohmann::json;

std::string leafOf(const json& entry) {
    const std::string node = entry.value("node", "");
    return node.substr(node.rfind('/') + 1);
}

// How an entry's line ends, when the result is not the one that was asked for.
std::string ending(const json& entry, const char* key, const json& asked) {
    const json result = entry.value(key, json());
    if (result == asked) return "";
    return " = " + (result.is_string() ? result.get<std::string>() : result.dump());
}

std::string number(const json& entry, const char* key) {
    return std::to_string(entry.value(key, -1));
}

std::string inWords(const json& entry) {
    const std::string op = entry.value("op", "");
    if (op == "open") {
        return "open " + leafOf(entry) + " " + entry.value("flags", "") + ending(entry, "error", 0);
    }
    if (op == "read") return "read " + leafOf(entry) + " " + number(entry, "size");
    if (op == "write") {
        const std::string data = entry.value("data", "");
        return "write " + leafOf(entry) + " " + data + ending(entry, "result", data.size());
    }
    if (op == "upload")
        return "upload " + number(entry, "length") + " " + entry.value("custom_hex", "");
    if (op == "event") return "event " + number(entry, "code") + " " + number(entry, "value");
    if (op == "erase") return "erase " + number(entry, "id");
    return op;
}

}  // namespace

std::vector<json> callAllAs(const std::string& user, const std::vector<std::string>& calls) {
    std::string script;  // one process for all calls, because a process costs much in the guest
    for (const std::string& call : calls) script += "vibctl --json ext " + call + "\n";
    std::istringstream out(
            runCommand({"phone", "exec", "--user", user, "--", "sh", "-c", script}).out);
    std::vector<json> answers;
    for (std::string line; std::getline(out, line);) {
        answers.push_back(json::parse(line, nullptr, false));
    }
    return answers;
}

std::vector<std::string> extensionCall(std::string_view words) {
    std::vector<std::string> call = {"ext"};
    std::istringstream stream{std::string(words)};
    for (std::string word; stream >> word;) call.push_back(word);
    return call;
}

std::vector<std::string> journalInWords(const Phone& phone, size_t skipped) {
    std::vector<std::string> lines;
    for (const json& entry : phone.journal()) {
        if (entry.value("op", "") != "close") lines.push_back(inWords(entry));
    }
    lines.erase(lines.begin(),
                lines.begin() + static_cast<ptrdiff_t>(std::min(skipped, lines.size())));
    return lines;
}

}  // namespace qvx::test
