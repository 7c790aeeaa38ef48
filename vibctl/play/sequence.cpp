// SPDX-License-Identifier: Apache-2.0
//
// Sequence files: see plan.h.
#include <android-base/strings.h>
#include <fmt/format.h>

#include "vibctl/find_method.h"
#include "vibctl/play/json_fields.h"
#include "vibctl/play/plan.h"

namespace vibctl {

namespace {

// A day.
constexpr double kLatestMs = 86400000;

// The number above means "no user" to the kernel.
constexpr double kLargestUser = 4294967294;

TimedCall readCall(JsonFields& fields, double earliest) {
    fields.expectKeys({"at", "iface", "method", "args", "callback", "uid"});
    TimedCall call;
    const double at = fields.number("at", earliest, kLatestMs, earliest);
    call.at = std::chrono::microseconds(static_cast<int64_t>(at * 1000));
    call.iface = fields.string("iface", "std");
    call.words.push_back(fields.string("method", ""));
    for (const Json::Value& word : fields.list("args")) {
        if (word.isArray() || word.isObject() || word.isNull()) {
            fields.complain(word, "args: strings, numbers and booleans are accepted");
        } else {
            call.words.push_back(word.asString());
        }
    }
    call.callback = fields.boolean("callback");
    constexpr double kNobody = -1;
    const double uid = fields.number("uid", 0, kLargestUser, kNobody);
    if (uid != kNobody) call.uid = static_cast<unsigned>(uid);
    return call;
}

// Whether the service's interface has such a call.
Problem checkCall(const TimedCall& timed) {
    if (timed.iface != "std" && timed.iface != "ext") {
        return fmt::format("iface: {} is neither std nor ext", inQuotes(timed.iface));
    }
    const CommandLine line = commandLineOf(timed);
    const Method* method = nullptr;
    if (Problem problem = findMethod(line, method)) return "method: " + *problem;
    Call call;
    if (Problem problem = prepareCall(line, *method, call)) return "args: " + *problem;
    return std::nullopt;
}

}  // namespace

CommandLine commandLineOf(const TimedCall& timed) {
    CommandLine line;
    line.command = timed.iface;
    line.method = timed.words[0];
    line.arguments.assign(timed.words.begin() + 1, timed.words.end());
    const Method* method = nullptr;
    const bool awaits = (timed.iface == "std" || timed.iface == "ext") &&
                        !findMethod(line, method) && method->traits.awaitsCompletion;
    line.callback = timed.callback.value_or(awaits);
    return line;
}

Problem planSequence(const std::string& text, Plan& plan) {
    int number = 0;
    double earliest = 0;
    for (const std::string& line : android::base::Split(text, "\n")) {
        ++number;
        if (android::base::Trim(line).empty()) continue;
        Json::Value object;
        if (Problem problem = parseJson(line, number, object)) return problem;
        Problem problem;
        JsonFields fields(object, line, number, problem);
        plan.calls.push_back(readCall(fields, earliest));
        if (problem) return problem;
        problem = checkCall(plan.calls.back());
        if (problem) return fmt::format("line {}: {}", number, *problem);
        earliest = static_cast<double>(plan.calls.back().at.count()) / 1000;
    }
    if (plan.calls.empty()) return "no call in it";
    return std::nullopt;
}

}  // namespace vibctl
