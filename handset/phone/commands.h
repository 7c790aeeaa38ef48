// SPDX-License-Identifier: Apache-2.0
//
// The phone tool's commands but for "up". Each returns the tool's exit status and has printed, on
// failure, one line that says why.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "handset/phone/phone_state.h"

namespace handset {

// The exit statuses of failures.
inline constexpr int kNotWell = 1;  // the phone or its service is not as it was asked to be
inline constexpr int kRefused = 2;  // nothing was changed

inline constexpr const char* kDownText = "no phone is up; \"phone up\" starts one";

// The phone that is up, or nothing.
std::optional<PhoneState> phoneThatIsUp();

// Takes the phone down, or cleans up after one that was cut off. Quiet when none is up.
int phoneDown();

// Prints what runs and what clients find now, in words or as one JSON object. 0: a phone is up, and
// its service (if it has one) is registered; 1: not.
int phoneStatus(bool json);

// "stop", "start", "restart" or "kill": what is to happen to the service alone. What starts it waits
// until it is registered.
int phoneService(const std::string& action);

// Empties the journal, the service's log and the list of calls.
int phoneReset();

// Adds a fault given as words or as a JSON object, forgets all, or prints them with how often each
// has struck.
int phoneFault(const std::vector<std::string>& words);
int phoneClearFaults();
int phoneListFaults(bool json);

// Takes a node, or the motor, away or brings it back, `after` milliseconds from now.
int phonePlug(bool plugIn, const std::string& node, unsigned after);

// Prints a node's text, or sets it where `text` is given.
int phoneNode(const std::string& path, const std::optional<std::string>& text);

// How the journal or the log is printed.
struct ListingOptions {
    std::string out;      // the output directory of a phone that was up; empty: the one that is
    bool pretty = false;  // journal, log and calls in words, in order of time
    bool follow = false;  // what comes later too, while the phone is up
};

// Prints the journal, or the service's log.
int phoneJournal(const ListingOptions& options);
int phoneLog(const ListingOptions& options);

// Runs a command where the phone's nodes are seen; does not return when that works.
int phoneExec(std::optional<unsigned> user, const std::vector<std::string>& command);

}  // namespace handset
