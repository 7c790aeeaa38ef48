// SPDX-License-Identifier: Apache-2.0
// Calls of the maker's interface as any user, and the journal in words.
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "phone_control.h"

namespace qvx::test {

// One call by another user of the phone that is up; otherwise as Phone::call().
nlohmann::json callAs(const std::string& user, const std::vector<std::string>& words);

// "performFifoHapticEngine 25" as the words of a call of the extension.
std::vector<std::string> extensionCall(std::string_view words);

// What the driver was asked since the last reset, in order. Closing is left out: the kernel tells
// of it when it likes.
//   "open LEAF O_RDWR"      "read LEAF SIZE"      "write LEAF DATA"
//   "upload LENGTH CUSTOM_HEX"      "event CODE VALUE"      "erase ID"
// What did not go as asked ends with " = " and the error's name or the count that was taken.
std::vector<std::string> journalInWords(const Phone& phone);

}  // namespace qvx::test
