// SPDX-License-Identifier: Apache-2.0
//
// The amplitude steps a motor offers, and the number of patterns its driver holds.
#define LOG_TAG "QvxVibrator-HAL-AIDL-EXT"

#include <array>
#include <cstddef>
#include <iterator>
#include <vector>

#include <android-base/logging.h>

#include "ServiceStatus.h"
#include "Vibrator_vendor.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

constexpr size_t kStepsMax = 6;

// Ascending amplitudes on the scale up to 10000. No steps: not offered for this motor.
struct Steps {
    size_t count;
    int32_t values[kStepsMax];
};

constexpr Steps kNone = {0, {}};
constexpr Steps kListA = {6, {0, 3000, 4000, 6000, 8000, 10000}};
constexpr Steps kListB = {6, {0, 1500, 4000, 6000, 8000, 10000}};
constexpr Steps kListC = {6, {0, 3400, 4900, 6500, 8200, 10000}};
constexpr Steps kListD = {6, {0, 2000, 4000, 6000, 8000, 10000}};
constexpr Steps kListE = {4, {0, 1000, 5000, 9000}};
constexpr Steps kListF = {4, {0, 2000, 6000, 10000}};

// A motor's lists by amplitude type. Type 1 has a second one for drivers without the pattern-index
// node. The assignments were tuned motor by motor.
struct MotorSteps {
    const Steps& type0;
    const Steps& type1;
    const Steps& type1WithoutIndex;
};

// Indexed by motor index.
constexpr std::array<MotorSteps, 13> kMotorSteps = {{
        {kNone, kNone, kNone},     //  0
        {kNone, kNone, kNone},     //  1
        {kListD, kListC, kListC},  //  2
        {kListE, kListE, kListE},  //  3
        {kNone, kNone, kNone},     //  4
        {kListA, kListD, kListD},  //  5
        {kListA, kListD, kListD},  //  6
        {kListA, kListD, kListD},  //  7
        {kListD, kListC, kListC},  //  8
        {kListD, kListD, kListC},  //  9
        {kListB, kListD, kListD},  // 10
        {kListF, kListF, kListF},  // 11
        {kListF, kListF, kListF},  // 12
}};

const Steps& stepsOf(int motor, bool isFirstType, bool hasIndexMethod) {
    if (motor < 0 || static_cast<size_t>(motor) >= kMotorSteps.size()) return kNone;
    const MotorSteps& steps = kMotorSteps[static_cast<size_t>(motor)];
    if (isFirstType) return steps.type0;
    return hasIndexMethod ? steps.type1 : steps.type1WithoutIndex;
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
        LOG(INFO) << "V_4_0: getNumberOfPrebakedHapticPattern unsupports";
        return core::exception(EX_UNSUPPORTED_OPERATION);
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
        LOG(INFO) << "V_4_0: getAmplitudeList Fail - Type is Abnormal";
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    if (_aidl_return == nullptr || !_aidl_return->empty()) {
        LOG(INFO) << "V_4_0: getAmplitudeList Fail - Wrong Param: "
                  << static_cast<const void*>(_aidl_return);
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    const bool isFirstType = number == 0;

    if (mHwApi->isDynamicIntensityNodeExist()) {
        LOG(INFO) << "V_4_0: Support Dynamic Intensity";
        if (mHwApi->getDynamicIntensityList(isFirstType, *_aidl_return)) return core::ok();
        _aidl_return->clear();
        LOG(INFO) << "V_4_0: Fail - Dynamic Intensity List Read Fail";
        return core::exception(EX_ILLEGAL_STATE);
    }
    LOG(INFO) << "V_4_0: Not Support Dynamic Intensity";

    const int motor = findMotor(*mHwApi);
    if (motor == 0) {
        LOG(INFO) << "V_4_0: Vibrator motor type is some problem.";
        return core::exception(EX_ILLEGAL_STATE);
    }
    LOG(INFO) << "V_4_0: zelGetAmplitudeList existing_motorType : " << motor;
    if (motor < 0) {
        LOG(INFO) << "V_4_0: getAmplitudeList motor type is NONE.";
        return core::exception(EX_ILLEGAL_STATE);
    }
    const bool hasIndexMethod = mHwApi->isNodeExist(core::THE_DEVICE_HAPTIC_ENGINE_INDEX);
    LOG(INFO) << "V_4_0: getAmplitudeList " << (hasIndexMethod ? "" : "NOT ")
              << "support index method";

    const Steps& steps = stepsOf(motor, isFirstType, hasIndexMethod);
    if (steps.count == 0) {
        LOG(INFO) << "V_4_0: getAmplitudeList false : EX_UNSUPPORTED_OPERATION";
        return core::exception(EX_UNSUPPORTED_OPERATION);
    }
    _aidl_return->assign(std::begin(steps.values), std::begin(steps.values) + steps.count);
    LOG(INFO) << "V_4_0: getAmplitudeList size: " << _aidl_return->size();
    return core::ok();
}

}  // namespace aidl::vendor::quorvan::hardware::vibrator
