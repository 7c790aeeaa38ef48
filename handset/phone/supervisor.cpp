// SPDX-License-Identifier: Apache-2.0
// The process that stands behind a phone.
#include "phone/supervisor.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/signalfd.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <initializer_list>
#include <utility>

#include "phone/binder_probe.h"
#include "phone/text_file.h"
#include "phone/vintf_fragments.h"

namespace handset {
namespace {

using std::chrono::milliseconds;
using std::chrono::seconds;

constexpr int kUp = 0;
constexpr int kServiceEnded = 1;
constexpr int kNotStarted = 2;

constexpr uid_t kSystemUser = 1000;
constexpr std::string_view kServiceName = "android.hardware.vibrator.IVibrator/default";

constexpr seconds kReadyPatience{20};
constexpr seconds kServicePatience{60};  // emulation under the address sanitizer takes its time
constexpr int kProbeFound = 0;
constexpr int kProbeFailed = 1;
constexpr int kEndPatience = 3000;  // milliseconds

UniqueFd openLog(const std::string& path) {
    // Appending, so that "phone reset" may empty the file under its writer.
    return UniqueFd(open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_APPEND | O_CLOEXEC, 0644));
}

std::string withLastLine(std::string text, const std::string& log) {
    const std::string line = lastLineOf(log);
    return line.empty() ? text : fmt::format("{}: {}", text, line);
}

/// How a server ended before it was ready. Both end with a line of their own that says why.
std::string endOf(std::string_view what, Child& child, const std::string& log) {
    child.end(kEndPatience);
    std::string line = lastLineOf(log);
    if (line.empty()) return fmt::format("the {} exited with status {}", what, *child.poll());
    constexpr std::string_view kOwnName = "handset-driver: ";
    if (line.starts_with(kOwnName)) line.erase(0, kOwnName.size());
    return line;
}

/// Asks until the service is registered, or is no more; runs in a process of its own. SIGTERM ends
/// it between two questions: one that is cut off would leave the manager's answer undelivered.
int awaitService(bool registered) {
    sigset_t end;
    sigemptyset(&end);
    sigaddset(&end, SIGTERM);
    sigprocmask(SIG_BLOCK, &end, nullptr);
    constexpr timespec kPause{0, 1000000};
    BinderProbe probe;
    if (!probe.isOpen()) return kProbeFailed;
    while (probe.isRegistered(kServiceName) != registered) {
        if (sigtimedwait(&end, nullptr, &kPause) == SIGTERM) return kProbeFailed;
    }
    return kProbeFound;
}

void endAll(std::initializer_list<std::optional<Child>*> children) {
    for (std::optional<Child>* child : children) {
        if (*child) (*child)->end(kEndPatience);
        child->reset();
    }
}

}  // namespace

Supervisor::Supervisor(PhonePlan plan, UniqueFd starter)
    : plan_(std::move(plan)), starter_(std::move(starter)) {
    sigset_t signals;
    sigemptyset(&signals);
    sigaddset(&signals, SIGTERM);
    sigaddset(&signals, SIGINT);
    sigprocmask(SIG_BLOCK, &signals, nullptr);
    signals_.reset(signalfd(-1, &signals, SFD_CLOEXEC));
    signal(SIGPIPE, SIG_IGN);
    state_.profile = plan_.profileName;
    state_.out = plan_.out;
    state_.supervisor = getpid();
}

void Supervisor::run() {
    UpReport up = bringUp();
    if (up.status != kUp) takeDown();
    report(up);
    if (up.status != kUp) return;
    watch();
    takeDown();
}

void Supervisor::report(const UpReport& report) {
    const std::string message = fmt::format("{}{}\n", report.status, report.text);
    if (write(starter_.get(), message.data(), message.size()) < 0) errno = 0;  // nobody waits
    starter_.reset();
}

UpReport Supervisor::bringUp() {
    if (auto failure = saveState(state_)) return {kNotStarted, failure->text};
    if (auto failed = startDriver()) return *failed;
    if (auto failed = startManager()) return *failed;
    if (!plan_.service.empty()) {
        if (auto failed = startService()) return *failed;
        return awaitRegistration();
    }
    if (auto failure = saveState(state_)) return {kNotStarted, failure->text};
    return {kUp, fmt::format("phone is up: profile {}, no service", state_.profile)};
}

/// Starts a server that is told, by --ready-fd, where to write a line once it serves; `ready`
/// becomes the other end.
Result<Child> Supervisor::startServer(std::vector<std::string> command, const std::string& log,
                                      UniqueFd& ready) {
    std::array<int, 2> ends{};
    if (pipe2(ends.data(), O_CLOEXEC) != 0) return Error{strerror(errno)};
    ready.reset(ends[0]);
    const UniqueFd told(ends[1]);
    const UniqueFd output = openLog(log);
    if (!output) return Error{fmt::format("{}: {}", log, strerror(errno))};
    command.insert(command.end(), {"--ready-fd", std::to_string(told.get())});
    return Child::start({.command = std::move(command),
                         .output = output.get(),
                         .errors = output.get(),
                         .kept = told.get()});
}

std::optional<UpReport> Supervisor::startDriver() {
    UniqueFd ready;
    Result<Child> driver = startServer({plan_.driver, "--profile", plan_.profilePath, "--journal",
                                        state_.journal(), "--control", kControlSocket},
                                       state_.driverLog(), ready);
    if (!driver) return UpReport{kNotStarted, driver.error().text};
    driver_ = std::move(*driver);
    state_.driver = driver_->pid();
    const Event event = wait(Clock::now() + kReadyPatience, ready.get());
    return event == Event::kReady ? std::nullopt : std::optional(notReady(event));
}

std::optional<UpReport> Supervisor::startManager() {
    if (auto failure = installVintfFragments(state_.made)) {
        return UpReport{kNotStarted, failure->text};
    }
    UniqueFd ready;
    Result<Child> manager = startServer({plan_.manager}, state_.managerLog(), ready);
    if (!manager) return UpReport{kNotStarted, manager.error().text};
    manager_ = std::move(*manager);
    state_.manager = manager_->pid();
    const Event event = wait(Clock::now() + kReadyPatience, ready.get());
    return event == Event::kReady ? std::nullopt : std::optional(notReady(event));
}

std::optional<UpReport> Supervisor::startService() {
    const UniqueFd mounts(
            open(fmt::format("/proc/{}/ns/mnt", driver_->pid()).c_str(), O_RDONLY | O_CLOEXEC));
    if (!mounts) return UpReport{kNotStarted, "the driver's mount namespace is gone"};
    const UniqueFd log = openLog(state_.serviceLog());
    const UniqueFd output = openLog(state_.serviceOutput());
    if (!log || !output) {
        return UpReport{kNotStarted, fmt::format("{}: {}", state_.serviceLog(), strerror(errno))};
    }
    Result<Child> service = Child::start({.command = {plan_.service},
                                          .mounts = mounts.get(),
                                          .user = kSystemUser,
                                          .output = output.get(),
                                          .errors = log.get()});
    if (!service) return UpReport{kNotStarted, service.error().text};
    service_ = std::move(*service);
    state_.service = service_->pid();
    if (auto failure = saveState(state_)) return UpReport{kNotStarted, failure->text};
    return std::nullopt;
}

UpReport Supervisor::awaitRegistration() {
    Result<Child> probe = Child::fork([] { return awaitService(true); });
    if (!probe) return {kNotStarted, probe.error().text};
    probe_ = std::move(*probe);
    const Event event = wait(Clock::now() + kServicePatience);
    if (event == Event::kService) {
        noteServiceEnd();
        return {kServiceEnded, serviceEndText(state_)};
    }
    if (event == Event::kLate) {
        return {kServiceEnded,
                withLastLine(fmt::format("the service did not register within {} seconds",
                                         kServicePatience.count()),
                             state_.serviceLog())};
    }
    if (event != Event::kProbe) return notReady(event);
    if (probe_->poll() != kProbeFound) return {kNotStarted, "/dev/binder cannot be opened"};
    probe_.reset();
    state_.registered = true;
    if (auto failure = saveState(state_)) return {kNotStarted, failure->text};
    return {kUp, fmt::format("phone is up: profile {}, service registered, pid {}", state_.profile,
                             state_.service)};
}

/// Why something that was waited for did not come.
UpReport Supervisor::notReady(Event event) {
    switch (event) {
        case Event::kDriver:
            return {kNotStarted, endOf("driver", *driver_, state_.driverLog())};
        case Event::kManager:
            return {kNotStarted, endOf("service manager", *manager_, state_.managerLog())};
        case Event::kLate:
            return {kNotStarted, "the driver or the service manager hangs"};
        default:
            return {kNotStarted, "interrupted"};
    }
}

void Supervisor::watch() {
    while (true) {
        switch (wait(Clock::time_point::max())) {
            case Event::kStop:
            case Event::kDriver:
                return;
            case Event::kService:
                noteServiceEnd();
                break;
            case Event::kManager:
                manager_.reset();
                state_.manager = 0;
                break;
            default:
                break;
        }
        if (saveState(state_)) return;
    }
}

void Supervisor::noteServiceEnd() {
    state_.serviceStatus = service_->poll();
    service_.reset();
}

void Supervisor::takeDown() {
    // The service first, so that the driver sees it let go of everything.
    endAll({&probe_, &service_, &driver_});
    // A manager that ends with the news of the service's death unread leaves a complaint of the
    // binder driver's behind.
    if (state_.registered && manager_) {
        Result<Child> probe = Child::fork([] { return awaitService(false); });
        if (probe) probe->await(kEndPatience);
        if (probe) probe->end(kEndPatience);
    }
    endAll({&manager_});
    removeVintfFragments(state_.made);
    unlink(kControlSocket);
    removeState();
}

// The first thing that happens: an end, then readiness, then the lapse of time.
Supervisor::Event Supervisor::wait(Clock::time_point deadline, int ready) {
    const auto handleOf = [](const std::optional<Child>& child) {
        return child ? child->descriptor() : -1;
    };
    // In the order in which they count.
    const std::array<std::pair<int, Event>, 7> sources{{
            {signals_.get(), Event::kStop},
            {handleOf(driver_), Event::kDriver},
            {handleOf(manager_), Event::kManager},
            {handleOf(service_), Event::kService},
            {handleOf(probe_), Event::kProbe},
            {ready, Event::kReady},
            {starter_.get(), Event::kStarterGone},
    }};
    std::array<pollfd, sources.size()> polled{};
    for (size_t i = 0; i < sources.size(); ++i) {
        // Of the starter only its end is of interest, and that is reported unasked.
        const bool asked = sources[i].second != Event::kStarterGone;
        polled[i] = {sources[i].first, static_cast<short>(asked ? POLLIN : 0), 0};
    }
    while (true) {
        int patience = -1;
        if (deadline != Clock::time_point::max()) {
            const auto left = std::chrono::ceil<milliseconds>(deadline - Clock::now());
            if (left.count() <= 0) return Event::kLate;
            patience = static_cast<int>(left.count());
        }
        if (poll(polled.data(), polled.size(), patience) <= 0) continue;
        for (size_t i = 0; i < sources.size(); ++i) {
            if (polled[i].revents == 0) continue;
            if (sources[i].second != Event::kReady || (polled[i].revents & POLLIN) != 0) {
                return sources[i].second;
            }
            polled[i].fd = -1;  // closed without a word: its writer is about to end
        }
    }
}

void cleanUpAfter(const PhoneState& state) {
    removeVintfFragments(state.made);
    unlink(kControlSocket);
    removeState();
}

std::string serviceEndText(const PhoneState& state) {
    return withLastLine(
            fmt::format("the service exited with status {}", state.serviceStatus.value_or(-1)),
            state.serviceLog());
}

}  // namespace handset
