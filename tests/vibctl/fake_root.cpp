// SPDX-License-Identifier: Apache-2.0
#include "fake_root.h"

#include <sys/stat.h>

#include <cstdlib>
#include <fstream>

namespace fake {

namespace fs = std::filesystem;

Root::Root() {
    std::string pattern = (fs::temp_directory_path() / "rootXXXXXX").string();
    mPath = mkdtemp(pattern.data());
    chmod("", 0755);
}

Root::~Root() {
    std::error_code ignored;
    fs::remove_all(mPath, ignored);
}

void Root::put(const std::string& path, const std::string& text) const {
    const fs::path file = at(path);
    fs::create_directories(file.parent_path());
    std::ofstream(file, std::ios::binary) << text;
    chmod(path, 0666);
}

void Root::chmod(const std::string& path, mode_t mode) const {
    ::chmod(at(path).c_str(), mode);
}

void Root::putNodes(const std::string& folder, const std::vector<std::string>& names) const {
    for (const std::string& name : names) put(folder + "/" + name);
}

void Root::putProcess(pid_t pid, const std::vector<std::string>& words, uid_t uid) const {
    const std::string folder = "/proc/" + std::to_string(pid);
    const std::string id = std::to_string(uid);
    put(folder + "/status", "Name:\tservice\nUid:\t" + id + "\t" + id + "\t" + id + "\t" + id +
                                    "\nGid:\t" + id + "\t" + id + "\t" + id + "\t" + id +
                                    "\nGroups:\t1004 1007 \n");
    std::string line;
    for (const std::string& word : words) line += word + '\0';
    put(folder + "/cmdline", line);
    fs::create_symlink(words.at(0), at(folder + "/exe"));
    fs::create_directory_symlink(mPath, at(folder + "/root"));
}

void Root::putFragment() const {
    const fs::path source = VINTF_FRAGMENT;
    const fs::path folder = at("/vendor/etc/vintf/manifest");
    fs::create_directories(folder);
    fs::copy_file(source, folder / source.filename());
}

}  // namespace fake
