// SPDX-License-Identifier: Apache-2.0
//
// What a force-feedback motor saw of the service, read from the driver's journal.
#pragma once

#include <string>
#include <vector>

#include "tests/support/phone_control.h"

namespace qvx::test {

// The motor's part of the journal in words (journal_words.h).
std::vector<std::string> motorRequests(const Phone& phone);

// The motor's part of the journal as it stands, but for what differs from run to run: running
// number, time and process.
std::vector<nlohmann::json> motorLines(const Phone& phone);

}  // namespace qvx::test
