// SPDX-License-Identifier: Apache-2.0
//
// A phone's root as "vibctl doctor" looks at it.
#include "vibctl/tests/doctor_root.h"

#include <filesystem>

#include <android-base/file.h>
#include <gtest/gtest.h>

namespace fake {

namespace fs = std::filesystem;

void Root::edit(const std::string& path, const std::string& from, const std::string& to) const {
    std::string text;
    EXPECT_TRUE(android::base::ReadFileToString(at(path), &text)) << path;
    const size_t where = text.find(from);
    ASSERT_NE(where, std::string::npos) << from;
    put(path, text.replace(where, from.size(), to));
}

void Root::putNodes(const std::string& directory, const std::vector<std::string>& names) const {
    for (const std::string& name : names) put(directory + "/" + name);
}

void Root::putProcess(pid_t pid, const std::vector<std::string>& words, uid_t uid) const {
    const std::string directory = "/proc/" + std::to_string(pid);
    const std::string id = std::to_string(uid);
    put(directory + "/status", "Name:\tservice\nUid:\t" + id + "\t" + id + "\t" + id + "\t" + id +
                                       "\nGid:\t" + id + "\t" + id + "\t" + id + "\t" + id +
                                       "\nGroups:\t1004 1007 \n");
    std::string line;
    for (const std::string& word : words) line += word + '\0';
    put(directory + "/cmdline", line);
    fs::create_symlink(words.at(0), at(directory + "/exe"));
    fs::create_directory_symlink(path(), at(directory + "/root"));
}

void Root::putState(pid_t pid, char state, int started) const {
    // The third field is the state, the twenty-second the start.
    std::string line = std::to_string(pid) + " (a name) " + state;
    for (int i = 4; i < 22; ++i) line += " 0";
    put("/proc/" + std::to_string(pid) + "/stat", line + " " + std::to_string(started) + " 0\n");
}

void Root::putFragment() const {
    const fs::path source = VINTF_FRAGMENT;
    const fs::path directory = at("/vendor/etc/vintf/manifest");
    fs::create_directories(directory);
    fs::copy_file(source, directory / source.filename());
}

}  // namespace fake
