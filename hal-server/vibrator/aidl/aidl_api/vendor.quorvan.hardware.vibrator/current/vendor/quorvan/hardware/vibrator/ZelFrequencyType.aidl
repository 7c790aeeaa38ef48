// SPDX-License-Identifier: Apache-2.0
// One version of this type as `aidl --dumpapi` wrote it. A numbered version is what its users were
// built against: the version's hash covers every byte, so it is never edited, only followed by the
// next. Change the source beside aidl_api/ instead.

package vendor.quorvan.hardware.vibrator;
@Backing(type="int") @VintfStability
enum ZelFrequencyType {
  FREQUENCY_0 = 0,
  FREQUENCY_1 = 1,
  FREQUENCY_2 = 2,
  FREQUENCY_3 = 3,
  FREQUENCY_4 = 4,
}
