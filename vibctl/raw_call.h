// SPDX-License-Identifier: Apache-2.0
//
// What the generated clients cannot send: a transaction by its number, and the request for a dump.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "vibctl/arguments.h"
#include "vibctl/binder_client.h"
#include "vibctl/outcome.h"

namespace vibctl {

// A transaction: its number and the 32-bit words behind its interface header, in the order and the
// byte order in which they are sent.
struct RawCall {
    uint32_t code = 0;
    std::vector<int32_t> words;
};

// Parses CODE and HEX, two digits for each byte and four bytes for each word, or says what is wrong.
Problem parseRawCall(Words arguments, RawCall& call);

// Sends it. The result is the reply in hexadecimal digits, its status header included; an exception
// in that header is the outcome's. Of a reply that is shorter than a status header, the result is
// all there is.
Outcome sendRaw(const Service& service, const RawCall& call);

// What the service writes about itself. Empty when it writes nothing.
Outcome dump(const Service& service);

}  // namespace vibctl
