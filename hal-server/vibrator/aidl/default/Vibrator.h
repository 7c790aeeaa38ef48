// SPDX-License-Identifier: Apache-2.0
//
// The platform's vibrator interface, served on the hardware layer.
#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include <aidl/android/hardware/vibrator/BnVibrator.h>

#include "HwApi.h"

namespace aidl::android::hardware::vibrator {

// A translator without state: every operation logs its call, checks its arguments against fixed
// ranges, asks the hardware layer and turns the answer into a binder status. What an operation
// means, and its units, is the interface's business (IVibrator); what is particular to this
// service stands here. No operation asks who is calling.
//
// A refused argument is EX_ILLEGAL_ARGUMENT, a driver that fails EX_ILLEGAL_STATE, and what is not
// offered EX_UNSUPPORTED_OPERATION; out-values are then left alone.
class Vibrator : public BnVibrator {
  public:
    explicit Vibrator(std::shared_ptr<HwApi> hwApi);

    // Closes the force-feedback device, which the hardware layer leaves open between requests.
    ~Vibrator() override;

    // Amplitude control, compositions and external control, as the driver has them; never more.
    ndk::ScopedAStatus getCapabilities(int32_t* _aidl_return) override;
    ndk::ScopedAStatus off() override;
    // Passes every duration on, zero and negative ones included; offers no callback.
    ndk::ScopedAStatus on(int32_t timeoutMs,
                          const std::shared_ptr<IVibratorCallback>& callback) override;
    // CLICK, DOUBLE_CLICK, TICK and HEAVY_CLICK; offers no callback.
    ndk::ScopedAStatus perform(Effect effect, EffectStrength strength,
                               const std::shared_ptr<IVibratorCallback>& callback,
                               int32_t* _aidl_return) override;
    ndk::ScopedAStatus getSupportedEffects(std::vector<Effect>* _aidl_return) override;
    // Above 0.0 up to 1.0, in steps of 1/10000; not a number counts as 0 steps.
    ndk::ScopedAStatus setAmplitude(float amplitude) override;
    // Only confirms that there is external control: the driver switches it by itself.
    ndk::ScopedAStatus setExternalControl(bool enabled) override;

    // At most 10 primitives, each after at most 1000 ms. The callback comes on force feedback only;
    // a negative delay is left to the waveform compiler, which refuses it.
    ndk::ScopedAStatus getCompositionDelayMax(int32_t* _aidl_return) override;
    ndk::ScopedAStatus getCompositionSizeMax(int32_t* _aidl_return) override;
    ndk::ScopedAStatus getSupportedPrimitives(
            std::vector<CompositePrimitive>* _aidl_return) override;
    ndk::ScopedAStatus getPrimitiveDuration(CompositePrimitive primitive,
                                            int32_t* _aidl_return) override;
    ndk::ScopedAStatus compose(const std::vector<CompositeEffect>& composite,
                               const std::shared_ptr<IVibratorCallback>& callback) override;

    // Lists the supported effects, although none can be enabled always-on.
    ndk::ScopedAStatus getSupportedAlwaysOnEffects(std::vector<Effect>* _aidl_return) override;

    // Declined, every one.
    ndk::ScopedAStatus alwaysOnEnable(int32_t id, Effect effect, EffectStrength strength) override;
    ndk::ScopedAStatus alwaysOnDisable(int32_t id) override;
    ndk::ScopedAStatus getResonantFrequency(float* _aidl_return) override;
    ndk::ScopedAStatus getQFactor(float* _aidl_return) override;
    ndk::ScopedAStatus getFrequencyResolution(float* _aidl_return) override;
    ndk::ScopedAStatus getFrequencyMinimum(float* _aidl_return) override;
    ndk::ScopedAStatus getBandwidthAmplitudeMap(std::vector<float>* _aidl_return) override;
    ndk::ScopedAStatus getPwlePrimitiveDurationMax(int32_t* _aidl_return) override;
    ndk::ScopedAStatus getPwleCompositionSizeMax(int32_t* _aidl_return) override;
    ndk::ScopedAStatus getSupportedBraking(std::vector<Braking>* _aidl_return) override;

    // Refused, as longer than getPwleCompositionSizeMax() allows.
    ndk::ScopedAStatus composePwle(const std::vector<PrimitivePwle>& composite,
                                   const std::shared_ptr<IVibratorCallback>& callback) override;

    // The driver's wavetable entry for a primitive, in the numbering the driver was switched to.
    // NOOP has none: EX_ILLEGAL_ARGUMENT; another number is EX_UNSUPPORTED_OPERATION.
    ndk::ScopedAStatus getPrimitiveDetails(CompositePrimitive primitive, uint32_t* index);

    // What dumpsys shows, for root, system and shell; HwApi::dump() says it all.
    binder_status_t dump(int fd, const char** args, uint32_t numArgs) override;

  private:
    // Logs the line and answers with the exception.
    static ndk::ScopedAStatus refuse(binder_exception_t code, const char* line);

    const std::shared_ptr<HwApi> mHwApi;
};

}  // namespace aidl::android::hardware::vibrator
