// SPDX-License-Identifier: Apache-2.0
//
// One thing that goes wrong: at which call, and what the caller gets instead.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include <nlohmann/json.hpp>

namespace handset {

// The name faults and the journal use for the motor, where a node's path stands otherwise.
inline constexpr std::string_view kMotorNode = "motor";

// The calls a fault may apply to. Upload and erase are the motor's alone, read the nodes' alone.
enum class FaultOp { kOpen, kRead, kWrite, kUpload, kErase };

// The operation's name in a profile: "open", "read", "write", "upload", "erase".
std::string_view faultOpName(FaultOp op);

// What happens to one call.
struct FaultAction {
    int error = 0;                       // errno the call fails with, or 0
    std::optional<size_t> shortCount;    // bytes a read or write transfers at most
    std::chrono::milliseconds delay{0};  // pause before the answer
    bool unplug = false;                 // this and every later call fails with ENODEV
    std::optional<std::string> text;     // what a read shows in place of the node's contents

    // True where anything goes wrong at all.
    bool strikes() const {
        return error != 0 || shortCount || delay.count() != 0 || unplug || text.has_value();
    }
};

// A fault as a profile gives it. Of the calls it matches it lets `after` pass, then strikes the
// last one of every `every`, `times` times.
struct Fault {
    std::string node;  // a node's path or kMotorNode
    FaultOp op = FaultOp::kOpen;
    FaultAction action;
    uint64_t after = 0;  // calls of this kind let through first
    uint64_t times = 0;  // calls it then strikes; 0: all
    uint64_t every = 1;  // 3: every third call
};

// The action and the whole fault as JSON, with a profile's keys.
nlohmann::ordered_json toJson(const FaultAction& action);
nlohmann::ordered_json toJson(const Fault& fault);

}  // namespace handset
