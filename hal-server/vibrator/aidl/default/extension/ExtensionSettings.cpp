// SPDX-License-Identifier: Apache-2.0
//
// Values that the driver keeps for later vibrations: amplitudes, frequency type and the posture of
// a foldable device. Nothing here starts a vibration.
#define LOG_TAG "QvxVibrator-HAL-AIDL-EXT"

#include <optional>
#include <string_view>

#include <android-base/logging.h>

#include "Constants.h"
#include "ServiceStatus.h"
#include "Vibrator_vendor.h"
#include "hwapi/DriverWriter.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

constexpr uint32_t kFrequencyTypes = 5;
constexpr uint32_t kPostures = 2;

// Negative values count as large ones.
template <typename Value>
bool isBelow(Value value, uint32_t limit) {
    return static_cast<uint32_t>(value) < limit;
}

}  // namespace

ndk::ScopedAStatus Vibrator::setAmplitude(int32_t amplitude) {
    LOG(INFO) << "V_4_0: setAmplitude " << amplitude;
    if (!isCallerAllowed()) return core::ok();
    if (!core::isDriverAmplitude(core::kExtensionLog, "setAmplitude", amplitude)) {
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    return core::okOrIllegalState(mHwApi->sendAmplitude(amplitude));
}

ndk::ScopedAStatus Vibrator::setForceTouchAmplitude(int32_t amplitude) {
    LOG(INFO) << "V_4_0: setForceTouchAmplitude " << amplitude;
    if (!isCallerAllowed()) return core::ok();
    if (!core::isDriverAmplitude(core::kExtensionLog, "setForceTouchAmplitude", amplitude)) {
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
    return setPosture("setFolderStatus", static_cast<int32_t>(status),
                      {core::FOLDER_OPEN, core::FOLDER_CLOSE});
}

ndk::ScopedAStatus Vibrator::setFolderTentModeStatus(ZelFolderTentModeStatus status) {
    return setPosture("setFolderTentModeStatus", static_cast<int32_t>(status),
                      {core::FOLDER_TENT_OPEN, core::FOLDER_TENT_CLOSE});
}

ndk::ScopedAStatus Vibrator::setPosture(const char* operation, int32_t status,
                                        const std::array<std::string_view, 2>& commands) const {
    LOG(INFO) << "V_4_0: " << operation << status;
    if (!isCallerAllowed()) return core::ok();
    if (!core::checked(isBelow(status, kPostures), core::kExtensionLog, operation, " BAD_VALUE")) {
        return core::exception(EX_ILLEGAL_ARGUMENT);
    }
    const std::string_view command = commands[static_cast<size_t>(status)];
    LOG(INFO) << "V_4_0: " << command << " length : " << command.size();
    const std::optional<ssize_t> written =
            core::writeBytes(core::kExtensionLog, operation, core::THE_DEVICE_EVENT_CMD, command);
    if (!written) return core::exception(EX_ILLEGAL_STATE);
    LOG(INFO) << "V_4_0: ret : " << *written;
    const bool whole = *written == static_cast<ssize_t>(command.size());
    LOG(INFO) << "V_4_0: " << operation << (whole ? " end" : " error");
    return core::okOrIllegalState(whole);
}

}  // namespace aidl::vendor::quorvan::hardware::vibrator
