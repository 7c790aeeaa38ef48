// SPDX-License-Identifier: Apache-2.0
//
// The object behind handle 0, when it is this process's.
#pragma once

struct AIBinder;

namespace binder_ndk {

// Null unless this process is the service manager. The reference stays the library's.
AIBinder* contextManagerObject();

}  // namespace binder_ndk
