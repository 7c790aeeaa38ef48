// SPDX-License-Identifier: Apache-2.0
//
// Calls of the vendor's interface as any user, and the journal in words.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "tests/support/phone_control.h"

namespace qvx::test {

// Calls of the extension, each as "performFifoHapticEngine 25", one after another by one user of
// the phone that is up: what vibctl printed for each, parsed.
std::vector<nlohmann::json> callAllAs(const std::string& user,
                                      const std::vector<std::string>& calls);

// One such call as the words for Phone::call().
std::vector<std::string> extensionCall(std::string_view words);

// What the driver was asked since the last reset, in words (journal_words.h) and in order, without
// closing and without the first `skipped` lines.
std::vector<std::string> journalInWords(const Phone& phone, size_t skipped = 0);

}  // namespace qvx::test
