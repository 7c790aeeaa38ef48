// SPDX-License-Identifier: Apache-2.0
//
// The methods of both interfaces, in their order of declaration.
#pragma once

#include <span>

#include <aidl/android/hardware/vibrator/IVibrator.h>
#include <aidl/vendor/quorvan/hardware/vibrator/IZelVibrator.h>

#include "method.h"

namespace vibctl {

using IVibrator = aidl::android::hardware::vibrator::IVibrator;
using IZelVibrator = aidl::vendor::quorvan::hardware::vibrator::IZelVibrator;

std::span<const Method<IVibrator>> standardMethods();
std::span<const Method<IZelVibrator>> extensionMethods();

}  // namespace vibctl
