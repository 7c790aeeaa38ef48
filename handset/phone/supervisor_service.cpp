// SPDX-License-Identifier: Apache-2.0
//
// The service's life under its supervisor: started, registered, ended, started again.
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <utility>

#include <android-base/strings.h>
#include <fmt/format.h>

#include "handset/driver/permission.h"
#include "handset/phone/registration.h"
#include "handset/phone/supervisor.h"
#include "handset/phone/text_file.h"

namespace handset {
namespace {

using android::base::Result;
using android::base::unique_fd;

// Emulation under the address sanitizer takes its time.
constexpr std::chrono::seconds kServiceTimeout{60};

std::string withLastLine(std::string text, const std::string& log) {
    std::string line = lastLineOf(log);
    line.erase(0, line.find_first_not_of("0123456789"));  // the time
    line = android::base::Trim(line);
    return line.empty() ? text : fmt::format("{}: {}", text, line);
}

}  // namespace

std::optional<UpReport> Supervisor::startService() {
    const unique_fd mounts(
            open(fmt::format("/proc/{}/ns/mnt", mDriver->pid()).c_str(), O_RDONLY | O_CLOEXEC));
    if (!mounts.ok()) return UpReport::notStarted("the driver's mount namespace is gone");
    if (!mLog) {
        Result<ServiceLog> log = ServiceLog::create(mState.serviceLog());
        if (!log) return UpReport::notStarted(log.error().message());
        mLog = std::move(*log);
        unlink(mState.serviceOutput().c_str());
    }
    mServiceStart = Clock::now();
    mRestartAt.reset();
    const unique_fd output = openLog(mState.serviceOutput());
    if (!output.ok()) {
        return UpReport::notStarted(fmt::format("{}: {}", mState.serviceLog(), strerror(errno)));
    }
    Result<Child> service = Child::start({.command = {mPlan.service},
                                          .mounts = mounts.get(),
                                          .user = kSystemUser,
                                          .output = output.get(),
                                          .errors = mLog->writer()});
    if (!service) return UpReport::notStarted(service.error().message());
    mService = std::move(*service);
    mState.service = mService->pid();
    mState.serviceStatus.reset();
    mState.stopped = false;
    mState.restartAt = 0;
    ++mState.starts;
    if (auto done = saveState(mState); !done) return UpReport::notStarted(done.error().message());
    return std::nullopt;
}

UpReport Supervisor::awaitRegistration() {
    Result<Child> probe = Child::fork([] { return awaitService(true); });
    if (!probe) return UpReport::notStarted(probe.error().message());
    mProbe = std::move(*probe);
    const Event event = wait(Clock::now() + kServiceTimeout);
    if (event == Event::kService) {
        noteServiceEnd();
        return {UpReport::kServiceEnded, serviceEndText(mState)};
    }
    if (event == Event::kLate) {
        return {UpReport::kServiceEnded,
                withLastLine(fmt::format("the service did not register within {} seconds",
                                         kServiceTimeout.count()),
                             mState.serviceLog())};
    }
    if (event != Event::kProbe) return notReady(event);
    if (mProbe->poll() != kProbeDone) return UpReport::notStarted("/dev/binder cannot be opened");
    mProbe.reset();
    mState.registered = true;
    if (auto done = saveState(mState); !done) return UpReport::notStarted(done.error().message());
    return {UpReport::kUp, fmt::format("phone is up: profile {}, service registered, pid {}",
                                       mState.profile, mState.service)};
}

// Does what is asked; why not, or nothing.
std::string Supervisor::serviceRequest(std::string_view action) {
    if (action == "kill") {
        if (!mService) return "the service does not run";
        kill(mService->pid(), SIGKILL);
        mService->await(kEndTimeout);
        noteServiceEnd();
        return "";
    }
    if (action == "start" && mService) {
        return fmt::format("the service runs already, pid {}", mService->pid());
    }
    if (action == "stop" || action == "restart") stopService();
    if (action == "stop") return "";
    const std::optional<UpReport> failed = startService();
    return failed ? failed->text : "";
}

void Supervisor::stopService() {
    if (mService) {
        mService->end(kEndTimeout);
        noteServiceEnd();
    }
    mRestartAt.reset();
    mState.restartAt = 0;
    mState.stopped = true;
}

// As init has it: started again, but no sooner than the period after the last start.
void Supervisor::noteServiceEnd() {
    mLog->drain();
    mLog->flush();
    mState.serviceStatus = mService->poll();
    mService.reset();
    mState.service = 0;
    if (mPlan.init.oneshot) return;
    mRestartAt = std::max(Clock::now(), mServiceStart + mPlan.init.period);
    mState.restartAt =
            std::chrono::duration_cast<std::chrono::microseconds>(mRestartAt->time_since_epoch())
                    .count();
}

std::string serviceEndText(const PhoneState& state) {
    return withLastLine(
            fmt::format("the service exited with status {}", state.serviceStatus.value_or(-1)),
            state.serviceLog());
}

}  // namespace handset
