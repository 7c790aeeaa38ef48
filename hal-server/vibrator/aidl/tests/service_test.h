// SPDX-License-Identifier: Apache-2.0
//
// The ground on which the service's unit tests stand: a fake kernel, a caught log, fresh
// process-wide values, and the phones that tests ask for.
#pragma once

#include <memory>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "HwApi.h"
#include "tests/fake_kernel.h"
#include "tests/log_capture.h"

class ServiceTest : public ::testing::Test {
  protected:
    ServiceTest();

    // Fails a test whose log lines do not stand beside the driver calls that they tell of.
    ~ServiceTest() override;

    // The nodes by which probing knows each class. Others are added by the tests that need them.
    void addLegacyClass();
    void addLedsClass();

    // The hardware layer on what was added so far; without a class, one that found no device. What
    // its construction called and logged is forgotten, so that a test sees its own calls alone.
    std::shared_ptr<aidl::android::hardware::vibrator::HwApi> makeHwApi();

    fake::FakeKernel kernel;
    LogCapture log;
};

// Node paths as tests write them.
inline const std::string kLegacy = "/sys/class/timed_output/vibrator/";
inline const std::string kLeds = "/sys/class/leds/vibrator/";
inline const std::string kInfo = "/sys/class/vib_info_class/vib_support_info/";
