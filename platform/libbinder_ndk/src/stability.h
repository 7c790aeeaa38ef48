// SPDX-License-Identifier: Apache-2.0
//
// Stability levels and the word that carries them behind every binder in a parcel:
//
//   byte 0: wire version, 1 | bytes 1-2: zero | byte 3: level
#pragma once

#include <cstdint>

#include <android/binder_ibinder.h>

namespace binder_ndk {

inline constexpr uint32_t kUndeclaredStabilityWord = 0x00000001;
inline constexpr uint32_t kVendorStabilityWord = 0x03000001;
inline constexpr uint32_t kSystemStabilityWord = 0x0c000001;
inline constexpr uint32_t kVintfStabilityWord = 0x3f000001;

// The word to write behind `binder`, not null. A local object without a mark becomes system: the
// library is part of the system, in vendor processes too.
uint32_t stabilityWordForSending(AIBinder* binder);

// Takes the word read behind `binder`, which may be null. STATUS_BAD_TYPE for a word that cannot
// be, or one that differs from what the object was seen with before.
binder_status_t acceptStabilityWord(AIBinder* binder, uint32_t word);

// Marks the proxy of the service manager, which no parcel brought.
void markServiceManagerStability(AIBinder* proxy);

// True when a caller with these flags (FLAG_PRIVATE_VENDOR or not) may call `binder`.
bool mayCall(const AIBinder* binder, uint32_t flags);

}  // namespace binder_ndk
