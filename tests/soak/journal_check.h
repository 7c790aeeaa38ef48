// SPDX-License-Identifier: Apache-2.0
//
// Holds what the users of a soak were answered against what the driver saw.
//
// The service serves one request after another, so the journal is made of whole requests: those of a
// user in the user's order, each between its begin and its end. A request that is answered with ok has
// all its lines there, one that is answered with EX_ILLEGAL_STATE those up to the one that failed. One
// that nobody answered, because the service or its user was killed, may have left any number of them.
#pragma once

#include <string>
#include <vector>

#include "tests/soak/user.h"

namespace qvx::test {

// What is wrong: answers that are not the ones of the table, lines nobody asked for, and answers that
// the driver never saw the cause of. `journal` is its file.
std::vector<std::string> disagreements(const std::vector<const User*>& users,
                                       std::span<const Request> table, const std::string& journal);

}  // namespace qvx::test
