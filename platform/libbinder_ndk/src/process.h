// SPDX-License-Identifier: Apache-2.0
//
// The process's pool of serving threads.
#pragma once

namespace binder_ndk {

// Serves the driver's wish for another thread; ignored unless the pool was started.
void spawnRequestedThread();

}  // namespace binder_ndk
