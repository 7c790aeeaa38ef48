// SPDX-License-Identifier: Apache-2.0
//
// The interface token: what every request for a user method starts with.
//
//   strict-mode policy | work source uid, -1 | header 'SYST' | descriptor String16
#pragma once

#include <string_view>

#include <android/binder_status.h>

namespace binder_ndk {

class Parcel;

binder_status_t writeInterfaceToken(Parcel& parcel, std::u16string_view descriptor);

// True when the request starts with the token of `descriptor`; the position then stands after it.
// The caller's strict-mode policy becomes the thread's.
bool checkInterfaceToken(const Parcel& parcel, std::u16string_view descriptor);

}  // namespace binder_ndk
