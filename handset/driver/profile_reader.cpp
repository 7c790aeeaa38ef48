// SPDX-License-Identifier: Apache-2.0
//
// A profile's keys, table by table, and what its parts have to agree on.
#include "handset/driver/profile_reader.h"

#include <linux/input.h>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstring>
#include <fstream>

#include <fmt/format.h>

#include "handset/driver/error_names.h"
#include "handset/driver/printable.h"

namespace handset {
namespace {

using android::base::ErrnoError;
using android::base::Error;
using android::base::Result;

constexpr size_t kLargestProfile = 1 << 20;
constexpr uint64_t kLongestDelay = 600000;  // ten minutes: longer is a slip of the pen
constexpr unsigned kLargestEvent = 1023;

constexpr std::string_view kNodeRoot = "/sys/class/";
constexpr std::string_view kEventMark = "{event}";

std::string stringOf(const Json& value) {
    return value.get<std::string>();
}

std::string bytesOf(const Json& digits) {
    return *decodeHex(stringOf(digits));
}

Access accessOf(std::string_view mode) {
    if (mode == "ro") return Access::kReadOnly;
    return mode == "wo" ? Access::kWriteOnly : Access::kReadWrite;
}

FaultOp faultOpOf(std::string_view name) {
    for (const FaultOp op : {FaultOp::kOpen, FaultOp::kRead, FaultOp::kWrite, FaultOp::kUpload}) {
        if (faultOpName(op) == name) return op;
    }
    return FaultOp::kErase;
}

// clang-format off
const std::vector<Field<NodeProfile>> kNodeFields = {
        {"mode", Accepted::name({"rw", "ro", "wo"}), [](auto& node, auto& value) { node.access = accessOf(stringOf(value)); }, true},
        {"text", Accepted::string(),                 [](auto& node, auto& value) { node.text = stringOf(value); }},
        {"hex",  Accepted::hex(),                    [](auto& node, auto& value) { node.text = bytesOf(value); }},
        {"hold", Accepted::boolean(),                [](auto& node, auto& value) { node.hold = value; }},
};

const std::vector<Field<FileProfile>> kFileFields = {
        {"text", Accepted::string(), [](auto& file, auto& value) { file.text = stringOf(value); }},
        {"hex",  Accepted::hex(),    [](auto& file, auto& value) { file.text = bytesOf(value); }},
};

const std::vector<Field<MotorProfile>> kMotorFields = {
        {"name",        Accepted::string(),                   [](auto& motor, auto& value) { motor.name = stringOf(value); }},
        {"event",       Accepted::integer(0, kLargestEvent),  [](auto& motor, auto& value) { motor.event = value.template get<unsigned>(); }},
        {"effects_max", Accepted::integer(1, FF_MAX_EFFECTS), [](auto& motor, auto& value) { motor.effectsMax = value; }},
};

const std::vector<Field<Fault>> kFaultFields = {
        {"node",   Accepted::node(),                       [](auto& fault, auto& value) { fault.node = stringOf(value); }, true},
        {"op",     Accepted::name({"open", "read", "write", "upload", "erase"}),
                                                           [](auto& fault, auto& value) { fault.op = faultOpOf(stringOf(value)); }, true},
        {"errno",  Accepted::errorName(),                  [](auto& fault, auto& value) { fault.action.error = *errorNumber(stringOf(value)); }},
        {"short",  Accepted::integer(0, INT_MAX, "bytes"),  [](auto& fault, auto& value) { fault.action.shortCount = value.template get<size_t>(); }},
        {"delay",  Accepted::integer(0, kLongestDelay, "milliseconds"),  [](auto& fault, auto& value) { fault.action.delay = std::chrono::milliseconds(value); }},
        {"unplug", Accepted::boolean(),                    [](auto& fault, auto& value) { fault.action.unplug = value; }},
        {"text",   Accepted::string(),                     [](auto& fault, auto& value) { fault.action.text = stringOf(value); }},
        {"hex",    Accepted::hex(),                        [](auto& fault, auto& value) { fault.action.text = bytesOf(value); }},
        {"after",  Accepted::integer(0, UINT32_MAX, "calls"),  [](auto& fault, auto& value) { fault.after = value; }},
        {"times",  Accepted::integer(0, UINT32_MAX, "calls"),  [](auto& fault, auto& value) { fault.times = value; }},
        {"every",  Accepted::integer(1, UINT32_MAX, "calls"),  [](auto& fault, auto& value) { fault.every = value; }},
};
// clang-format on

// An absolute path of plain components, as a profile has to spell it: there is one spelling for
// each file, so that two entries cannot mean the same one.
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

bool isBelow(std::string_view path, std::string_view directory) {
    return path.size() > directory.size() && path.starts_with(directory) &&
           path[directory.size()] == '/';
}

Result<void> checkPlainPath(const std::string& where, std::string_view path) {
    if (isPlainPath(path)) return {};
    return Error() << fmt::format(
                   "{}: an absolute path without empty, \".\" or \"..\" parts expected", where);
}

Result<void> checkOneContent(const Json& value, const std::string& where) {
    if (!value.is_object() || !value.contains("text") || !value.contains("hex")) return {};
    return Error() << fmt::format("{}: text and hex exclude each other", where);
}

// Fails where one entry is a directory on another's path: a file cannot be both.
template <typename Entry>
Result<void> checkNested(const std::vector<Entry>& entries, const char* table) {
    for (const Entry& outer : entries) {
        for (const Entry& inner : entries) {
            if (!isBelow(inner.path, outer.path)) continue;
            return Error() << fmt::format("{}: \"{}\" is a file, so \"{}\" cannot lie below it",
                                          table, outer.path, inner.path);
        }
    }
    return {};
}

Result<void> readNode(const std::string& path, const Json& value, Profile& profile) {
    const std::string where = fmt::format("nodes[\"{}\"]", path);
    if (auto done = checkPlainPath(where, path); !done) return done;
    if (!path.starts_with(kNodeRoot)) {
        return Error() << fmt::format("{}: nodes lie below {}; plain files go under \"files\"",
                                      where, kNodeRoot);
    }
    NodeProfile node;
    node.path = path;
    if (auto done = checkOneContent(value, where); !done) return done;
    if (auto done = readFields(value, where, kNodeFields, node); !done) return done;
    profile.nodes.push_back(std::move(node));
    return {};
}

Result<void> readFile(const std::string& path, const Json& value, Profile& profile) {
    const std::string where = fmt::format("files[\"{}\"]", path);
    if (auto done = checkPlainPath(where, path); !done) return done;
    for (const std::string_view directory : {"/proc", "/sys", "/dev"}) {
        if (path != directory && !isBelow(path, directory)) continue;
        return Error() << fmt::format("{}: plain files do not lie below {}", where, directory);
    }
    FileProfile file{path, ""};
    if (value.is_string()) {
        file.text = value.get<std::string>();
    } else if (!value.is_object()) {
        return Error() << fmt::format(
                       "{}: a string, or an object with text or hex, expected, not {}", where,
                       kindOf(value));
    } else {
        if (auto done = checkOneContent(value, where); !done) return done;
        if (auto done = readFields(value, where, kFileFields, file); !done) return done;
    }
    profile.files.push_back(std::move(file));
    return {};
}

// Reads a fault's keys, then what they have to agree on.
Result<void> readFault(const Json& value, const std::string& where, const Profile& profile,
                       Fault& fault) {
    if (auto done = checkOneContent(value, where); !done) return done;
    if (auto done = readFields(value, where, kFaultFields, fault); !done) return done;
    const bool isMotor = fault.node == kMotorNode;
    if (isMotor && !profile.motor)
        return Error() << fmt::format("{}.node: the profile has no motor", where);
    if (!isMotor && profile.findNode(fault.node) == nullptr) {
        return Error() << fmt::format("{}.node: the profile has no node \"{}\"", where, fault.node);
    }
    const bool isNodes = fault.op == FaultOp::kRead;
    const bool isMotors = fault.op == FaultOp::kUpload || fault.op == FaultOp::kErase;
    if (isMotor ? isNodes : isMotors) {
        return Error() << fmt::format("{}.op: \"{}\" unknown; accepted: {}", where,
                                      faultOpName(fault.op),
                                      isMotor ? "open, write, upload, erase" : "open, read, write");
    }
    const FaultAction& action = fault.action;
    if (action.shortCount && fault.op != FaultOp::kRead && fault.op != FaultOp::kWrite) {
        return Error() << fmt::format("{}.short: only a read or write can be short", where);
    }
    if (action.shortCount && action.error != 0) {
        return Error() << fmt::format("{}: errno and short exclude each other", where);
    }
    if (action.text && fault.op != FaultOp::kRead) {
        return Error() << fmt::format("{}: only a read can show other contents", where);
    }
    if (action.text && action.error != 0) {
        return Error() << fmt::format("{}: errno and other contents exclude each other", where);
    }
    if (!action.strikes()) {
        return Error() << fmt::format(
                       "{}: nothing goes wrong; give one of errno, short, delay, unplug, text, hex",
                       where);
    }
    return {};
}

Result<void> readDescription(const Json& value, Profile& profile) {
    if (auto done = checkValue(value, "", "description", Accepted::string()); !done) return done;
    profile.description = stringOf(value);
    return {};
}

// Reads a table of paths entry by entry.
template <typename ReadEntry>
Result<void> readTable(const Json& value, const char* name, Profile& profile, ReadEntry readEntry) {
    if (!value.is_object()) {
        return Error() << fmt::format("{}: an object expected, not {}", name, kindOf(value));
    }
    for (const auto& [path, entry] : value.items()) {
        if (auto done = readEntry(path, entry, profile); !done) return done;
    }
    return {};
}

Result<void> readNodes(const Json& value, Profile& profile) {
    if (auto done = readTable(value, "nodes", profile, readNode); !done) return done;
    return checkNested(profile.nodes, "nodes");
}

Result<void> readFiles(const Json& value, Profile& profile) {
    if (auto done = readTable(value, "files", profile, readFile); !done) return done;
    return checkNested(profile.files, "files");
}

Result<void> readMotor(const Json& value, Profile& profile) {
    MotorProfile motor;
    if (auto done = readFields(value, "motor", kMotorFields, motor); !done) return done;
    if (motor.name.empty() || motor.name.find_first_of({"\n\0", 2}) != std::string::npos) {
        return Error() << "motor.name: a string of one line expected";
    }
    profile.motor = std::move(motor);
    return {};
}

Result<void> readInputDevices(const Json& value, Profile& profile) {
    if (!value.is_string()) {
        return Error() << fmt::format("input_devices: a string or null expected, not {}",
                                      kindOf(value));
    }
    std::string text = value.get<std::string>();
    if (!profile.motor && text.find(kEventMark) != std::string::npos) {
        return Error() << "input_devices: {event} needs a motor, and the profile has none";
    }
    profile.inputDevices = std::move(text);
    return {};
}

Result<void> readFaults(const Json& value, Profile& profile) {
    if (!value.is_array())
        return Error() << fmt::format("faults: an array expected, not {}", kindOf(value));
    for (const Json& entry : value) {
        Fault fault;
        const std::string where = fmt::format("faults[{}]", profile.faults.size());
        if (auto done = readFault(entry, where, profile, fault); !done) return done;
        profile.faults.push_back(std::move(fault));
    }
    return {};
}

struct Part {
    std::string_view key;
    Result<void> (*read)(const Json& value, Profile& profile);
};

// The motor stands before what refers to it. Null stands for absent.
constexpr Part kParts[] = {
        {"description", readDescription},
        {"nodes", readNodes},
        {"files", readFiles},
        {"motor", readMotor},
        {"input_devices", readInputDevices},
        {"faults", readFaults},
};

template <typename Object>
void addKeys(std::string_view name, const std::vector<Field<Object>>& table,
             std::vector<KnownKey>& keys) {
    for (const Field<Object>& field : table) keys.push_back({name, field.key, &field.accepted});
}

Result<Profile> readDocument(std::string_view text) {
    Result<Json> document = parseJson(text);
    if (!document) return document.error();
    std::vector<std::string_view> keys;
    for (const Part& part : kParts) keys.push_back(part.key);
    if (auto done = checkKeys(*document, "", keys); !done) return done.error();
    Profile profile;
    for (const Part& part : kParts) {
        const auto value = document->find(part.key);
        if (value == document->end() || value->is_null()) continue;
        if (auto done = part.read(*value, profile); !done) return done.error();
    }
    return profile;
}

Result<Fault> readOneFault(std::string_view text, const Profile& profile) {
    Result<Json> document = parseJson(text);
    if (!document) return document.error();
    Fault fault;
    if (auto done = readFault(*document, "fault", profile, fault); !done) return done.error();
    return fault;
}

// What is quoted from the JSON may hold anything, and a message is one line.
template <typename T>
Result<T> withPrintableError(Result<T> result) {
    if (result) return result;
    return Error() << printable(result.error().message());
}

}  // namespace

Result<Profile> parseProfile(std::string_view text) {
    return withPrintableError(readDocument(text));
}

Result<Profile> readProfile(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    std::string text(kLargestProfile + 1, '\0');
    file.read(text.data(), static_cast<std::streamsize>(text.size()));
    if (!file.is_open() || file.bad()) return ErrnoError() << path;
    text.resize(static_cast<size_t>(file.gcount()));
    if (text.size() > kLargestProfile) return Error() << fmt::format("{}: larger than 1 MiB", path);
    Result<Profile> profile = parseProfile(text);
    if (!profile) return Error() << fmt::format("{}: {}", path, profile.error().message());
    return profile;
}

Result<Fault> parseFault(std::string_view text, const Profile& profile) {
    return withPrintableError(readOneFault(text, profile));
}

std::vector<KnownKey> knownKeys() {
    std::vector<KnownKey> keys;
    for (const Part& part : kParts) keys.push_back({"profile", part.key});
    addKeys("node", kNodeFields, keys);
    addKeys("file", kFileFields, keys);
    addKeys("motor", kMotorFields, keys);
    addKeys("fault", kFaultFields, keys);
    return keys;
}

}  // namespace handset
