// SPDX-License-Identifier: Apache-2.0
//
// The service as a process: see service.h.
#include "vibctl/doctor/service.h"

#include <fcntl.h>

#include <cerrno>

#include <fmt/format.h>

#include "vibctl/doctor/nodes.h"
#include "vibctl/doctor/processes.h"

namespace vibctl {

namespace {

namespace fs = std::filesystem;

constexpr const char* kManager = "servicemanager";
constexpr const char* kExecutable = "android.hardware.vibrator-service.quorvan";
constexpr int32_t kServedVersion = 2;
constexpr int32_t kExtensionVersion = 4;

// The user and the groups (system, input, log) of the service's init script.
const User kInitUser = {1000, 1000, {1004, 1007}};

}  // namespace

ServiceProcess findService(const BinderFacts& facts, const fs::path& proc) {
    ServiceProcess service;
    if (facts.registrant > 0) service.pid = facts.registrant;
    if (!service.pid) service.pid = findProcess(proc, kExecutable);
    const std::optional<User> user = service.pid ? userOf(proc, *service.pid) : std::nullopt;
    service.user = user.value_or(kInitUser);
    if (!user) service.pid.reset();
    return service;
}

bool managerAnswers(const BinderFacts& facts) {
    return !facts.deviceProblem && !facts.managerProblem;
}

Finding checkDevice(const BinderFacts& facts, const FileView& view, const User& user) {
    constexpr const char* kCheck = "binder";
    const std::vector<Access> device = {{facts.device, O_RDWR}};
    if (view.describe(facts.device).empty()) {
        return bad(kCheck, fmt::format("there is no {}", facts.device),
                   "modprobe binder_linux devices=binder");
    }
    if (facts.deviceProblem || view.open(user, device)[0] != 0) {
        return bad(kCheck,
                   fmt::format("user {} cannot open {} ({})", user.uid, facts.device,
                               view.describe(facts.device)),
                   fmt::format("chmod 0666 {}", facts.device));
    }
    return good(kCheck, facts.device + " opens");
}

Finding checkManager(const BinderFacts& facts, const fs::path& proc) {
    constexpr const char* kCheck = "service manager";
    if (facts.deviceProblem) return skipped(kCheck, "needs binder");
    if (!facts.managerProblem) return good(kCheck, "answers");
    const std::optional<pid_t> pid = findProcess(proc, kManager);
    if (!pid) return bad(kCheck, "it does not run", "start it, before the service");
    if (isStopped(proc, *pid)) {
        return bad(kCheck, fmt::format("process {} is stopped", *pid),
                   fmt::format("kill -CONT {}", *pid));
    }
    return bad(kCheck, fmt::format("process {} runs and does not answer", *pid),
               "restart it, then the service");
}

Finding checkRegistration(const BinderFacts& facts, const ServiceProcess& service,
                          const fs::path& proc) {
    constexpr const char* kCheck = "registration";
    if (!managerAnswers(facts)) {
        return skipped(kCheck, service.pid ? fmt::format("process {} runs; needs a service manager",
                                                         *service.pid)
                                           : "needs a service manager");
    }
    if (!facts.registered && !service.pid) {
        return bad(kCheck, "the service does not run",
                   facts.declared ? "start it; should it end at once, its log says why"
                                  : "see declaration, then start it");
    }
    if (!service.pid) {
        return facts.serviceProblem
                       ? bad(kCheck, "registered; " + *facts.serviceProblem, "restart it")
                       : good(kCheck, fmt::format("registered, version {}", facts.version));
    }
    const pid_t pid = *service.pid;
    if (isStopped(proc, pid)) {
        return bad(kCheck, fmt::format("process {} is stopped", pid),
                   fmt::format("kill -CONT {}", pid));
    }
    if (!facts.registered) {
        const std::optional<pid_t> manager = findProcess(proc, kManager);
        if (manager && startTimeOf(proc, pid) < startTimeOf(proc, *manager)) {
            return bad(kCheck,
                       fmt::format("process {} is unknown to the younger service manager", pid),
                       "restart it");
        }
        return bad(kCheck, fmt::format("process {} runs unregistered", pid),
                   facts.declared ? "see both their logs" : "see declaration, then restart it");
    }
    if (facts.serviceProblem) {
        if (const std::string node = nodeInUse(proc, pid); !node.empty()) {
            return bad(kCheck, fmt::format("process {} hangs in {}", pid, shortName(node)),
                       "see the kernel log");
        }
        return bad(kCheck, fmt::format("process {} {}", pid, *facts.serviceProblem),
                   "see its log, then restart it");
    }
    if (const std::string name = executableOf(proc, pid); name != kExecutable) {
        return bad(kCheck, fmt::format("process {}, {}, has registered it", pid, name),
                   "remove that other service");
    }
    if (facts.version != kServedVersion) {
        return bad(kCheck,
                   fmt::format("process {} has version {}, not {}", pid, facts.version,
                               kServedVersion),
                   "install this service's own program");
    }
    return good(kCheck, fmt::format("process {}, version {}", pid, kServedVersion));
}

Finding checkUser(const ServiceProcess& service) {
    constexpr const char* kCheck = "user";
    if (!service.pid) {
        return skipped(kCheck, fmt::format("nodes are judged for user {}", service.user.uid));
    }
    const std::string text = fmt::format("process {} is user {}", *service.pid, service.user.uid);
    if (service.user.uid != 0) return good(kCheck, text);
    return bad(kCheck, text + ", who opens what others cannot", "run it as user 1000");
}

Finding checkExtension(const BinderFacts& facts) {
    constexpr const char* kCheck = "extension";
    if (!managerAnswers(facts) || !facts.registered || facts.serviceProblem) {
        return skipped(kCheck, "needs the registered service");
    }
    constexpr const char* kNext = "install this service's own program";
    if (facts.extensionProblem) return bad(kCheck, *facts.extensionProblem, kNext);
    if (facts.extensionVersion != kExtensionVersion) {
        return bad(
                kCheck,
                fmt::format("it has version {}, not {}", facts.extensionVersion, kExtensionVersion),
                kNext);
    }
    return good(kCheck, fmt::format("version {}", kExtensionVersion));
}

}  // namespace vibctl
