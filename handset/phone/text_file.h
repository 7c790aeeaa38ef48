// SPDX-License-Identifier: Apache-2.0
//
// What libbase has not about small text files.
#pragma once

#include <string>

#include <android-base/result.h>
#include <android-base/unique_fd.h>

namespace handset {

// Replaces the file's content in one step: a reader sees the old or the new one. Mode 0644.
android::base::Result<void> replaceTextFile(const std::string& path, const std::string& content);

// Opens an empty file for appending, so that "phone reset" may empty it under its writer. Mode
// 0644; on failure the descriptor is not ok() and errno is set.
android::base::unique_fd openLog(const std::string& path);

// The last line of the file that is not empty, without its newline; "" where there is none.
std::string lastLineOf(const std::string& path);

}  // namespace handset
