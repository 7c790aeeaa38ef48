// SPDX-License-Identifier: Apache-2.0
//
// Files as a process of another user, perhaps in another mount namespace, sees and may open them.
#pragma once

#include <filesystem>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include <android-base/unique_fd.h>

#include "vibctl/doctor/processes.h"

namespace vibctl {

// A file and the flags of open(2) that it is wanted with: O_RDONLY, O_WRONLY or O_RDWR.
struct Access {
    std::string path;  // absolute
    int flags = 0;
};

class FileView {
  public:
    // `root` stands for "/". The root directory of a process, /proc/PID/root, shows what that process
    // sees, its private mounts included.
    explicit FileView(const std::filesystem::path& root);
    // Per access 0, or the error number that `user` gets. Root takes on the user in a process of
    // its own and opens each file; so does the user itself. Anybody else judges by the mode bits
    // of the file and its directories.
    std::vector<int> open(const User& user, std::span<const Access> accesses) const;

    // False when open() judges by mode bits.
    static bool canBecome(const User& user);

    // The whole text of a small file; nothing when it cannot be read.
    std::optional<std::string> read(const std::string& path) const;

    // The names in a directory in byte order; none when it cannot be read.
    std::vector<std::string> list(const std::string& path) const;

    // "0:0 0644", owner, group and mode; empty when the file is not there.
    std::string describe(const std::string& path) const;

  private:
    // Only to look files up from; not open when there is no such directory.
    android::base::unique_fd mRoot;
};

}  // namespace vibctl
