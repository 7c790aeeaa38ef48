// SPDX-License-Identifier: Apache-2.0
#include "tests/system/extension_calls.h"

#include <algorithm>
#include <sstream>

#include "tests/support/journal_words.h"

namespace qvx::test {

using nlohmann::json;

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
