// SPDX-License-Identifier: Apache-2.0
// The process that stands behind a phone: it starts the driver, the service manager and the
// service, watches them, and takes them down in the right order. A thing it started never outlives
// it.
#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <vector>

#include "common/unique_fd.h"
#include "driver/result.h"
#include "phone/phone_state.h"
#include "phone/process.h"

namespace handset {

/// What to bring up.
struct PhonePlan {
    std::string profileName;  ///< as the user named it
    std::string profilePath;
    std::string out;  ///< exists
    std::string driver;
    std::string manager;
    std::string service;  ///< empty: none
};

/// How bringing a phone up came out.
struct UpReport {
    int status = 0;    ///< exit status of "phone up"
    std::string text;  ///< its one line
};

class Supervisor {
  public:
    /// `starter` is the writing end of a pipe to the process that waits for the report.
    Supervisor(PhonePlan plan, UniqueFd starter);

    /// Brings the phone up, reports, watches until SIGTERM or until the driver ends, and takes
    /// everything down. Blocks SIGTERM and SIGINT for the whole process.
    void run();

  private:
    enum class Event { kStop, kStarterGone, kDriver, kManager, kService, kProbe, kReady, kLate };
    using Clock = std::chrono::steady_clock;

    UpReport bringUp();
    Result<Child> startServer(std::vector<std::string> command, const std::string& log,
                              UniqueFd& ready);
    std::optional<UpReport> startDriver();
    std::optional<UpReport> startManager();
    std::optional<UpReport> startService();
    UpReport awaitRegistration();
    void watch();
    void takeDown();

    Event wait(Clock::time_point deadline, int ready = -1);
    UpReport notReady(Event event);
    void noteServiceEnd();
    void report(const UpReport& report);

    PhonePlan plan_;
    UniqueFd starter_;
    UniqueFd signals_;
    PhoneState state_;
    std::optional<Child> driver_;
    std::optional<Child> manager_;
    std::optional<Child> service_;
    std::optional<Child> probe_;
};

/// Removes what a phone left behind whose supervisor was killed.
void cleanUpAfter(const PhoneState& state);

/// The line that says how the service ended: "the service exited with status 134: LAST LOG LINE".
std::string serviceEndText(const PhoneState& state);

}  // namespace handset
