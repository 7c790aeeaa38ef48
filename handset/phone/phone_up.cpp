// SPDX-License-Identifier: Apache-2.0
//
// "phone up".
#include "handset/phone/phone_up.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <optional>
#include <string_view>
#include <system_error>
#include <vector>

#include <android-base/result.h>
#include <android-base/unique_fd.h>
#include <fmt/format.h>

#include "handset/driver/printable.h"
#include "handset/phone/commands.h"
#include "handset/phone/phone_state.h"
#include "handset/phone/supervisor.h"
#include "handset/phone/text_file.h"

namespace handset {
namespace {

using android::base::Error;
using android::base::Result;
using android::base::unique_fd;

namespace fs = std::filesystem;

constexpr const char* kProfiles = QVX_PROFILE_DIRECTORY;
constexpr const char* kBinder = "/dev/binder";
constexpr const char* kServiceFile = "android.hardware.vibrator-service.quorvan";
constexpr const char* kInitScript =
        QVX_SERVICE_DIRECTORY "/android.hardware.vibrator-service.quorvan.rc";

std::vector<std::string> builtInProfiles() {
    std::vector<std::string> names;
    std::error_code error;
    for (const auto& entry : fs::directory_iterator(kProfiles, error)) {
        const fs::path name = entry.path().stem();  // the schema has one dot more
        if (entry.path().extension() == ".json" && !name.has_extension()) names.push_back(name);
    }
    std::sort(names.begin(), names.end());
    return names;
}

// The file of a profile given by name or by path.
Result<std::string> findProfile(const std::string& profile) {
    if (profile.find('/') != std::string::npos || profile.ends_with(".json")) {
        if (access(profile.c_str(), R_OK) == 0) return fs::absolute(profile).string();
        return Error() << fmt::format("profile {}: {}", profile, strerror(errno));
    }
    const std::vector<std::string> names = builtInProfiles();
    if (std::find(names.begin(), names.end(), profile) == names.end()) {
        return Error() << fmt::format(
                       "no profile named \"{}\"; there are {}, or give a file's path", profile,
                       fmt::join(names, ", "));
    }
    return fmt::format("{}/{}.json", kProfiles, profile);
}

Result<std::string> findExecutable(const std::string& path) {
    if (access(path.c_str(), X_OK) == 0) return fs::absolute(path).string();
    return Error() << fmt::format("{}: {}; build it first", path, strerror(errno));
}

Result<PhonePlan> makePlan(const UpOptions& options) {
    std::error_code error;
    const fs::path here = fs::read_symlink("/proc/self/exe", error).parent_path();
    PhonePlan plan;
    plan.profileName = options.profile;
    if (options.out.empty()) return Error() << "--out: a directory expected, not \"\"";
    plan.out = fs::absolute(options.out).string();
    Result<std::string> profile = findProfile(options.profile);
    if (!profile) return profile.error();
    plan.profilePath = *profile;
    if (!options.module.empty()) plan.module = fs::absolute(options.module).string();
    const std::string service =
            options.service.empty() ? (here / kServiceFile).string() : options.service;
    struct Part {
        std::string path;
        std::string* found;
    };
    std::vector<Part> parts{{here / "handset-driver", &plan.driver},
                            {here / "servicemanager", &plan.manager}};
    if (!options.noService) {
        parts.push_back({service, &plan.service});
        Result<InitScript> init = readInitScript(kInitScript);
        if (!init) return init.error();
        plan.init = *init;
    }
    for (const Part& part : parts) {
        Result<std::string> found = findExecutable(part.path);
        if (!found) return found.error();
        *part.found = *found;
    }
    return plan;
}

// The supervisor's life, in a process of its own that keeps nothing of the terminal.
[[noreturn]] void supervise(PhonePlan plan, unique_fd starter, PhoneLock lock) {
    setsid();
    if (chdir("/") != 0) _exit(1);
    const unique_fd nothing(open("/dev/null", O_RDWR | O_CLOEXEC));
    for (const int fd : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) dup2(nothing.get(), fd);
    Supervisor(std::move(plan), std::move(starter)).run();
    lock.unlock();
    _exit(0);
}

UpReport readReport(int fd) {
    std::string text;
    std::array<char, 4096> part;
    for (ssize_t size = 1; size > 0;) {
        size = read(fd, part.data(), part.size());
        if (size < 0 && errno == EINTR) size = 1;
        if (size > 0) text.append(part.data(), static_cast<size_t>(size));
    }
    if (text.empty()) return {kRefused, "the supervisor died"};
    if (text.ends_with('\n')) text.pop_back();
    return {text[0] - '0', text.substr(1)};
}

UpReport startSupervisor(PhonePlan plan, PhoneLock lock) {
    std::array<int, 2> ends{};
    if (pipe2(ends.data(), O_CLOEXEC) != 0) return {kRefused, strerror(errno)};
    unique_fd readEnd(ends[0]);
    unique_fd writeEnd(ends[1]);
    const pid_t pid = fork();
    if (pid < 0) return {kRefused, strerror(errno)};
    if (pid == 0) {
        readEnd.reset();
        supervise(std::move(plan), std::move(writeEnd), std::move(lock));
    }
    writeEnd.reset();
    return readReport(readEnd.get());
}

}  // namespace

int failWith(int status, std::string text) {
    fmt::print(stderr, "phone: {}\n", printable(std::move(text)));
    return status;
}

int phoneUp(const UpOptions& options) {
    if (geteuid() != 0) return failWith(kRefused, "bringing a phone up takes root");
    if (access(kBinder, F_OK) != 0) {
        return failWith(kRefused,
                        "there is no /dev/binder here; phones come up inside the "
                        "handset, see handset/shell");
    }
    Result<PhonePlan> plan = makePlan(options);
    if (!plan) return failWith(kRefused, plan.error().message());
    std::optional<PhoneLock> lock = PhoneLock::tryTake();
    if (!lock) {
        const std::optional<PhoneState> other = loadState();
        return failWith(kRefused,
                        fmt::format("a phone is up already: profile {}; \"phone down\" ends it",
                                    other ? other->profile : "unknown"));
    }
    if (const std::optional<PhoneState> left = loadState()) cleanUpAfter(*left);
    std::error_code error;
    fs::create_directories(plan->out, error);
    if (error) {
        lock->unlock();
        return failWith(kRefused, fmt::format("{}: {}", plan->out, error.message()));
    }
    // Clients of every user open it, as on a phone.
    if (chmod(kBinder, 0666) != 0) {
        lock->unlock();
        return failWith(kRefused, fmt::format("{}: {}", kBinder, strerror(errno)));
    }
    const UpReport report = startSupervisor(std::move(*plan), std::move(*lock));
    if (report.status != 0) return failWith(report.status, report.text);
    fmt::print("{}\n", report.text);
    return 0;
}

}  // namespace handset
