// SPDX-License-Identifier: Apache-2.0
//
// Who plays. Binder tells the service which user has opened it, so the calls of each user are made by
// a process of their own.
#pragma once

#include <sys/types.h>

#include <chrono>
#include <vector>

#include <android-base/unique_fd.h>

#include "vibctl/outcome.h"
#include "vibctl/play/plan.h"

namespace vibctl {

class Callers {
  public:
    // What keeps this user from making all the calls of `plan`.
    static Problem check(const Plan& plan);

    // Starts a process for each user in `plan` but this one. All of them go on from here. To be
    // called before the process has a second thread or has asked for the service.
    explicit Callers(const Plan& plan);

    // Leaves in `plan` the calls that this process is to make.
    void keepOwn(Plan& plan) const;

    // Waits until every process is ready to play, or has given up; when the calls at 0 are due.
    Clock::time_point start();

    // To be called at the end by each of them. In the first process, waits for the others: `own`, or
    // what the first of them came to that did not end well. In the others `own`.
    Exit join(Exit own);

  private:
    uid_t mUser;                      // who makes the calls without a user
    uid_t mOwn;                       // whom this process calls as
    std::vector<pid_t> mOthers;       // in the first process
    android::base::unique_fd mReady;  // its end is everybody's being ready
    android::base::unique_fd mStart;  // brings the time to each of the others
};

}  // namespace vibctl
