// SPDX-License-Identifier: Apache-2.0
//
// The extension service without a binder in between, called by the system user unless a test puts
// another CallingUid on top.
#pragma once

#include <unistd.h>

#include <cstdint>
#include <limits>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "Vibrator_vendor.h"
#include "tests/calling_uid.h"
#include "tests/fake_motor.h"
#include "tests/vibrator_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {

using core::exceptionOf;

inline const std::string kIntensity = kLegacy + "intensity";
inline const std::string kIndex = kLegacy + "cp_trigger_index";
inline const std::string kQueue = kLegacy + "cp_trigger_queue";
inline const std::string kEnable = kLegacy + "enable";
inline const std::string kInputFf = "/sys/class/qvx_vib_inputff/control/";
inline const std::string kMotorDevice = "/dev/input/event7";

class ExtensionTest : public ServiceTest {
  protected:
    // The service on what was added so far.
    std::shared_ptr<Vibrator> makeExtension() { return makeExtension(makeHwApi()); }

    // The service on a hardware layer of the test's own.
    std::shared_ptr<Vibrator> makeExtension(std::shared_ptr<core::HwApi> hwApi) {
        auto extension = ndk::SharedRefBase::make<Vibrator>(std::move(hwApi));
        kernel.clear();
        log.clear();
        return extension;
    }

    void addNodes(const std::string& directory, const std::vector<const char*>& leaves) {
        for (const char* leaf : leaves) kernel.addNode(directory + leaf);
    }

    // Takes addLedsClass() back, for phones of another class or of none.
    void removeLedsClass() {
        for (const char* leaf : {"activate", "duration", "state"}) kernel.removeNode(kLeds + leaf);
    }

    // A phone whose motor is a force-feedback input device, as probing finds it.
    void addForceFeedback() {
        kernel.addNode("/proc/bus/input/devices",
                       "N: Name=\"qvx_vibrator_inputff\"\nH: Handlers=event7 \n\n",
                       fake::Access::kReadOnly);
        kernel.addDevice(kMotorDevice, std::make_shared<fake::FakeMotor>());
    }

    ~ExtensionTest() override {
        // As the standard service does at its end; nothing else closes the motor.
        if (core::inputFD >= 0) close(std::exchange(core::inputFD, -1));
    }

    // Never asked for anything; its address is all that the service looks at.
    const std::shared_ptr<core::IVibratorCallback> callback =
            ndk::SharedRefBase::make<core::Callback>();

  private:
    const CallingUid mSystem{1000};
};

// Asks one of the queries that are answered with an ok status; the result begins as the other
// answer.
using Query = ndk::ScopedAStatus (Vibrator::*)(bool*);
inline bool ask(Vibrator& extension, Query query, bool expected) {
    bool result = !expected;
    EXPECT_TRUE((extension.*query)(&result).isOk());
    return result;
}

// Names a parameterised test after its row.
template <typename Row>
std::string rowName(const testing::TestParamInfo<Row>& info) {
    return info.param.name;
}

}  // namespace aidl::vendor::quorvan::hardware::vibrator
