// SPDX-License-Identifier: Apache-2.0
//
// What the kernel tells of another process.
#pragma once

#include <sys/types.h>

#include <string>
#include <vector>

namespace qvx::test {

// The names in a directory of the process's own in /proc: "fd" for its descriptors, "task" for its
// threads. Empty when the process has ended.
std::vector<std::string> entriesOf(pid_t process, const std::string& directory);

// The memory that no other process shares, in KiB; 0 when the process has ended.
int privateMemory(pid_t process);

}  // namespace qvx::test
