// SPDX-License-Identifier: Apache-2.0
//
// The vendor's vibrator interface, served on the hardware layer and reached as the binder extension
// of the standard service.
#pragma once

#include <array>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include <aidl/vendor/quorvan/hardware/vibrator/BnZelVibrator.h>

#include "HwApi.h"

namespace aidl::vendor::quorvan::hardware::vibrator {

// The hardware layer is shared with the standard service, and so are the platform's types.
namespace core = ::aidl::android::hardware::vibrator;

// A query that the driver's feature list answers, and what answers it for drivers without a list.
struct FeatureQuery;

// A query that the string of the event_cmd node answers: yes when it holds any of the letters.
struct LetterQuery;

// A translator without state, like the standard service; every answer comes from the driver as it
// stands at that moment. What an operation means, and its units, is the interface's business
// (IZelVibrator); what is particular to this service stands here.
//
// Every operation first asks who is calling. Anyone but root and the system user is logged and
// refused, and a refusal looks like this unless an operation says otherwise: the status is ok, the
// out-value is false, 0 or empty, and the driver is left alone.
//
// A refused argument is EX_ILLEGAL_ARGUMENT, a driver that fails EX_ILLEGAL_STATE, and what is not
// offered EX_UNSUPPORTED_OPERATION. The operations are defined by subject:
//
//   Vibrator_vendor.cpp      the caller check
//   ExtensionQueries.cpp     what the driver supports
//   ExtensionSettings.cpp    amplitude, frequency and posture
//   AmplitudeLists.cpp       amplitude steps and the number of stored patterns
//   ExtensionPatterns.cpp    stored patterns and the platform's effects
//   HapticEngineRequests.cpp packets, hybrid packets and FIFO patterns
//   PlaybackEngine.cpp       queued patterns
class Vibrator : public BnZelVibrator {
  public:
    explicit Vibrator(std::shared_ptr<core::HwApi> hwApi);

    ndk::ScopedAStatus supportsAmplitudeControl(bool* _aidl_return) override;
    ndk::ScopedAStatus supportsForceTouchAmplitudeControl(bool* _aidl_return) override;
    ndk::ScopedAStatus supportsFrequencyControl(bool* _aidl_return) override;
    ndk::ScopedAStatus supportsHapticEngine(bool* _aidl_return) override;
    ndk::ScopedAStatus supportsPrebakedHapticPattern(bool* _aidl_return) override;
    // True when the string of the event_cmd node has any of the letters D, F, L, O.
    ndk::ScopedAStatus supportsFolderStatusSetting(bool* _aidl_return) override;
    ndk::ScopedAStatus supportsEnhancedQuorvanHapticPattern(bool* _aidl_return) override;

    ndk::ScopedAStatus setAmplitude(int32_t amplitude) override;
    ndk::ScopedAStatus setForceTouchAmplitude(int32_t amplitude) override;
    ndk::ScopedAStatus setFrequencyType(ZelFrequencyType type) override;
    ndk::ScopedAStatus setFolderStatus(ZelFolderStatus status) override;

    // Passes the driver's number on as it is read, -1 for a failed read included.
    ndk::ScopedAStatus getNumberOfPrebakedHapticPattern(int32_t* _aidl_return) override;

    // On force feedback: ok, with nothing played.
    ndk::ScopedAStatus performHapticEngine(const std::vector<ZelHapticEnginePacket>& packets,
                                           int32_t amplitude) override;
    // Pattern 0 played once only sets the amplitude and the index.
    ndk::ScopedAStatus performPrebakedHapticPattern(int32_t patternIndex, int32_t amplitude,
                                                    bool repeat) override;

    // Takes an empty vector and fills it, from the driver's own lists where it has them. Null or
    // not empty is EX_ILLEGAL_ARGUMENT; every other failure leaves it empty.
    ndk::ScopedAStatus getAmplitudeList(ZelAmplitudeType type,
                                        std::vector<int32_t>* _aidl_return) override;

    // Offers no callback. The tests come in this order: perform method, callback, effect,
    // amplitude.
    ndk::ScopedAStatus perform(core::Effect effect, int32_t amplitude,
                               const std::shared_ptr<core::IVibratorCallback>& callback,
                               int32_t* _aidl_return) override;
    // Without repeat, repeatCnt is not looked at.
    ndk::ScopedAStatus performPlaybackEngine(const std::vector<ZelPlaybackPacket>& packets,
                                             bool repeat, int32_t repeatCnt) override;

    ndk::ScopedAStatus supportsFifoHapticEngine(bool* _aidl_return) override;
    ndk::ScopedAStatus supportsHybridHapticEngine(bool* _aidl_return) override;
    ndk::ScopedAStatus supportsEnhancedHybridHapticPattern(bool* _aidl_return) override;

    ndk::ScopedAStatus performFifoHapticEngine(ZelFifoType type) override;
    // A string that the driver does not take whole is ok too, but starts no vibration.
    ndk::ScopedAStatus performHybridHapticEngine(
            const std::vector<ZelHybridHapticEnginePacket>& packets, int32_t amplitude) override;

    // True when the string of the event_cmd node has any of the letters E, N, T.
    ndk::ScopedAStatus supportsFolderTentModeStatusSetting(bool* _aidl_return) override;
    ndk::ScopedAStatus setFolderTentModeStatus(ZelFolderTentModeStatus status) override;

    // Whether hasFeature() has a list to look in. A refused caller is EX_SECURITY, with false.
    ndk::ScopedAStatus supportsHasFeature(bool* _aidl_return) override;
    // Whether the driver lists exactly this word. A refused caller is EX_SECURITY, with false.
    ndk::ScopedAStatus hasFeature(const std::string& featureName, bool* _aidl_return) override;

    // What dumpsys shows, for root, system and shell; HwApi::dump() says it all.
    binder_status_t dump(int fd, const char** args, uint32_t numArgs) override;

  private:
    // Whether the caller of the transaction being served may use the service. A refused one is
    // logged, behind `prefix`.
    bool isCallerAllowed(const char* prefix = "") const;

    // Logs the line and answers with the exception.
    static ndk::ScopedAStatus refuse(binder_exception_t code, const char* line);

    // A query from its entry line to its status, which is always ok.
    ndk::ScopedAStatus answer(const FeatureQuery& query, bool* result) const;
    ndk::ScopedAStatus answer(const LetterQuery& query, bool* result) const;

    // A posture request from its entry line to its status. The event_cmd node gets the command that
    // stands at `status`.
    ndk::ScopedAStatus setPosture(const char* operation, int32_t status,
                                  const std::array<std::string_view, 2>& commands) const;

    const std::shared_ptr<core::HwApi> mHwApi;
};

}  // namespace aidl::vendor::quorvan::hardware::vibrator
