// SPDX-License-Identifier: Apache-2.0
// The mount namespace in which a phone's files exist.
#include "driver/private_mounts.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <utility>

#include "common/unique_fd.h"

namespace handset {
namespace {

Error systemError(std::string_view what) {
    return Error{fmt::format("{}: {}", what, strerror(errno))};
}

}  // namespace

Failure enterPrivateMounts() {
    if (unshare(CLONE_NEWNS) != 0) return systemError("private mount namespace");
    if (mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0) {
        return systemError("private mounts");
    }
    return std::nullopt;
}

Result<StagingFolder> StagingFolder::create() {
    std::string path = "/tmp/handset-XXXXXX";
    if (mkdtemp(path.data()) == nullptr) return systemError("temporary folder");
    if (mount("handset", path.c_str(), "tmpfs", MS_NOSUID | MS_NODEV, "mode=0755") != 0) {
        const Error error = systemError("mount on " + path);
        rmdir(path.c_str());
        return error;
    }
    return StagingFolder(std::move(path));
}

StagingFolder::StagingFolder(StagingFolder&& other) noexcept
    : path_(std::exchange(other.path_, {})), files_(other.files_) {}

StagingFolder::~StagingFolder() {
    if (path_.empty()) return;
    umount2(path_.c_str(), MNT_DETACH);
    rmdir(path_.c_str());
}

Failure StagingFolder::bindFile(const std::string& target, const std::string& content, uid_t owner,
                                mode_t mode) {
    const std::string source = fmt::format("{}/{}", path_, ++files_);
    if (auto failure = writeNewFile(source, content, owner, mode)) return failure;
    if (mount(source.c_str(), target.c_str(), nullptr, MS_BIND, nullptr) != 0) {
        return systemError("mount on " + target);
    }
    return std::nullopt;
}

Failure writeNewFile(const std::string& path, const std::string& content, uid_t owner,
                     mode_t mode) {
    const UniqueFd file(open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
    if (!file) return systemError(path);
    for (size_t done = 0; done < content.size();) {
        const ssize_t size = write(file.get(), content.data() + done, content.size() - done);
        if (size < 0 && errno == EINTR) continue;
        if (size <= 0) return systemError(path);
        done += static_cast<size_t>(size);
    }
    if (fchown(file.get(), owner, owner) != 0 || fchmod(file.get(), mode) != 0) {
        return systemError(path);
    }
    return std::nullopt;
}

}  // namespace handset
