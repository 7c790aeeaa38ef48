// SPDX-License-Identifier: Apache-2.0
//
// Phones for tests.
#include "tests/service_test.h"

#include "tests/sequence.h"

namespace vibrator = aidl::android::hardware::vibrator;

ServiceTest::ServiceTest() {
    sequence::forget();
    // As at the start of a process, for programs that run several tests in one.
    vibrator::useLedsClass = false;
    vibrator::useForceFeedback = false;
    vibrator::useKypIndex = false;
    vibrator::motorPerformMethod = 0;
    vibrator::inputFD = -1;
    for (std::string* path : {&vibrator::THE_DEVICE_FF,
                              &vibrator::THE_DEVICE_INTENSITY,
                              &vibrator::THE_DEVICE_FORCE_TOUCH_INTENSITY,
                              &vibrator::THE_DEVICE_MULTI_FREQ,
                              &vibrator::THE_DEVICE_HAPTIC_ENGINE,
                              &vibrator::THE_DEVICE_HAPTIC_ENGINE_INDEX,
                              &vibrator::THE_DEVICE_HAPTIC_PLAYBACK_QUEUE,
                              &vibrator::THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES,
                              &vibrator::THE_DEVICE_MOTOR_TYPE,
                              &vibrator::THE_DEVICE_EVENT_CMD,
                              &vibrator::THE_DEVICE_PATTERN_LENGTH,
                              &vibrator::THE_DEVICE_EXT_CONTROL,
                              &vibrator::THE_DEVICE_CAL_INTENSITIES,
                              &vibrator::THE_DEVICE_CAL_HAPTIC_INTENSITIES,
                              &vibrator::THE_DEVICE_FIFO_HAPTIC_ENGINE,
                              &vibrator::THE_DEVICE_HYBRID_HAPTIC_ENGINE,
                              &vibrator::THE_DEVICE_ASP_ENABLE,
                              &vibrator::THE_DEVICE_GPIO1_FALL_INDEX,
                              &vibrator::THE_DEVICE_GPIO1_FALL_DIG_SCALE,
                              &vibrator::THE_DEVICE_GPIO1_RISE_INDEX,
                              &vibrator::THE_DEVICE_GPIO1_RISE_DIG_SCALE,
                              &vibrator::THE_DEVICE_VIB_STATE}) {
        path->clear();
    }
}

ServiceTest::~ServiceTest() {
    EXPECT_THAT(sequence::misplaced(), ::testing::IsEmpty());
}

void ServiceTest::addLegacyClass() {
    kernel.addNode(kLegacy + "enable");
}

void ServiceTest::addLedsClass() {
    for (const char* leaf : {"activate", "duration", "state"}) {
        kernel.addNode(kLeds + leaf);
    }
}

std::shared_ptr<vibrator::HwApi> ServiceTest::makeHwApi() {
    auto hwApi = std::make_shared<vibrator::HwApi>();
    kernel.clear();
    log.clear();
    return hwApi;
}
