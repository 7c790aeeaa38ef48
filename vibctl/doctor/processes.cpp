// SPDX-License-Identifier: Apache-2.0
//
// Processes as /proc shows them: see processes.h.
#include "vibctl/doctor/processes.h"

#include <linux/input.h>
#include <sys/ioctl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <set>
#include <system_error>

#include <android-base/file.h>
#include <android-base/parseint.h>
#include <android-base/strings.h>
#include <android-base/unique_fd.h>

namespace vibctl {

namespace {

namespace fs = std::filesystem;

// What the kernel puts behind the path of an open file that has been removed.
constexpr std::string_view kDeleted = " (deleted)";
constexpr std::string_view kInputDirectory = "/dev/input/";

// A file of a process; empty when it cannot be read.
std::string readOf(const fs::path& proc, pid_t pid, const std::string& file) {
    std::string text;
    android::base::ReadFileToString((proc / std::to_string(pid) / file).string(), &text);
    return text;
}

// Where a link of a process leads; empty when that may not be seen.
std::string linkOf(const fs::path& proc, pid_t pid, const std::string& file) {
    std::error_code error;
    return fs::read_symlink(proc / std::to_string(pid) / file, error).string();
}

// The numbers that are names of entries.
std::vector<pid_t> numbersIn(const fs::path& directory) {
    std::vector<pid_t> numbers;
    std::error_code error;
    for (fs::directory_iterator item(directory, error), end; !error && item != end;
         item.increment(error)) {
        pid_t number = 0;
        if (android::base::ParseInt(item->path().filename().string(), &number)) {
            numbers.push_back(number);
        }
    }
    std::sort(numbers.begin(), numbers.end());
    return numbers;
}

// The fields of the file stat from the third on: those behind the name, which may hold anything.
std::vector<std::string> statOf(const fs::path& proc, pid_t pid) {
    const std::string text = readOf(proc, pid, "stat");
    const size_t end = text.rfind(") ");
    if (end == std::string::npos) return {};
    return android::base::Split(text.substr(end + 2), " ");
}

// Asks a process's own open device. A name that stands again, for a device that has come back, tells
// nothing of it. False where the kernel (before 5.6) or a lack of rights does not let it be asked.
bool hasLostItsDevice(pid_t pid, int descriptor) {
    const android::base::unique_fd process(static_cast<int>(syscall(SYS_pidfd_open, pid, 0)));
    const android::base::unique_fd copy(
            static_cast<int>(syscall(SYS_pidfd_getfd, process.get(), descriptor, 0)));
    int version = 0;
    return copy.ok() && ioctl(copy.get(), EVIOCGVERSION, &version) != 0 && errno == ENODEV;
}

}  // namespace

std::string executableOf(const fs::path& proc, pid_t pid) {
    std::string path = linkOf(proc, pid, "exe");
    if (path.empty()) {
        const std::vector<std::string> words = commandLineOf(proc, pid);
        if (!words.empty()) path = words.front();
    }
    // A program that was replaced while it runs.
    if (path.ends_with(kDeleted)) path.resize(path.size() - kDeleted.size());
    return fs::path(path).filename().string();
}

std::optional<pid_t> findProcess(const fs::path& proc, std::string_view executable) {
    const std::vector<pid_t> pids = numbersIn(proc);
    const auto found = std::find_if(pids.begin(), pids.end(), [&](pid_t pid) {
        return executableOf(proc, pid) == executable;
    });
    if (found == pids.end()) return std::nullopt;
    return *found;
}

std::optional<User> userOf(const fs::path& proc, pid_t pid) {
    std::optional<User> user;
    for (const std::string& line : android::base::Split(readOf(proc, pid, "status"), "\n")) {
        // "Uid:\treal\teffective\t...", "Groups:\t1004 1007 "
        std::vector<std::string> words = android::base::Split(line, "\t ");
        std::vector<uint32_t> ids;
        for (const std::string& word : words) {
            uint32_t id = 0;
            if (!word.empty() && android::base::ParseUint(word, &id)) ids.push_back(id);
        }
        if (words[0] == "Uid:" && ids.size() > 1) user = User{ids[1], 0, {}};
        if (words[0] == "Gid:" && ids.size() > 1 && user) user->gid = ids[1];
        if (words[0] == "Groups:" && user) user->groups.assign(ids.begin(), ids.end());
    }
    return user;
}

std::vector<std::string> commandLineOf(const fs::path& proc, pid_t pid) {
    std::vector<std::string> words =
            android::base::Split(readOf(proc, pid, "cmdline"), std::string(1, '\0'));
    // Each word ends in a zero byte.
    words.pop_back();
    return words;
}

bool isStopped(const fs::path& proc, pid_t pid) {
    const std::vector<std::string> fields = statOf(proc, pid);
    return !fields.empty() && (fields[0] == "T" || fields[0] == "t");
}

uint64_t startTimeOf(const fs::path& proc, pid_t pid) {
    // The twenty-second field.
    const std::vector<std::string> fields = statOf(proc, pid);
    uint64_t ticks = 0;
    if (fields.size() > 19) android::base::ParseUint(fields[19], &ticks);
    return ticks;
}

std::string nodeInUse(const fs::path& proc, pid_t pid) {
    for (const pid_t thread : numbersIn(proc / std::to_string(pid) / "task")) {
        // "NUMBER ARGUMENT ..."; of the calls on a node, the first argument is its descriptor.
        const std::string call = readOf(proc, pid, "task/" + std::to_string(thread) + "/syscall");
        const std::vector<std::string> words = android::base::Split(call, " ");
        int descriptor = 0;
        if (words.size() < 2 || !android::base::ParseInt(words[1], &descriptor, 0)) continue;
        std::string node = linkOf(proc, pid, "fd/" + std::to_string(descriptor));
        if (node.starts_with("/sys/") || node.starts_with(kInputDirectory)) return node;
    }
    return "";
}

std::string goneInputDevice(const fs::path& proc, pid_t pid) {
    for (const pid_t descriptor : numbersIn(proc / std::to_string(pid) / "fd")) {
        std::string device = linkOf(proc, pid, "fd/" + std::to_string(descriptor));
        if (!device.starts_with(kInputDirectory)) continue;
        if (device.ends_with(kDeleted)) return device.substr(0, device.size() - kDeleted.size());
        if (hasLostItsDevice(pid, descriptor)) return device;
    }
    return "";
}

std::vector<pid_t> otherViews(const fs::path& proc) {
    std::vector<pid_t> views;
    std::set<std::string> seen = {linkOf(proc, 1, "ns/mnt"), ""};
    for (const pid_t pid : numbersIn(proc)) {
        if (seen.insert(linkOf(proc, pid, "ns/mnt")).second) views.push_back(pid);
    }
    return views;
}

}  // namespace vibctl
