// SPDX-License-Identifier: Apache-2.0
//
// The process that runs a phone: it starts the driver, the service manager and the service, watches
// them, starts the service again as its init script says, and takes everything down in the right
// order. A thing it started never outlives it.
//
// While the phone is up it answers at kSupervisorSocket, as the driver does at its own:
//
//   service stop       ends the service; it stays so
//   service start      starts it
//   service restart    both
//   service kill       kills it; it is started again as after any end
//   log                writes out what the service has logged so far
#pragma once

#include <chrono>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include <android-base/result.h>
#include <android-base/unique_fd.h>

#include "handset/driver/control_socket.h"
#include "handset/phone/init_script.h"
#include "handset/phone/phone_state.h"
#include "handset/phone/process.h"
#include "handset/phone/service_log.h"

namespace handset {

// How long a process that is told to end may take, in milliseconds.
inline constexpr int kEndTimeout = 3000;

// What to bring up.
struct PhonePlan {
    std::string profileName;  // as the user named it
    std::string profilePath;
    std::string out;  // exists
    std::string driver;
    std::string module;  // of the kernel; empty: the driver simulates
    std::string manager;
    std::string service;  // empty: none
    InitScript init;      // how the service is started again
};

// How bringing a phone up came out.
struct UpReport {
    static constexpr int kUp = 0;
    static constexpr int kServiceEnded = 1;
    static constexpr int kNotStarted = 2;

    static UpReport notStarted(std::string text) { return {kNotStarted, std::move(text)}; }

    int status = kUp;  // exit status of "phone up"
    std::string text;  // its one line
};

class Supervisor {
  public:
    // `starter` is the writing end of a pipe to the process that waits for the report.
    Supervisor(PhonePlan plan, android::base::unique_fd starter);

    // Brings the phone up, reports, watches until SIGTERM or until the driver ends, and takes
    // everything down. Blocks SIGTERM and SIGINT for the whole process.
    void run();

  private:
    enum class Event {
        kStop,
        kStarterGone,
        kDriver,
        kManager,
        kService,
        kProbe,
        kReady,
        kRequest,
        kLate
    };
    using Clock = std::chrono::steady_clock;

    UpReport bringUp();
    android::base::Result<Child> startServer(std::vector<std::string> command,
                                             const std::string& log,
                                             android::base::unique_fd& ready);
    std::optional<UpReport> startDriver();
    std::optional<UpReport> startManager();
    std::optional<UpReport> startService();
    UpReport awaitRegistration();
    android::base::Result<void> listen();
    android::base::Result<void> makeCalls() const;
    void watch();
    std::string answer(std::string_view request);
    std::string serviceRequest(std::string_view action);
    void stopService();
    void takeDown();

    Event wait(Clock::time_point deadline, int ready = -1);
    UpReport notReady(Event event);
    void noteServiceEnd();
    void report(const UpReport& report);

    PhonePlan mPlan;
    android::base::unique_fd mStarter;
    android::base::unique_fd mSignals;
    PhoneState mState;
    std::optional<Child> mDriver;
    std::optional<Child> mManager;
    std::optional<Child> mService;
    std::optional<Child> mProbe;
    std::optional<ServiceLog> mLog;
    std::unique_ptr<ControlSocket> mRequests;
    Clock::time_point mServiceStart;
    std::optional<Clock::time_point> mRestartAt;  // when init would start the service again
};

// Removes what a phone left behind whose supervisor was killed.
void cleanUpAfter(const PhoneState& state);

// The line that says how the service ended: "the service exited with status 134: LAST LOG LINE".
std::string serviceEndText(const PhoneState& state);

}  // namespace handset
