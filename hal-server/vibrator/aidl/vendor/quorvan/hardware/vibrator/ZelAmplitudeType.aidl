// SPDX-License-Identifier: Apache-2.0
package vendor.quorvan.hardware.vibrator;

/** Which list IZelVibrator.getAmplitudeList returns. */
@VintfStability
@Backing(type="int")
enum ZelAmplitudeType {
    /** The default steps; the driver's table is its node intensities. */
    DEFAULT = 0,
    /** The steps of the haptic table; the driver's table is its node haptic_intensities. */
    HAPTIC = 1,
}
