// SPDX-License-Identifier: Apache-2.0
package vendor.quorvan.hardware.vibrator;

/**
 * One packet of IZelVibrator.performHapticEngine.
 *
 * The four numbers go to the driver as decimal text in the order of the fields, each with a space
 * behind it, and none of them is checked. A number and its space are cut to 9 characters together:
 * one of more than 8 characters, its sign included, runs into the next.
 */
@VintfStability
parcelable ZelHapticEnginePacket {
    /** Time of the packet, in the driver's unit; passed on as it is. The tick effect uses 7. */
    int time;

    /**
     * Strength, 0 to 10000. The driver gets intensity x amplitude / 10000, rounded towards 0; a
     * product beyond 32 bits wraps around.
     */
    int intensity;

    /** Frequency, in the driver's unit; passed on as it is. The tick effect uses 2050. */
    int frequency;

    /** Overdrive; passed on as it is. The tick effect uses 0, the heavy click 1. */
    int overdrive;
}
