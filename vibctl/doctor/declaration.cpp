// SPDX-License-Identifier: Apache-2.0
//
// The service's declaration: see declaration.h.
#include "doctor/declaration.h"

#include <string_view>
#include <vector>

#include <fmt/format.h>
#include <fmt/ranges.h>

#include "doctor/processes.h"
#include "manifests.h"

namespace vibctl {

namespace {

namespace fs = std::filesystem;

constexpr const char* kFragment = "android.hardware.vibrator-service.quorvan.xml";
constexpr const char* kFolder = "vendor/etc/vintf/manifest";

/// Every manifest there is, with what is wrong with it where something is.
std::string manifestsFound(const servicemanager::Manifests& manifests, const fs::path& root,
                           const std::vector<std::string>& faults) {
    if (!faults.empty()) return fmt::format("{}", fmt::join(faults, ", "));
    std::vector<std::string> names;
    for (const fs::path& file : manifests.files()) names.push_back(file.string());
    if (names.empty()) {
        return fmt::format("there is none below {}", (root / kFolder).string());
    }
    return fmt::format("there is {}", fmt::join(names, ", "));
}

}  // namespace

Finding checkDeclaration(const fs::path& root, const std::string& service,
                         std::optional<bool> declared) {
    std::vector<std::string> faults;
    const servicemanager::Manifests manifests(
            root, [&faults](const std::string& line) { faults.push_back(line); });
    const std::optional<fs::path> file = manifests.fileDeclaring(service);
    if (file && declared.value_or(true)) {
        return good("declaration", fmt::format("{} declares {}", file->string(), service));
    }
    if (file) {
        return bad("declaration",
                   fmt::format("{} declares {}, but the service manager does not see it",
                               file->string(), service),
                   "run the service manager where that file is, or with --root");
    }
    if (declared.value_or(false)) {
        return good("declaration",
                    fmt::format("the service manager says that {} is declared", service));
    }
    const std::string next = fmt::format("install {} in {}", kFragment, (root / kFolder).string());
    const std::string interface = service.substr(0, service.find('/'));
    const std::vector<std::string> others = manifests.instancesOf(interface);
    if (!others.empty()) {
        return bad("declaration",
                   fmt::format("no manifest declares {}, only the instance {} of its interface",
                               service, fmt::join(others, ", ")),
                   next);
    }
    faults.clear();
    static_cast<void>(manifests.isDeclared(service));
    return bad("declaration",
               fmt::format("no manifest declares {}: {}", service,
                           manifestsFound(manifests, root, faults)),
               next);
}

fs::path manifestRoot(const fs::path& proc) {
    constexpr std::string_view kOption = "--root";
    const std::optional<pid_t> pid = findProcess(proc, "servicemanager");
    if (!pid) return "/";
    const std::vector<std::string> words = commandLineOf(proc, *pid);
    for (size_t i = 1; i < words.size(); ++i) {
        if (words[i] == kOption && i + 1 < words.size()) return words[i + 1];
        if (words[i].starts_with("--root=")) return words[i].substr(kOption.size() + 1);
    }
    return "/";
}

}  // namespace vibctl
