// SPDX-License-Identifier: Apache-2.0
//
// What generated interfaces say of themselves, and how objects and binders belong together.
#include <type_traits>

#include <aidl/android/hardware/vibrator/BnVibratorCallback.h>
#include <aidl/android/hardware/vibrator/IVibrator.h>
#include <aidl/android/hardware/vibrator/IVibratorManager.h>
#include <aidl/sample/BnListener.h>
#include <aidl/sample/BpListener.h>
#include <aidl/sample/IPainter.h>
#include <aidl/unversioned/BnPlain.h>
#include <aidl/vendor/quorvan/hardware/vibrator/IZelVibrator.h>
#include <android/binder_stability.h>
#include <gtest/gtest.h>

#include "frozen_hash.h"
#include "platform/aidl/tests/recording_binder.h"

namespace {

using aidl::android::hardware::vibrator::BnVibratorCallback;
using aidl::android::hardware::vibrator::IVibrator;
using aidl::android::hardware::vibrator::IVibratorCallback;
using aidl::android::hardware::vibrator::IVibratorManager;
using aidl::sample::BnListener;
using aidl::sample::IListener;
using aidl::sample::IListenerDefault;
using aidl::sample::IPainter;
using aidl::vendor::quorvan::hardware::vibrator::IZelVibrator;
using ndk::ScopedAStatus;

class Callback : public BnVibratorCallback {
    ScopedAStatus onComplete() override { return ScopedAStatus::ok(); }
};

class Listener : public BnListener {
  public:
    ScopedAStatus onDone(int32_t result) override {
        last = result;
        return ScopedAStatus::ok();
    }
    int32_t last = 0;
};

TEST(Interface, DescriptorIsTheQualifiedNameUnlessAnotherIsGiven) {
    EXPECT_STREQ(IVibrator::descriptor, "android.hardware.vibrator.IVibrator");
    EXPECT_STREQ(IVibratorCallback::descriptor, "android.hardware.vibrator.IVibratorCallback");
    EXPECT_STREQ(IVibratorManager::descriptor, "android.hardware.vibrator.IVibratorManager");
    EXPECT_STREQ(IZelVibrator::descriptor, "vendor.quorvan.hardware.vibrator.IZelVibrator");
    EXPECT_STREQ(IPainter::descriptor, "sample.painting.IPainter");
}

TEST(Interface, VersionAndHashAreThoseItWasBuiltWith) {
    EXPECT_EQ(IVibrator::version, 2);
    EXPECT_EQ(IVibrator::hash, "ea8742d6993e1a82917da38b9938e537aa7fcb54");
    EXPECT_EQ(IVibratorCallback::version, 2);
    EXPECT_EQ(IZelVibrator::version, 4);
    EXPECT_EQ(IZelVibrator::hash, kFrozenHash);
}

TEST(Interface, CodesOfTheStandardInterfaceFollowItsDeclaration) {
    EXPECT_EQ(IVibrator::TRANSACTION_getCapabilities, 1U);
    EXPECT_EQ(IVibrator::TRANSACTION_off, 2U);
    EXPECT_EQ(IVibrator::TRANSACTION_on, 3U);
    EXPECT_EQ(IVibrator::TRANSACTION_perform, 4U);
    EXPECT_EQ(IVibrator::TRANSACTION_getSupportedEffects, 5U);
    EXPECT_EQ(IVibrator::TRANSACTION_setAmplitude, 6U);
    EXPECT_EQ(IVibrator::TRANSACTION_setExternalControl, 7U);
    EXPECT_EQ(IVibrator::TRANSACTION_getCompositionDelayMax, 8U);
    EXPECT_EQ(IVibrator::TRANSACTION_getCompositionSizeMax, 9U);
    EXPECT_EQ(IVibrator::TRANSACTION_getSupportedPrimitives, 10U);
    EXPECT_EQ(IVibrator::TRANSACTION_getPrimitiveDuration, 11U);
    EXPECT_EQ(IVibrator::TRANSACTION_compose, 12U);
    EXPECT_EQ(IVibrator::TRANSACTION_getSupportedAlwaysOnEffects, 13U);
    EXPECT_EQ(IVibrator::TRANSACTION_alwaysOnEnable, 14U);
    EXPECT_EQ(IVibrator::TRANSACTION_alwaysOnDisable, 15U);
    EXPECT_EQ(IVibrator::TRANSACTION_getResonantFrequency, 16U);
    EXPECT_EQ(IVibrator::TRANSACTION_getQFactor, 17U);
    EXPECT_EQ(IVibrator::TRANSACTION_getFrequencyResolution, 18U);
    EXPECT_EQ(IVibrator::TRANSACTION_getFrequencyMinimum, 19U);
    EXPECT_EQ(IVibrator::TRANSACTION_getBandwidthAmplitudeMap, 20U);
    EXPECT_EQ(IVibrator::TRANSACTION_getPwlePrimitiveDurationMax, 21U);
    EXPECT_EQ(IVibrator::TRANSACTION_getPwleCompositionSizeMax, 22U);
    EXPECT_EQ(IVibrator::TRANSACTION_getSupportedBraking, 23U);
    EXPECT_EQ(IVibrator::TRANSACTION_composePwle, 24U);
    EXPECT_EQ(IVibratorManager::TRANSACTION_cancelSynced, 6U);
}

TEST(Interface, CodesOfTheExtensionFollowItsDeclaration) {
    EXPECT_EQ(IZelVibrator::TRANSACTION_supportsAmplitudeControl, 1U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_supportsForceTouchAmplitudeControl, 2U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_supportsFrequencyControl, 3U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_supportsHapticEngine, 4U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_supportsPrebakedHapticPattern, 5U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_supportsFolderStatusSetting, 6U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_supportsEnhancedQuorvanHapticPattern, 7U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_setAmplitude, 8U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_setForceTouchAmplitude, 9U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_setFrequencyType, 10U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_setFolderStatus, 11U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_getNumberOfPrebakedHapticPattern, 12U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_performHapticEngine, 13U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_performPrebakedHapticPattern, 14U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_getAmplitudeList, 15U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_perform, 16U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_performPlaybackEngine, 17U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_supportsFifoHapticEngine, 18U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_supportsHybridHapticEngine, 19U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_supportsEnhancedHybridHapticPattern, 20U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_performFifoHapticEngine, 21U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_performHybridHapticEngine, 22U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_supportsFolderTentModeStatusSetting, 23U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_setFolderTentModeStatus, 24U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_supportsHasFeature, 25U);
    EXPECT_EQ(IZelVibrator::TRANSACTION_hasFeature, 26U);
}

TEST(Interface, ConstantsAreTheirValues) {
    EXPECT_EQ(static_cast<int>(IVibrator::CAP_ON_CALLBACK), 1);
    EXPECT_EQ(static_cast<int>(IVibrator::CAP_AMPLITUDE_CONTROL), 4);
    EXPECT_EQ(static_cast<int>(IVibrator::CAP_COMPOSE_PWLE_EFFECTS), 1024);
    EXPECT_EQ(static_cast<int>(IVibratorManager::CAP_TRIGGER_CALLBACK), 128);
    EXPECT_EQ(static_cast<int>(IPainter::LIMIT), 15);
    EXPECT_EQ(static_cast<int>(IPainter::LOWEST), -128);
    EXPECT_EQ(static_cast<int64_t>(IPainter::MASK), 0x7ffffffffffffffe);
    EXPECT_STREQ(IPainter::NAME, "a \"painter\"\n");
    EXPECT_TRUE((std::is_same_v<std::underlying_type_t<decltype(IPainter::LOWEST)>, int8_t>));
    EXPECT_TRUE((std::is_same_v<std::underlying_type_t<decltype(IPainter::MASK)>, int64_t>));
}

template <typename T, typename = void>
struct HasVersion : std::false_type {};
template <typename T>
struct HasVersion<T, std::void_t<decltype(&T::getInterfaceVersion)>> : std::true_type {};

TEST(Interface, WithoutVersionHasNoMethodForIt) {
    EXPECT_TRUE(HasVersion<IPainter>::value);
    EXPECT_FALSE(HasVersion<aidl::unversioned::IPlain>::value);
}

TEST(DefaultImplementation, KnowsNoMethod) {
    const auto implementation = ndk::SharedRefBase::make<IListenerDefault>();
    EXPECT_EQ(implementation->onDone(1).getStatus(), STATUS_UNKNOWN_TRANSACTION);
    EXPECT_EQ(implementation->asBinder().get(), nullptr);
    EXPECT_FALSE(implementation->isRemote());
    int32_t version = -1;
    EXPECT_TRUE(implementation->getInterfaceVersion(&version).isOk());
    EXPECT_EQ(version, 0);
    std::string hash = "x";
    EXPECT_TRUE(implementation->getInterfaceHash(&hash).isOk());
    EXPECT_EQ(hash, "");
}

// The default of a class cannot be taken back, so this is the only test that sets IListener's.
TEST(DefaultImplementationDeathTest, AnswersWhatTheObjectDoesNotKnowAndIsSetOnce) {
    class Fallback : public IListenerDefault {
      public:
        ScopedAStatus onDone(int32_t result) override {
            last = result;
            return ScopedAStatus::ok();
        }
        int32_t last = 0;
    };
    EXPECT_FALSE(IListener::setDefaultImpl(nullptr));
    EXPECT_EQ(IListener::getDefaultImpl(), nullptr);
    const auto fallback = ndk::SharedRefBase::make<Fallback>();
    EXPECT_TRUE(IListener::setDefaultImpl(fallback));
    EXPECT_EQ(IListener::getDefaultImpl(), fallback);

    RecordingBinder old("sample.IListener");
    old.status = STATUS_UNKNOWN_TRANSACTION;
    EXPECT_TRUE(old.proxy<aidl::sample::BpListener>()->onDone(4).isOk());
    EXPECT_EQ(fallback->last, 4);

    EXPECT_DEATH(IListener::setDefaultImpl(fallback), "default_impl");
}

TEST(FromBinder, OfALocalObjectIsTheObject) {
    const auto listener = ndk::SharedRefBase::make<Listener>();
    const ndk::SpAIBinder binder = listener->asBinder();
    EXPECT_EQ(IListener::fromBinder(binder), listener);
    EXPECT_FALSE(listener->isRemote());
    EXPECT_EQ(listener->asBinder(), binder);
}

TEST(FromBinder, OfNullOrAnotherInterfaceIsNull) {
    EXPECT_EQ(IListener::fromBinder(nullptr), nullptr);
    const auto callback = ndk::SharedRefBase::make<Callback>();
    EXPECT_EQ(IListener::fromBinder(callback->asBinder()), nullptr);
}

TEST(FromBinder, OfAnEqualNameFromAnotherLibraryIsNull) {
    const RecordingBinder binder("sample.IListener");
    EXPECT_EQ(IListener::fromBinder(binder.proxy<aidl::sample::BpListener>()->asBinder()), nullptr);
}

TEST(LocalObject, ReportsVersionAndHashItself) {
    const auto callback = ndk::SharedRefBase::make<Callback>();
    int32_t version = 0;
    EXPECT_TRUE(callback->getInterfaceVersion(&version).isOk());
    EXPECT_EQ(version, 2);
    std::string hash;
    EXPECT_TRUE(callback->getInterfaceHash(&hash).isOk());
    EXPECT_EQ(hash, "ea8742d6993e1a82917da38b9938e537aa7fcb54");
}

TEST(LocalObject, OutlivesItsOwnerInItsBinder) {
    auto listener = ndk::SharedRefBase::make<Listener>();
    const std::weak_ptr<Listener> watched = listener;
    ndk::SpAIBinder binder = listener->asBinder();
    listener.reset();
    EXPECT_FALSE(watched.expired());
    binder.set(nullptr);
    EXPECT_TRUE(watched.expired());
}

// Marking a binder with another level than it has aborts, with the one it has does nothing.
TEST(StabilityDeathTest, VintfStableInterfacesAreMarkedSo) {
    const auto callback = ndk::SharedRefBase::make<Callback>();
    const ndk::SpAIBinder binder = callback->asBinder();
    AIBinder_markVintfStability(binder.get());
    EXPECT_DEATH(AIBinder_markSystemStability(binder.get()), "");
}

TEST(StabilityDeathTest, OtherInterfacesBelongToTheImageTheyAreBuiltFor) {
    const auto listener = ndk::SharedRefBase::make<Listener>();
    const ndk::SpAIBinder binder = listener->asBinder();
    AIBinder_markSystemStability(binder.get());
    EXPECT_DEATH(AIBinder_markVintfStability(binder.get()), "");
}

}  // namespace
