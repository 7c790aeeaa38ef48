// SPDX-License-Identifier: Apache-2.0
//
// The doctor's questions over binder: see binder_questions.h.
#include "doctor/binder_questions.h"

#include <chrono>
#include <future>
#include <string>
#include <thread>
#include <utility>

#include <android/binder_manager.h>
#include <fmt/format.h>

#include "binder_client.h"

namespace vibctl {

namespace {

constexpr std::chrono::seconds kServicePatience{2};
const std::string kName = std::string(IVibrator::descriptor) + "/default";

Problem problemOf(const ndk::ScopedAStatus& status, const char* what) {
    if (status.isOk()) return std::nullopt;
    return fmt::format("{}: {}", what, status.getDescription());
}

/// What only the service itself can answer.
void askService(BinderFacts& facts) {
    const auto service = connect(static_cast<IVibrator*>(nullptr), facts.serviceProblem);
    if (facts.serviceProblem) return;
    facts.serviceProblem =
            problemOf(service->getInterfaceVersion(&facts.version), "it does not tell its version");
    if (facts.serviceProblem) return;
    const auto extension = connect(static_cast<IZelVibrator*>(nullptr), facts.extensionProblem);
    if (facts.extensionProblem) return;
    facts.extensionProblem = problemOf(extension->getInterfaceVersion(&facts.extensionVersion),
                                       "the extension does not tell its version");
}

}  // namespace

BinderFacts askOverBinder() {
    BinderFacts facts;
    facts.deviceProblem = checkDevice(facts.device);
    if (facts.deviceProblem) return facts;
    facts.managerProblem = checkManager();
    if (facts.managerProblem) return facts;
    facts.declared = AServiceManager_isDeclared(kName.c_str());
    facts.registered =
            ndk::SpAIBinder(AServiceManager_checkService(kName.c_str())).get() != nullptr;
    if (!facts.registered) return facts;
    facts.registrant = findRegistrant(kName);
    // A service that hangs would keep its caller for ever: a thread of its own asks, and is left
    // behind when that takes too long.
    std::promise<BinderFacts> promise;
    std::future<BinderFacts> answer = promise.get_future();
    std::thread([facts, promise = std::move(promise)]() mutable {
        askService(facts);
        promise.set_value(std::move(facts));
    }).detach();
    if (answer.wait_for(kServicePatience) == std::future_status::ready) return answer.get();
    facts.serviceProblem =
            fmt::format("it has not answered for {} seconds", kServicePatience.count());
    return facts;
}

}  // namespace vibctl
