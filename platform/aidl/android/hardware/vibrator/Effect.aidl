// SPDX-License-Identifier: Apache-2.0
package android.hardware.vibrator;

/**
 * The predefined effects of IVibrator.perform. A motor plays those that
 * IVibrator.getSupportedEffects lists.
 */
@VintfStability
@Backing(type="int")
enum Effect {
    /** A single short click, as of a key. */
    CLICK = 0,
    /** Two clicks close together. */
    DOUBLE_CLICK = 1,
    /** Weaker and shorter than a click. */
    TICK = 2,
    /** A dull, heavy blow. */
    THUD = 3,
    /** A light, springy pop. */
    POP = 4,
    /** Stronger than a click. */
    HEAVY_CLICK = 5,
    /** Goes with the device's 1st ringtone. */
    RINGTONE_1 = 6,
    /** Goes with the device's 2nd ringtone. */
    RINGTONE_2 = 7,
    /** Goes with the device's 3rd ringtone. */
    RINGTONE_3 = 8,
    /** Goes with the device's 4th ringtone. */
    RINGTONE_4 = 9,
    /** Goes with the device's 5th ringtone. */
    RINGTONE_5 = 10,
    /** Goes with the device's 6th ringtone. */
    RINGTONE_6 = 11,
    /** Goes with the device's 7th ringtone. */
    RINGTONE_7 = 12,
    /** Goes with the device's 8th ringtone. */
    RINGTONE_8 = 13,
    /** Goes with the device's 9th ringtone. */
    RINGTONE_9 = 14,
    /** Goes with the device's 10th ringtone. */
    RINGTONE_10 = 15,
    /** Goes with the device's 11th ringtone. */
    RINGTONE_11 = 16,
    /** Goes with the device's 12th ringtone. */
    RINGTONE_12 = 17,
    /** Goes with the device's 13th ringtone. */
    RINGTONE_13 = 18,
    /** Goes with the device's 14th ringtone. */
    RINGTONE_14 = 19,
    /** Goes with the device's 15th ringtone. */
    RINGTONE_15 = 20,
    /** A very light tick, fit to be repeated quickly so that a surface seems to have a grain. */
    TEXTURE_TICK = 21,
}
