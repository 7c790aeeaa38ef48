// SPDX-License-Identifier: Apache-2.0
//
// "phone up": finding everything that is needed, and handing it to a supervisor.
#pragma once

#include <string>

namespace handset {

// What the command line of "phone up" says.
struct UpOptions {
    std::string profile = "leds";    // a built-in profile's name, or a file
    std::string out = "/run/phone";  // directory for the journal and the logs
    std::string service;             // another build of the service; empty: the one beside phone
    std::string module;              // the kernel module that drives; empty: the simulated driver
    bool noService = false;
};

// Brings a phone up and prints the line that says how that came out. Returns the exit status.
int phoneUp(const UpOptions& options);

// Prints "phone: TEXT" on standard error, kept to one line, and returns `status`.
int failWith(int status, std::string text);

}  // namespace handset
