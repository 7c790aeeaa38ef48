// SPDX-License-Identifier: Apache-2.0
// One thing that goes wrong: at which call, and what the caller gets instead.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace handset {

/// The name faults and the journal use for the motor, where a node's path stands otherwise.
inline constexpr std::string_view kMotorNode = "motor";

/// The calls a fault may apply to. Upload and erase are the motor's alone, read the nodes' alone.
enum class FaultOp { kOpen, kRead, kWrite, kUpload, kErase };

/// The operation's name in a profile: "open", "read", "write", "upload", "erase".
std::string_view faultOpName(FaultOp op);

/// What happens to one call.
struct FaultAction {
    int error = 0;                       ///< errno the call fails with, or 0
    std::optional<size_t> shortCount;    ///< bytes a read or write transfers at most
    std::chrono::milliseconds delay{0};  ///< pause before the answer
    bool unplug = false;                 ///< this and every later call fails with ENODEV
};

/// A fault as a profile gives it.
struct FaultSpec {
    std::string node;  ///< a node's path or kMotorNode
    FaultOp op = FaultOp::kOpen;
    FaultAction action;
    uint64_t after = 0;  ///< calls of this kind let through first
    uint64_t times = 0;  ///< calls it then applies to; 0: all
};

}  // namespace handset
