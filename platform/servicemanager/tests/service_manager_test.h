// SPDX-License-Identifier: Apache-2.0
//
// A running service manager for a guest test, and the users of its clients.
#pragma once

#include <sys/types.h>

#include <gtest/gtest.h>

#include "platform/servicemanager/tests/manager_client.h"
#include "platform/servicemanager/tests/processes.h"
#include "tests/support/fake_root.h"

using qvx::test::kApp;
using qvx::test::kRoot;
using qvx::test::kSystem;
inline constexpr uid_t kIsolated = 90001;

// Who may register what in these tests, beside root.
inline constexpr const char* kRules =
        "android.hardware.vibrator.IVibrator/default 1000\n"
        "android.hardware.vibrator.IVibrator/default 1002\n"
        "test.service 1000\n"
        "test.service 2000\n"
        "test.service 9999\n"
        "test.service 101000\n"
        "test.own 1000\n"
        "test.other 1000\n"
        "test.lazy 1000 " LAZY_SERVICE_PROGRAM
        "\n"
        "test.never 1000 /no/such/program\n"
        "test.pack.IFoo/default 1000\n"
        "test.pack.IFoo/other 1000\n";

class ServiceManagerTest : public ::testing::Test {
  protected:
    qvx::test::FakeRoot mRoot;
    processes::Manager mManager{mRoot.path(), kRules};
};
