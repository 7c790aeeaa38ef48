// SPDX-License-Identifier: Apache-2.0
//
// A phone's root as "vibctl doctor" looks at it: driver nodes, manifests and processes as plain
// files.
#pragma once

#include <sys/types.h>

#include <string>
#include <vector>

#include "tests/support/fake_root.h"

namespace fake {

class Root : public qvx::test::FakeRoot {
  public:
    // Replaces the first occurrence of `from` in a file.
    void edit(const std::string& path, const std::string& from, const std::string& to) const;

    // The nodes of a driver, each with some text.
    void putNodes(const std::string& directory, const std::vector<std::string>& names) const;

    // A process that sees this root; `words` are its command line, the first names its executable.
    void putProcess(pid_t pid, const std::vector<std::string>& words, uid_t uid) const;

    // State ('S', 'T') and start time of a process, in clock ticks.
    void putState(pid_t pid, char state, int started) const;

    // The project's own VINTF fragment, where a phone has it.
    void putFragment() const;
};

}  // namespace fake
