// SPDX-License-Identifier: Apache-2.0
package android.hardware.vibrator;

/**
 * The building blocks of IVibrator.compose. A motor plays those that
 * IVibrator.getSupportedPrimitives lists.
 */
@VintfStability
@Backing(type="int")
enum CompositePrimitive {
    /** Nothing is played; only the entry's delay counts. */
    NOOP = 0,
    /** A short click. */
    CLICK = 1,
    /** A dull blow that dies away. */
    THUD = 2,
    /** Strength goes up and down, as of a turning weight. */
    SPIN = 3,
    /** Strength grows within a short time. */
    QUICK_RISE = 4,
    /** Strength grows within a long time. */
    SLOW_RISE = 5,
    /** Strength fades within a short time. */
    QUICK_FALL = 6,
    /** A short, light tick of high pitch. */
    LIGHT_TICK = 7,
    /** A short, light tick of low pitch. Since version 2. */
    LOW_TICK = 8,
}
