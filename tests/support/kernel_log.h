// SPDX-License-Identifier: Apache-2.0
//
// What the guest's kernel said about binder. The driver logs every misuse it sees, so a quiet log
// is evidence that this project's processes keep its protocol.
#pragma once

#include <string>
#include <vector>

namespace qvx::test {

// The kernel log's lines that mention binder and were not provoked on purpose, oldest first.
std::vector<std::string> binderComplaints();

// While one lives, the kernel's complaints are expected: the test breaks the protocol on purpose.
class ExpectBinderComplaints {
  public:
    ExpectBinderComplaints();
    ~ExpectBinderComplaints();
    ExpectBinderComplaints(const ExpectBinderComplaints&) = delete;
    ExpectBinderComplaints& operator=(const ExpectBinderComplaints&) = delete;
};

}  // namespace qvx::test
