// SPDX-License-Identifier: Apache-2.0
// A profile's plain files at their fixed paths.
#pragma once

#include <string>
#include <vector>

#include "driver/private_mounts.h"
#include "driver/profile.h"
#include "driver/result.h"

namespace handset {

/// Places files inside the private mount namespace, owned by the platform's system user. A file
/// that exists is covered, not changed. Where a folder is missing, its topmost missing parent is
/// made and covered with a memory file system; that empty folder, or an empty file where only the
/// last name is missing, is all that shows outside, and it goes away with this object.
class PlacedFiles {
  public:
    PlacedFiles() = default;
    PlacedFiles(const PlacedFiles&) = delete;
    PlacedFiles& operator=(const PlacedFiles&) = delete;
    ~PlacedFiles();

    Failure place(const FileSpec& file, StagingFolder& staging);

  private:
    struct Made {
        std::string path;
        bool folder = false;
    };

    Failure placeBelow(const std::string& missing, const FileSpec& file);

    std::vector<Made> made_;
};

}  // namespace handset
