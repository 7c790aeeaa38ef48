// SPDX-License-Identifier: Apache-2.0
//
// A directory that stands for "/" of a phone: driver nodes, manifests and processes as plain files.
#pragma once

#include <sys/types.h>

#include <filesystem>
#include <string>
#include <vector>

namespace fake {

class Root {
  public:
    Root();
    ~Root();
    Root(const Root&) = delete;
    Root& operator=(const Root&) = delete;

    const std::filesystem::path& path() const { return mPath; }

    // Writes a file that everybody may read and write, and the directories above it.
    void put(const std::string& path, const std::string& text = "0\n") const;

    void remove(const std::string& path) const;
    void chmod(const std::string& path, mode_t mode) const;

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

    // The path below the root, as messages have it.
    std::string at(const std::string& path) const { return mPath.string() + path; }

  private:
    std::filesystem::path mPath;
};

}  // namespace fake
