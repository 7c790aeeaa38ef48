// SPDX-License-Identifier: Apache-2.0
//
// Compositions of primitives. A composition becomes one string, delays and waveforms each followed
// by a comma ("50,1.100," for a full-scale click after 50 ms), which goes to the driver whole: on
// force feedback as a compiled waveform, with a callback when it is over; otherwise to the driver's
// pattern queue, from which no callback ever comes.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <array>
#include <cstddef>
#include <string>

#include <android-base/logging.h>

#include "ServiceStatus.h"
#include "Vibrator.h"
#include "hwapi/DriverWriter.h"
#include "hwapi/TextBuffer.h"
#include "standard/CompletionWorker.h"

namespace aidl::android::hardware::vibrator {
namespace {

constexpr int32_t kDelayMaxMs = 1000;
constexpr int32_t kSizeMax = 10;

// The amplitudes that stand for full scale.
constexpr float kFullForceFeedback = 100.0F;
constexpr float kFullSysfs = 10000.0F;

constexpr CompletionTexts kWorkerTexts = {"Starting compose on another thread",
                                          "Notifying compose complete"};

// The lines of the extension's pattern player, which went this way first, are kept.
constexpr QueueWords kQueueWords = {kStandardLog, "compose", "zelPerformPrebakedHapticPattern",
                                    false};

// A primitive's entry in the plain wavetable and its nominal length.
struct Primitive {
    CompositePrimitive name;
    uint32_t waveform;
    int32_t durationMs;
};

// In the order of their numbers. NOOP has no waveform.
constexpr std::array<Primitive, 9> kPrimitives = {{
        {CompositePrimitive::NOOP, 0, 0},
        {CompositePrimitive::CLICK, 1, 20},
        {CompositePrimitive::THUD, 124, 300},
        {CompositePrimitive::SPIN, 123, 130},
        {CompositePrimitive::QUICK_RISE, 121, 150},
        {CompositePrimitive::SLOW_RISE, 122, 500},
        {CompositePrimitive::QUICK_FALL, 120, 100},
        {CompositePrimitive::LIGHT_TICK, 41, 20},
        {CompositePrimitive::LOW_TICK, 119, 20},
}};

// Null for a number that is no primitive; a negative one counts as large.
const Primitive* findPrimitive(CompositePrimitive primitive) {
    const auto number = static_cast<uint32_t>(primitive);
    return number < kPrimitives.size() ? &kPrimitives[number] : nullptr;
}

// The amplitude of a scale between 0.0 and 1.0. The waveform compiler takes no amplitude 0, so on
// force feedback the least is 1.
int32_t scaleToAmplitude(float scale) {
    if (!useForceFeedback) return toDriverAmplitude(scale, kFullSysfs);
    return scale == 0.0F ? 1 : toDriverAmplitude(scale, kFullForceFeedback);
}

// A composition as it is handed to the driver. The totals take whatever ten effects can add up to:
// a delay may be as negative as 32 bits allow, for nothing refuses it here.
struct Composition {
    // Each effect is a delay, an entry and an amplitude of at most eleven characters with what
    // follows them; then comes a "0" and a terminator.
    TextBuffer<static_cast<size_t>(kSizeMax) * 3 * 12 + 2> text;
    int64_t delayMs = 0;
    int64_t durationMs = 0;
};

}  // namespace

ndk::ScopedAStatus Vibrator::getCompositionDelayMax(int32_t* _aidl_return) {
    LOG(ERROR) << "V_2_0: Vibrator getCompositionDelayMax ";
    *_aidl_return = kDelayMaxMs;
    return ok();
}

ndk::ScopedAStatus Vibrator::getCompositionSizeMax(int32_t* _aidl_return) {
    LOG(ERROR) << "V_2_0: Vibrator getCompositionSizeMax ";
    *_aidl_return = kSizeMax;
    return ok();
}

ndk::ScopedAStatus Vibrator::getSupportedPrimitives(std::vector<CompositePrimitive>* _aidl_return) {
    LOG(ERROR) << "V_2_0: Vibrator getSupportedPrimitives ";
    _aidl_return->clear();
    if (mHwApi->hasFeature(qvx_features::PRIMITIVE_EFFECT_COMPOSE) == 1) {
        for (const Primitive& primitive : kPrimitives) _aidl_return->push_back(primitive.name);
    }
    return ok();
}

ndk::ScopedAStatus Vibrator::getPrimitiveDuration(CompositePrimitive primitive,
                                                  int32_t* _aidl_return) {
    LOG(ERROR) << "V_2_0: Vibrator getPrimitiveDuration ";
    const Primitive* const found = findPrimitive(primitive);
    if (found == nullptr) return exception(EX_UNSUPPORTED_OPERATION);
    *_aidl_return = found->durationMs;
    return ok();
}

ndk::ScopedAStatus Vibrator::getPrimitiveDetails(CompositePrimitive primitive, uint32_t* index) {
    const Primitive* const found = findPrimitive(primitive);
    if (found == nullptr) return exception(EX_UNSUPPORTED_OPERATION);
    if (primitive == CompositePrimitive::NOOP) return exception(EX_ILLEGAL_ARGUMENT);
    *index = found->waveform;
    if (useKypIndex && useForceFeedback) {
        LOG(ERROR) << "V_2_0: [getPrimitiveDetails]kyp index transform";
        *index = static_cast<uint32_t>(toKypIndex(static_cast<int32_t>(found->waveform)));
    }
    return ok();
}

ndk::ScopedAStatus Vibrator::compose(const std::vector<CompositeEffect>& composite,
                                     const std::shared_ptr<IVibratorCallback>& callback) {
    LOG(ERROR) << "V_2_0: Vibrator compose : " << composite.size() << " size";
    if (composite.size() > static_cast<size_t>(kSizeMax)) {
        return refuse(EX_ILLEGAL_ARGUMENT, "V_2_0:  e.size error ");
    }
    Composition composition;
    for (const CompositeEffect& effect : composite) {
        if (effect.delayMs != 0) {
            if (effect.delayMs > kDelayMaxMs) {
                return refuse(EX_ILLEGAL_ARGUMENT, "V_2_0:  e.delayMs error ");
            }
            composition.text.append("%d,", effect.delayMs);
            LOG(ERROR) << " delayMs : " << effect.delayMs;
            composition.delayMs += effect.delayMs;
        }
        if (effect.primitive == CompositePrimitive::NOOP) {
            LOG(ERROR) << "V_2_0:  CompositePrimitive is NOOP ";
            continue;
        }
        uint32_t index = 0;
        ndk::ScopedAStatus status = getPrimitiveDetails(effect.primitive, &index);
        if (!status.isOk()) return status;
        if (effect.scale < 0.0F || effect.scale > 1.0F) {
            return refuse(EX_ILLEGAL_ARGUMENT, "V_2_0:  e.scale error ");
        }
        composition.text.append("%u.%d,", index, scaleToAmplitude(effect.scale));
        LOG(ERROR) << "V_2_0: " << composition.text.get();
        int32_t durationMs = 0;
        getPrimitiveDuration(effect.primitive, &durationMs);
        LOG(ERROR) << " durationMs : " << durationMs;
        composition.durationMs += durationMs;
    }
    if (composition.text.get().empty()) {
        return refuse(EX_ILLEGAL_ARGUMENT, "V_2_0: effectBuilder is null");
    }
    LOG(ERROR) << " totaldelay : " << composition.delayMs
               << " totalDuration : " << composition.durationMs;
    LOG(ERROR) << "V_2_0: Effect cmd : " << composition.text.get();
    if (!useForceFeedback) {
        composition.text.append("0");
        LOG(ERROR) << "V_2_0: Effect cmd : " << composition.text.get();
        // Unlike the queue's other strings, this one goes without a terminating zero byte.
        return okOrIllegalState(playQueue(*mHwApi, kQueueWords, composition.text.get()));
    }

    if (!mHwApi->setAndTriggerOwt_primitve(std::string(composition.text.get()))) {
        return refuse(EX_ILLEGAL_STATE, "V_2_0: compose setAndTriggerOwt fail");
    }
    LOG(ERROR) << "V_2_0: compose setAndTriggerOwt_Primitive pass";
    if (!startCompletionWorker(kWorkerTexts, composition.durationMs + composition.delayMs,
                               callback)) {
        // A client that is told of a failure must not feel the motor, nor wait for a callback.
        mHwApi->triggerForceFeedbackVibration(false);
        return exception(EX_ILLEGAL_STATE);
    }
    return ok();
}

}  // namespace aidl::android::hardware::vibrator
