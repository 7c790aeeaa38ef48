// SPDX-License-Identifier: Apache-2.0
//
// Work that needs files and processes, and leaves neither behind, also when it is interrupted.
#pragma once

#include <functional>
#include <string>

namespace bench {

// Runs `work` with a new directory, in a process group of its own. The directory is removed at the end,
// and the group ended when this process is told to end (SIGHUP, SIGINT, SIGTERM). The work's
// result, which is an exit status; 128 and the signal's number when a signal ended it.
int runInTemporaryDirectory(const std::function<int(const std::string& directory)>& work);

}  // namespace bench
