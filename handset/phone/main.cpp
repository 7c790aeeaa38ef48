// SPDX-License-Identifier: Apache-2.0
//
// The phone tool: brings a simulated phone up inside the handset, asks it for things, and takes it
// down.
#include <cstdio>
#include <exception>
#include <functional>
#include <iostream>
#include <optional>
#include <string>
#include <vector>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include "handset/phone/commands.h"
#include "handset/phone/phone_up.h"

namespace handset {
namespace {

constexpr int kWrongUsage = 2;

constexpr const char* kHelp = R"(A simulated phone: driver, service manager and vibrator service.

  phone up --profile leds           bring one up; prints one line that says how that came out
  phone exec --user 1000 -- sh      look at its nodes, as the user its service runs as
  phone fault node=/sys/class/leds/vibrator/duration op=write errno=EIO times=1
  phone journal                     what the driver saw, one JSON object a line
  phone journal --pretty --follow   calls, driver and log in words, as it happens
  phone unplug --after 300          the motor goes away in 300 milliseconds
  phone service kill                the service dies; it starts again as its init script says
  phone down                        take it down

Exit status: 0 done, 1 the service is not well, 2 wrong usage or not possible.)";

struct Arguments {
    UpOptions up;
    std::vector<std::string> faultWords;
    bool clearFaults = false;
    bool listFaults = false;
    bool json = false;
    std::string action;
    std::string node = "motor";
    unsigned after = 0;
    std::string nodeText;
    ListingOptions listing;
    unsigned user = 0;
    std::vector<std::string> command;
};

// An empty word would be taken for 0.
std::string refuseEmpty(const std::string& word) {
    return word.empty() ? "a number expected, not \"\"" : "";
}

// The commands, or with one of them the options and arguments that it takes.
std::string acceptedBy(const CLI::App& app) {
    const std::vector<CLI::App*> chosen = app.get_subcommands();
    std::vector<std::string> names;
    if (chosen.empty()) {
        for (const CLI::App* command : app.get_subcommands({})) {
            names.push_back(command->get_name());
        }
    } else {
        for (const CLI::Option* option : chosen.front()->get_options()) {
            names.push_back(option->get_name());
        }
    }
    return fmt::format("{}", fmt::join(names, ", "));
}

// What was wrong, and what is accepted there.
std::string explain(const CLI::App& app, const CLI::ParseError& error, int argc, char** argv) {
    const std::string accepted = acceptedBy(app);
    if (app.get_subcommands().empty()) {
        return argc < 2 ? fmt::format("no command given; there are {}", accepted)
                        : fmt::format("unknown command \"{}\"; there are {}", argv[1], accepted);
    }
    return fmt::format("{}: {}; accepted: {}", app.get_subcommands().front()->get_name(),
                       error.what(), accepted);
}

// Adds a command; what it does runs after the whole line has been understood.
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
    up->add_option("--out", options.out, "directory for the journal and the logs");
    up->add_option("--service", options.service, "another build of the service")
            ->envname("PHONE_SERVICE");
    up->add_option("--module", options.module, "the kernel module that drives, as a file")
            ->envname("PHONE_MODULE");
    up->add_flag("--no-service", options.noService, "driver and service manager only");
}

void addFault(CLI::App& app, std::function<int()>& chosen, Arguments& arguments) {
    CLI::App* fault = addCommand(
            app, chosen, "fault", "add a fault, list all with how often each struck, or forget all",
            [&arguments] {
                if (arguments.listFaults) return phoneListFaults(arguments.json);
                return arguments.clearFaults ? phoneClearFaults()
                                             : phoneFault(arguments.faultWords);
            });
    CLI::Option* words = fault->add_option(
            "SPEC", arguments.faultWords, "a JSON object, or node=PATH op=write errno=EIO times=1");
    CLI::Option* clear = fault->add_flag("--clear", arguments.clearFaults, "forget all faults");
    CLI::Option* list = fault->add_flag("--list", arguments.listFaults, "print all faults");
    fault->add_flag("--json", arguments.json, "the list as JSON")->needs(list);
    clear->excludes(words)->excludes(list);
    list->excludes(words);
    fault->parse_complete_callback([words, clear, list] {
        if (words->count() + clear->count() + list->count() == 0) {
            throw CLI::RequiredError("SPEC, --list or --clear");
        }
    });
}

void addPlug(CLI::App& app, std::function<int()>& chosen, Arguments& arguments, bool plugIn) {
    CLI::App* plug = addCommand(
            app, chosen, plugIn ? "plug" : "unplug",
            plugIn ? "bring the motor, or a node, back" : "take the motor, or a node, away",
            [&arguments, plugIn] { return phonePlug(plugIn, arguments.node, arguments.after); });
    plug->add_option("NODE", arguments.node, "a node's path (default: motor)");
    plug->add_option("--after", arguments.after, "milliseconds from now")
            ->check(refuseEmpty)
            ->check(CLI::Range(0, 3600000));
}

void addService(CLI::App& app, std::function<int()>& chosen, Arguments& arguments) {
    CLI::App* service =
            addCommand(app, chosen, "service", "stop, start, restart or kill the service",
                       [&arguments] { return phoneService(arguments.action); });
    service->add_option("ACTION", arguments.action, "stop, start, restart or kill")
            ->required()
            ->check(CLI::IsMember({"stop", "start", "restart", "kill"}));
}

// What the journal and the log have in common.
CLI::App* addListing(CLI::App& app, std::function<int()>& chosen, const char* name,
                     const char* help, ListingOptions& options,
                     int (*print)(const ListingOptions&)) {
    CLI::App* command =
            addCommand(app, chosen, name, help, [&options, print] { return print(options); });
    command->add_option("--out", options.out, "its directory, where no phone is up");
    command->add_flag("--follow", options.follow, "go on while the phone is up");
    return command;
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
    CLI::Option* user =
            exec->add_option("--user", arguments.user, "user id to run it as")->check(refuseEmpty);
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
    addCommand(app, chosen, "status", "say what runs and what clients find", [&arguments] {
        return phoneStatus(arguments.json);
    })->add_flag("--json", arguments.json, "as one JSON object");
    addService(app, chosen, arguments);
    addCommand(app, chosen, "reset", "empty the journal, the service's log and the calls",
               phoneReset);
    addFault(app, chosen, arguments);
    addNode(app, chosen, arguments);
    addPlug(app, chosen, arguments, false);
    addPlug(app, chosen, arguments, true);
    addListing(app, chosen, "journal", "print what the driver saw", arguments.listing, phoneJournal)
            ->add_flag("--pretty", arguments.listing.pretty,
                       "in words, with calls, answers and log lines, in order of time");
    addListing(app, chosen, "log", "print the service's log", arguments.listing, phoneLog);
    addExec(app, chosen, arguments);
    try {
        app.parse(argc, argv);
    } catch (const CLI::CallForHelp&) {
        std::cout << app.help();
        return 0;
    } catch (const CLI::ParseError& error) {
        return failWith(kWrongUsage, explain(app, error, argc, argv));
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
