// SPDX-License-Identifier: Apache-2.0
//
// vibctl: calls any method of the vibrator service from the command line. `vibctl help` says how.
#include <cstdio>
#include <exception>
#include <string>
#include <vector>

#include <unistd.h>

#include <android/binder_process.h>
#include <android/log.h>
#include <fmt/format.h>

#include "binder_client.h"
#include "command_line.h"
#include "doctor/binder_questions.h"
#include "doctor/doctor.h"
#include "outcome.h"
#include "usage.h"

namespace vibctl {
namespace {

Exit fail(const std::string& why, Exit status) {
    fmt::print(stderr, "vibctl: {}\n", why);
    return status;
}

Exit print(const std::string& text) {
    fmt::print("{}", text);
    return Exit::kOk;
}

Exit report(const CommandLine& line, const std::string& iface, const std::string& method,
            const Outcome& outcome) {
    fmt::print("{}\n", line.json ? jsonLine(iface, method, outcome) : humanLine(method, outcome));
    return exitStatusOf(outcome);
}

/// Makes the call and, where a completion is to come, waits for it. The service may call back as
/// soon as it has the callback, hence a thread pool from the start.
template <typename Interface>
Outcome callWithCallback(Interface& service, const Method<Interface>& method,
                         const typename Method<Interface>::Call& call,
                         std::chrono::milliseconds limit) {
    ABinderProcess_startThreadPool();
    const auto callback = ndk::SharedRefBase::make<CompletionCallback>();
    const auto before = CompletionCallback::Clock::now();
    Outcome outcome = call(service, callback);
    if (outcome.exception != EX_NONE || !method.traits.awaitsCompletion) return outcome;
    using Milliseconds = std::chrono::milliseconds;
    if (const auto when = callback->waitFor(limit)) {
        outcome.completion = {Completion::Kind::kCompleted,
                              std::chrono::duration_cast<Milliseconds>(*when - before).count()};
    } else {
        outcome.completion = {Completion::Kind::kTimedOut, limit.count()};
    }
    return outcome;
}

template <typename Interface>
Exit runMethod(const CommandLine& line) {
    const Method<Interface>* method = nullptr;
    if (line.method == "help" || (line.method.empty() && line.help)) {
        return print(helpOfInterface<Interface>());
    }
    if (const Problem problem = findMethod(line, method)) return fail(*problem, Exit::kUsage);
    if (line.help) return print(helpOf(*method));
    typename Method<Interface>::Call call;
    if (const Problem problem = prepareCall(line, *method, call)) {
        return fail(*problem, Exit::kUsage);
    }

    Problem problem = checkBinder();
    if (problem) return fail(*problem, Exit::kNoService);
    const auto service = connect(static_cast<Interface*>(nullptr), problem);
    if (problem) return fail(*problem, Exit::kNoService);
    const Outcome outcome = line.callback ? callWithCallback(*service, *method, call, line.wait)
                                          : call(*service, nullptr);
    return report(line, ifaceOf<Interface>(), method->name, outcome);
}

Exit runList(const CommandLine& line) {
    if (!line.method.empty()) {
        return fail("list takes no arguments; usage: vibctl [--json] list", Exit::kUsage);
    }
    if (const Problem problem = checkBinder()) return fail(*problem, Exit::kNoService);
    const Outcome outcome = listServices();
    if (line.json || outcome.exception != EX_NONE) return report(line, "manager", "list", outcome);
    for (const auto& name : outcome.result) fmt::print("{}\n", name.get<std::string>());
    return Exit::kOk;
}

Exit runDoctor(const CommandLine& line) {
    if (!line.method.empty()) {
        return fail("doctor takes no arguments; usage: vibctl [--json] doctor", Exit::kUsage);
    }
    const std::vector<Finding> findings = diagnose(askOverBinder(), "/");
    for (const Finding& finding : findings) {
        fmt::print("{}\n", line.json ? jsonLine(finding) : humanLine(finding));
    }
    return allIsWell(findings) ? Exit::kOk : Exit::kException;
}

Exit run(const std::vector<std::string>& words) {
    CommandLine line;
    if (const Problem problem = parseCommandLine(words, line)) {
        return fail(*problem, Exit::kUsage);
    }
    if (line.version) return print("vibctl " VIBCTL_VERSION "\n");
    if (line.command == "std") return runMethod<IVibrator>(line);
    if (line.command == "ext") return runMethod<IZelVibrator>(line);
    if (line.help || line.command == "help") return print(programHelp());
    if (line.command == "list") return runList(line);
    if (line.command == "doctor") return runDoctor(line);
    return fail(unknownCommand(line.command), Exit::kUsage);
}

}  // namespace
}  // namespace vibctl

int main(int argc, char** argv) {
    // What goes wrong is said once, here: the binder library's own lines would come on top.
    __android_log_set_minimum_priority(ANDROID_LOG_FATAL);
    auto status = vibctl::Exit::kNoService;
    try {
        status = vibctl::run({argv + 1, argv + argc});
        std::fflush(stdout);
    } catch (const std::exception& error) {
        std::fprintf(stderr, "vibctl: %s\n", error.what());
    }
    // No destructors: a thread may still be inside the binder library.
    _exit(static_cast<int>(status));
}
