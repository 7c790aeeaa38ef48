// SPDX-License-Identifier: Apache-2.0
//
// The service manager that all tests of the program share. Always root's: the driver keeps the user
// of a boot's first manager for good.
#include <memory>

#include <gtest/gtest.h>

#include "platform/libbinder_ndk/tests/guest/small_manager.h"
#include "tests/support/process.h"

namespace binder_test {
namespace {

using qvx::test::Process;

class Manager : public testing::Environment {
  public:
    void SetUp() override {
        mProcess = std::make_unique<Process>(
                qvx::test::kRoot, [](const Process::Ready& ready) { serveSmallManager(ready); });
    }
    void TearDown() override { mProcess.reset(); }

  private:
    std::unique_ptr<Process> mProcess;
};

[[maybe_unused]] const auto* const manager = testing::AddGlobalTestEnvironment(new Manager);

}  // namespace
}  // namespace binder_test
