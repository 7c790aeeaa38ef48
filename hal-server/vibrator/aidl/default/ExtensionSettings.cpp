// SPDX-License-Identifier: Apache-2.0
//
// Values that the driver keeps for later vibrations: amplitudes, frequency type and the posture of
// a foldable device. Nothing here starts a vibration.
#define LOG_TAG "QvxVibrator-HAL-AIDL-EXT"

#include <cerrno>
#include <optional>
#include <string_view>

#include <android-base/logging.h>

#include "Amplitude.h"
#include "Constants.h"
#include "ServiceStatus.h"
#include "SystemCalls.h"
#include "Vibrator_vendor.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

constexpr uint32_t kFrequencyTypes = 5;
constexpr uint32_t kPostures = 2;

// Negative values count as large ones.
template <typename Enum>
bool isBelow(Enum value, uint32_t limit) {
    return static_cast<uint32_t>(value) < limit;
}

}  // namespace

ndk::ScopedAStatus Vibrator::setAmplitude(int32_t amplitude) {
    LOG(INFO) << "V_4_0: setAmplitude " << amplitude;
    if (!isCallerAllowed()) return core::ok();
    if (!core::isDriverAmplitude(amplitude)) {
        LOG(INFO) << "V_4_0: setAmplitude amplitude is abnormal " << amplitude;
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    return core::okOrIllegalState(
            core::useForceFeedback ? mHwApi->setForceFeedbackAmplitude(amplitude)
                                   : mHwApi->writeNode(core::THE_DEVICE_INTENSITY, amplitude));
}

ndk::ScopedAStatus Vibrator::setForceTouchAmplitude(int32_t amplitude) {
    LOG(INFO) << "V_4_0: setForceTouchAmplitude " << amplitude;
    if (!isCallerAllowed()) return core::ok();
    if (!core::isDriverAmplitude(amplitude)) {
        LOG(INFO) << "V_4_0: setForceTouchAmplitude amplitude is abnormal " << amplitude;
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    return core::okOrIllegalState(
            mHwApi->writeNode(core::THE_DEVICE_FORCE_TOUCH_INTENSITY, amplitude));
}

ndk::ScopedAStatus Vibrator::setFrequencyType(ZelFrequencyType type) {
    const auto number = static_cast<int32_t>(type);
    LOG(INFO) << "V_4_0: setFrequencyType" << number;
    if (!isCallerAllowed()) return core::ok();
    if (!isBelow(type, kFrequencyTypes)) {
        LOG(INFO) << "V_4_0: setFrequencyType is abnormal " << number;
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    return core::okOrIllegalState(mHwApi->writeNode(core::THE_DEVICE_MULTI_FREQ, number));
}

ndk::ScopedAStatus Vibrator::setFolderStatus(ZelFolderStatus status) {
    LOG(INFO) << "V_4_0: setFolderStatus" << static_cast<int32_t>(status);
    if (!isCallerAllowed()) return core::ok();
    if (!isBelow(status, kPostures)) {
        LOG(INFO) << "V_4_0: setFolderStatus BAD_VALUE";
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    return sendPosture("setFolderStatus",
                       static_cast<int32_t>(status) == 0 ? core::FOLDER_OPEN : core::FOLDER_CLOSE);
}

ndk::ScopedAStatus Vibrator::setFolderTentModeStatus(ZelFolderTentModeStatus status) {
    LOG(INFO) << "V_4_0: setFolderTentModeStatus" << static_cast<int32_t>(status);
    if (!isCallerAllowed()) return core::ok();
    if (!isBelow(status, kPostures)) {
        LOG(INFO) << "V_4_0: setFolderTentModeStatus BAD_VALUE";
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    return sendPosture("setFolderTentModeStatus", static_cast<int32_t>(status) == 0
                                                          ? core::FOLDER_TENT_OPEN
                                                          : core::FOLDER_TENT_CLOSE);
}

ndk::ScopedAStatus Vibrator::sendPosture(const char* operation, std::string_view command) const {
    LOG(INFO) << "V_4_0: " << command << " length : " << command.size();
    const std::optional<ssize_t> written =
            core::kernel::writeOnce(core::THE_DEVICE_EVENT_CMD, command.data(), command.size());
    if (!written) {
        const int error = errno;
        LOG(INFO) << "V_4_0: " << operation << " is fail: " << error;
        return core::exception(EX_ILLEGAL_STATE);
    }
    LOG(INFO) << "V_4_0: ret : " << *written;
    const bool whole = *written == static_cast<ssize_t>(command.size());
    LOG(INFO) << "V_4_0: " << operation << (whole ? " end" : " error");
    return core::okOrIllegalState(whole);
}

}  // namespace aidl::vendor::quorvan::hardware::vibrator
