// SPDX-License-Identifier: Apache-2.0
//
// Files as another user sees them: see file_view.h.
#include "vibctl/doctor/file_view.h"

#include <dirent.h>
#include <fcntl.h>
#include <grp.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <memory>

#include <android-base/file.h>
#include <android-base/unique_fd.h>
#include <fmt/format.h>

namespace vibctl {

namespace {

// Look-ups start at a directory, so the slash in front goes; "/" itself becomes ".".
std::string relative(const std::string& path) {
    const size_t start = path.find_first_not_of('/');
    return start == std::string::npos ? "." : path.substr(start);
}

int tryOpen(int root, const std::string& path, int flags) {
    // Not to block on a node that is a pipe or a terminal.
    const int fd = openat(root, path.c_str(), flags | O_CLOEXEC | O_NOCTTY | O_NONBLOCK);
    if (fd < 0) return errno;
    close(fd);
    return 0;
}

bool isInGroup(const User& user, gid_t group) {
    return user.gid == group ||
           std::find(user.groups.begin(), user.groups.end(), group) != user.groups.end();
}

// Whether `user` has all of the rights `wanted`, a sum of 4 (read), 2 (write) and 1 (search).
bool grants(const struct stat& file, const User& user, unsigned wanted) {
    unsigned shift = 0;
    if (user.uid == file.st_uid) {
        shift = 6;
    } else if (isInGroup(user, file.st_gid)) {
        shift = 3;
    }
    return ((file.st_mode >> shift) & wanted) == wanted;
}

// What open() would answer `user`, as far as mode bits tell.
int judge(int root, const User& user, const std::string& path, int flags) {
    for (size_t slash = path.find('/'); slash != std::string::npos;
         slash = path.find('/', slash + 1)) {
        struct stat directory {};
        if (fstatat(root, path.substr(0, slash).c_str(), &directory, 0) != 0) return errno;
        if (user.uid != 0 && !grants(directory, user, 1)) return EACCES;
    }
    struct stat file {};
    if (fstatat(root, path.c_str(), &file, 0) != 0) return errno;
    const unsigned wanted = flags == O_RDWR ? 6 : (flags == O_WRONLY ? 2 : 4);
    return user.uid == 0 || grants(file, user, wanted) ? 0 : EACCES;
}

// Opens each file as `user` and tells the answers to `answers`. In a process of its own, whose end
// takes back the change of user.
[[noreturn]] void openInChild(int root, const User& user, const std::vector<std::string>& paths,
                              std::span<const Access> accesses, int answers) {
    if (setgroups(user.groups.size(), user.groups.data()) != 0 ||
        setresgid(user.gid, user.gid, user.gid) != 0 ||
        setresuid(user.uid, user.uid, user.uid) != 0) {
        _exit(1);
    }
    for (size_t i = 0; i < paths.size(); ++i) {
        const int error = tryOpen(root, paths[i], accesses[i].flags);
        if (write(answers, &error, sizeof error) != sizeof error) _exit(1);
    }
    _exit(0);
}

}  // namespace

FileView::FileView(const std::filesystem::path& root)
    : mRoot(::open(root.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC)) {}

bool FileView::canBecome(const User& user) {
    return geteuid() == 0 || geteuid() == user.uid;
}

std::vector<int> FileView::open(const User& user, std::span<const Access> accesses) const {
    std::vector<std::string> paths;
    for (const Access& access : accesses) paths.push_back(relative(access.path));
    std::vector<int> errors(accesses.size(), EIO);
    if (geteuid() != 0 || user.uid == 0) {
        const auto ask = [&](size_t i) {
            return canBecome(user) ? tryOpen(mRoot.get(), paths[i], accesses[i].flags)
                                   : judge(mRoot.get(), user, paths[i], accesses[i].flags);
        };
        for (size_t i = 0; i < paths.size(); ++i) errors[i] = ask(i);
        return errors;
    }
    std::array<int, 2> ends{};
    if (pipe2(ends.data(), O_CLOEXEC) != 0) return errors;
    const pid_t child = fork();
    if (child == 0) openInChild(mRoot.get(), user, paths, accesses, ends[1]);
    close(ends[1]);
    for (int& error : errors) {
        int answer = 0;
        if (::read(ends[0], &answer, sizeof answer) != sizeof answer) break;
        error = answer;
    }
    close(ends[0]);
    if (child > 0) waitpid(child, nullptr, 0);
    return errors;
}

std::optional<std::string> FileView::read(const std::string& path) const {
    const android::base::unique_fd fd(
            openat(mRoot.get(), relative(path).c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    std::string text;
    if (!fd.ok() || !android::base::ReadFdToString(fd, &text)) return std::nullopt;
    return text;
}

std::vector<std::string> FileView::list(const std::string& path) const {
    std::vector<std::string> names;
    const int fd = openat(mRoot.get(), relative(path).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    const std::unique_ptr<DIR, int (*)(DIR*)> directory(fd < 0 ? nullptr : fdopendir(fd), closedir);
    if (directory == nullptr) return names;
    while (const dirent* entry = readdir(directory.get())) {
        if (entry->d_name[0] != '.') names.emplace_back(entry->d_name);
    }
    std::sort(names.begin(), names.end());
    return names;
}

std::string FileView::describe(const std::string& path) const {
    struct stat file {};
    if (fstatat(mRoot.get(), relative(path).c_str(), &file, 0) != 0) return {};
    return fmt::format("{}:{} {:04o}", file.st_uid, file.st_gid, file.st_mode & 07777);
}

}  // namespace vibctl
