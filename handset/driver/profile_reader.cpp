// SPDX-License-Identifier: Apache-2.0
// Reading a profile from JSON.
#include "driver/profile_reader.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <linux/input.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <cstring>

#include "common/unique_fd.h"
#include "driver/error_names.h"
#include "driver/json_fields.h"

namespace handset {
namespace {

constexpr size_t kLargestProfile = 1 << 20;
constexpr uint64_t kLongestDelay = 600000;  // ten minutes: longer is a slip of the pen
constexpr unsigned kLargestEvent = 1023;

constexpr std::string_view kNodeRoot = "/sys/class/";
constexpr std::string_view kEventMark = "{event}";

struct NamedAccess {
    std::string_view name;
    Access access;
};

constexpr std::array kAccesses = {
        NamedAccess{"rw", Access::kReadWrite},
        NamedAccess{"ro", Access::kReadOnly},
        NamedAccess{"wo", Access::kWriteOnly},
};

constexpr std::array kNodeOps = {FaultOp::kOpen, FaultOp::kRead, FaultOp::kWrite};
constexpr std::array kMotorOps = {FaultOp::kOpen, FaultOp::kWrite, FaultOp::kUpload,
                                  FaultOp::kErase};

/// An absolute path of plain components, as a profile has to spell it: there is one spelling for
/// each file, so that two entries cannot mean the same one.
bool isPlainPath(std::string_view path) {
    if (path.size() < 2 || path.size() >= PATH_MAX || path.front() != '/') return false;
    if (path.find('\0') != std::string_view::npos) return false;
    for (size_t at = 0; at < path.size();) {
        const size_t end = std::min(path.find('/', at + 1), path.size());
        const std::string_view component = path.substr(at + 1, end - at - 1);
        if (component.empty() || component.size() > NAME_MAX) return false;
        if (component == "." || component == "..") return false;
        at = end;
    }
    return true;
}

bool isBelow(std::string_view path, std::string_view folder) {
    return path.size() > folder.size() && path.starts_with(folder) && path[folder.size()] == '/';
}

Failure checkPlainPath(const std::string& where, std::string_view path) {
    if (isPlainPath(path)) return std::nullopt;
    return Error{fmt::format("{}: an absolute path without empty, \".\" or \"..\" parts expected",
                             where)};
}

/// Fails where one entry is a folder on another's path: a file cannot be both.
template <typename Entry>
Failure checkNested(const std::vector<Entry>& entries, const char* table) {
    for (const Entry& outer : entries) {
        for (const Entry& inner : entries) {
            if (!isBelow(inner.path, outer.path)) continue;
            return Error{fmt::format("{}: \"{}\" is a file, so \"{}\" cannot lie below it", table,
                                     outer.path, inner.path)};
        }
    }
    return std::nullopt;
}

Failure readNode(const std::string& path, const Json& value, Profile& profile) {
    const std::string where = fmt::format("nodes[\"{}\"]", path);
    NodeSpec node;
    node.path = path;
    if (auto failure = checkPlainPath(where, path)) return failure;
    if (!path.starts_with(kNodeRoot)) {
        return Error{fmt::format("{}: nodes lie below {}; plain files go under \"files\"", where,
                                 kNodeRoot)};
    }
    if (auto failure = checkObject(value, where, {"mode", "text", "hex", "hold"})) return failure;
    std::string mode;
    if (auto failure = readText(value, where, "mode", mode)) return failure;
    const auto* access = std::find_if(kAccesses.begin(), kAccesses.end(),
                                      [&](const NamedAccess& named) { return named.name == mode; });
    if (access == kAccesses.end()) {
        const std::string given = value.contains("mode") ? fmt::format("\"{}\" unknown", mode)
                                                         : std::string("missing");
        return Error{fmt::format("{}.mode: {}; accepted: rw, ro, wo", where, given)};
    }
    node.access = access->access;
    if (auto failure = readBytes(value, where, node.text)) return failure;
    if (auto failure = readTruth(value, where, "hold", node.hold)) return failure;
    profile.nodes.push_back(std::move(node));
    return std::nullopt;
}

Failure readFile(const std::string& path, const Json& value, Profile& profile) {
    const std::string where = fmt::format("files[\"{}\"]", path);
    if (auto failure = checkPlainPath(where, path)) return failure;
    for (const std::string_view folder : {"/proc", "/sys", "/dev"}) {
        if (path != folder && !isBelow(path, folder)) continue;
        return Error{fmt::format("{}: plain files do not lie below {}", where, folder)};
    }
    FileSpec file{path, ""};
    if (value.is_string()) {
        file.text = value.get<std::string>();
    } else if (!value.is_object()) {
        return Error{fmt::format("{}: a text, or an object with text or hex, expected, not {}",
                                 where, kindOf(value))};
    } else {
        if (auto failure = checkObject(value, where, {"text", "hex"})) return failure;
        if (auto failure = readBytes(value, where, file.text)) return failure;
    }
    profile.files.push_back(std::move(file));
    return std::nullopt;
}

Failure readMotor(const Json& value, Profile& profile) {
    if (value.is_null()) return std::nullopt;
    if (auto failure = checkObject(value, "motor", {"name", "event", "effects_max"})) {
        return failure;
    }
    MotorSpec motor;
    if (auto failure = readText(value, "motor", "name", motor.name)) return failure;
    if (motor.name.empty() || motor.name.find_first_of({"\n\0", 2}) != std::string::npos) {
        return Error{"motor.name: a text of one line expected"};
    }
    uint64_t event = 0;
    if (auto failure = readNumber(value, "motor", "event", 0, kLargestEvent, event)) {
        return failure;
    }
    if (value.contains("event")) motor.event = static_cast<unsigned>(event);
    uint64_t effects = motor.effectsMax;
    if (auto failure = readNumber(value, "motor", "effects_max", 1, FF_MAX_EFFECTS, effects)) {
        return failure;
    }
    motor.effectsMax = static_cast<unsigned>(effects);
    profile.motor = std::move(motor);
    return std::nullopt;
}

Failure readInputDevices(const Json& value, Profile& profile) {
    if (value.is_null()) return std::nullopt;
    if (!value.is_string()) {
        return Error{fmt::format("input_devices: a text or null expected, not {}", kindOf(value))};
    }
    std::string text = value.get<std::string>();
    if (!profile.motor && text.find(kEventMark) != std::string::npos) {
        return Error{"input_devices: {event} needs a motor, and the profile has none"};
    }
    profile.inputDevices = std::move(text);
    return std::nullopt;
}

/// Reads the operation's name; which are accepted depends on what the fault is for.
template <size_t count>
Failure readOp(const Json& value, const std::string& where,
               const std::array<FaultOp, count>& accepted, FaultOp& out) {
    std::string name;
    if (auto failure = readText(value, where, "op", name)) return failure;
    std::vector<std::string_view> names;
    for (const FaultOp op : accepted) {
        names.push_back(faultOpName(op));
        if (names.back() != name) continue;
        out = op;
        return std::nullopt;
    }
    const std::string given =
            value.contains("op") ? fmt::format("\"{}\" unknown", name) : std::string("missing");
    return Error{fmt::format("{}.op: {}; accepted: {}", where, given, joinNames(names))};
}

Failure readFaultNode(const Json& value, const std::string& where, const Profile& profile,
                      FaultSpec& fault) {
    if (!value.contains("node")) {
        return Error{fmt::format("{}.node: missing; accepted: a node's path, or motor", where)};
    }
    if (auto failure = readText(value, where, "node", fault.node)) return failure;
    if (fault.node == kMotorNode) {
        if (!profile.motor) {
            return Error{fmt::format("{}.node: the profile has no motor", where)};
        }
        return readOp(value, where, kMotorOps, fault.op);
    }
    if (profile.findNode(fault.node) == nullptr) {
        return Error{fmt::format("{}.node: the profile has no node \"{}\"", where, fault.node)};
    }
    return readOp(value, where, kNodeOps, fault.op);
}

Failure readFaultAction(const Json& value, const std::string& where, FaultSpec& fault) {
    FaultAction& action = fault.action;
    std::string error;
    if (auto failure = readText(value, where, "errno", error)) return failure;
    if (value.contains("errno")) {
        const std::optional<int> number = errorNumber(error);
        if (!number) {
            return Error{
                    fmt::format("{}.errno: \"{}\" unknown; accepted: an error's name, such "
                                "as EIO, EINTR, EACCES",
                                where, error)};
        }
        action.error = *number;
    }
    uint64_t count = 0;
    if (auto failure = readNumber(value, where, "short", 0, INT_MAX, count)) return failure;
    if (value.contains("short")) {
        if (fault.op != FaultOp::kRead && fault.op != FaultOp::kWrite) {
            return Error{fmt::format("{}.short: only a read or write can be short", where)};
        }
        if (action.error != 0) {
            return Error{fmt::format("{}: errno and short exclude each other", where)};
        }
        action.shortCount = count;
    }
    uint64_t delay = 0;
    if (auto failure = readNumber(value, where, "delay", 0, kLongestDelay, delay)) return failure;
    action.delay = std::chrono::milliseconds(delay);
    if (auto failure = readTruth(value, where, "unplug", action.unplug)) return failure;
    if (action.error == 0 && !action.shortCount && delay == 0 && !action.unplug) {
        return Error{fmt::format("{}: nothing goes wrong; give one of errno, short, delay, unplug",
                                 where)};
    }
    return std::nullopt;
}

Failure readFault(const Json& value, const std::string& where, const Profile& profile,
                  FaultSpec& fault) {
    if (auto failure = checkObject(
                value, where,
                {"node", "op", "errno", "short", "delay", "unplug", "after", "times"})) {
        return failure;
    }
    if (auto failure = readFaultNode(value, where, profile, fault)) return failure;
    if (auto failure = readFaultAction(value, where, fault)) return failure;
    if (auto failure = readNumber(value, where, "after", 0, UINT32_MAX, fault.after)) {
        return failure;
    }
    return readNumber(value, where, "times", 0, UINT32_MAX, fault.times);
}

Failure readFaults(const Json& value, Profile& profile) {
    if (value.is_null()) return std::nullopt;
    if (!value.is_array()) {
        return Error{fmt::format("faults: an array expected, not {}", kindOf(value))};
    }
    for (const Json& entry : value) {
        FaultSpec fault;
        const std::string where = fmt::format("faults[{}]", profile.faults.size());
        if (auto failure = readFault(entry, where, profile, fault)) return failure;
        profile.faults.push_back(std::move(fault));
    }
    return std::nullopt;
}

/// Reads a table of paths entry by entry; null stands for an empty one.
template <typename ReadEntry>
Failure readTable(const Json& value, const char* name, Profile& profile, ReadEntry readEntry) {
    if (value.is_null()) return std::nullopt;
    if (!value.is_object()) {
        return Error{fmt::format("{}: an object expected, not {}", name, kindOf(value))};
    }
    for (const auto& [path, entry] : value.items()) {
        if (auto failure = readEntry(path, entry, profile)) return failure;
    }
    return std::nullopt;
}

Failure readWhole(const Json& document, Profile& profile) {
    if (auto failure = checkObject(
                document, "",
                {"description", "nodes", "files", "motor", "input_devices", "faults"})) {
        return failure;
    }
    const auto field = [&](const char* key) { return document.value(key, Json()); };
    if (auto failure = readText(document, "", "description", profile.description)) return failure;
    if (auto failure = readTable(field("nodes"), "nodes", profile, readNode)) return failure;
    if (auto failure = readTable(field("files"), "files", profile, readFile)) return failure;
    if (auto failure = checkNested(profile.nodes, "nodes")) return failure;
    if (auto failure = checkNested(profile.files, "files")) return failure;
    // The motor before what refers to it.
    if (auto failure = readMotor(field("motor"), profile)) return failure;
    if (auto failure = readInputDevices(field("input_devices"), profile)) return failure;
    return readFaults(field("faults"), profile);
}

Result<std::string> readLimited(const std::string& path) {
    const UniqueFd file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
    if (!file) return Error{strerror(errno)};
    std::string text;
    std::array<char, 16384> part;
    while (true) {
        const ssize_t size = read(file.get(), part.data(), part.size());
        if (size < 0 && errno == EINTR) continue;
        if (size < 0) return Error{strerror(errno)};
        if (size == 0) return text;
        text.append(part.data(), static_cast<size_t>(size));
        if (text.size() > kLargestProfile) return Error{"larger than 1 MiB"};
    }
}

}  // namespace

Result<Profile> parseProfile(std::string_view text) {
    Result<Json> document = parseJson(text);
    if (!document) return document.error();
    Profile profile;
    if (auto failure = readWhole(*document, profile)) return *failure;
    return profile;
}

Result<Profile> readProfile(const std::string& path) {
    const Result<std::string> text = readLimited(path);
    if (!text) return Error{fmt::format("{}: {}", path, text.error().text)};
    Result<Profile> profile = parseProfile(*text);
    if (!profile) return Error{fmt::format("{}: {}", path, profile.error().text)};
    return profile;
}

Result<FaultSpec> parseFault(std::string_view text, const Profile& profile) {
    Result<Json> document = parseJson(text);
    if (!document) return document.error();
    FaultSpec fault;
    if (auto failure = readFault(*document, "fault", profile, fault)) return *failure;
    return fault;
}

}  // namespace handset
