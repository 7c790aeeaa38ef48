// SPDX-License-Identifier: Apache-2.0
//
// What the tests of the extension's amplitude lists start from.
#pragma once

#include <memory>
#include <vector>

#include "tests/extension_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {

using Steps = std::vector<int32_t>;

// A motor whose index is what the test says, and which counts how often it is asked.
class NumberedMotor : public core::HwApi {
  public:
    int getMotorIndex() override {
        ++asked;
        return named;
    }
    int getMotorIndexbyMethod() override {
        ++askedByMethod;
        return byMethod;
    }

    int named = 0;
    int byMethod = 0;
    int asked = 0;
    int askedByMethod = 0;
};

class LedsPhone : public ExtensionTest {
  protected:
    LedsPhone() { addLedsClass(); }
};

class AmplitudeList : public LedsPhone {
  protected:
    // The exception's number; the list goes to `list`, which begins empty.
    binder_exception_t get(Vibrator& extension, ZelAmplitudeType type = ZelAmplitudeType::DEFAULT) {
        list.clear();
        return exceptionOf(extension.getAmplitudeList(type, &list));
    }

    const std::shared_ptr<NumberedMotor> motor = std::make_shared<NumberedMotor>();
    Steps list;
};

}  // namespace aidl::vendor::quorvan::hardware::vibrator
