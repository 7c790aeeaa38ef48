// SPDX-License-Identifier: Apache-2.0
//
// One call of the service from the look-up to its answer and, where one is awaited, its callback;
// never longer than the command line allows.
#pragma once

#include "vibctl/binder_client.h"
#include "vibctl/command_line.h"
#include "vibctl/method.h"
#include "vibctl/outcome.h"

namespace vibctl {

// Finds the service of the interface `iface` and lets `work` ask it; noAnswer() when both together
// take longer than `limit`.
Outcome askService(const std::string& iface, std::chrono::milliseconds limit,
                   const std::function<Outcome(const Service& service)>& work);

// Makes the call with the callback and the limits that `line` asks for.
Outcome callMethod(const CommandLine& line, const Method& method, const Call& call);

// From now on SIGINT, SIGTERM and SIGHUP turn the motor off and then end the process with the status
// 128 + N. To be called before the process has a second thread.
void turnOffOnInterrupt();

}  // namespace vibctl
