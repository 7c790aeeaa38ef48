// SPDX-License-Identifier: Apache-2.0
//
// Processes as /proc shows them: see processes.h.
#include "doctor/processes.h"

#include <algorithm>
#include <charconv>
#include <fstream>
#include <sstream>
#include <system_error>

namespace vibctl {

namespace {

namespace fs = std::filesystem;

std::optional<pid_t> pidIn(const std::string& name) {
    pid_t pid = 0;
    const char* const end = name.data() + name.size();
    const auto [stop, error] = std::from_chars(name.data(), end, pid);
    if (error != std::errc() || stop != end) return std::nullopt;
    return pid;
}

/// The file name of the executable, or of the first word where the executable may not be seen.
std::string nameOf(const fs::path& proc, pid_t pid) {
    std::error_code error;
    fs::path executable = fs::read_symlink(proc / std::to_string(pid) / "exe", error);
    if (error) {
        const std::vector<std::string> words = commandLineOf(proc, pid);
        if (words.empty()) return {};
        executable = words.front();
    }
    std::string name = executable.filename().string();
    // A program that was replaced while it runs.
    constexpr std::string_view kDeleted = " (deleted)";
    if (name.ends_with(kDeleted)) name.resize(name.size() - kDeleted.size());
    return name;
}

}  // namespace

std::optional<pid_t> findProcess(const fs::path& proc, std::string_view executable) {
    std::vector<pid_t> pids;
    std::error_code error;
    for (fs::directory_iterator item(proc, error), end; !error && item != end;
         item.increment(error)) {
        if (const auto pid = pidIn(item->path().filename().string())) pids.push_back(*pid);
    }
    std::sort(pids.begin(), pids.end());
    const auto found = std::find_if(pids.begin(), pids.end(),
                                    [&](pid_t pid) { return nameOf(proc, pid) == executable; });
    if (found == pids.end()) return std::nullopt;
    return *found;
}

std::optional<User> userOf(const fs::path& proc, pid_t pid) {
    std::ifstream status(proc / std::to_string(pid) / "status");
    std::optional<User> user;
    for (std::string line; std::getline(status, line);) {
        std::istringstream words(line);
        std::string key;
        words >> key;
        uint32_t real = 0;
        uint32_t effective = 0;
        if (key == "Uid:" && words >> real >> effective) {
            if (!user) user.emplace();
            user->uid = effective;
        } else if (key == "Gid:" && words >> real >> effective && user) {
            user->gid = effective;
        } else if (key == "Groups:" && user) {
            for (gid_t group = 0; words >> group;) user->groups.push_back(group);
        }
    }
    return user;
}

std::vector<std::string> commandLineOf(const fs::path& proc, pid_t pid) {
    std::ifstream file(proc / std::to_string(pid) / "cmdline", std::ios::binary);
    std::vector<std::string> words;
    for (std::string word; std::getline(file, word, '\0');) words.push_back(word);
    return words;
}

}  // namespace vibctl
