// SPDX-License-Identifier: Apache-2.0
//
// A directory that stands for "/" of a phone.
#pragma once

#include <sys/types.h>

#include <filesystem>
#include <string>

#include <android-base/file.h>

namespace qvx::test {

// Empty at first, open to every user, and removed with all in it at the end. Paths are absolute, as
// what is tested with this root has them.
class FakeRoot {
  public:
    FakeRoot();

    std::filesystem::path path() const { return mDirectory.path; }

    // The path below the root, as messages have it.
    std::string at(const std::string& path) const { return mDirectory.path + path; }

    // Writes a file that everybody may read and write, and the directories above it.
    void put(const std::string& path, const std::string& text = "0\n") const;

    void remove(const std::string& path) const;
    void chmod(const std::string& path, mode_t mode) const;

  private:
    const TemporaryDir mDirectory;
};

}  // namespace qvx::test
