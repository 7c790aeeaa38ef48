// SPDX-License-Identifier: Apache-2.0
// The mount namespace in which a phone's files exist. Nothing mounted here is seen outside; those
// who want to see it enter through /proc/<driver>/ns/mnt.
#pragma once

#include <string>

#include "driver/result.h"

namespace handset {

/// Gives the process (which must have one thread only) a mount namespace of its own, from which
/// no mount travels back.
Failure enterPrivateMounts();

/// A memory file system under a temporary folder, in which files are made that are then bound over
/// existing ones. The folder is gone as soon as the object is; what was bound stays.
class StagingFolder {
  public:
    static Result<StagingFolder> create();

    StagingFolder(StagingFolder&& other) noexcept;
    StagingFolder& operator=(StagingFolder&&) = delete;
    ~StagingFolder();

    /// Makes a file with that content, owner and mode and binds it over the existing file
    /// `target`.
    Failure bindFile(const std::string& target, const std::string& content, uid_t owner,
                     mode_t mode);

  private:
    explicit StagingFolder(std::string path) : path_(std::move(path)) {}

    std::string path_;
    int files_ = 0;
};

/// Creates the file `path` with that content, owner and mode; the folder it lies in exists.
Failure writeNewFile(const std::string& path, const std::string& content, uid_t owner, mode_t mode);

}  // namespace handset
