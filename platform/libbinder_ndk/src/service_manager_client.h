// SPDX-License-Identifier: Apache-2.0
//
// The service manager as the library itself calls it.
#pragma once

#include <aidl/android/os/IServiceManager.h>

namespace binder_ndk {

// The service manager; the first call waits for it without limit.
aidl::android::os::IServiceManager& serviceManager();

// Whether the answer is a success; what it is else is on the log.
bool succeeded(const ndk::ScopedAStatus& answer);

}  // namespace binder_ndk
