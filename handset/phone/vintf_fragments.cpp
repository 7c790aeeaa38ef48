// SPDX-License-Identifier: Apache-2.0
// The VINTF fragments that declare the service.
#include "phone/vintf_fragments.h"

#include <fmt/format.h>
#include <sys/stat.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <optional>
#include <system_error>

#include "phone/text_file.h"

namespace handset {
namespace {

constexpr const char* kSource = QVX_VINTF_FOLDER;
constexpr const char* kFolders[] = {"/vendor", "/vendor/etc", "/vendor/etc/vintf",
                                    "/vendor/etc/vintf/manifest"};

}  // namespace

Failure installVintfFragments(std::vector<std::string>& made) {
    for (const char* folder : kFolders) {
        if (mkdir(folder, 0755) == 0) {
            made.emplace_back(folder);
        } else if (errno != EEXIST) {
            return Error{fmt::format("{}: {}", folder, strerror(errno))};
        }
    }
    std::error_code error;
    for (const auto& entry : std::filesystem::directory_iterator(kSource, error)) {
        const std::filesystem::path& source = entry.path();
        if (source.extension() != ".xml") continue;
        const std::string target =
                fmt::format("{}/{}", std::end(kFolders)[-1], source.filename().string());
        const std::optional<std::string> text = readTextFile(source.string());
        if (!text) return Error{fmt::format("{}: {}", source.string(), strerror(errno))};
        const bool isNew = !std::filesystem::exists(target, error);
        if (auto failure = replaceTextFile(target, *text)) return failure;
        if (isNew) made.push_back(target);
    }
    return std::nullopt;
}

void removeVintfFragments(const std::vector<std::string>& made) {
    for (auto path = made.rbegin(); path != made.rend(); ++path) std::remove(path->c_str());
}

}  // namespace handset
