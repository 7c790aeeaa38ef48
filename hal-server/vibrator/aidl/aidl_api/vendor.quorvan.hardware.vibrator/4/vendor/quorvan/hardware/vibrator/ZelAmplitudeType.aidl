// SPDX-License-Identifier: Apache-2.0
// One version of this type as `aidl --dumpapi` wrote it. A numbered version is what its users were
// built against: the version's hash covers every byte, so it is never edited, only followed by the
// next. Change the source beside aidl_api/ instead.

package vendor.quorvan.hardware.vibrator;
@Backing(type="int") @VintfStability
enum ZelAmplitudeType {
  DEFAULT = 0,
  HAPTIC = 1,
}
