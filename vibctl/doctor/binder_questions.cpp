// SPDX-License-Identifier: Apache-2.0
//
// The doctor's questions over binder: see binder_questions.h.
#include "vibctl/doctor/binder_questions.h"

#include <chrono>
#include <string>

#include <android/binder_manager.h>
#include <fmt/format.h>

#include "vibctl/binder_client.h"
#include "vibctl/deadline.h"

namespace vibctl {

namespace {

constexpr std::chrono::seconds kTimeout{2};

Problem problemOf(const ndk::ScopedAStatus& status, const char* what) {
    if (status.isOk()) return std::nullopt;
    return fmt::format("{}: {}", what, status.getDescription());
}

// What only the service itself can answer.
void askVersions(BinderFacts& facts) {
    const Service service = connect("std", facts.serviceProblem);
    if (facts.serviceProblem) return;
    facts.serviceProblem =
            problemOf(static_cast<IVibrator&>(*service).getInterfaceVersion(&facts.version),
                      "does not tell its version");
    if (facts.serviceProblem) return;
    const Service extension = connect("ext", facts.extensionProblem);
    if (facts.extensionProblem) return;
    facts.extensionProblem = problemOf(
            static_cast<IZelVibrator&>(*extension).getInterfaceVersion(&facts.extensionVersion),
            "the extension does not tell its version");
}

}  // namespace

BinderFacts askOverBinder() {
    BinderFacts facts;
    facts.deviceProblem = checkDevice(facts.device);
    if (facts.deviceProblem) return facts;
    facts.managerProblem = checkManager(kTimeout);
    if (facts.managerProblem) return facts;
    const std::string name = serviceName();
    facts.declared = AServiceManager_isDeclared(name.c_str());
    facts.registered = ndk::SpAIBinder(AServiceManager_checkService(name.c_str())).get() != nullptr;
    if (!facts.registered) return facts;
    facts.registrant = findRegistrant(name);
    const auto answered = within(kTimeout, [facts]() mutable {
        askVersions(facts);
        return facts;
    });
    if (answered) return *answered;
    facts.serviceProblem = fmt::format("has not answered for {} s", kTimeout.count());
    return facts;
}

}  // namespace vibctl
