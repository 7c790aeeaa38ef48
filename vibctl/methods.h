// SPDX-License-Identifier: Apache-2.0
//
// The methods of both interfaces, in their order of declaration.
#pragma once

#include <span>
#include <string>

#include <aidl/android/hardware/vibrator/IVibrator.h>
#include <aidl/vendor/quorvan/hardware/vibrator/IZelVibrator.h>

#include "vibctl/method.h"

namespace vibctl {

using IVibrator = aidl::android::hardware::vibrator::IVibrator;
using IZelVibrator = aidl::vendor::quorvan::hardware::vibrator::IZelVibrator;

std::span<const Method> standardMethods();
std::span<const Method> extensionMethods();

// Those of the interface that the command line calls "std" or "ext".
inline std::span<const Method> methodsOf(const std::string& iface) {
    return iface == "std" ? standardMethods() : extensionMethods();
}

}  // namespace vibctl
