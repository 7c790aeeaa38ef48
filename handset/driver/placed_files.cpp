// SPDX-License-Identifier: Apache-2.0
// A profile's plain files at their fixed paths.
#include "driver/placed_files.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "common/unique_fd.h"

namespace handset {
namespace {

constexpr uid_t kSystemUser = 1000;
constexpr mode_t kFileMode = 0664;
constexpr mode_t kFolderMode = 0775;

Error systemError(std::string_view what) {
    return Error{fmt::format("{}: {}", what, strerror(errno))};
}

bool exists(const std::string& path) {
    struct stat attributes {};
    return lstat(path.c_str(), &attributes) == 0;
}

/// The shortest leading part of `path` that does not exist; `path` itself does not.
std::string topmostMissing(const std::string& path) {
    for (size_t slash = path.find('/', 1); slash != std::string::npos;
         slash = path.find('/', slash + 1)) {
        std::string part = path.substr(0, slash);
        if (!exists(part)) return part;
    }
    return path;
}

Failure makeFolder(const std::string& path) {
    if (mkdir(path.c_str(), kFolderMode) != 0 && errno != EEXIST) return systemError(path);
    if (chown(path.c_str(), kSystemUser, kSystemUser) != 0) return systemError(path);
    return std::nullopt;
}

}  // namespace

PlacedFiles::~PlacedFiles() {
    for (auto made = made_.rbegin(); made != made_.rend(); ++made) {
        umount2(made->path.c_str(), MNT_DETACH);
        if (made->folder) {
            rmdir(made->path.c_str());
        } else {
            unlink(made->path.c_str());
        }
    }
}

Failure PlacedFiles::place(const FileSpec& file, StagingFolder& staging) {
    if (!exists(file.path)) {
        const std::string missing = topmostMissing(file.path);
        if (missing != file.path) return placeBelow(missing, file);
        // A folder this object covered itself takes the file as it is.
        const bool covered = std::any_of(made_.begin(), made_.end(), [&](const Made& made) {
            return made.folder && file.path.starts_with(made.path + "/");
        });
        if (covered) return writeNewFile(file.path, file.text, kSystemUser, kFileMode);
        if (auto failure = writeNewFile(file.path, "", 0, 0600)) return failure;
        made_.push_back({file.path, false});
    }
    return staging.bindFile(file.path, file.text, kSystemUser, kFileMode);
}

Failure PlacedFiles::placeBelow(const std::string& missing, const FileSpec& file) {
    const bool covered = std::any_of(made_.begin(), made_.end(), [&](const Made& made) {
        return made.folder && missing.starts_with(made.path + "/");
    });
    if (!covered) {
        if (mkdir(missing.c_str(), kFolderMode) != 0) return systemError(missing);
        made_.push_back({missing, true});
        if (mount("handset", missing.c_str(), "tmpfs", MS_NOSUID | MS_NODEV, "mode=0775") != 0) {
            return systemError("mount on " + missing);
        }
    }
    if (auto failure = makeFolder(missing)) return failure;
    for (size_t slash = file.path.find('/', missing.size() + 1); slash != std::string::npos;
         slash = file.path.find('/', slash + 1)) {
        if (auto failure = makeFolder(file.path.substr(0, slash))) return failure;
    }
    return writeNewFile(file.path, file.text, kSystemUser, kFileMode);
}

}  // namespace handset
