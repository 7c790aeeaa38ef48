// SPDX-License-Identifier: Apache-2.0
//
// Whether clients find the service.
#include "handset/phone/registration.h"

#include <csignal>
#include <ctime>
#include <string_view>

#include "handset/common/raw_binder.h"
#include "handset/phone/process.h"

namespace handset {
namespace {

constexpr std::string_view kServiceName = "android.hardware.vibrator.IVibrator/default";
constexpr int kAnswerTimeout = 2000;  // milliseconds
constexpr int kUnknownStatus = 2;

}  // namespace

int awaitService(bool registered) {
    sigset_t end;
    sigemptyset(&end);
    sigaddset(&end, SIGTERM);
    sigprocmask(SIG_BLOCK, &end, nullptr);
    constexpr timespec kPause{0, 1000000};
    RawBinder probe;
    if (!probe.isOpen()) return kProbeFailed;
    while (probe.checkService(kServiceName).has_value() != registered) {
        if (sigtimedwait(&end, nullptr, &kPause) == SIGTERM) return kProbeFailed;
    }
    return kProbeDone;
}

Registration askRegistration() {
    auto probe = Child::fork([] {
        RawBinder binder;
        if (!binder.isOpen() || !binder.pingServiceManager()) return kProbeFailed;
        return binder.checkService(kServiceName) ? kProbeDone : kUnknownStatus;
    });
    if (!probe) return Registration::kNoAnswer;
    probe->await(kAnswerTimeout);
    const auto status = probe->poll();
    if (!status) probe->end(0);
    if (status == kProbeDone) return Registration::kRegistered;
    return status == kUnknownStatus ? Registration::kUnknown : Registration::kNoAnswer;
}

}  // namespace handset
