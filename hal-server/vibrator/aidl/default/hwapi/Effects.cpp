// SPDX-License-Identifier: Apache-2.0
//
// The platform's predefined effects: what each one plays on each kind of motor, and how long it
// lasts.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <chrono>
#include <memory>
#include <system_error>
#include <thread>
#include <vector>

#include <android-base/logging.h>

#include "HwApi.h"

namespace aidl::android::hardware::vibrator {
namespace {

// Length of the single pulse that stands for an effect on motors without stored patterns.
constexpr int kPulseMs = 7;

// Added to every effect's length for what the motor needs to come to rest.
constexpr int kSettleMs = 10;

// The ways in which motors without stored patterns play an effect.
enum class Action { kPulse, kDoubleClick, kPacket };

// An effect's lengths (without kSettleMs), stored pattern, and what replaces the pattern on motors
// that have none. The numbers were tuned on the device.
struct EffectRow {
    Effect effect;
    const char* name;
    struct {
        int durationMs;
        int pattern;
    } prebaked;
    struct {
        int durationMs;
        Action action;
        int frequency;  // of the packet
        int overdrive;
    } hapticEngine;
    struct {
        int durationMs;
        Action action;
    } amplitude;
};

// clang-format off
constexpr EffectRow kEffects[] = {
    // effect                name            prebaked    haptic engine                        amplitude
    {Effect::CLICK,        "CLICK",        { 50, 10}, { 7, Action::kPulse,          0, 0}, { 7, Action::kPulse}},
    {Effect::DOUBLE_CLICK, "DOUBLE_CLICK", {100, 14}, {85, Action::kDoubleClick,    0, 0}, {85, Action::kDoubleClick}},
    {Effect::TICK,         "TICK",         { 50, 50}, { 7, Action::kPacket,      2050, 0}, { 7, Action::kPulse}},
    {Effect::HEAVY_CLICK,  "HEAVY_CLICK",  {100, 23}, { 7, Action::kPacket,      2000, 1}, { 7, Action::kPulse}},
};
// clang-format on

const EffectRow* findEffect(Effect effect) {
    for (const EffectRow& row : kEffects) {
        if (row.effect == effect) return &row;
    }
    return nullptr;
}

bool pulse(HwApi& hardware, int amplitude) {
    return hardware.setAmplitude(amplitude) && hardware.do_on(kPulseMs);
}

bool doubleClick(HwApi& hardware, int amplitude) {
    const bool amplitudeSet = hardware.setAmplitude(amplitude);
    try {
        hardware.performEffect_DOUBLE_CLICK();
    } catch (const std::system_error&) {
        return false;  // no thread to be had, and nothing may be thrown at a binder client
    }
    return amplitudeSet;
}

bool playTimed(HwApi& hardware, Action action, int amplitude) {
    return action == Action::kDoubleClick ? doubleClick(hardware, amplitude)
                                          : pulse(hardware, amplitude);
}

bool playHapticEngine(HwApi& hardware, const EffectRow& row, int amplitude) {
    const auto& [durationMs, action, frequency, overdrive] = row.hapticEngine;
    if (action != Action::kPacket) return playTimed(hardware, action, amplitude);
    // The amplitude counts twice: here, and as the scale of the whole request.
    return hardware.performHapticEngine({{kPulseMs, amplitude, frequency, overdrive}}, amplitude);
}

}  // namespace

bool HwApi::isPlayed(Effect effect) {
    return findEffect(effect) != nullptr;
}

std::vector<Effect> HwApi::playedEffects() {
    std::vector<Effect> effects;
    for (const EffectRow& row : kEffects) effects.push_back(row.effect);
    return effects;
}

int HwApi::setPerformAmplitude(EffectStrength strength) {
    switch (strength) {
        case EffectStrength::LIGHT:
        case EffectStrength::MEDIUM:
        case EffectStrength::STRONG: {
            const int amplitude = 3400 + 3300 * static_cast<int>(strength);
            LOG(INFO) << "HW_API: setPerformAmplitude : " << amplitude;
            return amplitude;
        }
    }
    LOG(INFO) << "HW_API: setPerformAmplitude not supports : %d";  // the %d has always been there
    return 0;
}

bool HwApi::preparePerform(Effect effect, int amplitude, int& durationMs) {
    LOG(INFO) << "HW_API: [preparePerform]amplitude: " << amplitude;
    if (motorPerformMethod == PERFORM_NONE) {
        LOG(INFO) << "HW_API: [preparePerform]Fail - unsupported in case of PERFORM_NONE";
        return false;
    }
    bool accepted = false;
    if (const EffectRow* const row = findEffect(effect); row == nullptr) {
        LOG(INFO) << "HW_API: [preparePerform]Fail - unsupported effect";
    } else {
        LOG(INFO) << "HW_API: [preparePerform]" << row->name;
        switch (motorPerformMethod) {
            case PERFORM_PREBAKED_INDEX:
                durationMs = row->prebaked.durationMs;
                accepted = performPrebakedHapticPattern(row->prebaked.pattern, amplitude, false);
                break;
            case PERFORM_HAPTIC_ENGINE:
                durationMs = row->hapticEngine.durationMs;
                accepted = playHapticEngine(*this, *row, amplitude);
                break;
            default:  // PERFORM_AMPLITUDE
                durationMs = row->amplitude.durationMs;
                accepted = playTimed(*this, row->amplitude.action, amplitude);
                break;
        }
    }
    durationMs += kSettleMs;
    return accepted;
}

void HwApi::performEffect_DOUBLE_CLICK() {
    using std::chrono::milliseconds;
    // Empty only where no shared pointer owns this object, and then its owner must outlive the
    // click.
    const std::shared_ptr<HwApi> keepAlive = weak_from_this().lock();
    const auto click = [this, keepAlive] {
        LOG(INFO) << "HW_API: Start perform on another thread - performEffect_DOUBLE_CLICK";
        do_off();
        do_on(10);
        std::this_thread::sleep_for(milliseconds(70));
        do_on(15);
        LOG(INFO) << "HW_API: End perform on another thread - performEffect_DOUBLE_CLICK";
    };
    try {
        std::thread(click).detach();
    } catch (const std::system_error& error) {
        // In the words of the phone's C++ library, whichever library this is built with.
        throw std::system_error(error.code(), "thread constructor failed");
    }
}

}  // namespace aidl::android::hardware::vibrator
