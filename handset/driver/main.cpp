// SPDX-License-Identifier: Apache-2.0
// The simulated vibrator driver: shows a profile's nodes, files and motor to whoever enters its
// mount namespace, and keeps a journal of what they do with them.
#include <fcntl.h>
#include <fmt/format.h>
#include <poll.h>
#include <sys/eventfd.h>
#include <sys/prctl.h>
#include <sys/signalfd.h>
#include <unistd.h>

#include <CLI/CLI.hpp>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <exception>
#include <iostream>
#include <iterator>
#include <string>
#include <utility>

#include "common/unique_fd.h"
#include "driver/control_requests.h"
#include "driver/control_socket.h"
#include "driver/event_node.h"
#include "driver/fault_book.h"
#include "driver/input_devices.h"
#include "driver/journal.h"
#include "driver/motor_device.h"
#include "driver/node_tree.h"
#include "driver/one_line.h"
#include "driver/placed_files.h"
#include "driver/private_mounts.h"
#include "driver/profile_reader.h"
#include "driver/sysfs_server.h"

namespace handset {
namespace {

constexpr int kStopped = 0;
constexpr int kFailed = 1;
constexpr int kBadInput = 2;

constexpr const char* kInputDevices = "/proc/bus/input/devices";

constexpr const char* kHelp = R"(Simulates a phone's vibrator driver.

Takes a mount namespace of its own, shows the profile's nodes on /sys/class and its list of input
devices on /proc/bus/input/devices there, makes the motor's /dev/input/eventN, and records every
call in the journal. Enter it with
  nsenter --mount=/proc/PID/ns/mnt COMMAND...
SIGTERM, SIGINT, the control request "stop" and the end of the parent process stop it; whatever it
mounted or made is gone then.

Requests on the control socket, one a line, answered by "ok ..." or "error MESSAGE":
  fault {JSON}      add a fault, as in a profile    clear   forget all faults
  get PATH          what a read of a node returns   reset   empty the journal
  set PATH "TEXT"   change a node's text            stop    end
  settle            wait until the journal has every close so far

Exit status: 0 stopped, 1 could not start or lost its mount, 2 wrong usage or a wrong profile.)";

struct Options {
    std::string profile;
    std::string journal;
    std::string control;
    int readyFd = -1;
};

/// Prints the one line that says what went wrong, kept to one line whatever it quotes.
int fail(int status, std::string text) {
    fmt::print(stderr, "handset-driver: {}\n", oneLine(std::move(text)));
    return status;
}

/// SIGTERM and SIGINT as a descriptor, blocked for every thread that is started from here on.
UniqueFd stopSignals() {
    sigset_t signals;
    sigemptyset(&signals);
    sigaddset(&signals, SIGTERM);
    sigaddset(&signals, SIGINT);
    sigprocmask(SIG_BLOCK, &signals, nullptr);
    return UniqueFd(signalfd(-1, &signals, SFD_CLOEXEC));
}

void announceReady(int fd) {
    if (fd < 0) return;
    const std::string_view line = "ready\n";
    if (write(fd, line.data(), line.size()) < 0) {
        fmt::print(stderr, "handset-driver: ready descriptor: {}\n", strerror(errno));
    }
    close(fd);
}

/// Shows the profile's plain files and its list of input devices.
Failure showFiles(const Profile& profile, unsigned event, PlacedFiles& files) {
    Result<StagingFolder> staging = StagingFolder::create();
    if (!staging) return staging.error();
    for (const FileSpec& file : profile.files) {
        if (auto failure = files.place(file, *staging)) return failure;
    }
    return staging->bindFile(kInputDevices, inputDevicesText(profile, event), 0, 0444);
}

/// Serves until something asks for the end. False when the mount was lost.
bool serve(int signals, int ended, ControlSocket* control, const ControlRequests& requests) {
    pollfd polled[] = {{signals, POLLIN, 0},
                       {ended, POLLIN, 0},
                       {control != nullptr ? control->descriptor() : -1, POLLIN, 0}};
    while (!requests.isStopWanted()) {
        if (poll(polled, std::size(polled), -1) < 0 && errno != EINTR) return false;
        if (polled[0].revents != 0) return true;
        if (polled[1].revents != 0) return false;
        if (polled[2].revents != 0) control->serve();
    }
    return true;
}

int run(const Options& options) {
    const UniqueFd signals = stopSignals();
    const pid_t parent = getppid();
    prctl(PR_SET_PDEATHSIG, SIGTERM);
    if (getppid() != parent) return kStopped;

    const Result<Profile> profile = readProfile(options.profile);
    if (!profile) return fail(kBadInput, profile.error().text);
    if (geteuid() != 0) return fail(kFailed, "mounting the nodes takes root");
    Result<std::unique_ptr<Journal>> journal = Journal::create(options.journal);
    if (!journal) return fail(kBadInput, journal.error().text);

    Result<unsigned> event = 0U;
    if (profile->motor) event = chooseEvent(*profile->motor);
    if (!event) return fail(kFailed, event.error().text);
    if (auto failure = enterPrivateMounts()) return fail(kFailed, failure->text);
    PlacedFiles files;
    if (auto failure = showFiles(*profile, *event, files)) return fail(kFailed, failure->text);

    const NodeTree tree(kSysfsRoot, profile->nodes);
    FaultBook faults;
    for (const FaultSpec& fault : profile->faults) faults.add(fault);
    const UniqueFd ended(eventfd(0, EFD_CLOEXEC));
    Result<std::unique_ptr<MotorDevice>> motor = std::unique_ptr<MotorDevice>();
    if (profile->motor) {
        motor = MotorDevice::start(*profile->motor, *event, faults, **journal, ended.get());
    }
    if (!motor) return fail(kFailed, motor.error().text);
    const Result<std::unique_ptr<SysfsServer>> server =
            SysfsServer::start(tree, faults, **journal, ended.get());
    if (!server) return fail(kFailed, server.error().text);

    ControlRequests requests(*profile, tree, faults, **journal, [&] { (*server)->settle(); });
    std::unique_ptr<ControlSocket> control;
    if (!options.control.empty()) {
        auto listening = ControlSocket::listenAt(
                options.control, [&](std::string_view line) { return requests.answer(line); });
        if (!listening) return fail(kBadInput, listening.error().text);
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
