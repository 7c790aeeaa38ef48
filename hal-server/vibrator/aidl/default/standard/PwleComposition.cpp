// SPDX-License-Identifier: Apache-2.0
//
// Piecewise-linear compositions. The service offers no size for them, so every request is refused;
// behind that guard the path is complete but for the driver, which has no node for the string.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include "standard/PwleComposition.h"

#include <sstream>

#include "ServiceStatus.h"
#include "Vibrator.h"
#include "standard/CompletionWorker.h"

namespace aidl::android::hardware::vibrator {
namespace {

constexpr const char* kHeader = "S:0,WF:4,RP:0,WT:0";

constexpr float kAmplitudeMin = 0.0F;
constexpr float kAmplitudeMax = 0.98256F;
constexpr float kFrequencyMin = 140.0F;
constexpr float kFrequencyMax = 160.0F;
constexpr int32_t kDurationLimit = 16384;
constexpr uint32_t kBrakingLimit = 2;

// No ramp ends here, so whatever follows gets a lead-in.
constexpr float kNowhere = -1.0F;

constexpr CompletionTexts kWorkerTexts = {"Starting composePwle on another thread",
                                          "Notifying compose PWLE complete"};

// Not a number passes, as it does everywhere in this service.
bool isInRange(const ActivePwle& active) {
    return !(active.duration >= kDurationLimit || active.endAmplitude > kAmplitudeMax ||
             active.startAmplitude < kAmplitudeMin || active.startAmplitude > kAmplitudeMax ||
             active.endAmplitude < kAmplitudeMin || active.endFrequency > kFrequencyMax ||
             active.startFrequency < kFrequencyMin || active.startFrequency > kFrequencyMax ||
             active.endFrequency < kFrequencyMin);
}

bool isInRange(const BrakingPwle& braking) {
    return static_cast<uint32_t>(braking.braking) < kBrakingLimit &&
           braking.duration < kDurationLimit;
}

class SequenceBuilder {
  public:
    SequenceBuilder() { mText << kHeader; }

    void add(const ActivePwle& active) {
        if (active.startAmplitude != mAmplitude || active.startFrequency != mFrequency) {
            constructActiveSegment(mText, mSegment++, 0, active.startAmplitude,
                                   active.startFrequency);
        }
        constructActiveSegment(mText, mSegment++, static_cast<uint16_t>(active.duration),
                               active.endAmplitude, active.endFrequency);
        mTotalMs += active.duration;
        mAmplitude = active.endAmplitude;
        mFrequency = active.endFrequency;
    }

    void add(const BrakingPwle& braking) {
        constructBrakingSegment(mText, mSegment++, 0, braking.braking);
        constructBrakingSegment(mText, mSegment++, braking.duration, braking.braking);
        mTotalMs += braking.duration;
        mAmplitude = kNowhere;  // which alone gives the next ramp its lead-in
    }

    PwleSequence finish() const { return {mText.str(), mTotalMs}; }

  private:
    std::ostringstream mText;
    int mSegment = 0;
    int64_t mTotalMs = 0;
    float mAmplitude = kNowhere;  // where the ramp before ended
    float mFrequency = kNowhere;
};

}  // namespace

void constructActiveDefaults(std::ostream& text, const int& segment) {
    text << ",C" << segment << ":1,B" << segment << ":0,AR" << segment << ":0,V" << segment << ":0";
}

void constructActiveSegment(std::ostream& text, const int& segment, int duration, float amplitude,
                            float frequency) {
    text << ",T" << segment << ":" << duration << ",L" << segment << ":" << amplitude << ",F"
         << segment << ":" << frequency;
    constructActiveDefaults(text, segment);
}

void constructBrakingSegment(std::ostream& text, const int& segment, int duration,
                             Braking braking) {
    text << ",T" << segment << ":" << duration << ",L" << segment << ":0,F" << segment << ":0,C"
         << segment << ":0,B" << segment << ":" << static_cast<int32_t>(braking) << ",AR" << segment
         << ":0,V" << segment << ":0";
}

std::optional<PwleSequence> buildPwleSequence(const std::vector<PrimitivePwle>& composite) {
    SequenceBuilder builder;
    for (const PrimitivePwle& entry : composite) {
        switch (entry.getTag()) {
            case PrimitivePwle::active: {
                const auto& active = entry.get<PrimitivePwle::active>();
                if (!isInRange(active)) return std::nullopt;
                builder.add(active);
                break;
            }
            case PrimitivePwle::braking: {
                const auto& braking = entry.get<PrimitivePwle::braking>();
                if (!isInRange(braking)) return std::nullopt;
                builder.add(braking);
                break;
            }
        }
    }
    return builder.finish();
}

ndk::ScopedAStatus Vibrator::composePwle(const std::vector<PrimitivePwle>& composite,
                                         const std::shared_ptr<IVibratorCallback>& callback) {
    int32_t sizeMax = 0;
    getPwleCompositionSizeMax(&sizeMax);  // declined, which leaves the limit at 0
    if (composite.empty() || static_cast<int64_t>(composite.size()) > sizeMax) {
        return exception(EX_ILLEGAL_ARGUMENT);
    }
    const std::optional<PwleSequence> sequence = buildPwleSequence(composite);
    if (!sequence) return exception(EX_ILLEGAL_ARGUMENT);
    return okOrIllegalState(startCompletionWorker(kWorkerTexts, sequence->totalMs, callback));
}

}  // namespace aidl::android::hardware::vibrator
