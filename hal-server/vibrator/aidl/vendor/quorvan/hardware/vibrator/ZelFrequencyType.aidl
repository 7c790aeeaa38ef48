// SPDX-License-Identifier: Apache-2.0
package vendor.quorvan.hardware.vibrator;

/**
 * Frequency settings of the driver, for IZelVibrator.setFrequencyType. What each number
 * means is decided by the driver; the service only passes it on.
 */
@VintfStability
@Backing(type="int")
enum ZelFrequencyType {
    /** The driver's frequency setting 0. */
    FREQUENCY_0 = 0,
    /** The driver's frequency setting 1. */
    FREQUENCY_1 = 1,
    /** The driver's frequency setting 2. */
    FREQUENCY_2 = 2,
    /** The driver's frequency setting 3. */
    FREQUENCY_3 = 3,
    /** The driver's frequency setting 4. */
    FREQUENCY_4 = 4,
}
