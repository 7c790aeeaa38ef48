// SPDX-License-Identifier: Apache-2.0
//
// The process that runs a phone: its servers, what it waits for, and the way down.
#include "handset/phone/supervisor.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/signalfd.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <initializer_list>
#include <utility>

#include <fmt/format.h>

#include "handset/phone/registration.h"
#include "handset/phone/text_file.h"
#include "handset/phone/vintf_fragments.h"

namespace handset {
namespace {

using android::base::ErrnoError;
using android::base::Result;
using android::base::unique_fd;

using std::chrono::milliseconds;
using std::chrono::seconds;

constexpr seconds kReadyTimeout{20};

// How a server ended before it was ready. Both end with a line of their own that says why.
std::string endOf(std::string_view what, Child& child, const std::string& log) {
    child.end(kEndTimeout);
    std::string line = lastLineOf(log);
    if (line.empty()) return fmt::format("the {} exited with status {}", what, *child.poll());
    constexpr std::string_view kOwnName = "handset-driver: ";
    if (line.starts_with(kOwnName)) line.erase(0, kOwnName.size());
    return line;
}

void endAll(std::initializer_list<std::optional<Child>*> children) {
    for (std::optional<Child>* child : children) {
        if (*child) (*child)->end(kEndTimeout);
        child->reset();
    }
}

}  // namespace

Supervisor::Supervisor(PhonePlan plan, unique_fd starter)
    : mPlan(std::move(plan)), mStarter(std::move(starter)) {
    sigset_t signals;
    sigemptyset(&signals);
    sigaddset(&signals, SIGTERM);
    sigaddset(&signals, SIGINT);
    sigprocmask(SIG_BLOCK, &signals, nullptr);
    mSignals.reset(signalfd(-1, &signals, SFD_CLOEXEC));
    signal(SIGPIPE, SIG_IGN);
    mState.profile = mPlan.profileName;
    mState.out = mPlan.out;
    mState.supervisor = getpid();
}

void Supervisor::run() {
    UpReport up = bringUp();
    if (up.status != UpReport::kUp) takeDown();
    report(up);
    if (up.status != UpReport::kUp) return;
    if (listen()) watch();
    takeDown();
}

void Supervisor::report(const UpReport& report) {
    const std::string message = fmt::format("{}{}\n", report.status, report.text);
    if (write(mStarter.get(), message.data(), message.size()) < 0) errno = 0;  // nobody waits
    mStarter.reset();
}

UpReport Supervisor::bringUp() {
    if (auto done = saveState(mState); !done) return UpReport::notStarted(done.error().message());
    if (auto done = makeCalls(); !done) return UpReport::notStarted(done.error().message());
    if (auto failed = startDriver()) return *failed;
    if (auto failed = startManager()) return *failed;
    if (!mPlan.service.empty()) {
        if (auto failed = startService()) return *failed;
        return awaitRegistration();
    }
    if (auto done = saveState(mState); !done) return UpReport::notStarted(done.error().message());
    return {UpReport::kUp, fmt::format("phone is up: profile {}, no service", mState.profile)};
}

// Starts a server that is told, by --ready-fd, where to write a line once it serves; `ready`
// becomes the other end.
Result<Child> Supervisor::startServer(std::vector<std::string> command, const std::string& log,
                                      unique_fd& ready) {
    std::array<int, 2> ends{};
    if (pipe2(ends.data(), O_CLOEXEC) != 0) return ErrnoError();
    ready.reset(ends[0]);
    const unique_fd told(ends[1]);
    const unique_fd output = openLog(log);
    if (!output.ok()) return ErrnoError() << log;
    command.insert(command.end(), {"--ready-fd", std::to_string(told.get())});
    return Child::start({.command = std::move(command),
                         .output = output.get(),
                         .errors = output.get(),
                         .kept = told.get()});
}

std::optional<UpReport> Supervisor::startDriver() {
    unique_fd ready;
    std::vector<std::string> command = {mPlan.driver,  "--profile",      mPlan.profilePath,
                                        "--journal",   mState.journal(), "--control",
                                        kControlSocket};
    if (!mPlan.module.empty()) command.insert(command.end(), {"--module", mPlan.module});
    Result<Child> driver = startServer(std::move(command), mState.driverLog(), ready);
    if (!driver) return UpReport::notStarted(driver.error().message());
    mDriver = std::move(*driver);
    mState.driver = mDriver->pid();
    const Event event = wait(Clock::now() + kReadyTimeout, ready.get());
    return event == Event::kReady ? std::nullopt : std::optional(notReady(event));
}

std::optional<UpReport> Supervisor::startManager() {
    if (auto done = installVintfFragments(mState.made); !done) {
        return UpReport::notStarted(done.error().message());
    }
    unique_fd ready;
    Result<Child> manager =
            startServer({mPlan.manager, "--rules", QVX_SERVICE_RULES}, mState.managerLog(), ready);
    if (!manager) return UpReport::notStarted(manager.error().message());
    mManager = std::move(*manager);
    mState.manager = mManager->pid();
    const Event event = wait(Clock::now() + kReadyTimeout, ready.get());
    return event == Event::kReady ? std::nullopt : std::optional(notReady(event));
}

// Where clients note their calls: of whatever user they are.
Result<void> Supervisor::makeCalls() const {
    const unique_fd calls = openLog(mState.calls());
    if (!calls.ok() || fchmod(calls.get(), 0666) != 0) return ErrnoError() << mState.calls();
    return {};
}

// Why something that was waited for did not come.
UpReport Supervisor::notReady(Event event) {
    switch (event) {
        case Event::kDriver:
            return UpReport::notStarted(endOf("driver", *mDriver, mState.driverLog()));
        case Event::kManager:
            return UpReport::notStarted(endOf("service manager", *mManager, mState.managerLog()));
        case Event::kLate:
            return UpReport::notStarted("the driver or the service manager hangs");
        default:
            return UpReport::notStarted("interrupted");
    }
}

Result<void> Supervisor::listen() {
    auto requests = ControlSocket::listenAt(
            kSupervisorSocket, [this](std::string_view request) { return answer(request); });
    if (!requests) return requests.error();
    mRequests = std::move(*requests);
    return {};
}

void Supervisor::watch() {
    while (true) {
        switch (wait(mRestartAt.value_or(Clock::time_point::max()))) {
            case Event::kStop:
            case Event::kDriver:
                return;
            case Event::kService:
                noteServiceEnd();
                break;
            case Event::kManager:
                mManager.reset();
                mState.manager = 0;
                break;
            case Event::kRequest:
                mRequests->serve();
                break;
            case Event::kLate:
                mRestartAt.reset();
                (void)startService();
                break;
            default:
                break;
        }
        if (!saveState(mState)) return;
    }
}

std::string Supervisor::answer(std::string_view request) {
    constexpr std::string_view kService = "service ";
    if (request == "log") {
        if (mLog) mLog->drain();
        return "ok";
    }
    if (!request.starts_with(kService)) return "error unknown request";
    if (mPlan.service.empty()) return "error the phone has no service";
    const std::string refusal = serviceRequest(request.substr(kService.size()));
    (void)saveState(mState);  // before whoever asked looks at it
    return refusal.empty() ? "ok" : "error " + refusal;
}

void Supervisor::takeDown() {
    // The service first, so that the driver sees it let go of everything.
    endAll({&mProbe, &mService, &mDriver});
    if (mLog) {
        mLog->drain();
        mLog->flush();
    }
    mRequests.reset();
    // A manager that ends with the news of the service's death unread leaves a complaint of the
    // binder driver's behind.
    if (mState.registered && mManager) {
        Result<Child> probe = Child::fork([] { return awaitService(false); });
        if (probe) probe->await(kEndTimeout);
        if (probe) probe->end(kEndTimeout);
    }
    endAll({&mManager});
    removeVintfFragments(mState.made);
    unlink(kControlSocket);
    removeState();
}

// The first thing that happens: an end, then readiness, then the lapse of time.
Supervisor::Event Supervisor::wait(Clock::time_point deadline, int ready) {
    const auto handleOf = [](const std::optional<Child>& child) {
        return child ? child->descriptor() : -1;
    };
    // In the order in which they count.
    const std::array<std::pair<int, Event>, 8> sources{{
            {mSignals.get(), Event::kStop},
            {handleOf(mDriver), Event::kDriver},
            {handleOf(mManager), Event::kManager},
            {handleOf(mService), Event::kService},
            {handleOf(mProbe), Event::kProbe},
            {ready, Event::kReady},
            {mRequests ? mRequests->descriptor() : -1, Event::kRequest},
            {mStarter.get(), Event::kStarterGone},
    }};
    std::array<pollfd, sources.size() + 1> polled{};
    pollfd& log = polled.back();
    log = {mLog ? mLog->reader() : -1, POLLIN, 0};
    for (size_t i = 0; i < sources.size(); ++i) {
        // Of the starter only its end is of interest, and that is reported unasked.
        const bool asked = sources[i].second != Event::kStarterGone;
        polled[i] = {sources[i].first, static_cast<short>(asked ? POLLIN : 0), 0};
    }
    while (true) {
        int timeout = -1;
        if (deadline != Clock::time_point::max()) {
            const auto left = std::chrono::ceil<milliseconds>(deadline - Clock::now());
            if (left.count() <= 0) return Event::kLate;
            timeout = static_cast<int>(left.count());
        }
        if (poll(polled.data(), polled.size(), timeout) <= 0) continue;
        if (log.revents != 0) mLog->drain();
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
    unlink(kSupervisorSocket);
    removeState();
}

}  // namespace handset
