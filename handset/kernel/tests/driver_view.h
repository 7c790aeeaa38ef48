// SPDX-License-Identifier: Apache-2.0
//
// What the two drivers have noted, brought to one form.
//
// The simulated driver stands where the kernel's file layer and input core
// stand on a phone, so its journal tells more than a real driver learns. What
// is more, and only that, is listed and shown in differences_guest_test.cpp.
#pragma once

#include <nlohmann/json.hpp>
#include <string>
#include <vector>

namespace handset
{

using Json = nlohmann::json;

// What a real driver would have been told, of a journal of the simulated one:
// its stores and its motor's calls. Reads are left out: a real driver is asked
// once for a text read in pieces.
std::vector<Json> asRealDriverIsTold(const std::vector<Json> &journal);

// The same lines, of the kernel module's report.
std::vector<Json> withoutReads(const std::vector<Json> &report);

// Lines in short, for tables: "write duration 3530300a = 4", "open motor
// O_RDWR", "erase 0".
std::vector<std::string> inShort(const std::vector<Json> &lines);

} // namespace handset
