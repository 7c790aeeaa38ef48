// SPDX-License-Identifier: Apache-2.0
//
// The order of the questions, and those about binder: see doctor.h.
#include "doctor/doctor.h"

#include <unistd.h>

#include <optional>

#include <fmt/format.h>

#include "doctor/declaration.h"
#include "doctor/driver.h"
#include "doctor/file_view.h"
#include "doctor/processes.h"

namespace vibctl {

namespace {

namespace fs = std::filesystem;

constexpr const char* kService = "android.hardware.vibrator.IVibrator/default";
constexpr const char* kExecutable = "android.hardware.vibrator-service.quorvan";
constexpr const char* kExtension = "vendor.quorvan.hardware.vibrator.IZelVibrator";
constexpr int32_t kVersion = 2;
constexpr int32_t kExtensionVersion = 4;

/// The user and the groups (system, input, log) of the service's init script.
const User kInitUser = {1000, 1000, {1004, 1007}};

Finding checkDevice(const BinderFacts& facts) {
    if (!facts.deviceProblem) return good("binder", facts.device + " opens");
    return bad("binder", *facts.deviceProblem,
               "load the kernel's binder driver (modprobe binder_linux devices=binder) and let "
               "everybody open the device (chmod 0666)");
}

Finding checkManager(const BinderFacts& facts) {
    constexpr const char* kCheck = "service manager";
    if (facts.deviceProblem) return skipped(kCheck, "needs binder");
    if (!facts.managerProblem) return good(kCheck, "answers");
    return bad(kCheck, *facts.managerProblem, "start servicemanager, as the first user of binder");
}

bool managerAnswers(const BinderFacts& facts) {
    return !facts.deviceProblem && !facts.managerProblem;
}

Finding checkRegistration(const BinderFacts& facts, std::optional<pid_t> running) {
    constexpr const char* kCheck = "registration";
    const std::string process =
            running ? fmt::format("process {}", *running) : std::string("an unknown process");
    if (!managerAnswers(facts)) {
        const std::string state =
                running ? process + " runs" : fmt::format("no {} runs", kExecutable);
        return skipped(kCheck, fmt::format("needs a service manager; {}", state));
    }
    if (!facts.registered && !running) {
        return bad(kCheck,
                   fmt::format("{} is not registered and no {} runs", kService, kExecutable),
                   "start the service; where it ends at once, its log names the failed check");
    }
    if (!facts.registered) {
        return bad(kCheck, fmt::format("{} runs, but {} is not registered", process, kService),
                   facts.declared ? "look into the logs of the service and the service manager"
                                  : "see declaration, then restart the service");
    }
    if (facts.serviceProblem) {
        return bad(kCheck,
                   fmt::format("{} has registered {}, but {}", process, kService,
                               *facts.serviceProblem),
                   "look into the service's log for the call that it hangs in, then restart it");
    }
    if (facts.version != kVersion) {
        return bad(kCheck,
                   fmt::format("{} has registered {} version {} where {} is expected", process,
                               kService, facts.version, kVersion),
                   "stop the other vibrator service");
    }
    return good(kCheck,
                fmt::format("{} has registered {} version {}", process, kService, kVersion));
}

Finding checkUser(std::optional<pid_t> running, const std::optional<User>& user) {
    constexpr const char* kCheck = "user";
    if (!running) {
        return skipped(kCheck, fmt::format("the service does not run; nodes are judged for user {}",
                                           kInitUser.uid));
    }
    if (!user) {
        return bad(kCheck, fmt::format("process {} cannot be looked at", *running),
                   "run vibctl doctor where the service's /proc is seen");
    }
    const std::string text = fmt::format("process {} runs as user {}", *running, user->uid);
    if (user->uid != 0) return good(kCheck, text);
    return bad(kCheck, text,
               "run it as user 1000 (system): root hides which nodes others cannot open");
}

Finding checkExtension(const BinderFacts& facts) {
    constexpr const char* kCheck = "extension";
    if (!managerAnswers(facts) || !facts.registered || facts.serviceProblem) {
        return skipped(kCheck, "needs the registered service");
    }
    constexpr const char* kNext = "update the service: it attaches version 4 before it registers";
    if (facts.extensionProblem) return bad(kCheck, *facts.extensionProblem, kNext);
    if (facts.extensionVersion != kExtensionVersion) {
        return bad(kCheck,
                   fmt::format("{} has version {} where {} is expected", kExtension,
                               facts.extensionVersion, kExtensionVersion),
                   kNext);
    }
    return good(kCheck, fmt::format("{} version {} is attached", kExtension, kExtensionVersion));
}

/// What the service sees as "/", its private mounts included, as far as it may be looked at.
fs::path viewOf(const fs::path& root, std::optional<pid_t> running) {
    if (running) {
        fs::path own = root / "proc" / std::to_string(*running) / "root";
        if (access((own / ".").c_str(), R_OK | X_OK) == 0) return own;
    }
    return root;
}

}  // namespace

std::vector<Finding> diagnose(const BinderFacts& facts, const fs::path& root) {
    const fs::path proc = root / "proc";
    std::optional<pid_t> running;
    if (facts.registrant > 0) running = facts.registrant;
    if (!running) running = findProcess(proc, kExecutable);
    const std::optional<User> user = running ? userOf(proc, *running) : std::nullopt;
    const std::optional<bool> declared =
            managerAnswers(facts) ? std::optional(facts.declared) : std::nullopt;

    std::vector<Finding> findings = {
            checkDevice(facts),
            checkManager(facts),
            checkDeclaration(root / manifestRoot(proc).relative_path(), kService, declared),
            checkRegistration(facts, running),
            checkUser(running, user),
    };
    const FileView view(viewOf(root, running));
    for (Finding& finding : checkDriver(view, user.value_or(kInitUser))) {
        findings.push_back(std::move(finding));
    }
    findings.push_back(checkExtension(facts));
    return findings;
}

}  // namespace vibctl
