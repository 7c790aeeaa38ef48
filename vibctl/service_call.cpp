// SPDX-License-Identifier: Apache-2.0
//
// One call of the service: see service_call.h.
#include "vibctl/service_call.h"

#include <unistd.h>

#include <condition_variable>
#include <csignal>
#include <memory>
#include <mutex>
#include <optional>
#include <thread>

#include <aidl/android/hardware/vibrator/BnVibratorCallback.h>
#include <android/binder_process.h>
#include <fmt/format.h>

#include "vibctl/deadline.h"

namespace vibctl {

namespace {

using std::chrono::milliseconds;

// What is waited for after a call: the callback, or the death of the one who was to call it.
class CompletionCallback : public aidl::android::hardware::vibrator::BnVibratorCallback {
  public:
    enum class End { kTimedOut, kCompleted, kDied };

    ndk::ScopedAStatus onComplete() override {
        finish(End::kCompleted);
        return ndk::ScopedAStatus::ok();
    }

    // To be called before the call: `callback` hears of the death of the service.
    static void watch(const std::shared_ptr<CompletionCallback>& callback, const Service& service) {
        callback->mCalled = Clock::now();
        // Whoever holds the callback may let go of it before the service dies. The recipient and what
        // it is given stay: a notice may be on its way at any time. So does the service: to let go of
        // it is to ask for no notice, and the kernel complains of who ends before that is confirmed.
        struct Watch {
            std::weak_ptr<CompletionCallback> callback;
            Service service;
        };
        static AIBinder_DeathRecipient* const recipient =
                AIBinder_DeathRecipient_new([](void* watch) {
                    if (const auto self = static_cast<Watch*>(watch)->callback.lock())
                        self->finish(End::kDied);
                });
        auto* const watch = new Watch{callback, service};
        if (AIBinder_linkToDeath(service->asBinder().get(), recipient, watch) != STATUS_OK)
            callback->finish(End::kDied);
    }

    // Waits `limit` at most for the end. `taken` becomes the time from watch() to it.
    End wait(milliseconds limit, milliseconds& taken) {
        std::unique_lock lock(mMutex);
        mEnded.wait_for(lock, limit, [this] { return mEnd != End::kTimedOut; });
        taken = std::chrono::duration_cast<milliseconds>(mWhen - mCalled);
        return mEnd;
    }

  private:
    void finish(End end) {
        const std::lock_guard lock(mMutex);
        if (mEnd != End::kTimedOut) return;
        mEnd = end;
        mWhen = Clock::now();
        mEnded.notify_all();
    }

    std::mutex mMutex;
    std::condition_variable mEnded;
    End mEnd = End::kTimedOut;
    Clock::time_point mCalled;
    Clock::time_point mWhen;
};

// Waits for the callback that was given to the call which came to `outcome`.
void await(CompletionCallback& callback, milliseconds limit, Outcome& outcome) {
    milliseconds taken{};
    switch (callback.wait(limit, taken)) {
        case CompletionCallback::End::kCompleted:
            outcome.completion = {Completion::Kind::kCompleted, taken.count()};
            break;
        case CompletionCallback::End::kTimedOut:
            outcome.completion = {Completion::Kind::kTimedOut, limit.count()};
            break;
        case CompletionCallback::End::kDied: {
            const int64_t sent = outcome.sentMicroseconds;
            outcome =
                    transportFailure(STATUS_DEAD_OBJECT, "the service died before it called back");
            outcome.sentMicroseconds = sent;
            outcome.microseconds = std::chrono::microseconds(taken).count();
            break;
        }
    }
}

}  // namespace

Outcome askService(const std::string& iface, milliseconds limit,
                   const std::function<Outcome(const Service& service)>& work) {
    if (const Problem problem = checkBinder(limit)) return noService(*problem);
    const Clock::time_point asked = Clock::now();
    const auto outcome = within(limit, [iface, work] {
        Problem problem;
        const Service service = connect(iface, problem);
        return problem ? noService(*problem) : work(service);
    });
    if (outcome) return *outcome;
    Outcome none = noAnswer(limit);
    using std::chrono::duration_cast, std::chrono::microseconds;
    none.sentMicroseconds = duration_cast<microseconds>(asked.time_since_epoch()).count();
    none.microseconds = duration_cast<microseconds>(Clock::now() - asked).count();
    return none;
}

Outcome callMethod(const CommandLine& line, const Method& method, const Call& call) {
    if (!line.callback) {
        return askService(line.command, line.timeout,
                          [call](const Service& service) { return call(*service, nullptr); });
    }
    const auto callback = ndk::SharedRefBase::make<CompletionCallback>();
    const bool awaited = method.traits.awaitsCompletion;
    Outcome outcome = askService(line.command, line.timeout,
                                 [call, callback, awaited](const Service& service) {
                                     // The service may call back as soon as it has the callback.
                                     ABinderProcess_startThreadPool();
                                     if (awaited) CompletionCallback::watch(callback, service);
                                     return call(*service, callback);
                                 });
    if (awaited && outcome.exception == EX_NONE) await(*callback, line.wait, outcome);
    return outcome;
}

void turnOffOnInterrupt() {
    sigset_t signals;
    sigemptyset(&signals);
    for (const int signal : {SIGINT, SIGTERM, SIGHUP}) sigaddset(&signals, signal);
    pthread_sigmask(SIG_BLOCK, &signals, nullptr);
    std::thread([signals] {
        int signal = 0;
        sigwait(&signals, &signal);
        // A second one ends the process at once.
        pthread_sigmask(SIG_UNBLOCK, &signals, nullptr);
        Problem problem;
        const Service service = connect("std", problem);
        const bool isOff = service != nullptr && static_cast<IVibrator&>(*service).off().isOk();
        fmt::print(stderr, "vibctl: interrupted; the motor {}\n",
                   isOff ? "is off" : "could not be turned off");
        _exit(128 + signal);
    }).detach();
}

}  // namespace vibctl
