// SPDX-License-Identifier: Apache-2.0
//
// servicemanager [--root DIR] [--ready-fd N]: makes itself the context manager of the binder device
// and serves until the driver is gone. Exit status 2 for wrong usage, 1 when it cannot serve; each
// with one line that says why.
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <filesystem>
#include <string>

#include <unistd.h>

#include <android/binder_process.h>
#include <binder_context_manager.h>
#include <fmt/format.h>

#include <CLI/CLI.hpp>

#include "service_manager.h"

namespace {

constexpr const char* kBinderDevice = "/dev/binder";
constexpr const char* kMountedBinderDevice = "/dev/binderfs/binder";
constexpr int kWrongUsage = 2;

[[noreturn]] void fail(const std::string& why, int status) {
    fmt::print(stderr, "servicemanager: {}\n", why);
    std::exit(status);
}

/// The binder library ends the process when it cannot open its driver; say why before that. It
/// takes the first of the devices that exists.
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
    int readyFd = -1;
};

Options parseOptions(int argc, char** argv) {
    Options options;
    CLI::App app("Context manager of the binder device: finds services by name.", "servicemanager");
    app.add_option("--root", options.root, "Look for VINTF manifests below this folder")
            ->option_text("DIR (default /)")
            ->check(CLI::ExistingDirectory);
    app.add_option("--ready-fd", options.readyFd,
                   "Write a line feed to this descriptor and close it when requests are served")
            ->option_text("N");
    try {
        app.parse(argc, argv);
    } catch (const CLI::CallForHelp& help) {
        std::exit(app.exit(help));
    } catch (const CLI::ParseError& error) {
        fail(fmt::format("{}; usage: servicemanager [--root DIR] [--ready-fd N]", error.what()),
             kWrongUsage);
    }
    return options;
}

/// Whoever starts the manager can wait for this instead of asking a manager that is not there yet.
void announceReady(int fd) {
    if (fd < 0) return;
    if (write(fd, "\n", 1) != 1) {
        fail(fmt::format("--ready-fd {}: {}", fd, std::strerror(errno)), kWrongUsage);
    }
    close(fd);
}

[[noreturn]] void serve(const Options& options) {
    requireBinderDevice();
    // One thread, this one: registrations and questions are answered one after the other.
    ABinderProcess_setThreadPoolMaxThreadCount(0);
    servicemanager::ServiceManager manager(options.root);
    const binder_status_t status = ABinderProcess_becomeContextManager(manager.binder());
    if (status != STATUS_OK) {
        fail(fmt::format("cannot become the context manager: {}", reasonOf(status)), EXIT_FAILURE);
    }
    announceReady(options.readyFd);
    ABinderProcess_joinThreadPool();
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
