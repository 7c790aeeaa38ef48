// SPDX-License-Identifier: Apache-2.0
// Small text files, read and written whole.
#include "phone/text_file.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdio>
#include <cstring>

#include "common/unique_fd.h"

namespace handset {
namespace {

Error systemError(std::string_view what) {
    return Error{fmt::format("{}: {}", what, strerror(errno))};
}

std::optional<std::string> readFrom(int fd) {
    std::string text;
    std::array<char, 16384> part;
    while (true) {
        const ssize_t size = read(fd, part.data(), part.size());
        if (size < 0 && errno == EINTR) continue;
        if (size < 0) return std::nullopt;
        if (size == 0) return text;
        text.append(part.data(), static_cast<size_t>(size));
    }
}

}  // namespace

std::optional<std::string> readTextFile(const std::string& path) {
    const UniqueFd file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
    if (!file) return std::nullopt;
    return readFrom(file.get());
}

Failure replaceTextFile(const std::string& path, const std::string& content) {
    const std::string draft = path + ".new";
    const UniqueFd file(open(draft.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644));
    if (!file) return systemError(draft);
    if (write(file.get(), content.data(), content.size()) != static_cast<ssize_t>(content.size()) ||
        rename(draft.c_str(), path.c_str()) != 0) {
        const Error error = systemError(path);
        unlink(draft.c_str());
        return error;
    }
    return std::nullopt;
}

std::string lastLineOf(const std::string& path) {
    constexpr off_t kTail = 8192;
    const UniqueFd file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
    struct stat attributes {};
    if (!file || fstat(file.get(), &attributes) != 0) return "";
    if (attributes.st_size > kTail) lseek(file.get(), attributes.st_size - kTail, SEEK_SET);
    std::string text = readFrom(file.get()).value_or("");
    text.erase(text.find_last_not_of(" \r\n") + 1);
    return text.substr(text.rfind('\n') + 1);
}

Failure makeFolders(const std::string& path) {
    for (size_t slash = path.find('/', 1);; slash = path.find('/', slash + 1)) {
        const std::string folder = path.substr(0, slash);
        if (mkdir(folder.c_str(), 0755) != 0 && errno != EEXIST) return systemError(folder);
        if (slash == std::string::npos) return std::nullopt;
    }
}

}  // namespace handset
