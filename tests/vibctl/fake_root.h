// SPDX-License-Identifier: Apache-2.0
//
// A folder that stands for "/" of a phone: driver nodes, manifests and processes as plain files.
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

    /// Writes a file that everybody may read and write, and the folders above it.
    void put(const std::string& path, const std::string& text = "0\n") const;

    void chmod(const std::string& path, mode_t mode) const;

    /// The nodes of a driver, each with some text.
    void putNodes(const std::string& folder, const std::vector<std::string>& names) const;

    /// A process that sees this root; `words` are its command line, the first names its executable.
    void putProcess(pid_t pid, const std::vector<std::string>& words, uid_t uid) const;

    /// The project's own VINTF fragment, where a phone has it.
    void putFragment() const;

    /// The path below the root, as messages have it.
    std::string at(const std::string& path) const { return mPath.string() + path; }

  private:
    std::filesystem::path mPath;
};

}  // namespace fake
