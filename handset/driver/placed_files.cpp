// SPDX-License-Identifier: Apache-2.0
//
// A profile's plain files at their fixed paths.
#include "handset/driver/placed_files.h"

#include <fcntl.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

#include <android-base/unique_fd.h>
#include <fmt/format.h>

#include "handset/driver/permission.h"

namespace handset {
namespace {

using android::base::ErrnoError;
using android::base::Result;

constexpr mode_t kFileMode = 0664;
constexpr mode_t kDirectoryMode = 0775;

bool exists(const std::string& path) {
    struct stat attributes {};
    return lstat(path.c_str(), &attributes) == 0;
}

// The shortest leading part of `path` that does not exist; `path` itself does not.
std::string topmostMissing(const std::string& path) {
    for (size_t slash = path.find('/', 1); slash != std::string::npos;
         slash = path.find('/', slash + 1)) {
        std::string part = path.substr(0, slash);
        if (!exists(part)) return part;
    }
    return path;
}

Result<void> makeDirectory(const std::string& path) {
    if (mkdir(path.c_str(), kDirectoryMode) != 0 && errno != EEXIST) return ErrnoError() << path;
    if (chown(path.c_str(), kSystemUser, kSystemUser) != 0) return ErrnoError() << path;
    return {};
}

}  // namespace

PlacedFiles::~PlacedFiles() {
    for (auto made = mMade.rbegin(); made != mMade.rend(); ++made) {
        umount2(made->path.c_str(), MNT_DETACH);
        if (made->directory) {
            rmdir(made->path.c_str());
        } else {
            unlink(made->path.c_str());
        }
    }
}

Result<void> PlacedFiles::place(const FileProfile& file, StagingDirectory& staging) {
    if (!exists(file.path)) {
        const std::string missing = topmostMissing(file.path);
        if (missing != file.path) return placeBelow(missing, file);
        // A directory this object covered itself takes the file as it is.
        const bool covered = std::any_of(mMade.begin(), mMade.end(), [&](const Made& made) {
            return made.directory && file.path.starts_with(made.path + "/");
        });
        if (covered) return writeNewFile(file.path, file.text, kSystemUser, kFileMode);
        if (auto done = writeNewFile(file.path, "", 0, 0600); !done) return done;
        mMade.push_back({file.path, false});
    }
    return staging.bindFile(file.path, file.text, kSystemUser, kFileMode);
}

Result<void> PlacedFiles::placeBelow(const std::string& missing, const FileProfile& file) {
    const bool covered = std::any_of(mMade.begin(), mMade.end(), [&](const Made& made) {
        return made.directory && missing.starts_with(made.path + "/");
    });
    if (!covered) {
        if (mkdir(missing.c_str(), kDirectoryMode) != 0) return ErrnoError() << missing;
        mMade.push_back({missing, true});
        if (mount("handset", missing.c_str(), "tmpfs", MS_NOSUID | MS_NODEV, "mode=0775") != 0) {
            return ErrnoError() << "mount on " + missing;
        }
    }
    if (auto done = makeDirectory(missing); !done) return done;
    for (size_t slash = file.path.find('/', missing.size() + 1); slash != std::string::npos;
         slash = file.path.find('/', slash + 1)) {
        if (auto done = makeDirectory(file.path.substr(0, slash)); !done) return done;
    }
    return writeNewFile(file.path, file.text, kSystemUser, kFileMode);
}

}  // namespace handset
