// SPDX-License-Identifier: Apache-2.0
//
// Files as a process of another user, perhaps in another mount namespace, sees and may open them.
#pragma once

#include <filesystem>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "doctor/processes.h"

namespace vibctl {

/// A file and the flags of open(2) that it is wanted with: O_RDONLY, O_WRONLY or O_RDWR.
struct Access {
    std::string path;  ///< absolute
    int flags = 0;
};

class FileView {
  public:
    /// `root` stands for "/". The root folder of a process, /proc/PID/root, shows what that process
    /// sees, its private mounts included.
    explicit FileView(const std::filesystem::path& root);
    ~FileView();
    FileView(const FileView&) = delete;
    FileView& operator=(const FileView&) = delete;

    /// Per access 0, or the error number that `user` gets. Root takes on the user in a process of
    /// its own and opens each file; so does the user itself. Anybody else judges by the mode bits
    /// of the file and its folders.
    std::vector<int> open(const User& user, std::span<const Access> accesses) const;

    /// False when open() judges by mode bits.
    static bool canBecome(const User& user);

    /// The whole text of a small file; nothing when it cannot be read.
    std::optional<std::string> read(const std::string& path) const;

    /// "owner 0:0, mode 0644"; empty when the file is not there.
    std::string describe(const std::string& path) const;

  private:
    int mRoot;  ///< only to look files up from; -1 when there is no such folder
};

}  // namespace vibctl
