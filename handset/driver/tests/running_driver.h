// SPDX-License-Identifier: Apache-2.0
//
// A handset-driver that runs for one test.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "handset/driver/tests/client_process.h"
#include "handset/driver/tests/test_files.h"
#include "tests/support/process.h"

namespace handset {

// Two nodes that many a test's profile has.
inline const std::string kDuration = "/sys/class/leds/vibrator/duration";
inline const std::string kWaves = "/sys/class/leds/vibrator/num_waves";

// What tests of both drivers are run with: the simulated one, and the kernel module.
inline const char* const kBothDrivers[] = {"", QVX_MODULE};
inline std::string driverName(const testing::TestParamInfo<const char*>& info) {
    return info.index == 0 ? "Simulated" : "Kernel";
}

class RunningDriver {
  public:
    // Starts the driver with a profile's text, with the kernel module in `module` if there is one,
    // and waits until it is ready or has ended.
    explicit RunningDriver(const std::string& profile, const std::string& module = "");

    // Stops it, if it runs still.
    ~RunningDriver();
    RunningDriver(const RunningDriver&) = delete;
    RunningDriver& operator=(const RunningDriver&) = delete;

    bool isReady() const { return mProcess.isReady(); }
    pid_t pid() const { return mProcess.pid(); }
    std::string directory() const { return mDirectory.path; }

    // Sends the signal and waits for the end: the exit status, or 128 and the signal's number.
    int end(int signal);

    // What the driver printed on standard error.
    std::string errors() const { return contentOf(fileIn(mDirectory, "errors")); }

    // Asks through the control socket: "ok ..." or "error ...".
    std::string ask(const std::string& request) const;

    // The journal, with each line's n, us, pid and took left out.
    std::vector<std::string> journal() const;

    // The journal once it has what was done so far.
    std::string rawJournal() const;

    // Runs `work` in a process of its own that sees the driver's mounts, as runAs() does.
    std::string inside(uid_t user, const std::function<std::string()>& work) const {
        return runAs(user, work, pid());
    }

    // The same as root.
    std::string inside(const std::function<std::string()>& work) const { return inside(0, work); }

  private:
    TemporaryDir mDirectory;
    qvx::test::Process mProcess;
};

}  // namespace handset
