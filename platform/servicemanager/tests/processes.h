// SPDX-License-Identifier: Apache-2.0
//
// The processes of a guest test: the service manager itself, and clients that run as some user.
// Each client is a fork of a test that has not touched binder yet, so it has a binder of its own.
#pragma once

#include <functional>
#include <string>

#include "tests/support/process.h"

namespace processes {

// A running service manager; ended with the object.
class Manager {
  public:
    // Starts it as root with the option `--root root`, and `--rules` with these lines, and waits
    // until it answers.
    explicit Manager(const std::string& root, const std::string& rules = "");
    ~Manager();
    Manager(const Manager&) = delete;
    Manager& operator=(const Manager&) = delete;

    bool answers() const;

    // What it has written to its standard error so far.
    std::string log() const;

  private:
    std::string mLog;
    qvx::test::Process mProcess;
};

// Runs the service manager's program as a user until it exits; its exit status.
int runManager(uid_t uid, std::string& output);

// A client process that serves binder calls after `prepare`, which has returned by then.
qvx::test::Process serve(uid_t uid, const std::function<void()>& prepare);

}  // namespace processes
