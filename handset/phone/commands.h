// SPDX-License-Identifier: Apache-2.0
// The phone tool's commands but for "up". Each returns the tool's exit status and has printed, on
// failure, one line that says why.
#pragma once

#include <optional>
#include <string>
#include <vector>

namespace handset {

/// Takes the phone down, or cleans up after one that was cut off. Quiet when none is up.
int phoneDown();

/// Prints whether a phone is up. 0: it is, and its service (if it has one) runs; 1: not.
int phoneStatus();

/// Empties the journal and the service's log.
int phoneReset();

/// Adds a fault given as words or as a JSON object, or forgets all.
int phoneFault(const std::vector<std::string>& words);
int phoneClearFaults();

/// Prints a node's text, or sets it where `text` is given.
int phoneNode(const std::string& path, const std::optional<std::string>& text);

/// Prints the journal, or the service's log, of the phone that is up or was up last with this
/// output folder.
int phonePrintJournal(const std::string& out);
int phonePrintLog(const std::string& out);

/// Runs a command where the phone's nodes are seen; does not return when that works.
int phoneExec(std::optional<unsigned> user, const std::vector<std::string>& command);

}  // namespace handset
