// SPDX-License-Identifier: Apache-2.0
//
// Everything the code under test did, in one sequence: its log lines and its calls to the driver.
// FakeKernel and LogCapture note their records here.
#pragma once

#include <string>
#include <vector>

namespace sequence {

void note(std::string event);

// The events of the calling thread since forget(), calls and log lines as FakeKernel::calls() and
// LogCapture::lines() have them.
std::vector<std::string> events();

// Forgets the events of all threads.
void forget();

// The log lines that did not stand where they belong beside their driver call, on any thread: a
// line that announces an access comes right before it, and one that tells its outcome right after
// the node was closed. Empty when all is in order.
std::vector<std::string> misplaced();

}  // namespace sequence
