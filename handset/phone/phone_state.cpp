// SPDX-License-Identifier: Apache-2.0
//
// What is known about the phone that is up.
#include "handset/phone/phone_state.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <android-base/file.h>
#include <nlohmann/json.hpp>

#include "handset/phone/text_file.h"

namespace handset {
namespace {

using android::base::Result;
using android::base::unique_fd;

bool isSameFile(int fd, const char* path) {
    struct stat held {};
    struct stat there {};
    return fstat(fd, &held) == 0 && stat(path, &there) == 0 && held.st_ino == there.st_ino &&
           held.st_dev == there.st_dev;
}

}  // namespace

Result<void> saveState(const PhoneState& state) {
    nlohmann::json json{{"profile", state.profile},       {"out", state.out},
                        {"supervisor", state.supervisor}, {"driver", state.driver},
                        {"manager", state.manager},       {"service", state.service},
                        {"registered", state.registered}, {"made", state.made},
                        {"stopped", state.stopped},       {"starts", state.starts},
                        {"restart_at", state.restartAt}};
    if (state.serviceStatus) json["service_status"] = *state.serviceStatus;
    return replaceTextFile(
            kStateFile, json.dump(2, ' ', false, nlohmann::json::error_handler_t::replace) + "\n");
}

std::optional<PhoneState> loadState() {
    std::string text;
    if (!android::base::ReadFileToString(kStateFile, &text)) return std::nullopt;
    const nlohmann::json json = nlohmann::json::parse(text, nullptr, false);
    if (!json.is_object()) return std::nullopt;
    PhoneState state;
    try {
        state.profile = json.value("profile", "");
        state.out = json.value("out", kDefaultOut);
        state.supervisor = json.value("supervisor", 0);
        state.driver = json.value("driver", 0);
        state.manager = json.value("manager", 0);
        state.service = json.value("service", 0);
        state.registered = json.value("registered", false);
        state.stopped = json.value("stopped", false);
        state.starts = json.value("starts", 0);
        state.restartAt = json.value("restart_at", int64_t{0});
        if (json.contains("service_status")) state.serviceStatus = json["service_status"];
        state.made = json.value("made", std::vector<std::string>());
    } catch (const nlohmann::json::exception&) {
        return std::nullopt;  // not written by this tool
    }
    return state;
}

void removeState() {
    unlink(kStateFile);
}

std::optional<PhoneLock> PhoneLock::tryTake() {
    while (true) {
        unique_fd file(open(kLockFile, O_RDWR | O_CREAT | O_CLOEXEC, 0644));
        if (!file.ok() || flock(file.get(), LOCK_EX | LOCK_NB) != 0) return std::nullopt;
        // The last holder may have removed the file between the two calls.
        if (isSameFile(file.get(), kLockFile)) return PhoneLock(std::move(file));
    }
}

void PhoneLock::unlock() {
    unlink(kLockFile);
    mFile.reset();
}

bool isPhoneLocked() {
    const unique_fd file(open(kLockFile, O_RDONLY | O_CLOEXEC));
    return file.ok() && flock(file.get(), LOCK_SH | LOCK_NB) != 0;
}

}  // namespace handset
