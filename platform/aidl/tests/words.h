// SPDX-License-Identifier: Apache-2.0
//
// Parcels as the 32-bit words they consist of, which is how the tests write down what travels.
#pragma once

#include <cstdint>
#include <vector>

#include <android/binder_auto_utils.h>
#include <android/binder_parcel.h>

using Words = std::vector<uint32_t>;

// The words from position `from` to the end of a parcel that holds no objects.
inline Words wordsOf(const AParcel* parcel, int32_t from = 0) {
    Words words;
    AParcel_setDataPosition(parcel, from);
    while (AParcel_getDataPosition(parcel) < AParcel_getDataSize(parcel)) {
        uint32_t word = 0;
        if (AParcel_readUint32(parcel, &word) != STATUS_OK) break;
        words.push_back(word);
    }
    return words;
}

// Appends words.
inline void writeWords(AParcel* parcel, const Words& words) {
    for (const uint32_t word : words) AParcel_writeUint32(parcel, word);
}

// A parcel of these words, to be read from its start.
inline ndk::ScopedAParcel parcelOf(const Words& words) {
    ndk::ScopedAParcel parcel(AParcel_create());
    writeWords(parcel.get(), words);
    AParcel_setDataPosition(parcel.get(), 0);
    return parcel;
}

// What a parcelable or union writes.
template <typename T>
Words written(const T& value) {
    const ndk::ScopedAParcel parcel(AParcel_create());
    if (value.writeToParcel(parcel.get()) != STATUS_OK) return {};
    return wordsOf(parcel.get());
}
