// SPDX-License-Identifier: Apache-2.0
//
// Playing a plan: see player.h.
#include "vibctl/play/player.h"

#include <chrono>
#include <map>
#include <memory>
#include <string>
#include <thread>

#include <aidl/android/hardware/vibrator/BnVibratorCallback.h>
#include <android/binder_process.h>

#include "vibctl/deadline.h"
#include "vibctl/find_method.h"
#include "vibctl/service_call.h"

namespace vibctl {

namespace {

// A composition has to be given one; when it is called does not matter here.
class IgnoredCallback : public aidl::android::hardware::vibrator::BnVibratorCallback {
    ndk::ScopedAStatus onComplete() override { return ndk::ScopedAStatus::ok(); }
};

struct Prepared {
    Call call;
    Callback callback;
};

Prepared prepare(const TimedCall& timed, const Callback& callback) {
    const CommandLine words = commandLineOf(timed);
    const Method* method = nullptr;
    Prepared prepared;
    if (!findMethod(words, method)) prepareCall(words, *method, prepared.call);
    if (words.callback) prepared.callback = callback;
    return prepared;
}

}  // namespace

Offers askOffers(const CommandLine& line, Outcome& outcome) {
    Offers offers;
    outcome = askService("std", line.timeout, [](const Service& service) {
        Outcome answer;
        int32_t capabilities = 0;
        answer = outcomeOf(static_cast<IVibrator&>(*service).getCapabilities(&capabilities));
        answer.result = jsonOf(capabilities);
        return answer;
    });
    if (outcome.exception != EX_NONE) return offers;
    const int capabilities = std::stoi(outcome.result);
    offers.amplitude = (capabilities & IVibrator::CAP_AMPLITUDE_CONTROL) != 0;
    offers.compositions = (capabilities & IVibrator::CAP_COMPOSE_EFFECTS) != 0;
    const Outcome packets = askService("ext", line.timeout, [](const Service& service) {
        bool result = false;
        Outcome answer =
                outcomeOf(static_cast<IZelVibrator&>(*service).supportsHapticEngine(&result));
        answer.result = jsonOf(result);
        return answer;
    });
    offers.packets = packets.exception == EX_NONE && packets.result == "true";
    return offers;
}

Outcome playPlan(const Plan& plan, const CommandLine& line, const Start& start,
                 const OnCall& onCall) {
    ABinderProcess_startThreadPool();
    const Callback callback = ndk::SharedRefBase::make<IgnoredCallback>();
    std::map<std::string, Service> services;
    std::vector<Prepared> calls;
    for (const TimedCall& timed : plan.calls) {
        Service& service = services[timed.iface];
        if (service == nullptr) {
            const auto holder = std::make_shared<Service>();
            Outcome found = askService(timed.iface, line.timeout, [holder](const Service& one) {
                *holder = one;
                return Outcome();
            });
            if (found.exception != EX_NONE) return found;
            service = *holder;
        }
        calls.push_back(prepare(timed, callback));
    }
    Outcome result;
    const Clock::time_point zero = start();
    for (size_t i = 0; i < calls.size(); ++i) {
        const TimedCall& timed = plan.calls[i];
        std::this_thread::sleep_until(zero + timed.at);
        const auto late = Clock::now() - (zero + timed.at);
        const auto answer =
                within(line.timeout, [call = calls[i].call, service = services[timed.iface],
                                      given = calls[i].callback] { return call(*service, given); });
        const Outcome outcome = answer ? *answer : noAnswer(line.timeout);
        onCall(timed, outcome, std::chrono::duration_cast<std::chrono::microseconds>(late).count());
        if (result.exception == EX_NONE) result = outcome;
        if (outcome.exception == EX_TRANSACTION_FAILED) break;
    }
    return result;
}

}  // namespace vibctl
