// SPDX-License-Identifier: Apache-2.0
// One version of this type as `aidl --dumpapi` wrote it. A numbered version is what its users were
// built against: the version's hash covers every byte, so it is never edited, only followed by the
// next. Change the source beside aidl_api/ instead.

package vendor.quorvan.hardware.vibrator;
@Backing(type="int") @VintfStability
enum ZelFifoType {
  PATTERN_0 = 0,
  PATTERN_1 = 1,
  PATTERN_2 = 2,
  PATTERN_3 = 3,
  PATTERN_4 = 4,
  PATTERN_5 = 5,
  PATTERN_6 = 6,
  PATTERN_7 = 7,
  PATTERN_8 = 8,
  PATTERN_9 = 9,
  PATTERN_10 = 10,
  PATTERN_11 = 11,
  PATTERN_12 = 12,
  PATTERN_13 = 13,
  PATTERN_14 = 14,
  PATTERN_15 = 15,
  PATTERN_16 = 16,
  PATTERN_17 = 17,
  PATTERN_18 = 18,
  PATTERN_19 = 19,
  PATTERN_20 = 20,
  PATTERN_21 = 21,
  PATTERN_22 = 22,
  PATTERN_23 = 23,
  PATTERN_24 = 24,
  PATTERN_25 = 25,
}
