// SPDX-License-Identifier: Apache-2.0
package vendor.quorvan.hardware.vibrator;

/**
 * One pattern of IZelVibrator.performPlaybackEngine. The numbers go to the driver as decimal text,
 * and none of them is checked.
 */
@VintfStability
parcelable ZelPlaybackPacket {
    /** Number of a pattern that the driver holds. */
    int patternIndex;

    /** Strength of this pattern, in the driver's unit. */
    int level;

    /** A further number for this pattern, its meaning the driver's; 0 is not sent. */
    int option;
}
