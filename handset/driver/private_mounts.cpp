// SPDX-License-Identifier: Apache-2.0
//
// The mount namespace in which a phone's files exist.
#include "handset/driver/private_mounts.h"

#include <fcntl.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <utility>

#include <android-base/unique_fd.h>
#include <fmt/format.h>

namespace handset {
namespace {

using android::base::ErrnoError;
using android::base::Error;
using android::base::Result;
using android::base::unique_fd;

}  // namespace

Result<void> enterPrivateMounts() {
    if (unshare(CLONE_NEWNS) != 0) return ErrnoError() << "private mount namespace";
    if (mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0) {
        return ErrnoError() << "private mounts";
    }
    return {};
}

Result<StagingDirectory> StagingDirectory::create() {
    std::string path = "/tmp/handset-XXXXXX";
    if (mkdtemp(path.data()) == nullptr) return ErrnoError() << "temporary directory";
    if (mount("handset", path.c_str(), "tmpfs", MS_NOSUID | MS_NODEV, "mode=0755") != 0) {
        const int error = errno;
        rmdir(path.c_str());
        return Error(error) << "mount on " << path;
    }
    return StagingDirectory(std::move(path));
}

StagingDirectory::StagingDirectory(StagingDirectory&& other) noexcept
    : mPath(std::exchange(other.mPath, {})), mFiles(other.mFiles) {}

StagingDirectory::~StagingDirectory() {
    if (mPath.empty()) return;
    umount2(mPath.c_str(), MNT_DETACH);
    rmdir(mPath.c_str());
}

Result<void> StagingDirectory::bindFile(const std::string& target, const std::string& content,
                                        uid_t owner, mode_t mode) {
    const std::string source = fmt::format("{}/{}", mPath, ++mFiles);
    if (auto done = writeNewFile(source, content, owner, mode); !done) return done;
    if (mount(source.c_str(), target.c_str(), nullptr, MS_BIND, nullptr) != 0) {
        return ErrnoError() << "mount on " + target;
    }
    return {};
}

Result<void> writeNewFile(const std::string& path, const std::string& content, uid_t owner,
                          mode_t mode) {
    const unique_fd file(open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
    if (!file.ok()) return ErrnoError() << path;
    for (size_t done = 0; done < content.size();) {
        const ssize_t size = write(file.get(), content.data() + done, content.size() - done);
        if (size < 0 && errno == EINTR) continue;
        if (size <= 0) return ErrnoError() << path;
        done += static_cast<size_t>(size);
    }
    if (fchown(file.get(), owner, owner) != 0 || fchmod(file.get(), mode) != 0) {
        return ErrnoError() << path;
    }
    return {};
}

}  // namespace handset
