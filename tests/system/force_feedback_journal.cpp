// SPDX-License-Identifier: Apache-2.0
#include "tests/system/force_feedback_journal.h"

#include "tests/support/journal_words.h"

namespace qvx::test {

using nlohmann::json;

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
    for (const json& line : motorLines(phone)) requests.push_back(inWords(line));
    return requests;
}

}  // namespace qvx::test
