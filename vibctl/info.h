// SPDX-License-Identifier: Apache-2.0
//
// All that a client can ask the service without making it vibrate, on one screen.
#pragma once

#include <functional>
#include <string>

#include "vibctl/method.h"
#include "vibctl/outcome.h"

namespace vibctl {

// Makes a call of the interface "std" or "ext".
using Ask = std::function<Outcome(const std::string& iface, const Call& call)>;

// Asks every method of both interfaces that has a result and takes no argument, the duration of
// every primitive and the amplitudes of every type. The outcome's text has a line for each answer,
// and one for all that is not offered; its result is an object of objects, {"std":{"METHOD":...},
// "ext":{...}}, with null for what is not offered. Ends with the first call that does not get
// through.
Outcome askEverything(const Ask& ask);

}  // namespace vibctl
