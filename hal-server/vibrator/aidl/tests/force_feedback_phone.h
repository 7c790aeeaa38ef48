// SPDX-License-Identifier: Apache-2.0
//
// A phone with a force-feedback motor and no sysfs motor, for unit tests.
#pragma once

#include <fcntl.h>
#include <linux/input.h>
#include <unistd.h>

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "driver/ForceFeedbackEffect.h"
#include "tests/fake_motor.h"
#include "tests/service_test.h"

using Bytes = std::vector<uint8_t>;

inline Bytes bytesOf(const void* data, size_t size) {
    const auto* const begin = static_cast<const uint8_t*>(data);
    return {begin, begin + size};
}

// Keeps what it is sent to the byte. Calls that a fault of the kernel fails do not come this far.
class ObservedMotor : public fake::FakeMotor {
  public:
    ssize_t write(const void* data, size_t size) override {
        events.push_back(bytesOf(data, size));
        return writeResult.value_or(FakeMotor::write(data, size));
    }

    int ioctl(unsigned long request, void* argument) override {
        requests.push_back(request);
        if (request == EVIOCSFF) {
            const auto& effect = *static_cast<const ff_effect*>(argument);
            // The pointer at the end differs from run to run; what it points to does not.
            records.push_back(bytesOf(&effect, 40));
            customData.push_back(effect.u.periodic.custom_data);
        }
        return FakeMotor::ioctl(request, argument);
    }

    // Forgets what came so far; effects stay.
    void forget() {
        requests.clear();
        records.clear();
        customData.clear();
        events.clear();
    }

    std::vector<unsigned long> requests;
    std::vector<Bytes> records;
    std::vector<const int16_t*> customData;
    std::vector<Bytes> events;
    std::optional<ssize_t> writeResult;
};

inline const std::string kMotorNode = "/dev/input/event7";
inline const std::string kInputDeviceList = "/proc/bus/input/devices";
inline const std::string kControl = "/sys/class/qvx_vib_inputff/control/";

class ForceFeedbackPhone : public ServiceTest {
  protected:
    ForceFeedbackPhone() {
        kernel.addNode(kInputDeviceList,
                       "I: Bus=0006 Vendor=0000 Product=0000 Version=0000\n"
                       "N: Name=\"qvx_vibrator_inputff\"\n"
                       "H: Handlers=event7 \n"
                       "\n",
                       fake::Access::kReadOnly);
        kernel.addDevice(kMotorNode, motor);
    }

    ~ForceFeedbackPhone() override { closeMotor(); }

    // As the end of the service's process does.
    static void closeMotor() {
        using aidl::android::hardware::vibrator::inputFD;
        if (inputFD >= 0) close(inputFD);
        inputFD = -1;
    }

    // Whether the process's effect record is as an upload of plain vibration leaves it: the index
    // pair as its custom data.
    static bool recordHoldsTheIndexPair() {
        const auto& effect = aidl::android::hardware::vibrator::forceFeedbackEffect;
        return effect.record.u.periodic.custom_len == 2 &&
               effect.record.u.periodic.custom_data == effect.indexPair;
    }

    const std::shared_ptr<ObservedMotor> motor = std::make_shared<ObservedMotor>();
};
