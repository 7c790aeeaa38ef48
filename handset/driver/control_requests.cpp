// SPDX-License-Identifier: Apache-2.0
// What a running driver can be asked for.
#include "driver/control_requests.h"

#include <fmt/format.h>

#include "driver/json_fields.h"
#include "driver/json_text.h"
#include "driver/profile_reader.h"

namespace handset {
namespace {

constexpr std::string_view kDone = "ok";

std::string refusal(std::string_view why) {
    return fmt::format("error {}", why);
}

std::string noSuchNode(std::string_view path) {
    return refusal(fmt::format("the profile has no node \"{}\"", path));
}

}  // namespace

std::string ControlRequests::answer(std::string_view request) {
    settle_();
    const size_t blank = request.find(' ');
    const std::string_view verb = request.substr(0, blank);
    const std::string_view argument =
            blank == std::string_view::npos ? std::string_view() : request.substr(blank + 1);
    if (verb == "fault") return addFault(argument);
    if (verb == "get") return getNode(argument);
    if (verb == "set") return setNode(argument);
    if (verb == "clear") {
        faults_.clear();
    } else if (verb == "reset") {
        journal_.reset();
    } else if (verb == "stop") {
        stopWanted_ = true;
    } else if (verb != "settle") {
        return refusal(fmt::format(
                "unknown request \"{}\"; accepted: fault, clear, reset, get, set, settle, stop",
                verb));
    }
    return std::string(kDone);
}

std::string ControlRequests::addFault(std::string_view json) {
    Result<FaultSpec> fault = parseFault(json, profile_);
    if (!fault) return refusal(fault.error().text);
    faults_.add(std::move(*fault));
    return std::string(kDone);
}

std::string ControlRequests::getNode(std::string_view path) const {
    const Node* node = tree_.nodeAt(path);
    if (node == nullptr) return noSuchNode(path);
    const std::string text = node->text();
    fmt::memory_buffer reply;
    reply.append(kDone.data(), kDone.data() + kDone.size());
    reply.push_back(' ');
    if (!isUtf8(text)) {
        constexpr std::string_view kHex = "hex ";
        reply.append(kHex.data(), kHex.data() + kHex.size());
        appendHexString(reply, text);
    } else {
        appendJsonString(reply, text);
    }
    return fmt::to_string(reply);
}

std::string ControlRequests::setNode(std::string_view argument) const {
    const size_t blank = argument.find(' ');
    const std::string_view path = argument.substr(0, blank);
    Node* node = tree_.nodeAt(path);
    if (node == nullptr) return noSuchNode(path);
    if (blank == std::string_view::npos) return refusal("set: a text expected after the path");
    const Result<Json> text = parseJson(argument.substr(blank + 1));
    if (!text) return refusal(text.error().text);
    if (!text->is_string()) return refusal("set: a JSON string expected after the path");
    node->setText(text->get<std::string>());
    return std::string(kDone);
}

}  // namespace handset
