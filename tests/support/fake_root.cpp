// SPDX-License-Identifier: Apache-2.0
//
// A directory that stands for "/" of a phone.
#include "tests/support/fake_root.h"

#include <sys/stat.h>

#include <fstream>

namespace qvx::test {

FakeRoot::FakeRoot() {
    chmod("", 0777);
}

void FakeRoot::put(const std::string& path, const std::string& text) const {
    const std::filesystem::path file = at(path);
    std::filesystem::create_directories(file.parent_path());
    std::ofstream(file, std::ios::binary) << text;
    chmod(path, 0666);
}

void FakeRoot::remove(const std::string& path) const {
    std::filesystem::remove_all(at(path));
}

void FakeRoot::chmod(const std::string& path, mode_t mode) const {
    ::chmod(at(path).c_str(), mode);
}

}  // namespace qvx::test
