// SPDX-License-Identifier: Apache-2.0
#include "tests/sequence.h"

#include <map>
#include <mutex>
#include <string_view>
#include <thread>
#include <utility>

namespace sequence {
namespace {

std::mutex mutex;
std::map<std::thread::id, std::vector<std::string>> threads;

// Which neighbour a log line has: the event before it or after it begins with `neighbour` and ends
// as a call that worked or that failed does.
enum class Where { kBefore, kAfter };
enum class Outcome { kAny, kWorked, kFailed };

struct Rule {
    std::string_view line;  // a part of the log line
    Where where;
    std::string_view neighbour;
    Outcome outcome;
};

// clang-format off
constexpr Rule kRules[] = {
    {": >> writeNode node:",                        Where::kAfter,  "open ",  Outcome::kAny},
    {": << writeNode node OK : ",                   Where::kBefore, "close ", Outcome::kAny},
    {": >> readNode node:",                         Where::kAfter,  "open ",  Outcome::kAny},
    {": << readNode done",                          Where::kBefore, "close ", Outcome::kAny},
    {": >> readNodeAsString node:",                 Where::kAfter,  "open ",  Outcome::kAny},
    {": << readNodeAsString success",               Where::kBefore, "close ", Outcome::kAny},
    {": isNodeExist node:",                         Where::kAfter,  "open ",  Outcome::kAny},
    {"HW_API: true",                                Where::kBefore, "open ",  Outcome::kWorked},
    {"HW_API: true",                                Where::kAfter,  "close ", Outcome::kAny},
    {"HW_API: false",                               Where::kBefore, "open ",  Outcome::kFailed},
    {" open failed. errno: ",                       Where::kBefore, "open ",  Outcome::kFailed},
    {"read failed. errno: ",                        Where::kBefore, "read ",  Outcome::kAny},
    {"read failed. errno: ",                        Where::kAfter,  "close ", Outcome::kAny},
    {"Read MAX limit. ",                            Where::kBefore, "close ", Outcome::kAny},
    {" string : ",                                  Where::kBefore, "close ", Outcome::kAny},
    {" is fail: ",                                  Where::kBefore, "open ",  Outcome::kFailed},
    {": ret : ",                                    Where::kBefore, "close ", Outcome::kAny},
    {" UNKNOWN_ERROR",                              Where::kBefore, "close ", Outcome::kAny},
    {"[get_input_field_value]fopen done ",          Where::kBefore, "open ",  Outcome::kWorked},
    {"[get_input_field_value]fopen error !! ",      Where::kBefore, "open ",  Outcome::kFailed},
    {"[get_input_field_value]fopen close()!! ",     Where::kBefore, "close ", Outcome::kAny},
    {"[hasFeature]fopen error!!",                   Where::kBefore, "open ",  Outcome::kFailed},
    {"]Input Node File Open: ",                     Where::kAfter,  "open ",  Outcome::kAny},
    {"]open fail: ",                                Where::kBefore, "open ",  Outcome::kFailed},
    {"]ioctl success ,uploaded effect with ID: ",   Where::kBefore, "upload ", Outcome::kWorked},
    {"]ioctl fail: ",                               Where::kBefore, "upload ", Outcome::kFailed},
    {"]Clear Memory - ioctl fail: ",                Where::kBefore, "erase ", Outcome::kFailed},
    {"]write fail: ",                               Where::kBefore, "event ", Outcome::kFailed},
    {"inputFD close",                               Where::kBefore, "close ", Outcome::kAny},
};
// clang-format on

// A command that is too long for a node is refused without a call, and a read that claims too much is
// logged by two lines.
bool isException(const std::string& before) {
    return before.find(">> writeNodeByStringOnlyForWriting") != std::string::npos ||
           before.find("Read MAX limit.") != std::string::npos;
}

bool fits(const Rule& rule, const std::string& neighbour) {
    const bool failed = neighbour.find(" = ") != std::string::npos;
    return neighbour.rfind(rule.neighbour, 0) == 0 &&
           (rule.outcome == Outcome::kAny || failed == (rule.outcome == Outcome::kFailed));
}

bool isLogLine(const std::string& event) {
    return event.size() > 1 && event[1] == ' ' && (event[0] == 'I' || event[0] == 'E');
}

}  // namespace

void note(std::string event) {
    const std::lock_guard lock(mutex);
    threads[std::this_thread::get_id()].push_back(std::move(event));
}

std::vector<std::string> events() {
    const std::lock_guard lock(mutex);
    return threads[std::this_thread::get_id()];
}

void forget() {
    const std::lock_guard lock(mutex);
    threads.clear();
}

std::vector<std::string> misplaced() {
    const std::lock_guard lock(mutex);
    std::vector<std::string> found;
    for (const auto& [thread, events] : threads) {
        for (size_t i = 0; i < events.size(); ++i) {
            if (!isLogLine(events[i])) continue;
            const std::string before = i == 0 ? "" : events[i - 1];
            const std::string after = i + 1 == events.size() ? "" : events[i + 1];
            for (const Rule& rule : kRules) {
                if (events[i].find(rule.line) == std::string::npos || isException(before)) continue;
                const std::string& neighbour = rule.where == Where::kBefore ? before : after;
                if (!fits(rule, neighbour)) found.push_back(events[i] + " beside " + neighbour);
            }
        }
    }
    return found;
}

}  // namespace sequence
