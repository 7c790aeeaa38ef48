// SPDX-License-Identifier: Apache-2.0
//
// Death notices: who wants to know of which proxy's death.
#pragma once

#include <cstdint>

#include <android/binder_ibinder.h>

namespace binder_ndk {

class RemoteBinder;

// Drops a proxy's links without firing them and takes its request back from the driver. Called
// before the handle is released.
void forgetDeathLinks(RemoteBinder* proxy);

// Serves the driver's notice: marks the proxy dead and fires its links. A cookie whose request was
// taken back meanwhile is ignored.
void handleDeathNotice(uint64_t cookie);

}  // namespace binder_ndk
