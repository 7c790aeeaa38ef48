// SPDX-License-Identifier: Apache-2.0
//
// servicemanager [--root DIR] [--rules FILE] [--ready-fd N]: makes itself the context manager of the
// binder device and serves until the driver is gone. Exit status 2 for wrong usage, 1 when it cannot
// serve; each with one line that says why.
#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <filesystem>
#include <optional>
#include <string>
#include <utility>

#include <CLI/CLI.hpp>
#include <android-base/parseint.h>
#include <android/binder_process.h>
#include <binder_context_manager.h>
#include <fmt/format.h>

#include "platform/servicemanager/registration_rules.h"
#include "platform/servicemanager/service_manager.h"
#include "platform/servicemanager/systemd_notify.h"

namespace {

using servicemanager::RegistrationRules;
using servicemanager::ServiceManager;

constexpr const char* kBinderDevice = "/dev/binder";
constexpr const char* kMountedBinderDevice = "/dev/binderfs/binder";
constexpr int kWrongUsage = 2;

// How often clients are counted, as on a phone, and systemd hears that the one thread is alive.
constexpr std::chrono::seconds kTick{5};

// Keeps to one line: a word of the user's may hold anything.
[[noreturn]] void fail(std::string why, int status) {
    std::replace_if(
            why.begin(), why.end(), [](unsigned char c) { return std::iscntrl(c) != 0; }, '?');
    fmt::print(stderr, "servicemanager: {}\n", why);
    std::exit(status);
}

// The binder library ends the process when it cannot open its driver; say why before that. It
// takes the first of the devices that exists.
void requireBinderDevice() {
    for (const char* device : {kBinderDevice, kMountedBinderDevice}) {
        if (access(device, R_OK | W_OK) == 0) return;
        if (errno == ENOENT) continue;
        fail(fmt::format("cannot open {}: {}", device, std::strerror(errno)), EXIT_FAILURE);
    }
    fail(fmt::format("cannot open {}: {}", kBinderDevice, std::strerror(ENOENT)), EXIT_FAILURE);
}

std::string reasonOf(binder_status_t status) {
    switch (status) {
        case -EBUSY:
        case STATUS_ALREADY_EXISTS:
            return "another service manager is running";
        case STATUS_PERMISSION_DENIED:
            return "only the user who ran the first one may";
        default:
            return fmt::format("status {}", status);
    }
}

struct Options {
    std::string root = "/";
    std::optional<std::string> rules;
    int readyFd = -1;
};

// What is wrong with a descriptor; empty when it is open. An empty word would be taken for 0.
std::string requireDescriptor(const std::string& word) {
    int fd = -1;
    if (android::base::ParseInt(word, &fd) && fcntl(fd, F_GETFD) >= 0) return "";
    return fmt::format("\"{}\" is no open descriptor", word);
}

Options parseOptions(int argc, char** argv) {
    Options options;
    CLI::App app("Context manager of the binder device: finds services by name.", "servicemanager");
    app.add_option("--root", options.root, "Look for VINTF manifests below this directory")
            ->option_text("DIR (default /)")
            ->check(CLI::ExistingDirectory);
    app.add_option("--rules", options.rules,
                   "Let users register services, and start services on request, as this file says; "
                   "without it only root may register")
            ->option_text("FILE");
    app.add_option("--ready-fd", options.readyFd,
                   "Write a newline to this descriptor and close it when requests are served")
            ->option_text("N")
            ->check(requireDescriptor);
    try {
        app.parse(argc, argv);
    } catch (const CLI::CallForHelp& help) {
        std::exit(app.exit(help));
    } catch (const CLI::ParseError& error) {
        fail(fmt::format("{}; usage: servicemanager [--root DIR] [--rules FILE] [--ready-fd N]",
                         error.what()),
             kWrongUsage);
    }
    return options;
}

RegistrationRules loadRules(const std::optional<std::string>& file) {
    if (!file) return {};
    auto rules = RegistrationRules::load(*file);
    if (!rules.ok()) fail(rules.error().message(), kWrongUsage);
    return *std::move(rules);
}

// Whoever starts the manager can wait for this instead of asking a manager that is not there yet.
void reportReady(int fd) {
    servicemanager::notifySystemd("READY=1");
    if (fd < 0) return;
    if (write(fd, "\n", 1) != 1) {
        fail(fmt::format("--ready-fd {}: {}", fd, std::strerror(errno)), kWrongUsage);
    }
    close(fd);
}

// Answers what comes in and, between two requests, counts clients where somebody wants to know.
// Returns when the driver is gone.
void serveRequests(ServiceManager& manager) {
    using Clock = std::chrono::steady_clock;
    const bool isWatched = servicemanager::systemdWatches();
    pollfd driver{.fd = -1, .events = POLLIN, .revents = 0};
    ABinderProcess_setupPolling(&driver.fd);
    auto next = Clock::now() + kTick;
    while ((driver.revents & (POLLERR | POLLHUP | POLLNVAL)) == 0) {
        const auto left = std::chrono::ceil<std::chrono::milliseconds>(next - Clock::now());
        const bool ticks = isWatched || manager.hasClientCallbacks();
        const int timeout = ticks ? static_cast<int>(std::max<int64_t>(left.count(), 0)) : -1;
        if (poll(&driver, 1, timeout) < 0) continue;
        if ((driver.revents & POLLIN) != 0 && ABinderProcess_handlePolledCommands() < 0) return;
        if (Clock::now() < next) continue;
        next = Clock::now() + kTick;
        manager.checkClients();
        if (isWatched) servicemanager::notifySystemd("WATCHDOG=1");
    }
}

[[noreturn]] void serve(const Options& options) {
    RegistrationRules rules = loadRules(options.rules);
    requireBinderDevice();
    // Nobody waits for what is started on request.
    signal(SIGCHLD, SIG_IGN);
    // One thread, this one: registrations and questions are answered one after the other.
    ABinderProcess_setThreadPoolMaxThreadCount(0);
    ServiceManager manager(options.root, std::move(rules));
    const binder_status_t status = ABinderProcess_becomeContextManager(manager.binder());
    if (status != STATUS_OK) {
        fail(fmt::format("cannot become the context manager: {}", reasonOf(status)), EXIT_FAILURE);
    }
    reportReady(options.readyFd);
    serveRequests(manager);
    fail("the binder device is gone", EXIT_FAILURE);
}

}  // namespace

int main(int argc, char** argv) {
    try {
        serve(parseOptions(argc, argv));
    } catch (const std::exception& error) {
        std::fprintf(stderr, "servicemanager: %s\n", error.what());
        return EXIT_FAILURE;
    }
}
