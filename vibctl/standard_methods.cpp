// SPDX-License-Identifier: Apache-2.0
//
// The methods of the standard interface, and how the entries of its compositions are written.
#include "vibctl/methods.h"

namespace vibctl {

using aidl::android::hardware::vibrator::ActivePwle;
using aidl::android::hardware::vibrator::BrakingPwle;
using aidl::android::hardware::vibrator::CompositeEffect;
using aidl::android::hardware::vibrator::PrimitivePwle;

template <>
struct Argument<CompositeEffect> {
    static Problem parse(const std::string& name, const std::string& word, CompositeEffect& value) {
        return parsePacket(name, word, value.delayMs, value.primitive, value.scale);
    }

    static std::string accepted() {
        return "any count of these; PRIMITIVE is " +
               Argument<aidl::android::hardware::vibrator::CompositePrimitive>::accepted();
    }
};

template <>
struct Argument<PrimitivePwle> {
    static constexpr const char* kActive =
            "START_AMPLITUDE,START_FREQUENCY,END_AMPLITUDE,END_FREQUENCY,DURATION_MS";
    static constexpr const char* kBraking = "BRAKING,DURATION_MS";

    static Problem parse(const std::string&, const std::string& word, PrimitivePwle& value) {
        const std::vector<std::string> fields = android::base::Split(word, ",");
        const auto rest = std::span(fields).subspan(1);
        if (android::base::EqualsIgnoreCase(fields[0], "active")) {
            ActivePwle active;
            Problem problem =
                    parseFields(kActive, rest, active.startAmplitude, active.startFrequency,
                                active.endAmplitude, active.endFrequency, active.duration);
            value = active;
            return inPacket(word, problem);
        }
        if (android::base::EqualsIgnoreCase(fields[0], "brake")) {
            BrakingPwle braking;
            Problem problem = parseFields(kBraking, rest, braking.braking, braking.duration);
            value = braking;
            return inPacket(word, problem);
        }
        return inPacket(word, "begins with neither active nor brake");
    }

    static std::string accepted() {
        return fmt::format("any count of active,{} and brake,{}; BRAKING is {}", kActive, kBraking,
                           Argument<aidl::android::hardware::vibrator::Braking>::accepted());
    }
};

namespace {

constexpr Traits kHertz{.show = Show::kHertz};
constexpr Traits kCapabilities{.show = Show::kCapabilities};
constexpr Traits kComposition{.awaitsCompletion = true};

// clang-format off
constexpr Method kStandardMethods[] = {
        row<&IVibrator::getCapabilities>("getCapabilities", "", kCapabilities),
        row<&IVibrator::off>("off"),
        row<&IVibrator::on>("on", "TIMEOUT_MS"),
        row<&IVibrator::perform>("perform", "EFFECT STRENGTH", kMilliseconds),
        row<&IVibrator::getSupportedEffects>("getSupportedEffects"),
        row<&IVibrator::setAmplitude>("setAmplitude", "AMPLITUDE"),
        row<&IVibrator::setExternalControl>("setExternalControl", "ENABLED"),
        row<&IVibrator::getCompositionDelayMax>("getCompositionDelayMax", "", kMilliseconds),
        row<&IVibrator::getCompositionSizeMax>("getCompositionSizeMax"),
        row<&IVibrator::getSupportedPrimitives>("getSupportedPrimitives"),
        row<&IVibrator::getPrimitiveDuration>("getPrimitiveDuration", "PRIMITIVE", kMilliseconds),
        row<&IVibrator::compose>("compose", "DELAY_MS,PRIMITIVE,SCALE...", kComposition),
        row<&IVibrator::getSupportedAlwaysOnEffects>("getSupportedAlwaysOnEffects"),
        row<&IVibrator::alwaysOnEnable>("alwaysOnEnable", "ID EFFECT STRENGTH"),
        row<&IVibrator::alwaysOnDisable>("alwaysOnDisable", "ID"),
        row<&IVibrator::getResonantFrequency>("getResonantFrequency", "", kHertz),
        row<&IVibrator::getQFactor>("getQFactor"),
        row<&IVibrator::getFrequencyResolution>("getFrequencyResolution", "", kHertz),
        row<&IVibrator::getFrequencyMinimum>("getFrequencyMinimum", "", kHertz),
        row<&IVibrator::getBandwidthAmplitudeMap>("getBandwidthAmplitudeMap"),
        row<&IVibrator::getPwlePrimitiveDurationMax>("getPwlePrimitiveDurationMax", "", kMilliseconds),
        row<&IVibrator::getPwleCompositionSizeMax>("getPwleCompositionSizeMax"),
        row<&IVibrator::getSupportedBraking>("getSupportedBraking"),
        row<&IVibrator::composePwle>("composePwle", "SEGMENT...", kComposition),
        row<&IVibrator::getInterfaceVersion>("getInterfaceVersion"),
        row<&IVibrator::getInterfaceHash>("getInterfaceHash"),
};
// clang-format on

}  // namespace

std::span<const Method> standardMethods() {
    return kStandardMethods;
}

}  // namespace vibctl
