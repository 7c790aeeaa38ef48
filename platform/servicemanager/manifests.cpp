// SPDX-License-Identifier: Apache-2.0
//
// The VINTF manifests: see manifests.h.
#include "platform/servicemanager/manifests.h"

#include <algorithm>
#include <charconv>
#include <set>
#include <system_error>
#include <utility>

#include <fmt/format.h>
#include <tinyxml2.h>

#include "platform/servicemanager/service_name.h"

namespace servicemanager {

namespace {

namespace fs = std::filesystem;
using tinyxml2::XMLElement;

// One `IFoo/instance` of one <hal>.
struct Entry {
    std::string package;
    std::string interface;
    std::string instance;
    std::string apex;  // empty: not updatable
};

// What was wrong with a file; empty when nothing was.
using Fault = std::string;

struct ManifestKind {
    const char* type;                     // the type attribute its files must carry
    std::vector<const char*> partitions;  // in order of reading
};

const ManifestKind kDevice = {"device", {"vendor", "odm"}};
const ManifestKind kFramework = {"framework", {"system", "product", "system_ext"}};

std::string textOf(const XMLElement& element) {
    const char* text = element.GetText();
    return text == nullptr ? "" : text;
}

std::string attributeOf(const XMLElement& element, const char* name) {
    const char* value = element.Attribute(name);
    return value == nullptr ? "" : value;
}

Fault atLine(const XMLElement& element, const std::string& what) {
    return fmt::format("line {}: {}", element.GetLineNum(), what);
}

// The format's own version, "major.minor", up to 4.0.
bool isReadableVersion(const std::string& version) {
    unsigned major = 0;
    unsigned minor = 0;
    const char* const end = version.data() + version.size();
    const auto afterMajor = std::from_chars(version.data(), end, major);
    if (afterMajor.ec != std::errc() || afterMajor.ptr == end || *afterMajor.ptr != '.')
        return false;
    const auto afterMinor = std::from_chars(afterMajor.ptr + 1, end, minor);
    if (afterMinor.ec != std::errc() || afterMinor.ptr != end) return false;
    return major < 4 || (major == 4 && minor == 0);
}

// `<fqname>IFoo/instance</fqname>`. The forms with a package or a version belong to other formats.
Fault readFqname(const XMLElement& element, Entry entry, std::vector<Entry>& entries) {
    const std::string text = textOf(element);
    const size_t slash = text.find('/');
    if (slash == 0 || slash == std::string::npos || slash + 1 == text.size() ||
        text.find_first_of("@:.") < slash) {
        return atLine(element, fmt::format("fqname {:?} is not of the form IFoo/instance", text));
    }
    entry.interface = text.substr(0, slash);
    entry.instance = text.substr(slash + 1);
    entries.push_back(std::move(entry));
    return {};
}

// The older form: `<interface><name>IFoo</name><instance>default</instance>...</interface>`.
Fault readInterface(const XMLElement& element, Entry entry, std::vector<Entry>& entries) {
    const XMLElement* name = element.FirstChildElement("name");
    if (name == nullptr || textOf(*name).empty()) return atLine(element, "interface has no name");
    entry.interface = textOf(*name);
    for (const XMLElement* instance = element.FirstChildElement("instance"); instance != nullptr;
         instance = instance->NextSiblingElement("instance")) {
        entry.instance = textOf(*instance);
        entries.push_back(entry);
    }
    return {};
}

Fault readHal(const XMLElement& hal, std::vector<Entry>& entries) {
    if (attributeOf(hal, "format") != "aidl") return {};
    const XMLElement* name = hal.FirstChildElement("name");
    if (name == nullptr || textOf(*name).empty()) return atLine(hal, "hal has no name");
    Entry entry;
    entry.package = textOf(*name);
    entry.apex = attributeOf(hal, "updatable-via-apex");
    for (const XMLElement* child = hal.FirstChildElement(); child != nullptr;
         child = child->NextSiblingElement()) {
        const std::string tag = child->Name();
        Fault fault;
        if (tag == "fqname") fault = readFqname(*child, entry, entries);
        if (tag == "interface") fault = readInterface(*child, entry, entries);
        if (!fault.empty()) return fault;
    }
    return {};
}

// Adds the entries of one file; on a fault none of them.
Fault readFile(const fs::path& file, const char* type, std::vector<Entry>& entries) {
    tinyxml2::XMLDocument document;
    if (document.LoadFile(file.c_str()) != tinyxml2::XML_SUCCESS) {
        const int line = document.ErrorLineNum();
        return line > 0 ? fmt::format("line {}: {}", line, document.ErrorName())
                        : std::string(document.ErrorName());
    }
    const XMLElement* manifest = document.RootElement();
    if (manifest == nullptr || std::string(manifest->Name()) != "manifest") {
        return "no <manifest> element";
    }
    const std::string version = attributeOf(*manifest, "version");
    if (!isReadableVersion(version)) {
        return atLine(*manifest, fmt::format("version {:?} is not 1.0 to 4.0", version));
    }
    if (attributeOf(*manifest, "type") != type) {
        return atLine(*manifest, fmt::format("type {:?} where {:?} is expected",
                                             attributeOf(*manifest, "type"), type));
    }
    std::vector<Entry> found;
    for (const XMLElement* hal = manifest->FirstChildElement("hal"); hal != nullptr;
         hal = hal->NextSiblingElement("hal")) {
        Fault fault = readHal(*hal, found);
        if (!fault.empty()) return fault;
    }
    entries.insert(entries.end(), found.begin(), found.end());
    return {};
}

// The manifest of a partition and its fragments, those that exist, fragments in byte order.
std::vector<fs::path> filesOf(const fs::path& root, const char* partition) {
    const fs::path directory = root / partition / "etc" / "vintf";
    std::vector<fs::path> fragments;
    std::error_code error;
    // An absent directory is the usual case: an ended iterator.
    for (fs::directory_iterator item(directory / "manifest", error), end; !error && item != end;
         item.increment(error)) {
        if (item->path().extension() == ".xml") fragments.push_back(item->path());
    }
    std::sort(fragments.begin(), fragments.end());
    if (fs::exists(directory / "manifest.xml", error)) {
        fragments.insert(fragments.begin(), directory / "manifest.xml");
    }
    return fragments;
}

std::vector<Entry> readAll(const fs::path& root, const ManifestKind& kind,
                           const Manifests::Log& log) {
    std::vector<Entry> entries;
    for (const char* partition : kind.partitions) {
        for (const fs::path& file : filesOf(root, partition)) {
            const Fault fault = readFile(file, kind.type, entries);
            if (!fault.empty()) {
                log(fmt::format("manifest {} is passed over: {}", file.string(), fault));
            }
        }
    }
    return entries;
}

// The entry of a service, the device's before the framework's.
std::optional<Entry> findEntry(const fs::path& root, const std::string& serviceName,
                               const Manifests::Log& log) {
    const std::optional<InstanceName> wanted = parseInstanceName(serviceName);
    if (!wanted) return std::nullopt;
    for (const ManifestKind* kind : {&kDevice, &kFramework}) {
        for (Entry& entry : readAll(root, *kind, log)) {
            if (entry.package == wanted->interface.package &&
                entry.interface == wanted->interface.name && entry.instance == wanted->instance) {
                return std::move(entry);
            }
        }
    }
    return std::nullopt;
}

}  // namespace

Manifests::Manifests(fs::path root, Log log) : mRoot(std::move(root)), mLog(std::move(log)) {}

bool Manifests::isDeclared(const std::string& serviceName) const {
    return findEntry(mRoot, serviceName, mLog).has_value();
}

std::vector<std::string> Manifests::instancesOf(const std::string& interface) const {
    std::vector<std::string> instances;
    const std::optional<InterfaceName> wanted = parseInterfaceName(interface);
    if (!wanted) return instances;
    for (const ManifestKind* kind : {&kDevice, &kFramework}) {
        std::set<std::string> ofKind;
        for (const Entry& entry : readAll(mRoot, *kind, mLog)) {
            if (entry.package == wanted->package && entry.interface == wanted->name) {
                ofKind.insert(entry.instance);
            }
        }
        instances.insert(instances.end(), ofKind.begin(), ofKind.end());
    }
    return instances;
}

std::optional<std::string> Manifests::updatableViaApex(const std::string& serviceName) const {
    const std::optional<Entry> entry = findEntry(mRoot, serviceName, mLog);
    if (!entry || entry->apex.empty()) return std::nullopt;
    return entry->apex;
}

}  // namespace servicemanager
