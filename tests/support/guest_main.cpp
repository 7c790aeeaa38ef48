// SPDX-License-Identifier: Apache-2.0
//
// The main function of test programs that run in the guest: GoogleTest's, and after the last test
// a look at the kernel log, which must hold no complaint about binder.
#include <gtest/gtest.h>

#include "tests/support/kernel_log.h"

namespace {

class KernelLogIsQuiet : public testing::Environment {
  public:
    void TearDown() override {
        for (const std::string& line : qvx::test::binderComplaints()) {
            ADD_FAILURE() << "the kernel complains: " << line;
        }
    }
};

}  // namespace

int main(int argc, char** argv) {
    testing::InitGoogleTest(&argc, argv);
    testing::AddGlobalTestEnvironment(new KernelLogIsQuiet);
    return RUN_ALL_TESTS();
}
