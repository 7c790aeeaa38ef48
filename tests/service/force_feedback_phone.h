// SPDX-License-Identifier: Apache-2.0
//
// A phone whose motor is a force-feedback input device.
#pragma once

#include <unistd.h>

#include <memory>
#include <string>

#include "imitated_motor.h"
#include "service_test.h"

class ForceFeedbackPhone : public ServiceTest {
  protected:
    ForceFeedbackPhone() {
        kernel.addNode("/proc/bus/input/devices",
                       "I: Bus=0006 Vendor=0000 Product=0000 Version=0000\n"
                       "N: Name=\"qvx_vibrator_inputff\"\n"
                       "S: Sysfs=/devices/virtual/input/input7\n"
                       "H: Handlers=event7 \n"
                       "B: EV=200001\n"
                       "\n",
                       imitated::Access::kReadOnly);
        kernel.addDevice(kMotor, std::make_shared<imitated::ImitatedMotor>());
    }

    // The hardware layer keeps the device open; closing it is the service's part.
    ~ForceFeedbackPhone() override {
        if (aidl::android::hardware::vibrator::inputFD >= 0) {
            close(aidl::android::hardware::vibrator::inputFD);
        }
    }

    const std::string kMotor = "/dev/input/event7";
};
