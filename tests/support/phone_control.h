// SPDX-License-Identifier: Apache-2.0
//
// A phone inside the guest, as system tests drive it: brought up with a profile, called through
// vibctl, and read back through the driver's journal.
#pragma once

#include <string>
#include <vector>

#include <nlohmann/json.hpp>

#include "tests/support/command.h"

namespace qvx::test {

// What Phone::call() gives as "exception" for a request that is refused.
constexpr int kIllegalArgument = -3;
constexpr int kIllegalState = -5;

// Brings a phone up for the life of the object. The out directory is emptied first.
class Phone {
  public:
    // `profile` is a string, the name of a built-in profile, or an object, a profile of the test's
    // own. `options` go to "phone up" as they stand.
    explicit Phone(const nlohmann::json& profile, const std::vector<std::string>& options = {});
    ~Phone();
    Phone(const Phone&) = delete;
    Phone& operator=(const Phone&) = delete;

    // What "phone up" answered: status 0 when the service is registered.
    const CommandResult& up() const { return mUp; }

    // One call, with --json: what vibctl printed, parsed; null when that is not JSON.
    nlohmann::json call(const std::vector<std::string>& words) const;

    // The journal's lines, in order.
    std::vector<nlohmann::json> journal() const;

    // The journal's writes as "LEAF DATA", for example "duration 500\n".
    std::vector<std::string> writes() const;

    // Empties the journal and the log.
    void reset() const;

    // Adds a fault while the phone runs.
    void fault(const nlohmann::json& fault) const;

    // What the service has logged since it started or since reset().
    std::string log() const;

    // The service's process id; 0 when it does not run.
    int servicePid() const;

    // Starts the service once more, as `user`, and waits for its end.
    CommandResult startService(const std::string& user) const;

  private:
    std::string mOut;
    CommandResult mUp;
};

// The profile text of a built-in profile, to be varied by a test.
nlohmann::json builtInProfile(const std::string& name);

}  // namespace qvx::test
