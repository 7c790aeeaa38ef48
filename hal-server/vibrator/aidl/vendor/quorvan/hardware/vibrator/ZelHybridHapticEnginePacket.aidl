// SPDX-License-Identifier: Apache-2.0
package vendor.quorvan.hardware.vibrator;

import vendor.quorvan.hardware.vibrator.ZelHybridHapticEnginePacketType;

/**
 * One packet of IZelVibrator.performHybridHapticEngine.
 *
 * Time, intensity, value and frequency go to the driver as decimal text in the order of the fields,
 * each with a space behind it, and none of them is checked. A number and its space are cut to 9
 * characters together: one of more than 8 characters, its sign and prefix included, runs into the
 * next.
 */
@VintfStability
parcelable ZelHybridHapticEnginePacket {
    /** Time of the packet, in the driver's unit; passed on as it is. */
    int time;

    /**
     * Strength, 0 to 10000. The driver gets intensity x amplitude / 10000, rounded towards 0; a
     * product beyond 32 bits wraps around.
     */
    int intensity;

    /**
     * How the driver is to take the value. With a number that is not one of the type's, the value
     * is left out of the packet and the request goes on.
     */
    ZelHybridHapticEnginePacketType type;

    /** Meaning and unit depend on the type and are the driver's; passed on as it is. */
    int value;

    /** Frequency, in the driver's unit; passed on as it is. */
    int frequency;
}
