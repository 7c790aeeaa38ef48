// SPDX-License-Identifier: Apache-2.0
//
// A machine that has no thread to give: pthread_create is replaced in the test program, as the
// calls in interposed_calls.cpp are.
#pragma once

namespace imitated {

// While one lives, no thread can be started in this process (EAGAIN). One at a time.
class ThreadShortage {
  public:
    ThreadShortage();
    ~ThreadShortage();
    ThreadShortage(const ThreadShortage&) = delete;
    ThreadShortage& operator=(const ThreadShortage&) = delete;
};

}  // namespace imitated
