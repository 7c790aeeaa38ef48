// SPDX-License-Identifier: Apache-2.0
//
// The mount namespace in which a phone's files exist. Nothing mounted here is seen outside; those
// who want to see it enter through /proc/<driver>/ns/mnt.
#pragma once

#include <string>

#include <android-base/result.h>

namespace handset {

// Gives the process (which must have one thread only) a mount namespace of its own, from which
// no mount travels back.
android::base::Result<void> enterPrivateMounts();

// A memory file system under a temporary directory, in which files are made that are then bound over
// existing ones. The directory is gone as soon as the object is; what was bound stays.
class StagingDirectory {
  public:
    static android::base::Result<StagingDirectory> create();

    StagingDirectory(StagingDirectory&& other) noexcept;
    StagingDirectory& operator=(StagingDirectory&&) = delete;
    ~StagingDirectory();

    // Makes a file with that content, owner and mode and binds it over the existing file
    // `target`.
    android::base::Result<void> bindFile(const std::string& target, const std::string& content,
                                         uid_t owner, mode_t mode);

  private:
    explicit StagingDirectory(std::string path) : mPath(std::move(path)) {}

    std::string mPath;
    int mFiles = 0;
};

// Creates the file `path` with that content, owner and mode; the directory it lies in exists.
android::base::Result<void> writeNewFile(const std::string& path, const std::string& content,
                                         uid_t owner, mode_t mode);

}  // namespace handset
