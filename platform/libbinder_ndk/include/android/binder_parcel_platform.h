// SPDX-License-Identifier: Apache-2.0
//
// Parcels whose memory is cleared, and whether a parcel may carry descriptors.
#pragma once

#include <android/binder_parcel.h>

__BEGIN_DECLS

// True: this platform's parcels may always carry descriptors.
bool AParcel_getAllowFds(const AParcel* parcel);

// Has the parcel's own memory zeroed before it is freed.
void AParcel_markSensitive(const AParcel* parcel) __INTRODUCED_IN(31);

__END_DECLS
