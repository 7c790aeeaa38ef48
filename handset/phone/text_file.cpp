// SPDX-License-Identifier: Apache-2.0
//
// Small text files.
#include "handset/phone/text_file.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <fstream>

#include <android-base/file.h>
#include <android-base/strings.h>

namespace handset {

using android::base::Error;
using android::base::Result;
using android::base::unique_fd;

Result<void> replaceTextFile(const std::string& path, const std::string& content) {
    const std::string draft = path + ".new";
    if (android::base::WriteStringToFile(content, draft, 0644, geteuid(), getegid(), true) &&
        rename(draft.c_str(), path.c_str()) == 0) {
        return {};
    }
    const int error = errno;
    unlink(draft.c_str());
    return Error(error) << path;
}

unique_fd openLog(const std::string& path) {
    return unique_fd(open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_APPEND | O_CLOEXEC, 0644));
}

std::string lastLineOf(const std::string& path) {
    constexpr std::streamoff kTail = 8192;
    std::ifstream file(path, std::ios::binary | std::ios::ate);
    if (!file) return "";
    file.seekg(std::max<std::streamoff>(0, static_cast<std::streamoff>(file.tellg()) - kTail));
    std::string text(kTail, '\0');
    file.read(text.data(), kTail);
    text.resize(static_cast<size_t>(file.gcount()));
    text = android::base::Trim(text);
    return text.substr(text.rfind('\n') + 1);
}

}  // namespace handset
