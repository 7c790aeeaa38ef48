// SPDX-License-Identifier: Apache-2.0
//
// A profile's plain files at their fixed paths.
#pragma once

#include <string>
#include <vector>

#include <android-base/result.h>

#include "handset/driver/private_mounts.h"
#include "handset/driver/profile.h"

namespace handset {

// Places files inside the private mount namespace, owned by the platform's system user. A file
// that exists is covered, not changed. Where a directory is missing, its topmost missing parent is
// made and covered with a memory file system; that empty directory, or an empty file where only the
// last name is missing, is all that shows outside, and it goes away with this object.
class PlacedFiles {
  public:
    PlacedFiles() = default;
    PlacedFiles(const PlacedFiles&) = delete;
    PlacedFiles& operator=(const PlacedFiles&) = delete;
    ~PlacedFiles();

    android::base::Result<void> place(const FileProfile& file, StagingDirectory& staging);

  private:
    struct Made {
        std::string path;
        bool directory = false;
    };

    android::base::Result<void> placeBelow(const std::string& missing, const FileProfile& file);

    std::vector<Made> mMade;
};

}  // namespace handset
