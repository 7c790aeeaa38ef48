// SPDX-License-Identifier: Apache-2.0
//
// Telling the kernel module of faults.
#include "handset/driver/kernel_faults.h"

#include <cerrno>
#include <climits>
#include <cstdio>
#include <sstream>
#include <string_view>

#include <android-base/file.h>
#include <fmt/format.h>

#include "handset/driver/printable.h"

namespace handset {
namespace {

using android::base::ErrnoError;
using android::base::Error;
using android::base::Result;

constexpr const char* kParameter = "/sys/module/qvx_vibrator/parameters/fault";
constexpr std::string_view kClasses = "/sys/class/";
constexpr size_t kMostContents = 1500;  // of a page, in hexadecimal digits and beside the rest
constexpr size_t kMostFaults = 64;      // whose counts fit in a page

// How the module calls a node.
std::string_view targetOf(std::string_view node) {
    return node == kMotorNode ? node : node.substr(kClasses.size());
}

Result<void> ask(const std::string& request) {
    if (!android::base::WriteStringToFile(request, kParameter)) return ErrnoError() << kParameter;
    return {};
}

// For what the module cannot refuse.
void demand(const std::string& request) {
    if (auto done = ask(request); !done)
        fmt::print(stderr, "handset-driver: {}\n", done.error().message());
}

}  // namespace

Result<std::string> kernelFaultRequest(const Fault& fault) {
    const FaultAction& action = fault.action;
    if (fault.op == FaultOp::kOpen || (fault.node == kMotorNode && fault.op == FaultOp::kWrite)) {
        return Error() << fmt::format(
                       "the kernel module has no faults of {} {}; accepted: read and write of a "
                       "node, upload and erase of the motor",
                       fault.node, faultOpName(fault.op));
    }
    if (action.text && action.text->size() > kMostContents) {
        return Error() << fmt::format("the kernel module shows other contents of {} bytes at most",
                                      kMostContents);
    }
    return fmt::format("fault {} {} {} {} {} {:d} {} {} {}{}", targetOf(fault.node),
                       faultOpName(fault.op), action.error, action.shortCount.value_or(UINT_MAX),
                       action.delay.count(), action.unplug, fault.after, fault.every, fault.times,
                       action.text ? " =" + hexOf(*action.text) : "");
}

Result<void> KernelFaults::add(Fault fault) {
    Result<std::string> request = kernelFaultRequest(fault);
    if (!request) return request.error();
    if (FaultInjector::list().size() == kMostFaults)
        return Error() << fmt::format("the kernel module takes {} faults at most", kMostFaults);
    if (auto done = ask(*request); !done) return done;
    return FaultInjector::add(std::move(fault));
}

// What was struck by a fault that is no more is recorded while that is known.
void KernelFaults::clear() {
    demand("clear");
    mDrain();
    FaultInjector::clear();
}

std::vector<FaultInjector::Record> KernelFaults::list() const {
    std::vector<Record> records = FaultInjector::list();
    std::string counts;
    android::base::ReadFileToString(kParameter, &counts);
    std::istringstream numbers(counts);
    for (Record& record : records) numbers >> record.seen >> record.struck;
    return records;
}

void KernelFaults::unplug(std::string_view node) {
    demand(fmt::format("unplug {}", targetOf(node)));
    FaultInjector::unplug(node);
}

void KernelFaults::plug(std::string_view node) {
    mDrain();  // what went away before comes back
    demand(fmt::format("plug {}", targetOf(node)));
    FaultInjector::plug(node);
}

FaultAction KernelFaults::struck(size_t number) {
    FaultAction action;
    if (number == 0) {
        action.error = ENODEV;
        action.unplug = true;
        return action;
    }
    const std::vector<Record> records = FaultInjector::list();
    if (number > records.size()) return action;
    const Fault& fault = records[number - 1].fault;
    action = fault.action;
    if (action.unplug && action.error == 0) action.error = ENODEV;
    if (action.unplug) unplug(fault.node);  // returns when it has gone
    return action;
}

}  // namespace handset
