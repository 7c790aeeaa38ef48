// SPDX-License-Identifier: Apache-2.0
// Small text files, read and written whole.
#pragma once

#include <optional>
#include <string>

#include "driver/result.h"

namespace handset {

/// The file's content, or nothing where it cannot be read.
std::optional<std::string> readTextFile(const std::string& path);

/// Replaces the file's content in one step: a reader sees the old or the new one. Mode 0644.
Failure replaceTextFile(const std::string& path, const std::string& content);

/// The last line of the file that is not empty, without its line feed; "" where there is none.
std::string lastLineOf(const std::string& path);

/// Makes a folder and its missing parents, mode 0755.
Failure makeFolders(const std::string& path);

}  // namespace handset
