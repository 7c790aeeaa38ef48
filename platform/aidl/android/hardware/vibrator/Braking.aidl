// SPDX-License-Identifier: Apache-2.0
package android.hardware.vibrator;

/** How a motor is brought to rest within IVibrator.composePwle. Since version 2. */
@VintfStability
@Backing(type="int")
enum Braking {
    /** It runs out by itself. */
    NONE = 0,
    /** It is driven against its own movement, in a closed loop. */
    CLAB = 1,
}
