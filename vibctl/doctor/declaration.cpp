// SPDX-License-Identifier: Apache-2.0
//
// The service's declaration: see declaration.h.
#include "vibctl/doctor/declaration.h"

#include <algorithm>
#include <string>
#include <system_error>
#include <vector>

#include <fmt/format.h>
#include <tinyxml2.h>

#include "vibctl/doctor/processes.h"

namespace vibctl {

namespace {

namespace fs = std::filesystem;
using tinyxml2::XMLElement;

constexpr const char* kPackage = "android.hardware.vibrator";
constexpr const char* kInstance = "IVibrator/default";
constexpr const char* kDeclaredVersion = "2";
constexpr const char* kDirectory = "vendor/etc/vintf/manifest";

// How near a file, or one entry of it, comes to the declaration, and what is wrong with it. The
// nearer one explains better why the service is not declared.
struct Attempt {
    enum Nearness {
        kOtherService,
        kFaultyFile,
        kOtherPackage,
        kOtherFormat,
        kOtherInstance,
        kOtherVersion,
        kDeclares
    };
    Nearness nearness = kOtherService;
    std::string file;  // its name without the directory
    std::string fault;
    std::string next;
};

std::string textOf(const XMLElement* element) {
    const char* text = element == nullptr ? nullptr : element->GetText();
    return text == nullptr ? "" : text;
}

std::string attributeOf(const XMLElement& element, const char* name) {
    const char* value = element.Attribute(name);
    return value == nullptr ? "" : value;
}

// "IVibrator/default" for each instance that the entry lists, in the shorter or the older form.
std::vector<std::string> instancesOf(const XMLElement& hal) {
    std::vector<std::string> instances;
    for (auto* one = hal.FirstChildElement("fqname"); one != nullptr;
         one = one->NextSiblingElement("fqname")) {
        instances.push_back(textOf(one));
    }
    for (auto* one = hal.FirstChildElement("interface"); one != nullptr;
         one = one->NextSiblingElement("interface")) {
        for (auto* instance = one->FirstChildElement("instance"); instance != nullptr;
             instance = instance->NextSiblingElement("instance")) {
            instances.push_back(textOf(one->FirstChildElement("name")) + "/" + textOf(instance));
        }
    }
    return instances;
}

Attempt judgeHal(const XMLElement& hal) {
    const std::string name = textOf(hal.FirstChildElement("name"));
    const std::string format = attributeOf(hal, "format");
    const std::string version = textOf(hal.FirstChildElement("version"));
    const std::vector<std::string> instances = instancesOf(hal);
    const bool listed = std::find(instances.begin(), instances.end(), kInstance) != instances.end();
    if (name != kPackage) {
        if (!listed) return {};
        return {Attempt::kOtherPackage, "", fmt::format("is for {}", name),
                fmt::format("write {}", kPackage)};
    }
    if (format != "aidl") {
        return {Attempt::kOtherFormat, "", fmt::format("has the format \"{}\"", format),
                "write format=\"aidl\""};
    }
    if (!listed) {
        return {Attempt::kOtherInstance, "",
                instances.empty() ? "names no instance"
                                  : fmt::format("names {}", fmt::join(instances, ", ")),
                fmt::format("name {}", kInstance)};
    }
    if (version != kDeclaredVersion) {
        return {Attempt::kOtherVersion, "",
                fmt::format("has version {}, the service {}", version.empty() ? "1" : version,
                            kDeclaredVersion),
                fmt::format("write <version>{}</version>", kDeclaredVersion)};
    }
    return {Attempt::kDeclares, "", "", ""};
}

Attempt judgeFile(const fs::path& file) {
    tinyxml2::XMLDocument document;
    Attempt best;
    const auto faulty = [](const std::string& fault, const char* next) {
        return Attempt{Attempt::kFaultyFile, "", fault, next};
    };
    if (document.LoadFile(file.c_str()) != tinyxml2::XML_SUCCESS) {
        const int line = document.ErrorLineNum();
        best = line > 0 ? faulty(fmt::format("is no XML, line {}", line), "correct it")
                        : faulty("cannot be read", "let everybody read it");
    } else if (const XMLElement* manifest = document.RootElement();
               std::string(manifest->Name()) != "manifest") {
        best = faulty(fmt::format("is a <{}>", manifest->Name()), "write a <manifest>");
    } else if (const std::string type = attributeOf(*manifest, "type"); type != "device") {
        best = faulty(fmt::format("has the type \"{}\"", type), "write type=\"device\"");
    } else {
        for (auto* hal = manifest->FirstChildElement("hal"); hal != nullptr;
             hal = hal->NextSiblingElement("hal")) {
            const Attempt attempt = judgeHal(*hal);
            if (attempt.nearness > best.nearness) best = attempt;
        }
    }
    best.file = file.filename().string();
    return best;
}

std::vector<fs::path> manifestsBelow(const fs::path& root) {
    std::vector<fs::path> files;
    std::error_code error;
    for (const char* partition : {"vendor", "odm"}) {
        const fs::path directory = root / partition / "etc/vintf";
        if (fs::exists(directory / "manifest.xml", error)) {
            files.push_back(directory / "manifest.xml");
        }
        for (fs::directory_iterator item(directory / "manifest", error), end; !error && item != end;
             item.increment(error)) {
            if (item->path().extension() == ".xml") files.push_back(item->path());
        }
    }
    return files;
}

// A name that fits in a line: without what every file of the service has in common.
std::string fileName(const std::string& file) {
    return file == "android.hardware.vibrator-service.quorvan.xml" ? "its .xml" : file;
}

}  // namespace

Finding checkDeclaration(const fs::path& root, std::optional<bool> declared) {
    constexpr const char* kCheck = "declaration";
    Attempt best;
    for (const fs::path& file : manifestsBelow(root)) {
        const Attempt attempt = judgeFile(file);
        if (attempt.nearness > best.nearness) best = attempt;
    }
    const bool found = best.nearness >= Attempt::kOtherVersion;
    if (declared.value_or(found) && !found) {
        return good(kCheck, fmt::format("the service manager knows {}", kInstance));
    }
    if (best.nearness == Attempt::kDeclares && declared.value_or(true)) {
        return good(kCheck, fmt::format("{} names {} version {}", fileName(best.file), kInstance,
                                        kDeclaredVersion));
    }
    if (best.nearness == Attempt::kDeclares) {
        return bad(kCheck, "the service manager does not see " + fileName(best.file),
                   "start it where that is");
    }
    if (best.nearness == Attempt::kOtherService) {
        return bad(kCheck, fmt::format("no manifest names {}", kInstance),
                   fmt::format("install its .xml in {}", (root / kDirectory).string()));
    }
    return bad(kCheck, fmt::format("{} {}", fileName(best.file), best.fault), best.next);
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
