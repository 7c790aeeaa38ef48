// SPDX-License-Identifier: Apache-2.0
//
// The standard service but for its compositions: capabilities, on and off, amplitude, external
// control, predefined effects, and what it declines. Every line is logged at error severity, plain
// requests included, so that a field log shows them whatever its filter lets through.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include "Vibrator.h"

#include <utility>
#include <vector>

#include <android-base/logging.h>
#include <android/binder_ibinder.h>

#include "ServiceStatus.h"
#include "hwapi/DriverWriter.h"

namespace aidl::android::hardware::vibrator {
namespace {

// The driver's amplitude for 1.0.
constexpr float kFullAmplitude = 10000.0F;

ndk::ScopedAStatus declined(const char* operation) {
    LOG(ERROR) << "V_2_0: " << operation << "unsupported";
    return exception(EX_UNSUPPORTED_OPERATION);
}

}  // namespace

Vibrator::Vibrator(std::shared_ptr<HwApi> hwApi) : mHwApi(std::move(hwApi)) {
    LOG(ERROR) << "V_2_0: Vibrator::Vibrator()";
}

Vibrator::~Vibrator() {
    LOG(ERROR) << "V_2_0: Vibrator::~Vibrator()";
    if (inputFD >= 0) {
        HwApi::closeInputDevice();
        LOG(ERROR) << "V_2_0: inputFD close";
    }
}

ndk::ScopedAStatus Vibrator::getCapabilities(int32_t* _aidl_return) {
    LOG(ERROR) << "V_2_0: Vibrator reporting capabilities";
    int32_t capabilities = 0;
    if (mHwApi->isAmplitudeControlExist()) {
        capabilities |= CAP_AMPLITUDE_CONTROL;
    }
    if (mHwApi->hasFeature(qvx_features::PRIMITIVE_EFFECT_COMPOSE) == 1) {
        capabilities |= CAP_COMPOSE_EFFECTS;
    }
    if (mHwApi->hasFeature(qvx_features::CAPABILITY_EXTERNAL_CONTROL) == 1) {
        capabilities |= CAP_EXTERNAL_CONTROL | CAP_EXTERNAL_AMPLITUDE_CONTROL;
    }
    *_aidl_return = capabilities;
    return ok();
}

ndk::ScopedAStatus Vibrator::off() {
    LOG(ERROR) << "V_2_0: Vibrator off";
    return okOrIllegalState(mHwApi->do_off());
}

ndk::ScopedAStatus Vibrator::on(int32_t timeoutMs,
                                const std::shared_ptr<IVibratorCallback>& callback) {
    LOG(ERROR) << "V_2_0: Vibrator on for timeoutMs: " << timeoutMs;
    if (callback != nullptr) return refuse(EX_UNSUPPORTED_OPERATION, "Not support on() callback");
    return okOrIllegalState(mHwApi->do_on(timeoutMs));
}

ndk::ScopedAStatus Vibrator::perform(Effect effect, EffectStrength strength,
                                     const std::shared_ptr<IVibratorCallback>& callback,
                                     int32_t* _aidl_return) {
    LOG(ERROR) << "V_2_0: Vibrator perform Effect : " << static_cast<int>(effect)
               << " EffectStrength : " << static_cast<int>(strength);
    if (motorPerformMethod == PERFORM_NONE) {
        return refuse(EX_UNSUPPORTED_OPERATION, "V_2_0: performEffect PERFORM_NONE");
    }
    if (callback != nullptr) {
        return refuse(EX_UNSUPPORTED_OPERATION, "Not support perform() callback");
    }
    if (!HwApi::isPlayed(effect)) {
        return refuse(EX_UNSUPPORTED_OPERATION, "V_2_0: Unsupport vibrator perform effect");
    }
    if (static_cast<uint8_t>(strength) > static_cast<uint8_t>(EffectStrength::STRONG)) {
        return refuse(EX_UNSUPPORTED_OPERATION, "V_2_0: Unsupport vibrator perform strength");
    }
    const int amplitude = mHwApi->setPerformAmplitude(strength);
    if (amplitude < 1) {
        return refuse(EX_UNSUPPORTED_OPERATION, "V_2_0: performEffect not support real amplitude");
    }
    int durationMs = 0;
    if (!mHwApi->preparePerform(effect, amplitude, durationMs)) return exception(EX_ILLEGAL_STATE);
    LOG(ERROR) << "V_2_0: Vibrator perform timeMS return: " << durationMs;
    *_aidl_return = durationMs;
    return ok();
}

ndk::ScopedAStatus Vibrator::getSupportedEffects(std::vector<Effect>* _aidl_return) {
    LOG(ERROR) << "V_2_0: getSupportedEffects";
    const bool offered = mHwApi->isAmplitudeControlExist();
    *_aidl_return = offered ? HwApi::playedEffects() : std::vector<Effect>();
    return ok();
}

ndk::ScopedAStatus Vibrator::setAmplitude(float amplitude) {
    LOG(ERROR) << "V_2_0: Vibrator set amplitude: " << amplitude;
    if (!mHwApi->isAmplitudeControlExist()) {
        return refuse(EX_UNSUPPORTED_OPERATION, "V_2_0: Vibrator setAmplitude not supprot");
    }
    if (amplitude <= 0.0F || amplitude > 1.0F) return exception(EX_ILLEGAL_ARGUMENT);
    return okOrIllegalState(mHwApi->sendAmplitude(toDriverAmplitude(amplitude, kFullAmplitude)));
}

ndk::ScopedAStatus Vibrator::setExternalControl(bool enabled) {
    LOG(ERROR) << "Vibrator set external control: " << enabled;
    if (mHwApi->hasFeature(qvx_features::CAPABILITY_EXTERNAL_CONTROL) != 1) {
        return exception(EX_UNSUPPORTED_OPERATION);
    }
    return ok();
}

ndk::ScopedAStatus Vibrator::getSupportedAlwaysOnEffects(std::vector<Effect>* _aidl_return) {
    LOG(ERROR) << "V_2_0: Vibrator getSupportedAlwaysOnEffects ";
    return getSupportedEffects(_aidl_return);
}

ndk::ScopedAStatus Vibrator::alwaysOnEnable(int32_t /*id*/, Effect /*effect*/,
                                            EffectStrength /*strength*/) {
    LOG(ERROR) << "V_2_0: Vibrator getSupportedAlwaysOnEffects ";  // the query's line, kept
    return exception(EX_UNSUPPORTED_OPERATION);
}

ndk::ScopedAStatus Vibrator::alwaysOnDisable(int32_t /*id*/) {
    return declined("[alwaysOnDisable]");
}

ndk::ScopedAStatus Vibrator::getResonantFrequency(float* /*_aidl_return*/) {
    return declined("[getResonantFrequency]");
}

ndk::ScopedAStatus Vibrator::getQFactor(float* /*_aidl_return*/) {
    return declined("[getQFactor]");
}

ndk::ScopedAStatus Vibrator::getFrequencyResolution(float* /*_aidl_return*/) {
    return declined("[getFrequencyResolution]");
}

ndk::ScopedAStatus Vibrator::getFrequencyMinimum(float* /*_aidl_return*/) {
    return declined("[getFrequencyMinimum]");
}

ndk::ScopedAStatus Vibrator::getBandwidthAmplitudeMap(std::vector<float>* /*_aidl_return*/) {
    return declined("[getBandwidthAmplitudeMap]");
}

ndk::ScopedAStatus Vibrator::getPwlePrimitiveDurationMax(int32_t* /*_aidl_return*/) {
    return declined("[getPwlePrimitiveDurationMax]");
}

ndk::ScopedAStatus Vibrator::getPwleCompositionSizeMax(int32_t* /*_aidl_return*/) {
    return declined("[getPwleCompositionSizeMax]");
}

ndk::ScopedAStatus Vibrator::getSupportedBraking(std::vector<Braking>* /*_aidl_return*/) {
    return declined("[getSupportedBraking]");
}

ndk::ScopedAStatus Vibrator::refuse(binder_exception_t code, const char* line) {
    LOG(ERROR) << line;
    return exception(code);
}

binder_status_t Vibrator::dump(int fd, const char** /*args*/, uint32_t /*numArgs*/) {
    const auto uid = static_cast<int>(AIBinder_getCallingUid());
    return mHwApi->dump(uid, fd) ? STATUS_OK : STATUS_PERMISSION_DENIED;
}

}  // namespace aidl::android::hardware::vibrator
