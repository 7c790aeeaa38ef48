// SPDX-License-Identifier: Apache-2.0
//
// A line of the driver's journal in words, short enough to be compared by eye:
//
//   "open LEAF O_RDWR"   "read LEAF SIZE"   "write LEAF DATA"   "close LEAF"
//   "upload LENGTH CUSTOM_HEX"   "event CODE VALUE"   "erase ID"
//
// LEAF is the last part of the node's path, "motor" for the motor. What did not go as asked ends
// with " = " and the error's name or, of a write, the count that was taken.
#pragma once

#include <string>

#include <nlohmann/json.hpp>

namespace qvx::test {

std::string inWords(const nlohmann::json& line);

}  // namespace qvx::test
