// SPDX-License-Identifier: Apache-2.0
//
// The phone tool's commands but for "up".
#include "handset/phone/commands.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdlib>
#include <cstring>

#include <android-base/unique_fd.h>
#include <fmt/format.h>
#include <nlohmann/json.hpp>

#include "handset/common/control_client.h"
#include "handset/driver/printable.h"
#include "handset/phone/fault_arguments.h"
#include "handset/phone/phone_state.h"
#include "handset/phone/phone_up.h"
#include "handset/phone/process.h"
#include "handset/phone/supervisor.h"
#include "handset/phone/text_file.h"

namespace handset {
namespace {

using android::base::Result;
using android::base::unique_fd;

// Sends a request to the driver of the phone that is up and prints its answer, if it has one.
int request(const std::string& line) {
    if (!phoneThatIsUp()) return failWith(kRefused, kDownText);
    const Result<std::string> answer = askDriver(kControlSocket, line);
    return answer ? 0 : failWith(kRefused, answer.error().message());
}

// Waits until the process has ended, or `milliseconds` have passed. False when it runs on.
bool waitForEnd(pid_t pid, int milliseconds) {
    const unique_fd handle(static_cast<int>(syscall(SYS_pidfd_open, pid, 0)));
    if (!handle.ok()) return true;
    pollfd polled{handle.get(), POLLIN, 0};
    return poll(&polled, 1, milliseconds) > 0;
}

// One fault with what became of it: "motor upload errno=EIO delay=20 ms: struck 1 of 3 calls".
std::string faultText(const nlohmann::ordered_json& fault) {
    std::string text = fmt::format("{} {}", fault.value("node", ""), fault.value("op", ""));
    for (const auto& [key, value] : fault.items()) {
        if (key == "node" || key == "op" || key == "seen" || key == "struck") continue;
        text += fmt::format(" {}={}{}", key,
                            value.is_string() ? value.get<std::string>() : value.dump(),
                            key == "delay"   ? " ms"
                            : key == "short" ? " bytes"
                                             : "");
    }
    return printable(fmt::format("{}: struck {} of {} calls", text, fault.value("struck", 0),
                                 fault.value("seen", 0)));
}

}  // namespace

std::optional<PhoneState> phoneThatIsUp() {
    if (!isPhoneLocked()) return std::nullopt;
    return loadState();
}

int phoneDown() {
    if (geteuid() != 0) return failWith(kRefused, "taking a phone down takes root");
    using Clock = std::chrono::steady_clock;
    const Clock::time_point insist = Clock::now() + std::chrono::seconds(15);
    pid_t asked = 0;
    while (true) {
        if (std::optional<PhoneLock> lock = PhoneLock::tryTake()) {
            if (const std::optional<PhoneState> left = loadState()) cleanUpAfter(*left);
            lock->unlock();
            return 0;
        }
        const std::optional<PhoneState> state = loadState();
        if (state && state->supervisor != 0 && state->supervisor != asked) {
            asked = state->supervisor;
            kill(asked, SIGTERM);
            waitForEnd(asked, 10000);
            continue;
        }
        if (Clock::now() > insist) {
            if (asked == 0) {
                return failWith(kNotWell, "a \"phone up\" is under way and does not end");
            }
            kill(asked, SIGKILL);
            waitForEnd(asked, 1000);
        }
        // Somebody is just bringing a phone up, or has just taken one down.
        poll(nullptr, 0, 5);
    }
}

int phoneReset() {
    const std::optional<PhoneState> state = phoneThatIsUp();
    if (!state) return failWith(kRefused, kDownText);
    (void)askDriver(kSupervisorSocket, "log");
    for (const std::string& log : {state->serviceLog(), state->serviceOutput(), state->calls()}) {
        if (truncate(log.c_str(), 0) != 0 && errno != ENOENT) {
            return failWith(kRefused, fmt::format("{}: {}", log, strerror(errno)));
        }
    }
    return request("reset");
}

int phoneFault(const std::vector<std::string>& words) {
    const Result<std::string> fault = faultFromArguments(words);
    if (!fault) return failWith(kRefused, fault.error().message());
    return request("fault " + *fault);
}

int phoneClearFaults() {
    return request("clear");
}

int phoneListFaults(bool json) {
    if (!phoneThatIsUp()) return failWith(kRefused, kDownText);
    const Result<std::string> answer = askDriver(kControlSocket, "faults");
    if (!answer) return failWith(kRefused, answer.error().message());
    if (json) {
        fmt::print("{}\n", *answer);
        return 0;
    }
    for (const auto& fault : nlohmann::ordered_json::parse(*answer, nullptr, false)) {
        fmt::print("{}\n", faultText(fault));
    }
    return 0;
}

int phonePlug(bool plugIn, const std::string& node, unsigned after) {
    return request(fmt::format("{} {} {}", plugIn ? "plug" : "unplug", node, after));
}

int phoneNode(const std::string& path, const std::optional<std::string>& text) {
    if (text) {
        const nlohmann::json quoted = *text;
        return request(
                fmt::format("set {} {}", path,
                            quoted.dump(-1, ' ', true, nlohmann::json::error_handler_t::replace)));
    }
    if (!phoneThatIsUp()) return failWith(kRefused, kDownText);
    const Result<std::string> answer = askDriver(kControlSocket, "get " + path);
    if (!answer) return failWith(kRefused, answer.error().message());
    const nlohmann::json value = nlohmann::json::parse(*answer, nullptr, false);
    if (!value.is_string()) {
        fmt::print("{}\n", *answer);  // not text: its bytes in hexadecimal
        return 0;
    }
    const std::string content = value.get<std::string>();
    fwrite(content.data(), 1, content.size(), stdout);
    return 0;
}

int phoneExec(std::optional<unsigned> user, const std::vector<std::string>& command) {
    const std::optional<PhoneState> state = phoneThatIsUp();
    if (!state) return failWith(kRefused, kDownText);
    const unique_fd mounts(
            open(fmt::format("/proc/{}/ns/mnt", state->driver).c_str(), O_RDONLY | O_CLOEXEC));
    if (!mounts.ok()) return failWith(kRefused, fmt::format("the driver: {}", strerror(errno)));
    std::vector<char*> arguments;
    arguments.reserve(command.size() + 1);
    for (const std::string& word : command) arguments.push_back(const_cast<char*>(word.c_str()));
    arguments.push_back(nullptr);
    // Entering moves to the root directory; a relative path in the command is still meant from here.
    const unique_fd here(open(".", O_PATH | O_DIRECTORY | O_CLOEXEC));
    Launch launch;
    launch.mounts = mounts.get();
    if (user) launch.user = *user;
    if (auto done = becomeWhatLaunchAsks(launch); !done)
        return failWith(kRefused, done.error().message());
    if (here.ok() && fchdir(here.get()) != 0) errno = 0;  // stay at the root
    // Where a client notes its calls, unless whoever runs it has said so.
    setenv("VIBCTL_CALLS", state->calls().c_str(), 0);
    execvp(arguments[0], arguments.data());
    return failWith(errno == ENOENT ? 127 : 126,
                    fmt::format("{}: {}", command[0], strerror(errno)));
}

}  // namespace handset
