// SPDX-License-Identifier: Apache-2.0
//
// Mounts, as process 1 of a guest without udev or an init system.
#include "handset/guest/file_systems.h"

#include <fcntl.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <string_view>

namespace handset {
namespace {

struct Mount {
    const char* type;
    const char* source;
    const char* target;
    unsigned long flags;
    const char* options;
};

constexpr const char* kOutDirectory = "/run/handset/out";

// clang-format off
constexpr Mount kMounts[] = {
    {"proc",     "proc",     "/proc",    MS_NOSUID | MS_NODEV | MS_NOEXEC, ""},
    {"sysfs",    "sysfs",    "/sys",     MS_NOSUID | MS_NODEV | MS_NOEXEC, ""},
    {"devtmpfs", "devtmpfs", "/dev",     MS_NOSUID,                        "mode=0755"},
    {"devpts",   "devpts",   "/dev/pts", MS_NOSUID | MS_NOEXEC,            "gid=5,mode=0620,ptmxmode=0666"},
    {"tmpfs",    "shm",      "/dev/shm", MS_NOSUID | MS_NODEV,             "mode=1777"},
    {"tmpfs",    "run",      "/run",     MS_NOSUID | MS_NODEV,             "mode=0755"},
};
// clang-format on

// Without a tmpfs of its own the guest would see the host's files in /tmp, which is right only when
// the launcher says that the project, or what it was started with, lies there.
constexpr Mount kTemporary = {"tmpfs", "tmp", "/tmp", MS_NOSUID | MS_NODEV, "mode=1777"};

constexpr Mount kOutExport = {"9p", "out", kOutDirectory, MS_NOSUID | MS_NODEV,
                              "trans=virtio,version=9p2000.L,cache=none,msize=512000"};

bool isSet(const char* variable) {
    const char* value = std::getenv(variable);
    return value != nullptr && std::string_view(value) == "1";
}

// Lets every user of the guest reach this program and what lies beside it: the phone's service has
// a user of its own, and outside the directories above may be closed to all but their owner. The
// root is an overlay, so nothing changes outside.
void openDirectoriesAboveThisProgram() {
    char program[PATH_MAX];
    const ssize_t length = readlink("/proc/self/exe", program, sizeof(program));
    std::string path(program, static_cast<std::size_t>(length < 0 ? 0 : length));
    for (std::size_t end = path.rfind('/'); end != std::string::npos && end > 0;
         end = path.rfind('/')) {
        path.resize(end);
        constexpr mode_t kEnter = S_IRGRP | S_IXGRP | S_IROTH | S_IXOTH;
        struct stat status {};
        if (stat(path.c_str(), &status) != 0 || (status.st_mode & kEnter) == kEnter) continue;
        chmod(path.c_str(), (status.st_mode & ALLPERMS) | kEnter);
    }
}

std::string mountOne(const Mount& entry) {
    mkdir(entry.target, 0755);
    if (mount(entry.source, entry.target, entry.type, entry.flags, entry.options) == 0) return {};
    return std::string("cannot mount ") + entry.target + ": " + std::strerror(errno);
}

}  // namespace

std::string setUpFileSystems() {
    for (const Mount& entry : kMounts) {
        if (std::string failure = mountOne(entry); !failure.empty()) return failure;
    }
    if (!isSet("handset_host_tmp")) {
        if (std::string failure = mountOne(kTemporary); !failure.empty()) return failure;
    }
    mkdir("/run/handset", 0755);
    mkdir(kOutDirectory, 0755);
    if (isSet("handset_out_export")) {
        if (std::string failure = mountOne(kOutExport); !failure.empty()) return failure;
    }
    symlink("/proc/self/fd", "/dev/fd");
    openDirectoriesAboveThisProgram();
    for (const char* device : {"/dev/binder", "/dev/hwbinder", "/dev/vndbinder"}) {
        if (chmod(device, 0666) != 0) return std::string(device) + ": " + std::strerror(errno);
    }
    return {};
}

}  // namespace handset
