// SPDX-License-Identifier: Apache-2.0
//
// The ground on which the service's unit tests stand: a fake kernel, a caught log, fresh
// process-wide values, and the phones that tests ask for.
#pragma once

#include <cstdint>
#include <limits>
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
inline const std::string kFunctions = kInfo + "functions";

// The ends of what a parameter may be.
inline constexpr int32_t kIntMin = std::numeric_limits<int32_t>::min();
inline constexpr int32_t kIntMax = std::numeric_limits<int32_t>::max();
inline constexpr float kNan = std::numeric_limits<float>::quiet_NaN();
inline constexpr float kInfinity = std::numeric_limits<float>::infinity();
