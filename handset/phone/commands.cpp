// SPDX-License-Identifier: Apache-2.0
// The phone tool's commands but for "up".
#include "phone/commands.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <poll.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstring>
#include <nlohmann/json.hpp>

#include "phone/control_client.h"
#include "phone/fault_words.h"
#include "phone/phone_state.h"
#include "phone/phone_up.h"
#include "phone/process.h"
#include "phone/supervisor.h"
#include "phone/text_file.h"

namespace handset {
namespace {

constexpr int kNotWell = 1;
constexpr int kRefused = 2;
constexpr const char* kDownText = "no phone is up; \"phone up\" starts one";

std::optional<PhoneState> phoneThatIsUp() {
    if (!isPhoneLocked()) return std::nullopt;
    return loadState();
}

/// Sends a request to the driver of the phone that is up and prints its answer, if it has one.
int request(const std::string& line) {
    if (!phoneThatIsUp()) return failWith(kRefused, kDownText);
    const Result<std::string> answer = askDriver(kControlSocket, line);
    return answer ? 0 : failWith(kRefused, answer.error().text);
}

int printFile(const std::string& path) {
    const std::optional<std::string> text = readTextFile(path);
    if (!text) return failWith(kRefused, fmt::format("{}: {}", path, strerror(errno)));
    fwrite(text->data(), 1, text->size(), stdout);
    return 0;
}

std::string outFolder(const std::string& given) {
    if (!given.empty()) return given;
    const std::optional<PhoneState> state = loadState();
    return state ? state->out : kDefaultOut;
}

/// Waits until the process has ended, or `milliseconds` have passed. False when it runs on.
bool waitForEnd(pid_t pid, int milliseconds) {
    const UniqueFd handle(static_cast<int>(syscall(SYS_pidfd_open, pid, 0)));
    if (!handle) return true;
    pollfd polled{handle.get(), POLLIN, 0};
    return poll(&polled, 1, milliseconds) > 0;
}

}  // namespace

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

int phoneStatus() {
    const std::optional<PhoneState> state = phoneThatIsUp();
    if (!state) {
        fmt::print("phone is down\n");
        return kNotWell;
    }
    fmt::print("phone is up: profile {}, ", state->profile);
    if (state->serviceStatus) {
        fmt::print("{}\n", serviceEndText(*state));
        return kNotWell;
    }
    if (state->service == 0) {
        fmt::print("no service\n");
    } else if (state->registered) {
        fmt::print("service registered, pid {}\n", state->service);
    } else {
        fmt::print("service starting, pid {}\n", state->service);
    }
    return 0;
}

int phoneReset() {
    const std::optional<PhoneState> state = phoneThatIsUp();
    if (!state) return failWith(kRefused, kDownText);
    for (const std::string& log : {state->serviceLog(), state->serviceOutput()}) {
        if (truncate(log.c_str(), 0) != 0 && errno != ENOENT) {
            return failWith(kRefused, fmt::format("{}: {}", log, strerror(errno)));
        }
    }
    return request("reset");
}

int phoneFault(const std::vector<std::string>& words) {
    const Result<std::string> fault = faultFromWords(words);
    if (!fault) return failWith(kRefused, fault.error().text);
    return request("fault " + *fault);
}

int phoneClearFaults() {
    return request("clear");
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
    if (!answer) return failWith(kRefused, answer.error().text);
    const nlohmann::json value = nlohmann::json::parse(*answer, nullptr, false);
    if (!value.is_string()) {
        fmt::print("{}\n", *answer);  // not text: its bytes in hexadecimal
        return 0;
    }
    const std::string content = value.get<std::string>();
    fwrite(content.data(), 1, content.size(), stdout);
    return 0;
}

int phonePrintJournal(const std::string& out) {
    // A phone that is down has settled; one that does not answer still has a journal.
    if (phoneThatIsUp()) (void)askDriver(kControlSocket, "settle");
    return printFile(outFolder(out) + "/journal.jsonl");
}

int phonePrintLog(const std::string& out) {
    return printFile(outFolder(out) + "/service.log");
}

int phoneExec(std::optional<unsigned> user, const std::vector<std::string>& command) {
    const std::optional<PhoneState> state = phoneThatIsUp();
    if (!state) return failWith(kRefused, kDownText);
    const UniqueFd mounts(
            open(fmt::format("/proc/{}/ns/mnt", state->driver).c_str(), O_RDONLY | O_CLOEXEC));
    if (!mounts) return failWith(kRefused, fmt::format("the driver: {}", strerror(errno)));
    std::vector<char*> arguments;
    arguments.reserve(command.size() + 1);
    for (const std::string& word : command) arguments.push_back(const_cast<char*>(word.c_str()));
    arguments.push_back(nullptr);
    // Entering moves to the root folder; a relative path in the command is still meant from here.
    const UniqueFd here(open(".", O_PATH | O_DIRECTORY | O_CLOEXEC));
    Launch launch;
    launch.mounts = mounts.get();
    if (user) launch.user = *user;
    if (auto failure = becomeWhatLaunchAsks(launch)) return failWith(kRefused, failure->text);
    if (here && fchdir(here.get()) != 0) errno = 0;  // stay at the root
    execvp(arguments[0], arguments.data());
    return failWith(errno == ENOENT ? 127 : 126,
                    fmt::format("{}: {}", command[0], strerror(errno)));
}

}  // namespace handset
