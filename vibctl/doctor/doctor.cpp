// SPDX-License-Identifier: Apache-2.0
//
// The order of the questions: see doctor.h.
#include "vibctl/doctor/doctor.h"

#include <unistd.h>

#include <chrono>

#include <fmt/format.h>

#include "vibctl/deadline.h"
#include "vibctl/doctor/contents.h"
#include "vibctl/doctor/declaration.h"
#include "vibctl/doctor/driver.h"
#include "vibctl/doctor/file_view.h"
#include "vibctl/doctor/nodes.h"
#include "vibctl/doctor/processes.h"
#include "vibctl/doctor/service.h"

namespace vibctl {

namespace {

namespace fs = std::filesystem;

// "/" as the process sees it; empty without the right to look.
fs::path rootOf(const fs::path& proc, pid_t pid) {
    fs::path own = proc / std::to_string(pid) / "root";
    return access((own / ".").c_str(), R_OK | X_OK) == 0 ? own : fs::path();
}

// Where nodes of the driver are, seen from `root`.
bool hasNodes(const fs::path& root) {
    std::error_code error;
    for (const fs::path path : {kLegacyDirectory, kLedsDirectory, kForceFeedbackDirectory}) {
        if (fs::exists(root / path.relative_path(), error)) return true;
    }
    return false;
}

fs::path findView(const fs::path& root, const ServiceProcess& service) {
    const fs::path proc = root / "proc";
    if (service.pid) {
        fs::path own = rootOf(proc, *service.pid);
        if (!own.empty()) return own;
    }
    if (hasNodes(root)) return root;
    for (const pid_t pid : otherViews(proc)) {
        fs::path other = rootOf(proc, pid);
        if (!other.empty() && hasNodes(other)) return other;
    }
    return root;
}

// What the service holds and cannot be told that it is gone: it opens the motor once.
std::vector<Finding> checkHeldMotor(const ServiceProcess& service, const fs::path& proc) {
    const std::string device = service.pid ? goneInputDevice(proc, *service.pid) : "";
    if (device.empty()) return {};
    return {bad(
            "nodes",
            fmt::format("process {} still holds the unplugged {}", *service.pid, shortName(device)),
            "restart the service")};
}

// A driver that hangs must not take the doctor along.
std::vector<Finding> examine(const fs::path& root, const ServiceProcess& service,
                             const fs::path& proc) {
    constexpr std::chrono::seconds kTimeout{10};
    const auto findings = within(kTimeout, [root, service, proc] {
        const FileView view(root);
        Driver driver = checkDriver(view, service.user);
        for (Finding& finding : checkHeldMotor(service, proc)) {
            driver.findings.push_back(std::move(finding));
        }
        for (Finding& finding : checkContents(view, driver)) {
            driver.findings.push_back(std::move(finding));
        }
        return driver.findings;
    });
    if (findings) return *findings;
    return {bad("nodes", fmt::format("the driver has not answered for {} s", kTimeout.count()),
                "see the kernel log")};
}

}  // namespace

std::vector<Finding> diagnose(const BinderFacts& facts, const fs::path& root) {
    const fs::path proc = root / "proc";
    const ServiceProcess service = findService(facts, proc);
    const fs::path manifests = root / manifestRoot(proc).relative_path();
    const fs::path view = findView(root, service);
    std::vector<Finding> findings = {
            checkDevice(facts, FileView(root), service.user),
            checkManager(facts, proc),
            checkDeclaration(manifests,
                             managerAnswers(facts) ? std::optional(facts.declared) : std::nullopt),
            checkRegistration(facts, service, proc),
            checkUser(service),
    };
    for (Finding& finding : examine(view, service, proc)) findings.push_back(std::move(finding));
    findings.push_back(checkExtension(facts));
    return findings;
}

}  // namespace vibctl
