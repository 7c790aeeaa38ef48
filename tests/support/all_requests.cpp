// SPDX-License-Identifier: Apache-2.0
#include "tests/support/all_requests.h"

#include <cstdint>
#include <type_traits>

namespace qvx::test {
namespace {

namespace hal = aidl::android::hardware::vibrator;
namespace vendor = aidl::vendor::quorvan::hardware::vibrator;

template <typename Value>
std::string textOf(const Value& value) {
    if constexpr (std::is_enum_v<Value>) {
        return std::to_string(static_cast<int64_t>(value));
    } else {
        return std::to_string(value);
    }
}

template <typename Value>
std::string textOf(const std::vector<Value>& values) {
    std::string text;
    for (const Value& value : values) text += textOf(value) + " ";
    return text;
}

// A request without an out-value, and one with.
template <typename Call>
auto plain(Call call) {
    return [call](const Services& services) -> Answer {
        return {call(services).getExceptionCode(), ""};
    };
}

template <typename Value, typename Call>
auto with(Call call) {
    return [call](const Services& services) -> Answer {
        Value value = {};
        const binder_exception_t exception = call(services, &value).getExceptionCode();
        return {exception, textOf(value)};
    };
}

hal::CompositeEffect click(int32_t delayMs) {
    return {.delayMs = delayMs, .primitive = hal::CompositePrimitive::CLICK, .scale = 1.0F};
}

vendor::ZelHapticEnginePacket packet() {
    return {.time = 7, .intensity = 10000, .frequency = 2050};
}

vendor::ZelHybridHapticEnginePacket hybridPacket() {
    return {.time = 5, .intensity = 5000, .value = 3};
}

vendor::ZelPlaybackPacket playbackPacket() {
    return {.patternIndex = 5, .level = 100};
}

}  // namespace

const std::vector<Request>& allRequests() {
    using S = hal::IVibrator;
    using E = vendor::IZelVibrator;
    using hal::Effect;
    using hal::EffectStrength;
    using Effects = std::vector<Effect>;
    using Primitives = std::vector<hal::CompositePrimitive>;
    using Numbers = std::vector<int32_t>;
    const auto query = [](ndk::ScopedAStatus (E::*method)(bool*)) {
        return with<bool>([method](const Services& services, bool* value) {
            return (services.extension.get()->*method)(value);
        });
    };
    const auto declined = [](ndk::ScopedAStatus (S::*method)(float*)) {
        return with<float>([method](const Services& services, float* value) {
            return (services.standard.get()->*method)(value);
        });
    };
    const auto perform = [](Effect effect) {
        return with<int32_t>([effect](const Services& services, int32_t* value) {
            return services.standard->perform(effect, EffectStrength::STRONG, nullptr, value);
        });
    };
    const auto performExtended = [](Effect effect) {
        return with<int32_t>([effect](const Services& services, int32_t* value) {
            return services.extension->perform(effect, 5000, nullptr, value);
        });
    };
    const auto pattern = [](int32_t index, bool repeat) {
        return plain([=](const Services& services) {
            return services.extension->performPrebakedHapticPattern(index, 5000, repeat);
        });
    };
#define PLAIN(call) plain([](const Services& services) { return services.call; })
#define WITH(Type, call) \
    with<Type>([](const Services& services, Type* value) { return services.call; })
    static const std::vector<Request> kRequests = {
            {"std getCapabilities", WITH(int32_t, standard->getCapabilities(value))},
            {"std off", PLAIN(standard->off())},
            {"std on", PLAIN(standard->on(500, nullptr))},
            {"std perform CLICK", perform(Effect::CLICK)},
            {"std perform DOUBLE_CLICK", perform(Effect::DOUBLE_CLICK)},
            {"std perform TICK", perform(Effect::TICK)},
            {"std perform HEAVY_CLICK", perform(Effect::HEAVY_CLICK)},
            {"std getSupportedEffects", WITH(Effects, standard->getSupportedEffects(value))},
            {"std setAmplitude", PLAIN(standard->setAmplitude(0.5F))},
            {"std setExternalControl", PLAIN(standard->setExternalControl(true))},
            {"std getCompositionDelayMax", WITH(int32_t, standard->getCompositionDelayMax(value))},
            {"std getCompositionSizeMax", WITH(int32_t, standard->getCompositionSizeMax(value))},
            {"std getSupportedPrimitives",
             WITH(Primitives, standard->getSupportedPrimitives(value))},
            {"std getPrimitiveDuration",
             WITH(int32_t, standard->getPrimitiveDuration(hal::CompositePrimitive::CLICK, value))},
            {"std compose", PLAIN(standard->compose({click(0), click(20)}, nullptr))},
            {"std getSupportedAlwaysOnEffects",
             WITH(Effects, standard->getSupportedAlwaysOnEffects(value))},
            {"std alwaysOnEnable",
             PLAIN(standard->alwaysOnEnable(1, Effect::CLICK, EffectStrength::LIGHT))},
            {"std alwaysOnDisable", PLAIN(standard->alwaysOnDisable(1))},
            {"std getResonantFrequency", declined(&S::getResonantFrequency)},
            {"std getQFactor", declined(&S::getQFactor)},
            {"std getFrequencyResolution", declined(&S::getFrequencyResolution)},
            {"std getFrequencyMinimum", declined(&S::getFrequencyMinimum)},
            {"std getBandwidthAmplitudeMap",
             WITH(std::vector<float>, standard->getBandwidthAmplitudeMap(value))},
            {"std getPwlePrimitiveDurationMax",
             WITH(int32_t, standard->getPwlePrimitiveDurationMax(value))},
            {"std getPwleCompositionSizeMax",
             WITH(int32_t, standard->getPwleCompositionSizeMax(value))},
            {"std getSupportedBraking",
             WITH(std::vector<hal::Braking>, standard->getSupportedBraking(value))},
            {"std composePwle", PLAIN(standard->composePwle({}, nullptr))},

            {"ext supportsAmplitudeControl", query(&E::supportsAmplitudeControl)},
            {"ext supportsForceTouchAmplitudeControl",
             query(&E::supportsForceTouchAmplitudeControl)},
            {"ext supportsFrequencyControl", query(&E::supportsFrequencyControl)},
            {"ext supportsHapticEngine", query(&E::supportsHapticEngine)},
            {"ext supportsPrebakedHapticPattern", query(&E::supportsPrebakedHapticPattern)},
            {"ext supportsFolderStatusSetting", query(&E::supportsFolderStatusSetting)},
            {"ext supportsEnhancedQuorvanHapticPattern",
             query(&E::supportsEnhancedQuorvanHapticPattern)},
            {"ext setAmplitude", PLAIN(extension->setAmplitude(5000))},
            {"ext setForceTouchAmplitude", PLAIN(extension->setForceTouchAmplitude(5000))},
            {"ext setFrequencyType",
             PLAIN(extension->setFrequencyType(static_cast<vendor::ZelFrequencyType>(4)))},
            {"ext setFolderStatus",
             PLAIN(extension->setFolderStatus(static_cast<vendor::ZelFolderStatus>(1)))},
            {"ext getNumberOfPrebakedHapticPattern",
             WITH(int32_t, extension->getNumberOfPrebakedHapticPattern(value))},
            {"ext performHapticEngine", PLAIN(extension->performHapticEngine({packet()}, 10000))},
            {"ext performPrebakedHapticPattern once", pattern(5, false)},
            {"ext performPrebakedHapticPattern chosen", pattern(0, false)},
            {"ext performPrebakedHapticPattern repeat", pattern(5, true)},
            {"ext getAmplitudeList",
             WITH(Numbers, extension->getAmplitudeList(vendor::ZelAmplitudeType{}, value))},
            {"ext perform CLICK", performExtended(Effect::CLICK)},
            {"ext perform DOUBLE_CLICK", performExtended(Effect::DOUBLE_CLICK)},
            {"ext perform TICK", performExtended(Effect::TICK)},
            {"ext performPlaybackEngine",
             PLAIN(extension->performPlaybackEngine({playbackPacket()}, true, 2))},
            {"ext supportsFifoHapticEngine", query(&E::supportsFifoHapticEngine)},
            {"ext supportsHybridHapticEngine", query(&E::supportsHybridHapticEngine)},
            {"ext supportsEnhancedHybridHapticPattern",
             query(&E::supportsEnhancedHybridHapticPattern)},
            {"ext performFifoHapticEngine",
             PLAIN(extension->performFifoHapticEngine(static_cast<vendor::ZelFifoType>(25)))},
            {"ext performHybridHapticEngine",
             PLAIN(extension->performHybridHapticEngine({hybridPacket()}, 10000))},
            {"ext supportsFolderTentModeStatusSetting",
             query(&E::supportsFolderTentModeStatusSetting)},
            {"ext setFolderTentModeStatus",
             PLAIN(extension->setFolderTentModeStatus(
                     static_cast<vendor::ZelFolderTentModeStatus>(1)))},
            {"ext supportsHasFeature", query(&E::supportsHasFeature)},
            {"ext hasFeature", WITH(bool, extension->hasFeature("INTENSITY", value))},
    };
#undef PLAIN
#undef WITH
    return kRequests;
}

}  // namespace qvx::test
