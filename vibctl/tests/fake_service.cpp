// SPDX-License-Identifier: Apache-2.0
//
// A service that stands in for the vibrator's: see fake_service.h.
#include "vibctl/tests/fake_service.h"

#include <unistd.h>

#include <atomic>
#include <chrono>
#include <cmath>
#include <string>
#include <thread>

#include <aidl/android/hardware/vibrator/BnVibrator.h>
#include <aidl/vendor/quorvan/hardware/vibrator/BnZelVibrator.h>
#include <android-base/file.h>
#include <android/binder_manager.h>
#include <gtest/gtest.h>

namespace fake {

namespace {

using namespace aidl::android::hardware::vibrator;          // NOLINT(google-build-using-namespace)
using namespace aidl::vendor::quorvan::hardware::vibrator;  // NOLINT(google-build-using-namespace)
using Status = ndk::ScopedAStatus;
using Callback = std::shared_ptr<IVibratorCallback>;

Status unknown() {
    return Status::fromStatus(STATUS_UNKNOWN_TRANSACTION);
}

Status okIf(bool condition) {
    return condition ? Status::ok() : Status::fromExceptionCode(EX_ILLEGAL_ARGUMENT);
}

// From a thread of its own; never when there is nothing to wait for.
void callBackAfter(int32_t delayMs, const Callback& callback) {
    if (delayMs == 0) return;
    std::thread([delayMs, callback] {
        std::this_thread::sleep_for(std::chrono::milliseconds(delayMs));
        callback->onComplete();
    }).detach();
}

class Standard final : public BnVibrator {
    Status on(int32_t timeoutMs, const Callback&) override {
        if (timeoutMs == 1) {
            return Status::fromExceptionCodeWithMessage(EX_ILLEGAL_STATE, "no \"motor\"");
        }
        if (timeoutMs == 2) return Status::fromServiceSpecificError(7);
        if (timeoutMs == 3) _exit(0);
        if (timeoutMs == 4) pause();
        return Status::ok();
    }

    Status perform(Effect, EffectStrength, const Callback& callback, int32_t* result) override {
        if (callback != nullptr) callback->onComplete();
        *result = static_cast<int32_t>(AIBinder_getCallingUid());
        return Status::ok();
    }

    Status compose(const std::vector<CompositeEffect>& composite,
                   const Callback& callback) override {
        if (callback == nullptr || composite.empty()) {
            return Status::fromExceptionCode(EX_NULL_POINTER);
        }
        if (composite[0].delayMs == 1000) {
            std::thread([] {
                std::this_thread::sleep_for(std::chrono::milliseconds(200));
                _exit(0);
            }).detach();
            return Status::ok();
        }
        callBackAfter(composite[0].delayMs, callback);
        return Status::ok();
    }

    Status composePwle(const std::vector<PrimitivePwle>& composite,
                       const Callback& callback) override {
        if (callback == nullptr || composite.empty()) {
            return Status::fromExceptionCode(EX_NULL_POINTER);
        }
        callBackAfter(composite[0].get<PrimitivePwle::braking>().duration, callback);
        return Status::ok();
    }

    Status setAmplitude(float amplitude) override { return okIf(std::isnan(amplitude)); }

    Status off() override {
        ++mOffs;
        return Status::ok();
    }

    Status getCompositionSizeMax(int32_t* result) override {
        *result = mOffs;
        return Status::ok();
    }

    binder_status_t dump(int fd, const char**, uint32_t) override {
        const std::string text(100000, 'x');
        return android::base::WriteStringToFd(text, fd) ? STATUS_OK : STATUS_UNKNOWN_ERROR;
    }

    Status getCapabilities(int32_t*) override { return unknown(); }
    Status getSupportedEffects(std::vector<Effect>*) override { return unknown(); }
    Status setExternalControl(bool) override { return unknown(); }
    Status getCompositionDelayMax(int32_t*) override { return unknown(); }
    Status getSupportedPrimitives(std::vector<CompositePrimitive>*) override { return unknown(); }
    Status getPrimitiveDuration(CompositePrimitive, int32_t*) override { return unknown(); }
    Status getSupportedAlwaysOnEffects(std::vector<Effect>*) override { return unknown(); }
    Status alwaysOnEnable(int32_t, Effect, EffectStrength) override { return unknown(); }
    Status alwaysOnDisable(int32_t) override { return unknown(); }
    Status getResonantFrequency(float*) override { return unknown(); }
    Status getQFactor(float*) override { return unknown(); }
    Status getFrequencyResolution(float*) override { return unknown(); }
    Status getFrequencyMinimum(float*) override { return unknown(); }
    Status getBandwidthAmplitudeMap(std::vector<float>*) override { return unknown(); }
    Status getPwlePrimitiveDurationMax(int32_t*) override { return unknown(); }
    Status getPwleCompositionSizeMax(int32_t*) override { return unknown(); }
    Status getSupportedBraking(std::vector<Braking>*) override { return unknown(); }

    std::atomic<int32_t> mOffs = 0;
};

class Extension final : public BnZelVibrator {
    Status setAmplitude(int32_t amplitude) override { return okIf(amplitude == -1); }

    Status hasFeature(const std::string& name, bool* result) override {
        *result = name == "--json";
        return Status::ok();
    }

    Status supportsAmplitudeControl(bool*) override { return unknown(); }
    Status supportsForceTouchAmplitudeControl(bool*) override { return unknown(); }
    Status supportsFrequencyControl(bool*) override { return unknown(); }
    Status supportsHapticEngine(bool*) override { return unknown(); }
    Status supportsPrebakedHapticPattern(bool*) override { return unknown(); }
    Status supportsFolderStatusSetting(bool*) override { return unknown(); }
    Status supportsEnhancedQuorvanHapticPattern(bool*) override { return unknown(); }
    Status setForceTouchAmplitude(int32_t) override { return unknown(); }
    Status setFrequencyType(ZelFrequencyType) override { return unknown(); }
    Status setFolderStatus(ZelFolderStatus) override { return unknown(); }
    Status getNumberOfPrebakedHapticPattern(int32_t*) override { return unknown(); }
    Status performHapticEngine(const std::vector<ZelHapticEnginePacket>&, int32_t) override {
        return unknown();
    }
    Status performPrebakedHapticPattern(int32_t, int32_t, bool) override { return unknown(); }
    Status getAmplitudeList(ZelAmplitudeType, std::vector<int32_t>*) override { return unknown(); }
    Status perform(Effect, int32_t, const Callback&, int32_t*) override { return unknown(); }
    Status performPlaybackEngine(const std::vector<ZelPlaybackPacket>&, bool, int32_t) override {
        return unknown();
    }
    Status supportsFifoHapticEngine(bool*) override { return unknown(); }
    Status supportsHybridHapticEngine(bool*) override { return unknown(); }
    Status supportsEnhancedHybridHapticPattern(bool*) override { return unknown(); }
    Status performFifoHapticEngine(ZelFifoType) override { return unknown(); }
    Status performHybridHapticEngine(const std::vector<ZelHybridHapticEnginePacket>&,
                                     int32_t) override {
        return unknown();
    }
    Status supportsFolderTentModeStatusSetting(bool*) override { return unknown(); }
    Status setFolderTentModeStatus(ZelFolderTentModeStatus) override { return unknown(); }
    Status supportsHasFeature(bool*) override { return unknown(); }
};

}  // namespace

void registerServices() {
    // For the life of the process: a service object does not keep its own binder alive.
    static const auto standard = ndk::SharedRefBase::make<Standard>();
    static const auto extension = ndk::SharedRefBase::make<Extension>();
    static const ndk::SpAIBinder standardBinder = standard->asBinder();
    static const ndk::SpAIBinder extensionBinder = extension->asBinder();
    EXPECT_EQ(AIBinder_setExtension(standardBinder.get(), extensionBinder.get()), STATUS_OK);
    EXPECT_EQ(AServiceManager_addService(standardBinder.get(),
                                         "android.hardware.vibrator.IVibrator/default"),
              EX_NONE);
}

}  // namespace fake
