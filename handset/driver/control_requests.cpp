// SPDX-License-Identifier: Apache-2.0
//
// What a running driver can be asked for.
#include "handset/driver/control_requests.h"

#include <android-base/parseint.h>
#include <fmt/format.h>

#include "handset/driver/printable.h"
#include "handset/driver/profile_reader.h"

namespace handset {
namespace {

using android::base::Result;
using std::chrono::milliseconds;

constexpr std::string_view kDone = "ok";
constexpr std::string_view kKernelsNodes = "the nodes are the kernel's: read and write their files";
constexpr unsigned kLongestWait = 3600000;  // an hour, in milliseconds

std::string refusal(std::string_view why) {
    return fmt::format("error {}", why);
}

std::string noSuchNode(std::string_view path) {
    return refusal(fmt::format("the profile has no node \"{}\"", path));
}

// Splits at the first space: the second part is empty where there is none.
std::pair<std::string_view, std::string_view> splitWord(std::string_view line) {
    const size_t space = line.find(' ');
    if (space == std::string_view::npos) return {line, {}};
    return {line.substr(0, space), line.substr(space + 1)};
}

}  // namespace

std::string ControlRequests::answer(std::string_view request) {
    mSettle();
    const auto [verb, argument] = splitWord(request);
    if (verb == "fault") return addFault(argument);
    if (verb == "faults") return listFaults();
    if (verb == "plug" || verb == "unplug") return schedule(verb, argument);
    if (verb == "get") return getNode(argument);
    if (verb == "set") return setNode(argument);
    if (verb == "clear") {
        mFaults.clear();
    } else if (verb == "reset") {
        mJournal.reset();
    } else if (verb == "stop") {
        mStopWanted = true;
    } else if (verb != "settle") {
        return refusal(
                fmt::format("unknown request \"{}\"; accepted: fault, faults, clear, unplug, plug, "
                            "reset, get, set, settle, stop",
                            verb));
    }
    return std::string(kDone);
}

int ControlRequests::runDue() {
    while (!mDue.empty()) {
        const auto first = mDue.begin();
        const auto left = std::chrono::ceil<milliseconds>(first->first - Clock::now());
        if (left.count() > 0) return static_cast<int>(left.count());
        const std::function<void()> action = std::move(first->second);
        mDue.erase(first);
        action();
    }
    return -1;
}

std::string ControlRequests::addFault(std::string_view json) {
    Result<Fault> fault = parseFault(json, mProfile);
    if (!fault) return refusal(fault.error().message());
    if (auto done = mFaults.add(std::move(*fault)); !done) return refusal(done.error().message());
    return std::string(kDone);
}

std::string ControlRequests::listFaults() const {
    nlohmann::ordered_json list = nlohmann::ordered_json::array();
    for (const FaultInjector::Record& record : mFaults.list()) {
        list.push_back(toJson(record.fault));
        list.back()["seen"] = record.seen;
        list.back()["struck"] = record.struck;
    }
    return fmt::format("{} {}", kDone, list.dump());
}

// Unplugs or plugs in, at once or later.
std::string ControlRequests::schedule(std::string_view verb, std::string_view argument) {
    const auto [name, wait] = splitWord(argument);
    const std::string node(name);
    const bool known =
            node == kMotorNode ? mProfile.motor.has_value() : mProfile.findNode(node) != nullptr;
    if (!known) {
        return node == kMotorNode ? refusal("the profile has no motor") : noSuchNode(node);
    }
    unsigned after = 0;
    if (!wait.empty() && !android::base::ParseUint(std::string(wait), &after, kLongestWait)) {
        return refusal(fmt::format("{}: milliseconds from 0 to {} expected, not \"{}\"", verb,
                                   kLongestWait, wait));
    }
    const bool plugIn = verb == "plug";
    mDue.emplace(Clock::now() + milliseconds(after),
                 [this, node, plugIn] { plugIn ? mFaults.plug(node) : mFaults.unplug(node); });
    if (after == 0) runDue();
    return std::string(kDone);
}

std::string ControlRequests::getNode(std::string_view path) const {
    if (mTree == nullptr) return refusal(kKernelsNodes);
    const Node* node = mTree->nodeAt(path);
    if (node == nullptr) return noSuchNode(path);
    nlohmann::ordered_json content;
    putBytes(content, "text", "hex", node->text());
    if (content.contains("hex")) return fmt::format("{} hex {}", kDone, content["hex"].dump());
    return fmt::format("{} {}", kDone, content["text"].dump());
}

std::string ControlRequests::setNode(std::string_view argument) const {
    const auto [path, content] = splitWord(argument);
    if (mTree == nullptr) return refusal(kKernelsNodes);
    Node* node = mTree->nodeAt(path);
    if (node == nullptr) return noSuchNode(path);
    if (content.empty()) return refusal("set: a JSON string expected after the path");
    const Result<Json> text = parseJson(content);
    if (!text) return refusal(text.error().message());
    if (!text->is_string()) return refusal("set: a JSON string expected after the path");
    node->setText(text->get<std::string>());
    return std::string(kDone);
}

}  // namespace handset
