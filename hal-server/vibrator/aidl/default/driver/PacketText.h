// SPDX-License-Identifier: Apache-2.0
//
// The string of a packet request, as the driver's packet nodes take it: how many values follow,
// then the values of each packet, with a space between two numbers and a newline at the end.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace aidl::android::hardware::vibrator {

// The most packets in one request, and the values that each one counts for in the leading number
// and in the limit, however many it has.
inline constexpr size_t kPacketsMax = 339;
inline constexpr size_t kPacketValues = 4;

// intensity * amplitude / 10000, toward zero. The product wraps at 32 bits, so that no packet a
// client makes up is undefined.
constexpr int32_t scaleIntensity(int32_t intensity, int32_t amplitude) {
    const uint32_t product = static_cast<uint32_t>(intensity) * static_cast<uint32_t>(amplitude);
    return static_cast<int32_t>(product) / 10000;
}

// Holds the longest string there can be, so that none is ever cut: 339 packets of five values.
class PacketText {
  public:
    // Begins with the number of values of `packets` packets, at most kPacketsMax.
    explicit PacketText(size_t packets);

    // Appends the number and a space, together cut to nine characters.
    void append(int32_t value);

    // The same with "#" before the number.
    void appendMarked(int32_t value);

    // Ends the line in place of the last space (or of the last digit of a number that was cut).
    // The string is part of this object.
    std::string_view finish();

  private:
    static constexpr size_t kNumberSize = 10;  // nine characters and a terminator
    static constexpr size_t kPacketValuesMax = 5;

    void appendNumber(bool marked, int32_t value);

    char mText[(1 + kPacketsMax * kPacketValuesMax) * (kNumberSize - 1) + 1];
    size_t mLength = 0;
};

}  // namespace aidl::android::hardware::vibrator
