// SPDX-License-Identifier: Apache-2.0
//
// Counts the system calls of a piece of code by tracing a process of its own (ptrace(2)); needs no
// privilege.
#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>

namespace bench {

// System calls by what they are for.
struct CallCounts {
    int node = 0;                      // open, write, close and ioctl of the driver's files
    std::map<std::string, int> other;  // by name

    int otherTotal() const;
    int total() const { return node + otherTotal(); }
};

// Forks a process that runs `prepare`, then `request`, then `finish`, and counts the calls of
// `request`, those of threads that it starts to their end included. Empty when the process fails
// or may not be traced.
std::optional<CallCounts> countCalls(const std::function<void()>& prepare,
                                     const std::function<void()>& request,
                                     const std::function<void()>& finish);

}  // namespace bench
