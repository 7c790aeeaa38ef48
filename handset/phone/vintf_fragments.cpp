// SPDX-License-Identifier: Apache-2.0
//
// The VINTF fragments that declare the service.
#include "handset/phone/vintf_fragments.h"

#include <sys/stat.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <optional>
#include <system_error>

#include <fmt/format.h>

#include "handset/phone/text_file.h"

namespace handset {
namespace {

using android::base::ErrnoError;
using android::base::Error;

using android::base::Result;

constexpr const char* kSource = QVX_SERVICE_DIRECTORY;
constexpr const char* kDirectories[] = {"/vendor", "/vendor/etc", "/vendor/etc/vintf",
                                        "/vendor/etc/vintf/manifest"};

}  // namespace

Result<void> installVintfFragments(std::vector<std::string>& made) {
    for (const char* directory : kDirectories) {
        if (mkdir(directory, 0755) == 0) {
            made.emplace_back(directory);
        } else if (errno != EEXIST) {
            return ErrnoError() << directory;
        }
    }
    std::error_code error;
    for (const auto& entry : std::filesystem::directory_iterator(kSource, error)) {
        const std::filesystem::path& source = entry.path();
        if (source.extension() != ".xml") continue;
        const std::string target =
                fmt::format("{}/{}", std::end(kDirectories)[-1], source.filename().string());
        const bool isNew = !std::filesystem::exists(target, error);
        std::filesystem::copy_file(source, target,
                                   std::filesystem::copy_options::overwrite_existing, error);
        if (error) return Error(error.value()) << target;
        if (isNew) made.push_back(target);
    }
    return {};
}

void removeVintfFragments(const std::vector<std::string>& made) {
    for (auto path = made.rbegin(); path != made.rend(); ++path) std::remove(path->c_str());
}

}  // namespace handset
