// SPDX-License-Identifier: Apache-2.0
#include "tests/soak/journal_check.h"

#include <algorithm>
#include <cinttypes>
#include <cstdio>
#include <deque>
#include <fstream>
#include <string_view>
#include <unordered_map>

#include <fmt/format.h>
#include <nlohmann/json.hpp>

#include "tests/support/journal_words.h"

namespace qvx::test {
namespace {

constexpr int32_t kIllegalState = -5;

// A line of the journal that tells of more than a look at a node.
struct Line {
    int64_t us;
    int pid;
    std::string_view words;
    bool failed;
};

// A request that has, or may have, lines in the journal.
struct Awaited {
    const Asked* asked;
    const Request* request;
    std::vector<std::string> lines;

    bool isAnswered() const { return asked->end > 0 && asked->answer.status == 0; }
};

// What a line says from "op" on. The same comes again and again, and parsing costs much in the guest.
const std::string& wordsOf(const std::string& line) {
    static std::unordered_map<std::string, std::string> known;
    const auto [entry, isNew] = known.try_emplace(line.substr(line.find("\"op\"")));
    if (isNew) entry->second = inWords(nlohmann::json::parse("{" + entry->first, nullptr, false));
    return entry->second;
}

std::vector<Line> linesOf(const std::string& path) {
    std::vector<Line> lines;
    std::ifstream journal(path);
    for (std::string text; std::getline(journal, text);) {
        const bool looks = text.find("\"op\":\"open\"") != std::string::npos ||
                           text.find("\"op\":\"read\"") != std::string::npos;
        if (text.find("\"op\":\"close\"") != std::string::npos ||
            (looks && text.find("\":\"E") == std::string::npos)) {
            continue;
        }
        const std::string& words = wordsOf(text);
        // An effect is erased before the next one, if there is one. What is interrupted comes again.
        if (words.starts_with("erase ") || words.ends_with(" = EINTR")) continue;
        Line line{0, 0, words, words.find(" = ") != std::string::npos};
        std::sscanf(text.c_str(), R"({"n":%*d,"us":%)" SCNd64 R"(,"pid":%d)", &line.us, &line.pid);
        lines.push_back(line);
    }
    return lines;
}

bool isFailureOf(const Line& line, const std::string& expected) {
    if (!line.failed) return false;
    const std::string leaf = expected.substr(expected.find(' ') + 1);
    return line.words.starts_with(expected + " = ") ||
           line.words.starts_with("open " + leaf.substr(0, leaf.find(' ')) + " ");
}

class Matcher {
  public:
    explicit Matcher(std::vector<Line> lines) : mLines(std::move(lines)) {}

    void add(std::deque<Awaited> ofOneUser) { mUsers.push_back(std::move(ofOneUser)); }

    std::vector<std::string> match() {
        std::vector<std::string> wrong;
        for (mAt = 0; mAt < mLines.size();) {
            const size_t taken = takeNext();
            if (taken == 0 && !isStart(mLines[mAt])) {
                wrong.push_back(fmt::format("nobody asked for \"{}\" at {}", mLines[mAt].words,
                                            mLines[mAt].us));
                return wrong;  // what follows has lost its place
            }
            mAt += std::max<size_t>(taken, 1);
        }
        for (const auto& user : mUsers) {
            for (const Awaited& left : user) {
                if (!left.isAnswered()) continue;
                wrong.push_back(
                        fmt::format("{} {} was answered with {} at {}, and the driver did "
                                    "not see it",
                                    left.request->name, left.asked->number,
                                    left.asked->answer.exception, left.asked->end.load()));
            }
        }
        return wrong;
    }

  private:
    // What a service writes when it starts.
    static bool isStart(const Line& line) {
        return line.words.starts_with("write use_kyp_index ") ||
               line.words.starts_with("write f0_stored ");
    }

    // How many lines from here on are this request's; 0: it does not fit.
    size_t fits(const Awaited& awaited) const {
        const bool isAnswered = awaited.isAnswered();
        size_t count = 0;
        for (const std::string& expected : awaited.lines) {
            const Line* line = mAt + count < mLines.size() ? &mLines[mAt + count] : nullptr;
            if (line == nullptr || line->pid != mLines[mAt].pid) return isAnswered ? 0 : count;
            const bool isLate = isAnswered && line->us > awaited.asked->end;
            if (isLate || line->us < awaited.asked->begin) return 0;
            ++count;
            if (isFailureOf(*line, expected)) {
                const bool isDecisive = count <= awaited.request->decisive;
                const int32_t exception = isDecisive ? kIllegalState : 0;
                return !isAnswered || awaited.asked->answer.exception == exception ? count : 0;
            }
            if (line->words != expected) return 0;
        }
        return isAnswered && awaited.asked->answer.exception != 0 ? 0 : count;
    }

    // Takes the request that the next lines are of, and says how many they are. Of equals the one
    // that ended first goes first; those that were answered go before the others.
    size_t takeNext() {
        std::deque<Awaited>* owner = nullptr;
        size_t place = 0;
        size_t taken = 0;
        int64_t bestEnd = INT64_MAX;
        for (auto& user : mUsers) {
            for (size_t i = 0; i < user.size(); ++i) {
                const bool isAnswered = user[i].isAnswered();
                const size_t count = fits(user[i]);
                const int64_t end = isAnswered ? user[i].asked->end.load() : INT64_MAX - 1;
                if (count > 0 && end < bestEnd) {
                    owner = &user;
                    place = i;
                    taken = count;
                    bestEnd = end;
                }
                if (isAnswered) break;
            }
        }
        if (owner != nullptr) owner->erase(owner->begin() + static_cast<ptrdiff_t>(place));
        return taken;
    }

    std::vector<Line> mLines;
    std::vector<std::deque<Awaited>> mUsers;
    size_t mAt = 0;
};

}  // namespace

std::vector<std::string> disagreements(const std::vector<const User*>& users,
                                       std::span<const Request> table, const std::string& journal) {
    std::vector<std::string> wrong;
    Matcher matcher(linesOf(journal));
    for (const User* user : users) {
        std::deque<Awaited> awaited;
        for (const Asked& asked : user->asked()) {
            const Request& request = table[asked.request];
            const bool isRefused = request.isExtension && !user->isPrivileged();
            Awaited one{&asked, &request, {}};
            if (!isRefused) one.lines = journalOf(request, asked.number);
            const Answer expected = isRefused ? Answer{} : request.answer;
            const Answer failed{0, kIllegalState, 0};
            const bool mayFail = !one.lines.empty() && asked.answer == failed;
            if (one.isAnswered() ? asked.answer != expected && !mayFail
                                 : asked.end > 0 && asked.answer.status != kDead &&
                                           asked.answer != expected) {
                wrong.push_back(fmt::format("user {}: {} {} was answered with {}, {}, {}",
                                            user->uid(), request.name, asked.number,
                                            asked.answer.status, asked.answer.exception,
                                            asked.answer.value));
            }
            if (!one.lines.empty()) awaited.push_back(std::move(one));
        }
        matcher.add(std::move(awaited));
    }
    const std::vector<std::string> unseen = matcher.match();
    wrong.insert(wrong.end(), unseen.begin(), unseen.end());
    return wrong;
}

}  // namespace qvx::test
