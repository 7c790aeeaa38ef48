// SPDX-License-Identifier: Apache-2.0
//
// Files of a test.
#pragma once

#include <string>

#include <android-base/file.h>

namespace handset {

// The path of a file in a test's directory.
inline std::string fileIn(const TemporaryDir& directory, const std::string& name) {
    return std::string(directory.path) + "/" + name;
}

// A file's content; "" where it cannot be read.
inline std::string contentOf(const std::string& path) {
    std::string content;
    android::base::ReadFileToString(path, &content);
    return content;
}

}  // namespace handset
