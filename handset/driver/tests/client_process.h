// SPDX-License-Identifier: Apache-2.0
//
// A driver's clients: processes of their own, and what they do with files, as short texts.
#pragma once

#include <sys/types.h>

#include <functional>
#include <string>

namespace handset {

// Runs `work` in a process of its own, as that user with no further groups, and returns what it
// returned; with the mounts of the process `mountsOf` unless that is 0.
std::string runAs(uid_t user, const std::function<std::string()>& work, pid_t mountsOf = 0);

// Opens, writes once and closes: "4" for four bytes, or the error's name, after "open " where the
// open failed.
std::string writeNode(const std::string& path, const std::string& text, int flags);

// Opens, reads once and closes: the text, or the error's name as above.
std::string readNode(const std::string& path);

// Opens and closes: "ok" or the error's name.
std::string openNode(const std::string& path, int flags);

// The number of bytes a call returned, or the name of the error it set.
std::string outcome(ssize_t returned);

}  // namespace handset
