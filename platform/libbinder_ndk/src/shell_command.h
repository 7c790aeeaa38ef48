// SPDX-License-Identifier: Apache-2.0
//
// Dump and shell commands to a local object.
#pragma once

#include <android/binder_status.h>

namespace binder_ndk {

class LocalBinder;
class Parcel;

// Request: descriptor, count, strings.
binder_status_t serveDump(LocalBinder* binder, const Parcel& request);

// Request: three descriptors, count, strings, the shell's callback, the receiver of the result.
binder_status_t serveShellCommand(LocalBinder* binder, const Parcel& request);

}  // namespace binder_ndk
