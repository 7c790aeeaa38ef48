// SPDX-License-Identifier: Apache-2.0
//
// Calls that carry something, through the binder library and between two bare loops.
#pragma once

#include <string>
#include <vector>

#include "bench/guest_figures.h"

namespace bench {

struct LibraryCall {
    std::string name;
    Series library;
    Series bare;  // the same parcel, which nobody reads
};

// A call with a string, with an array and with a binder, counted `calls` times each. A service manager
// runs, this process has not used binder before `service`, which this ends, was started, and no bare service runs.
pid_t startLibraryService();
std::vector<LibraryCall> countLibraryCalls(pid_t service, int calls);

}  // namespace bench
