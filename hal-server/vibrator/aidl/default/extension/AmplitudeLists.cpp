// SPDX-License-Identifier: Apache-2.0
//
// The amplitude steps a motor offers, and the number of patterns its driver holds.
#define LOG_TAG "QvxVibrator-HAL-AIDL-EXT"

#include <array>
#include <vector>

#include <android-base/logging.h>

#include "Constants.h"
#include "ServiceStatus.h"
#include "Vibrator_vendor.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

// Ascending amplitudes on the scale up to 10000; trailing zeros are no steps.
using Steps = std::array<int32_t, 6>;

// Whether a row counts for drivers with the pattern-index node only, or for all that are left.
enum class Method { kIndex, kAny };

// A motor's lists by amplitude type. A motor without a row offers none.
struct MotorSteps {
    core::MotorIndex motor;
    Method method;
    Steps types[2];
};

// The first row that fits counts. The assignments were tuned motor by motor.
// clang-format off
constexpr MotorSteps kMotorSteps[] = {
    // motor                      method          type 0                                type 1
    {core::MOTOR_LINEAR,          Method::kAny,   {{0, 2000, 4000, 6000, 8000, 10000}, {0, 3400, 4900, 6500, 8200, 10000}}},
    {core::MOTOR_COINDC_PMIC,     Method::kAny,   {{0, 1000, 5000, 9000},              {0, 1000, 5000, 9000}}},
    {core::MOTOR_LINEAR_INDEX,    Method::kAny,   {{0, 3000, 4000, 6000, 8000, 10000}, {0, 2000, 4000, 6000, 8000, 10000}}},
    {core::MOTOR_LINEAR_0832RC,   Method::kAny,   {{0, 3000, 4000, 6000, 8000, 10000}, {0, 2000, 4000, 6000, 8000, 10000}}},
    {core::MOTOR_LINEAR_1040,     Method::kAny,   {{0, 3000, 4000, 6000, 8000, 10000}, {0, 2000, 4000, 6000, 8000, 10000}}},
    {core::MOTOR_LINEAR_RCVMOT,   Method::kAny,   {{0, 2000, 4000, 6000, 8000, 10000}, {0, 3400, 4900, 6500, 8200, 10000}}},
    {core::MOTOR_LINEAR_1030,     Method::kIndex, {{0, 2000, 4000, 6000, 8000, 10000}, {0, 2000, 4000, 6000, 8000, 10000}}},
    {core::MOTOR_LINEAR_1030,     Method::kAny,   {{0, 2000, 4000, 6000, 8000, 10000}, {0, 3400, 4900, 6500, 8200, 10000}}},
    {core::MOTOR_LINEAR_INDEX_RC, Method::kAny,   {{0, 1500, 4000, 6000, 8000, 10000}, {0, 2000, 4000, 6000, 8000, 10000}}},
    {core::MOTOR_LINEAR_WATCH,    Method::kAny,   {{0, 2000, 6000, 10000},             {0, 2000, 6000, 10000}}},
    {core::MOTOR_LINEAR_ACTIVE,   Method::kAny,   {{0, 2000, 6000, 10000},             {0, 2000, 6000, 10000}}},
};
// clang-format on

// Null when the motor offers none.
const Steps* stepsOf(int motor, int32_t type, bool hasIndexMethod) {
    for (const MotorSteps& row : kMotorSteps) {
        if (row.motor == motor && (row.method == Method::kAny || hasIndexMethod)) {
            return &row.types[type];
        }
    }
    return nullptr;
}

// The motor's index as its driver names it, else as its nodes suggest.
int findMotor(core::HwApi& hardware) {
    const int named = hardware.getMotorIndex();
    if (named > 0) return named;
    const int suggested = hardware.getMotorIndexbyMethod();
    LOG(INFO) << "V_4_0: Vibrator motor type is NONE. but ran vib method fallback : " << suggested;
    return suggested;
}

}  // namespace

ndk::ScopedAStatus Vibrator::getNumberOfPrebakedHapticPattern(int32_t* _aidl_return) {
    LOG(INFO) << "V_4_0: getNumberOfPrebakedHapticPattern";
    *_aidl_return = 0;
    if (!isCallerAllowed()) return core::ok();
    if (!mHwApi->isNumWavesNodeExist()) {
        return refuse(EX_UNSUPPORTED_OPERATION,
                      "V_4_0: getNumberOfPrebakedHapticPattern unsupports");
    }
    *_aidl_return = mHwApi->readNode(core::THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES);
    LOG(INFO) << "V_4_0: getNumberOfPrebakedHapticPattern value : " << *_aidl_return;
    return core::ok();
}

ndk::ScopedAStatus Vibrator::getAmplitudeList(ZelAmplitudeType type,
                                              std::vector<int32_t>* _aidl_return) {
    LOG(INFO) << "V_4_0: getAmplitudeList";
    if (!isCallerAllowed()) {
        if (_aidl_return != nullptr) _aidl_return->clear();
        return core::ok();
    }
    const auto number = static_cast<int32_t>(type);
    LOG(INFO) << "V_4_0: getAmplitudeList amplitude type: " << number;
    if (number != 0 && number != 1) {
        return refuse(EX_ILLEGAL_ARGUMENT, "V_4_0: getAmplitudeList Fail - Type is Abnormal");
    }
    if (_aidl_return == nullptr || !_aidl_return->empty()) {
        LOG(INFO) << "V_4_0: getAmplitudeList Fail - Wrong Param: "
                  << static_cast<const void*>(_aidl_return);
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    if (mHwApi->isDynamicIntensityNodeExist()) {
        LOG(INFO) << "V_4_0: Support Dynamic Intensity";
        if (mHwApi->getDynamicIntensityList(number == 0, *_aidl_return)) return core::ok();
        _aidl_return->clear();
        LOG(INFO) << "V_4_0: Fail - Dynamic Intensity List Read Fail";
        return core::exception(EX_ILLEGAL_STATE);
    }
    LOG(INFO) << "V_4_0: Not Support Dynamic Intensity";

    const int motor = findMotor(*mHwApi);
    if (motor == 0) return refuse(EX_ILLEGAL_STATE, "V_4_0: Vibrator motor type is some problem.");
    LOG(INFO) << "V_4_0: zelGetAmplitudeList existing_motorType : " << motor;
    if (motor < 0) return refuse(EX_ILLEGAL_STATE, "V_4_0: getAmplitudeList motor type is NONE.");
    const bool hasIndexMethod = mHwApi->isNodeExist(core::THE_DEVICE_HAPTIC_ENGINE_INDEX);
    LOG(INFO) << "V_4_0: getAmplitudeList " << (hasIndexMethod ? "" : "NOT ")
              << "support index method";

    const Steps* const steps = stepsOf(motor, number, hasIndexMethod);
    if (steps == nullptr) {
        return refuse(EX_UNSUPPORTED_OPERATION,
                      "V_4_0: getAmplitudeList false : EX_UNSUPPORTED_OPERATION");
    }
    _aidl_return->assign(steps->begin(), steps->end());
    while (_aidl_return->back() == 0) _aidl_return->pop_back();
    LOG(INFO) << "V_4_0: getAmplitudeList size: " << _aidl_return->size();
    return core::ok();
}

}  // namespace aidl::vendor::quorvan::hardware::vibrator
