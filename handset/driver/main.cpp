// SPDX-License-Identifier: Apache-2.0
//
// The vibrator driver of the handset: shows a profile's nodes, files and motor to whoever enters its
// mount namespace, and keeps a journal of what they do with them. Nodes and motor are simulated, or
// with --module the kernel's.
#include <fcntl.h>
#include <poll.h>
#include <sys/eventfd.h>
#include <sys/prctl.h>
#include <sys/signalfd.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <exception>
#include <iostream>
#include <iterator>
#include <string>
#include <utility>

#include <CLI/CLI.hpp>
#include <android-base/unique_fd.h>
#include <fmt/format.h>

#include "handset/driver/control_requests.h"
#include "handset/driver/control_socket.h"
#include "handset/driver/event_node.h"
#include "handset/driver/fault_injector.h"
#include "handset/driver/input_devices.h"
#include "handset/driver/journal.h"
#include "handset/driver/kernel_module.h"
#include "handset/driver/motor_device.h"
#include "handset/driver/node_tree.h"
#include "handset/driver/placed_files.h"
#include "handset/driver/printable.h"
#include "handset/driver/private_mounts.h"
#include "handset/driver/profile_reader.h"
#include "handset/driver/sysfs_server.h"

namespace handset {
namespace {

using android::base::Result;
using android::base::unique_fd;

constexpr int kStopped = 0;
constexpr int kFailed = 1;
constexpr int kBadInput = 2;

constexpr const char* kHelp = R"(Simulates a phone's vibrator driver.

Takes a mount namespace of its own, shows the profile's nodes on /sys/class and its list of input
devices on /proc/bus/input/devices there, makes the motor's /dev/input/eventN, and records every
call in the journal. Enter it with
  nsenter --mount=/proc/PID/ns/mnt COMMAND...
SIGTERM, SIGINT, the control request "stop" and the end of the parent process stop it; whatever it
mounted or made is gone then.

Requests on the control socket, one a line, answered by "ok ..." or "error MESSAGE":
  fault {JSON}      add a fault, as in a profile    clear   forget all faults
  faults            list them, with how often each has struck
  unplug NODE [MS]  take a node or "motor" away     plug NODE [MS]  bring it back
  get PATH          what a read of a node returns   reset   empty the journal
  set PATH "TEXT"   change a node's text            stop    end
  settle            wait until the journal has every close so far
With --module the kernel's driver takes the place of the simulated one: its nodes are everybody's, the
journal has no opens and closes, faults strike the calls that a driver is told of, and get and set are
refused.

Exit status: 0 stopped, 1 could not start or lost its mount, 2 wrong usage or a wrong profile.)";

struct Options {
    std::string profile;
    std::string journal;
    std::string control;
    std::string module;
    int readyFd = -1;
};

// Prints the one line that says what went wrong, kept to one line whatever it quotes.
int fail(int status, std::string text) {
    fmt::print(stderr, "handset-driver: {}\n", printable(std::move(text)));
    return status;
}

// SIGTERM and SIGINT as a descriptor, blocked for every thread that is started from here on.
unique_fd stopSignals() {
    sigset_t signals;
    sigemptyset(&signals);
    sigaddset(&signals, SIGTERM);
    sigaddset(&signals, SIGINT);
    sigprocmask(SIG_BLOCK, &signals, nullptr);
    return unique_fd(signalfd(-1, &signals, SFD_CLOEXEC));
}

void announceReady(int fd) {
    if (fd < 0) return;
    const std::string_view line = "ready\n";
    if (write(fd, line.data(), line.size()) < 0) {
        fmt::print(stderr, "handset-driver: ready descriptor: {}\n", strerror(errno));
    }
    close(fd);
}

// Shows the profile's plain files and its list of input devices.
Result<void> showFiles(const Profile& profile, PlacedFiles& files, StagingDirectory& staging,
                       InputDeviceList& list) {
    for (const FileProfile& file : profile.files) {
        if (auto done = files.place(file, staging); !done) return done;
    }
    return list.show();
}

// The phone with the kernel module, until something asks for the end.
int runModule(const Options& options, const Profile& profile, Journal& journal, int signals) {
    Result<StagingDirectory> staging = StagingDirectory::create();
    if (!staging) return fail(kFailed, staging.error().message());
    if (auto done = moduleParameters(profile); !done)
        return fail(kBadInput, fmt::format("{}: {}", options.profile, done.error().message()));
    const auto module = KernelModule::load(options.module, profile);
    if (!module) return fail(kFailed, module.error().message());
    PlacedFiles files;
    InputDeviceList list(profile, (*module)->event(), *staging);
    for (const FileProfile& file : profile.files) {
        if (auto done = files.place(file, *staging); !done)
            return fail(kFailed, done.error().message());
    }
    if (profile.inputDevices) {
        if (auto done = list.show(); !done) return fail(kFailed, done.error().message());
    }
    KernelFaults faults([&] { (*module)->report(journal, faults); });
    faults.setOnPlug([&](std::string_view node, bool plugged) {
        journal.record({}, {{"op", plugged ? "plug" : "unplug"}, {"node", node}});
        if (node != kMotorNode) return;
        Result<void> done;
        if (plugged) done = EventNode().handOver((*module)->event());
        if (done && profile.inputDevices) done = list.setPlugged(plugged);
        if (!done) fail(kFailed, done.error().message());
    });
    for (const Fault& fault : profile.faults) {
        if (auto done = faults.add(fault); !done) return fail(kFailed, done.error().message());
    }
    ControlRequests requests(profile, nullptr, faults, journal, [&] { faults.drain(); });
    std::unique_ptr<ControlSocket> control;
    if (!options.control.empty()) {
        auto listening = ControlSocket::listenAt(
                options.control, [&](std::string_view line) { return requests.answer(line); });
        if (!listening) return fail(kBadInput, listening.error().message());
        control = std::move(*listening);
    }
    announceReady(options.readyFd);
    pollfd polled[] = {{signals, POLLIN, 0},
                       {(*module)->descriptor(), POLLIN, 0},
                       {control != nullptr ? control->descriptor() : -1, POLLIN, 0}};
    while (!requests.isStopWanted() && polled[0].revents == 0) {
        if (poll(polled, std::size(polled), requests.runDue()) < 0 && errno != EINTR)
            return kFailed;
        if (polled[1].revents != 0) faults.drain();
        if (polled[2].revents != 0) control->serve();
    }
    faults.drain();
    return kStopped;
}

// Serves until something asks for the end. False when the mount was lost.
bool serve(int signals, int ended, ControlSocket* control, ControlRequests& requests) {
    pollfd polled[] = {{signals, POLLIN, 0},
                       {ended, POLLIN, 0},
                       {control != nullptr ? control->descriptor() : -1, POLLIN, 0}};
    while (!requests.isStopWanted()) {
        if (poll(polled, std::size(polled), requests.runDue()) < 0 && errno != EINTR) return false;
        if (polled[0].revents != 0) return true;
        if (polled[1].revents != 0) return false;
        if (polled[2].revents != 0) control->serve();
    }
    return true;
}

int run(const Options& options) {
    const unique_fd signals = stopSignals();
    const pid_t parent = getppid();
    prctl(PR_SET_PDEATHSIG, SIGTERM);
    if (getppid() != parent) return kStopped;

    const Result<Profile> profile = readProfile(options.profile);
    if (!profile) return fail(kBadInput, profile.error().message());
    if (geteuid() != 0) return fail(kFailed, "mounting the nodes takes root");
    Result<std::unique_ptr<Journal>> journal = Journal::create(options.journal);
    if (!journal) return fail(kBadInput, journal.error().message());

    if (auto done = enterPrivateMounts(); !done) return fail(kFailed, done.error().message());
    if (!options.module.empty()) return runModule(options, *profile, **journal, signals.get());
    Result<unsigned> event = 0U;
    if (profile->motor) event = chooseEvent(*profile->motor);
    if (!event) return fail(kFailed, event.error().message());
    Result<StagingDirectory> staging = StagingDirectory::create();
    if (!staging) return fail(kFailed, staging.error().message());
    InputDeviceList list(*profile, *event, *staging);
    PlacedFiles files;
    if (auto done = showFiles(*profile, files, *staging, list); !done)
        return fail(kFailed, done.error().message());

    const NodeTree tree(kSysfsRoot, profile->nodes);
    FaultInjector faults;
    for (const Fault& fault : profile->faults) faults.add(fault);
    const unique_fd ended(eventfd(0, EFD_CLOEXEC));
    Result<std::unique_ptr<MotorDevice>> motor = std::unique_ptr<MotorDevice>();
    if (profile->motor) {
        motor = MotorDevice::start(*profile->motor, *event, faults, **journal, ended.get());
    }
    if (!motor) return fail(kFailed, motor.error().message());
    faults.setOnPlug([&](std::string_view node, bool plugged) {
        (*journal)->record({}, {{"op", plugged ? "plug" : "unplug"}, {"node", node}});
        if (node != kMotorNode) return;
        if (!plugged) (*motor)->forgetEffects();
        if (auto done = list.setPlugged(plugged); !done) fail(kFailed, done.error().message());
    });
    const Result<std::unique_ptr<SysfsServer>> server =
            SysfsServer::start(tree, faults, **journal, ended.get());
    if (!server) return fail(kFailed, server.error().message());

    ControlRequests requests(*profile, &tree, faults, **journal, [&] { (*server)->settle(); });
    std::unique_ptr<ControlSocket> control;
    if (!options.control.empty()) {
        auto listening = ControlSocket::listenAt(
                options.control, [&](std::string_view line) { return requests.answer(line); });
        if (!listening) return fail(kBadInput, listening.error().message());
        control = std::move(*listening);
    }
    announceReady(options.readyFd);
    if (serve(signals.get(), ended.get(), control.get(), requests)) return kStopped;
    return fail(kFailed, "the mount of the nodes is gone");
}

int parseAndRun(int argc, char** argv) {
    Options options;
    CLI::App app(kHelp, "handset-driver");
    app.add_option("--profile", options.profile, "the profile, a JSON file")->required();
    app.add_option("--journal", options.journal, "the journal to write; emptied first")->required();
    app.add_option("--control", options.control, "where to make the control socket");
    app.add_option("--module", options.module, "the kernel module that drives, as a file");
    app.add_option("--ready-fd", options.readyFd,
                   "descriptor that gets the line \"ready\" once the nodes are there")
            ->check(CLI::Range(0, 1 << 20));
    try {
        app.parse(argc, argv);
    } catch (const CLI::CallForHelp&) {
        std::cout << app.help();
        return kStopped;
    } catch (const CLI::ParseError& error) {
        return fail(kBadInput, fmt::format("{}; see --help", error.what()));
    }
    return run(options);
}

}  // namespace
}  // namespace handset

int main(int argc, char** argv) {
    try {
        return handset::parseAndRun(argc, argv);
    } catch (const std::exception& error) {  // memory or threads have run out
        std::fprintf(stderr, "handset-driver: %s\n", error.what());
        return 1;
    }
}
