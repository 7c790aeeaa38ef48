// SPDX-License-Identifier: Apache-2.0
// The phone tool: brings a simulated phone up inside the handset, asks it for things, and takes it
// down.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <cstdio>
#include <exception>
#include <functional>
#include <iostream>
#include <optional>
#include <string>
#include <vector>

#include "phone/commands.h"
#include "phone/phone_up.h"

namespace handset {
namespace {

constexpr int kWrongUsage = 2;

constexpr const char* kHelp = R"(A simulated phone: driver, service manager and vibrator service.

  phone up --profile leds           bring one up; prints one line that says how that came out
  phone exec --user 1000 -- sh      look at its nodes, as the user its service runs as
  phone fault node=/sys/class/leds/vibrator/duration op=write errno=EIO times=1
  phone journal                     what the driver saw, one JSON object a line
  phone down                        take it down

Exit status: 0 done, 1 the service is not well, 2 wrong usage or not possible.)";

struct Arguments {
    UpOptions up;
    std::vector<std::string> faultWords;
    bool clearFaults = false;
    std::string node;
    std::string nodeText;
    std::string out;
    unsigned user = 0;
    std::vector<std::string> command;
};

/// Adds a command; what it does runs after the whole line has been understood.
CLI::App* addCommand(CLI::App& app, std::function<int()>& chosen, const char* name,
                     const char* help, const std::function<int()>& action) {
    CLI::App* command = app.add_subcommand(name, help);
    command->callback([&chosen, action] { chosen = action; });
    return command;
}

void addUp(CLI::App& app, std::function<int()>& chosen, UpOptions& options) {
    CLI::App* up = addCommand(app, chosen, "up", "bring a phone up",
                              [&options] { return phoneUp(options); });
    up->add_option("--profile", options.profile, "which phone: a built-in profile, or a file");
    up->add_option("--out", options.out, "folder for the journal and the logs");
    up->add_option("--service", options.service, "another build of the service")
            ->envname("PHONE_SERVICE");
    up->add_flag("--no-service", options.noService, "driver and service manager only");
}

void addFault(CLI::App& app, std::function<int()>& chosen, Arguments& arguments) {
    CLI::App* fault = addCommand(app, chosen, "fault", "add a fault, or forget all", [&arguments] {
        return arguments.clearFaults ? phoneClearFaults() : phoneFault(arguments.faultWords);
    });
    CLI::Option* words = fault->add_option(
            "SPEC", arguments.faultWords, "a JSON object, or node=PATH op=write errno=EIO times=1");
    CLI::Option* clear = fault->add_flag("--clear", arguments.clearFaults, "forget all faults");
    clear->excludes(words);
    fault->parse_complete_callback([fault, words, clear] {
        if (words->count() + clear->count() == 0) throw CLI::RequiredError("SPEC or --clear");
    });
}

void addNode(CLI::App& app, std::function<int()>& chosen, Arguments& arguments) {
    CLI::App* node = app.add_subcommand("node", "print a node's text, or set it unseen");
    node->add_option("PATH", arguments.node, "the node")->required();
    CLI::Option* text = node->add_option("TEXT", arguments.nodeText, "what it shows from now on");
    node->callback([&chosen, &arguments, text] {
        const bool given = text->count() > 0;
        chosen = [&arguments, given] {
            return phoneNode(arguments.node,
                             given ? std::optional(arguments.nodeText) : std::nullopt);
        };
    });
}

void addExec(CLI::App& app, std::function<int()>& chosen, Arguments& arguments) {
    CLI::App* exec = app.add_subcommand("exec", "run a command where the phone's nodes are seen");
    CLI::Option* user = exec->add_option("--user", arguments.user, "user id to run it as");
    exec->add_option("COMMAND", arguments.command, "the command")->required();
    exec->positionals_at_end();
    exec->callback([&chosen, &arguments, user] {
        const bool given = user->count() > 0;
        chosen = [&arguments, given] {
            return phoneExec(given ? std::optional(arguments.user) : std::nullopt,
                             arguments.command);
        };
    });
}

int parseAndRun(int argc, char** argv) {
    Arguments arguments;
    std::function<int()> chosen;
    CLI::App app(kHelp, "phone");
    app.require_subcommand(1);
    addUp(app, chosen, arguments.up);
    addCommand(app, chosen, "down", "take it down", phoneDown);
    addCommand(app, chosen, "status", "say whether one is up", phoneStatus);
    addCommand(app, chosen, "reset", "empty the journal and the service's log", phoneReset);
    addFault(app, chosen, arguments);
    addNode(app, chosen, arguments);
    addCommand(app, chosen, "journal", "print what the driver saw", [&arguments] {
        return phonePrintJournal(arguments.out);
    })->add_option("--out", arguments.out, "its folder, where no phone is up");
    addCommand(app, chosen, "log", "print the service's log", [&arguments] {
        return phonePrintLog(arguments.out);
    })->add_option("--out", arguments.out, "its folder, where no phone is up");
    addExec(app, chosen, arguments);
    try {
        app.parse(argc, argv);
    } catch (const CLI::CallForHelp&) {
        std::cout << app.help();
        return 0;
    } catch (const CLI::ParseError& error) {
        return failWith(kWrongUsage, fmt::format("{}; see phone --help", error.what()));
    }
    return chosen();
}

}  // namespace
}  // namespace handset

int main(int argc, char** argv) {
    try {
        return handset::parseAndRun(argc, argv);
    } catch (const std::exception& error) {  // memory has run out
        std::fprintf(stderr, "phone: %s\n", error.what());
        return 2;
    }
}
