// SPDX-License-Identifier: Apache-2.0
//
// Loading the kernel module, and its report as journal lines.
#include "handset/driver/kernel_module.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdlib>
#include <string_view>
#include <vector>

#include <android-base/file.h>
#include <android-base/strings.h>
#include <fmt/format.h>

#include "handset/driver/event_node.h"
#include "handset/driver/field_table.h"
#include "handset/driver/input_devices.h"
#include "handset/driver/permission.h"
#include "handset/driver/printable.h"

namespace handset {
namespace {

using android::base::ErrnoError;
using android::base::Error;
using android::base::Result;

constexpr const char* kModule = "qvx_vibrator";
constexpr const char* kReport = "/dev/qvx_vibrator_report";
constexpr std::string_view kRoot = "/sys/class/";
constexpr size_t kLongestText = 4095;  // sysfs shows a page less a byte

// Whether the string may stand in the module's parameters as it is.
bool isPlain(std::string_view text) {
    return std::all_of(text.begin(), text.end(), [](char c) {
        return c > ' ' && c < '\x7f' && c != '"' && c != ',' && c != ':';
    });
}

Result<std::string> describe(const NodeProfile& node) {
    const std::string_view path = std::string_view(node.path).substr(kRoot.size());
    if (std::count(path.begin(), path.end(), '/') != 2 || !isPlain(path)) {
        return Error() << fmt::format(
                       "{}: the kernel module makes nodes /sys/class/CLASS/DEVICE/NAME alone",
                       node.path);
    }
    if (node.text.size() > kLongestText) {
        return Error() << fmt::format("{}: a node of the kernel module shows {} bytes at most",
                                      node.path, kLongestText);
    }
    const char* const access = node.access == Access::kReadOnly    ? "ro"
                               : node.access == Access::kWriteOnly ? "wo"
                               : node.hold                         ? "hold"
                                                                   : "rw";
    return fmt::format("{}:{}:{}", path, access, hexOf(node.text));
}

Result<void> giveToSystemUser(const std::vector<NodeProfile>& nodes) {
    for (const NodeProfile& node : nodes) {
        if (chown(node.path.c_str(), kSystemUser, kSystemUser) != 0)
            return ErrnoError() << node.path;
    }
    return {};
}

// Takes a member out of a line: null where there is none.
JournalFields taken(JournalFields& fields, const char* key) {
    JournalFields value = fields.value(key, JournalFields());
    fields.erase(key);
    return value;
}

// A line of the report as the journal has it.
void record(Journal& journal, KernelFaults& faults, const std::string& line) {
    JournalFields fields = JournalFields::parse(line, nullptr, false);
    if (!fields.is_object()) return;
    const Caller caller = {fields.value("pid", 0), fields.value("uid", 0U)};
    fields.erase("pid");
    fields.erase("uid");
    fields["result"] = resultOf(fields.value("result", 0));
    const JournalFields fault = taken(fields, "fault");
    const JournalFields took = taken(fields, "took");
    if (const JournalFields digits = taken(fields, "hex"); digits.is_string()) {
        const JournalFields result = taken(fields, "result");
        putBytes(fields, "data", "hex", decodeHex(digits.get<std::string>()).value_or(""));
        fields["result"] = result;
    }
    if (fault.is_number()) {
        fields["fault"] = toJson(faults.struck(fault.get<size_t>()));
        fields["took"] = took;
    }
    journal.record(caller, fields);
}

}  // namespace

std::optional<unsigned> findEvent(const std::string& name) {
    std::string list;
    android::base::ReadFileToString(kInputDevices, &list);
    const size_t block = list.find(fmt::format("N: Name=\"{}\"\n", name));
    constexpr std::string_view kHandlers = "\nH: Handlers=event";
    const size_t handlers = list.find(kHandlers, block);
    if (block == std::string::npos || handlers == std::string::npos) return std::nullopt;
    return static_cast<unsigned>(strtoul(list.c_str() + handlers + kHandlers.size(), nullptr, 10));
}

Result<std::string> moduleParameters(const Profile& profile) {
    for (const Fault& fault : profile.faults) {
        if (auto done = kernelFaultRequest(fault); !done) return done.error();
    }
    std::vector<std::string> nodes;
    for (const NodeProfile& node : profile.nodes) {
        Result<std::string> description = describe(node);
        if (!description) return description.error();
        nodes.push_back(*description);
    }
    std::string parameters = fmt::format("nodes={}", fmt::join(nodes, ","));
    if (!profile.motor) return parameters;
    if (profile.motor->event) {
        return Error() << "the kernel chooses the motor's number: leave out \"event\"";
    }
    if (!isPlain(profile.motor->name)) {
        return Error() << fmt::format(
                       "motor \"{}\": the kernel module takes a name of ASCII characters without "
                       "spaces, quotes, commas and colons",
                       profile.motor->name);
    }
    return fmt::format("{} motor={} effects_max={}", parameters, profile.motor->name,
                       profile.motor->effectsMax);
}

Result<std::unique_ptr<KernelModule>> KernelModule::load(const std::string& file,
                                                         const Profile& profile) {
    Result<std::string> parameters = moduleParameters(profile);
    if (!parameters) return parameters.error();
    const android::base::unique_fd module(open(file.c_str(), O_RDONLY | O_CLOEXEC));
    if (!module.ok()) return ErrnoError() << file;
    if (syscall(SYS_finit_module, module.get(), parameters->c_str(), 0) != 0)
        return ErrnoError() << file;
    std::unique_ptr<KernelModule> loaded(new KernelModule);
    loaded->mReport.reset(open(kReport, O_RDONLY | O_CLOEXEC));
    if (!loaded->mReport.ok()) return ErrnoError() << kReport;
    if (auto done = giveToSystemUser(profile.nodes); !done) return done.error();
    if (!profile.motor) return loaded;
    const std::optional<unsigned> event = findEvent(profile.motor->name);
    if (!event) return Error() << "the kernel module has made no motor";
    loaded->mEvent = *event;
    if (auto done = EventNode().handOver(*event); !done) return done.error();
    return loaded;
}

KernelModule::~KernelModule() {
    mReport.reset();
    syscall(SYS_delete_module, kModule, 0);
}

void KernelModule::report(Journal& journal, KernelFaults& faults) {
    std::array<char, 16384> part;
    for (;;) {
        const ssize_t size = read(mReport.get(), part.data(), part.size());
        if (size < 0 && errno == EOVERFLOW) {
            journal.record({}, {{"op", "lost"}});
            mRest.clear();
            continue;
        }
        if (size <= 0) return;
        mRest.append(part.data(), static_cast<size_t>(size));
        size_t begin = 0;
        for (size_t end = mRest.find('\n'); end != std::string::npos;
             end = mRest.find('\n', begin)) {
            record(journal, faults, mRest.substr(begin, end - begin));
            begin = end + 1;
        }
        mRest.erase(0, begin);
    }
}

}  // namespace handset
