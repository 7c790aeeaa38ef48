// SPDX-License-Identifier: Apache-2.0
//
// vibctl: calls any method of the vibrator service from the command line. `vibctl help` says how.
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <exception>
#include <iostream>
#include <string>
#include <vector>

#include <android-base/file.h>
#include <android/log.h>
#include <fmt/format.h>

#include "vibctl/binder_client.h"
#include "vibctl/call_record.h"
#include "vibctl/command_line.h"
#include "vibctl/doctor/binder_questions.h"
#include "vibctl/doctor/doctor.h"
#include "vibctl/find_method.h"
#include "vibctl/info.h"
#include "vibctl/outcome.h"
#include "vibctl/play/callers.h"
#include "vibctl/play/player.h"
#include "vibctl/raw_call.h"
#include "vibctl/service_call.h"
#include "vibctl/session.h"
#include "vibctl/usage.h"

#define VIBCTL_QUOTED(version) #version
#define VIBCTL_STRING(version) VIBCTL_QUOTED(version)

namespace vibctl {
namespace {

Exit print(const std::string& text) {
    fmt::print("{}", text);
    return Exit::kOk;
}

// Prints what a call of the method came to.
Exit report(const CommandLine& line, const std::string& iface, const std::string& method,
            const Outcome& outcome) {
    if (line.json) {
        fmt::print("{}\n", jsonLine(iface, method, outcome));
    } else if (outcome.reached == Outcome::Reached::kCalled) {
        fmt::print("{}\n", humanLine(method, outcome));
    } else {
        fmt::print(stderr, "{}\n", humanLine("vibctl", outcome));
    }
    return exitStatusOf(outcome);
}

Exit fail(const CommandLine& line, const std::string& problem) {
    return report(line, line.command, line.method, wrongUsage(problem));
}

// Prints an outcome whose text is the answer itself, in lines of its own.
Exit reportText(const CommandLine& line, const std::string& iface, const Outcome& outcome) {
    if (line.json || outcome.exception != EX_NONE) {
        return report(line, iface, line.command, outcome);
    }
    return print(outcome.text);
}

Exit runMethod(const CommandLine& line) {
    if (line.help && line.method.empty()) return print(helpOfInterface(line.command));
    const Method* method = nullptr;
    if (const Problem problem = findMethod(line, method)) return fail(line, *problem);
    if (line.help) return print(helpOf(line.command, *method));
    Call call;
    if (const Problem problem = prepareCall(line, *method, call)) return fail(line, *problem);
    if (line.offOnInterrupt) turnOffOnInterrupt();
    const Outcome outcome = callMethod(line, *method, call);
    recordCall(line, method->name, outcome);
    return report(line, line.command, method->name, outcome);
}

// Calls that standard input names, each with its answer on a line; the status is that of the first
// that is not 0.
Exit runSession(const CommandLine&) {
    auto first = Exit::kOk;
    for (std::string text; std::getline(std::cin, text);) {
        CommandLine line;
        const Problem problem = parseSessionLine(text, line);
        const Exit status = problem ? fail(line, *problem) : runMethod(line);
        if (first == Exit::kOk) first = status;
        if (std::fflush(stdout) != 0) break;
    }
    return first;
}

Exit runList(const CommandLine& line) {
    const Problem problem = checkBinder(line.timeout);
    return reportText(line, "manager", problem ? noService(*problem) : listServices());
}

Exit runInfo(const CommandLine& line) {
    const Ask ask = [&line](const std::string& iface, const Call& call) {
        return askService(iface, line.timeout,
                          [call](const Service& service) { return call(*service, nullptr); });
    };
    return reportText(line, "", askEverything(ask));
}

// The interface that a command is to go to.
Problem checkInterface(const CommandLine& line, const std::string& iface) {
    if (iface == "std" || iface == "ext") return std::nullopt;
    return fmt::format("{}: interface {} is neither std nor ext", line.command, inQuotes(iface));
}

Exit runDump(const CommandLine& line) {
    const std::string iface = line.method.empty() ? "std" : line.method;
    if (const Problem problem = checkInterface(line, iface)) return fail(line, *problem);
    return reportText(line, iface, askService(iface, line.timeout, dump));
}

Exit runRaw(const CommandLine& line) {
    RawCall call;
    Problem problem = checkInterface(line, line.method);
    if (!problem) problem = parseRawCall(line.arguments, call);
    if (problem) return fail(line, *problem);
    const auto send = [call](const Service& service) { return sendRaw(service, call); };
    return report(line, line.method, "raw", askService(line.method, line.timeout, send));
}

// What is to be played: the steps of a pattern, or a file, "-" for standard input.
Problem makePlan(const CommandLine& line, const std::string& text, const Offers& offers,
                 Plan& plan) {
    if (line.method.empty()) return "play needs steps or a file; see vibctl help";
    if (isdigit(static_cast<unsigned char>(line.method[0])) != 0) {
        Pattern pattern{{line.method}, line.amplitudes, line.repeat};
        pattern.durations.insert(pattern.durations.end(), line.arguments.begin(),
                                 line.arguments.end());
        const Problem problem = planPattern(pattern, offers, plan);
        return problem ? "play: " + *problem : problem;
    }
    if (!line.arguments.empty()) return "play takes one file; see vibctl help";
    if (!line.amplitudes.empty() || line.repeat != 1) {
        return "play: --amplitudes and --repeat go with steps, not with a file";
    }
    const bool asAhap = line.method.ends_with(".ahap") || isAhap(text);
    const Problem problem = asAhap ? planAhap(text, offers, plan) : planSequence(text, plan);
    return problem ? line.method + ": " + *problem : problem;
}

// Plays what this process is to play, each call with a line, or all with one JSON object.
Exit playAndPrint(const Plan& plan, Callers& callers, const CommandLine& line) {
    std::string results;
    const auto onCall = [&](const TimedCall& call, const Outcome& one, int64_t late) {
        const double at = static_cast<double>(call.at.count()) / 1000;
        results += fmt::format(R"({}{{"at":{},"late_us":{},"exception":{}}})",
                               results.empty() ? "" : ",", at, late, one.exception);
        recordCall(commandLineOf(call), call.words[0], one);
        if (line.json) return;
        fmt::print("{} ms, {:.1f} ms late: {} {}\n", at, static_cast<double>(late) / 1000,
                   call.iface, humanLine(fmt::format("{}", fmt::join(call.words, " ")), one));
        std::fflush(stdout);
    };
    Outcome outcome = playPlan(
            plan, line, [&callers] { return callers.start(); }, onCall);
    if (line.json) {
        outcome.result = "[" + results + "]";
        return report(line, "", "play", outcome);
    }
    return outcome.reached == Outcome::Reached::kCalled ? exitStatusOf(outcome)
                                                        : report(line, "", "play", outcome);
}

Exit runPlay(const CommandLine& line) {
    std::string text;
    if (line.method == "-") {
        android::base::ReadFdToString(STDIN_FILENO, &text);
    } else if (!line.method.empty() && isdigit(static_cast<unsigned char>(line.method[0])) == 0 &&
               !android::base::ReadFileToString(line.method, &text)) {
        return fail(line, fmt::format("play: cannot read {}: {}", inQuotes(line.method),
                                      std::strerror(errno)));
    }
    // What is wrong is said before anybody is asked or anything is played.
    Plan plan;
    if (const Problem problem = makePlan(line, text, {}, plan)) return fail(line, *problem);
    if (const Problem problem = Callers::check(plan)) return fail(line, "play: " + *problem);
    Callers callers(plan);
    callers.keepOwn(plan);
    if (plan.calls.empty()) {
        callers.start();
        return callers.join(Exit::kOk);
    }
    turnOffOnInterrupt();
    Outcome outcome;
    const Offers offers = askOffers(line, outcome);
    if (outcome.exception != EX_NONE) return callers.join(report(line, "std", "play", outcome));
    plan = {};
    makePlan(line, text, offers, plan);
    callers.keepOwn(plan);
    if (line.explain && !line.json) {
        for (const std::string& note : plan.notes) fmt::print("{}\n", note);
    }
    return callers.join(playAndPrint(plan, callers, line));
}

Exit runDoctor(const CommandLine& line) {
    const std::vector<Finding> findings = diagnose(askOverBinder(), "/");
    const bool coloured = isatty(STDOUT_FILENO) != 0;
    for (const Finding& finding : findings) {
        fmt::print("{}\n", line.json ? jsonLine(finding) : humanLine(finding, coloured));
    }
    if (!line.json) fmt::print("{}\n", closingLine(findings));
    return allIsWell(findings) ? Exit::kOk : Exit::kException;
}

constexpr size_t kAnyCount = SIZE_MAX;

struct Command {
    const char* name;
    size_t mostWords;   // after the name
    const char* words;  // as the usage shows them
    Exit (*run)(const CommandLine& line);
};

// clang-format off
constexpr Command kCommands[] = {
        {"std", kAnyCount, "", runMethod},
        {"ext", kAnyCount, "", runMethod},
        {"info", 0, "", runInfo},
        {"dump", 1, " [std|ext]", runDump},
        {"raw", kAnyCount, "", runRaw},
        {"play", kAnyCount, "", runPlay},
        {"session", 0, "", runSession},
        {"list", 0, "", runList},
        {"doctor", 0, "", runDoctor},
};
// clang-format on

const Command* findCommand(const std::string& name) {
    const auto* const found =
            std::find_if(std::begin(kCommands), std::end(kCommands),
                         [&name](const Command& one) { return name == one.name; });
    return found == std::end(kCommands) ? nullptr : found;
}

// "help std on" and "std help" are other spellings of "std on --help" and "std --help".
Exit runHelp(CommandLine line) {
    size_t mostArguments = 0;
    if (line.command == "help") {
        mostArguments = 1;
        line.command = line.method;
        line.method = line.arguments.empty() ? "" : line.arguments.front();
    } else {
        line.method.clear();
    }
    if (line.arguments.size() > mostArguments) {
        return fail(line, "help takes fewer words; usage: vibctl help [std|ext [METHOD]]");
    }
    line.help = true;
    if (line.command == "std" || line.command == "ext") return runMethod(line);
    if (!line.command.empty() && findCommand(line.command) == nullptr) {
        return fail(line, unknownCommand(line.command));
    }
    return print(programHelp());
}

Exit run(const std::vector<std::string>& all) {
    CommandLine line;
    if (const Problem problem = parseCommandLine(all, line)) return fail(line, *problem);
    if (line.version) return print("vibctl " VIBCTL_STRING(VIBCTL_VERSION) "\n");
    if (line.command == "help" || line.method == "help") return runHelp(line);
    const Command* const command = findCommand(line.command);
    if (command == nullptr) {
        return line.help ? print(programHelp()) : fail(line, unknownCommand(line.command));
    }
    if (line.help && command->run != runMethod) return print(programHelp());
    const size_t words = line.arguments.size() + (line.method.empty() ? 0 : 1);
    if (words > command->mostWords) {
        return fail(line, fmt::format("{} takes {} arguments; usage: vibctl [--json] {}{}",
                                      command->name, command->mostWords == 0 ? "no" : "fewer",
                                      command->name, command->words));
    }
    return command->run(line);
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
